// Lists of single pixels in the quality codec's blocks: for each the number of pixels skipped since
// the one before, row by row from the first pixel of the top row on, as a number of seven bits a
// byte; and what belongs to the pixel.
#pragma once

#include <cstdint>

#include "image/image.h"
#include "serialize/quality_stream.h"

namespace zq {

inline std::uint64_t pixel_count(const Image& image) {
    return static_cast<std::uint64_t>(image.record().width) *
           static_cast<std::uint64_t>(image.record().height);
}

inline std::uint8_t* pixel_at(const Image& image, std::uint64_t index) {
    const auto width = static_cast<std::uint64_t>(image.record().width);
    return image.row(static_cast<std::int32_t>(index / width)) +
           static_cast<std::ptrdiff_t>(index % width) * bytes_per_pixel(image.type());
}

// Writes indices that rise.
class PixelListWriter {
  public:
    explicit PixelListWriter(Bytes& out) : out_(out) {}
    void put(std::uint64_t index);

  private:
    Bytes& out_;
    std::uint64_t next_ = 0;
};

// Calls visit(index, reader) for each pixel of the list; `visit` reads what belongs to it. Throws
// kInitializationError for a pixel outside the image.
template <class Visit>
void for_each_listed(std::span<const std::uint8_t> list, const Image& image, Visit&& visit) {
    const std::uint64_t pixels = pixel_count(image);
    StreamReader reader(list);
    for (std::uint64_t next = 0; !reader.at_end(); ++next) {
        const std::uint64_t skipped = reader.number();
        if (next >= pixels || skipped >= pixels - next) throw kInitializationError;
        next += skipped;
        visit(next, reader);
    }
}

}  // namespace zq
