// The quality codec as a pixel codec: its stored quality drives the compression.
#include <algorithm>
#include <atomic>

#include "serialize/pixel_codec.h"
#include "serialize/quality_codec.h"

namespace zq {

namespace {

constexpr std::int32_t kLeastStored = 10;
constexpr std::int32_t kInitialQuality = 750;

class QualityCodec final : public PixelCodec {
  public:
    void encode(FlattenContext& context, Image& image) const override {
        context.own_pixels(compress_pixels(image, quality_ / 10));
    }

    void decode(Image& image, const ZqFlattenContext& context, PixelMemory memory) const override {
        decompress_pixels(image, block_bytes(context.pixelBlock, context.pixelBlockSize), memory);
    }

    bool writes_all(const Image& /*image*/, const ZqFlattenContext& /*context*/) const override {
        return true;
    }

    void quality(std::int32_t& value, bool set) override {
        if (set) {
            quality_ = std::clamp(value, kLeastStored, kBestQuality);
        } else {
            value = quality_;
        }
    }

    void check(const ZqFlattenContext& /*context*/) const override {}
    bool may_fail_late() const override { return true; }

  private:
    std::atomic<std::int32_t> quality_ = kInitialQuality;
};

}  // namespace

std::unique_ptr<PixelCodec> make_quality_codec() {
    return std::make_unique<QualityCodec>();
}

}  // namespace zq
