// Pixel codecs: how the pixels of a flattened image are encoded.
#pragma once

#include <cstdint>
#include <memory>

#include "image/image.h"
#include "serialize/flatten_context.h"
#include "serialize/pixel_memory.h"

namespace zq {

enum class CodecId : std::int32_t { kPlain = 0, kQuality = 1, kPacked = 2 };
inline constexpr std::int32_t kCodecCount = 3;

// Range of qualities; a codec keeps its own within narrower bounds.
inline constexpr std::int32_t kLeastQuality = 0, kBestQuality = 1000;

// Threads: everything may be called from any thread; images are under their locks.
class PixelCodec {
  public:
    virtual ~PixelCodec() = default;

    // Fills the context's pixel block from an image with pixels, and whatever else of the context
    // the encoding changes.
    virtual void encode(FlattenContext& context, Image& image) const = 0;

    // Writes the pixels of an image that has the context's type, size and border. Trap: the context
    // has been found good by check().
    virtual void decode(Image& image, const ZqFlattenContext& context,
                        PixelMemory memory) const = 0;

    // Whether decode leaves no pixel of such an image, border included, as it was in the memory.
    virtual bool writes_all(const Image& image, const ZqFlattenContext& context) const = 0;

    // Reads, or with `set` stores, the quality.
    virtual void quality(std::int32_t& value, bool set) = 0;

    // Throws kInitializationError when the block does not fit the context's geometry.
    virtual void check(const ZqFlattenContext& context) const = 0;
    // Whether decode may still find the block bad; it throws kInitializationError then, and the
    // pixels are what they were.
    virtual bool may_fail_late() const { return false; }
};

// A new instance; null for an id that does not exist.
std::unique_ptr<PixelCodec> make_codec(std::int32_t id);

// One maker a codec, each in its own source.
std::unique_ptr<PixelCodec> make_plain_codec();
std::unique_ptr<PixelCodec> make_quality_codec();
std::unique_ptr<PixelCodec> make_packed_codec();

// For codecs without losses: nothing is stored, and the best quality reported.
inline void fixed_quality(std::int32_t& value, bool set) {
    if (!set) value = kBestQuality;
}

}  // namespace zq
