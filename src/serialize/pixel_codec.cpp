// Makes pixel codecs by id.
#include "serialize/pixel_codec.h"

namespace zq {

std::unique_ptr<PixelCodec> make_codec(std::int32_t id) {
    switch (static_cast<CodecId>(id)) {
        case CodecId::kPlain:
            return make_plain_codec();
        case CodecId::kQuality:
            return make_quality_codec();
        case CodecId::kPacked:
            return make_packed_codec();
    }
    return nullptr;
}

}  // namespace zq
