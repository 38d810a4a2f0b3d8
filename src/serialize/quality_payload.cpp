// The choice of codec by pixel type.
#include "serialize/quality_payload.h"

#include "serialize/quality_jpeg.h"
#include "serialize/quality_planes.h"

namespace zq {

void put_payload(Bytes& out, const Image& image, int quality, const Image& whole) {
    if (is_jpeg_type(image.type())) {
        put_jpeg(out, image, quality);
    } else {
        put_planes_of(out, image, quality, whole);
    }
}

void read_payload(StreamReader& reader, Image& image, PixelMemory memory) {
    if (is_jpeg_type(image.type())) {
        read_jpeg(reader, image, memory);
    } else {
        read_planes_of(reader, image);
    }
}

}  // namespace zq
