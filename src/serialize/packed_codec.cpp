// The packed codec: one bit for each pixel of the image proper, set where its 8-bit value is not 0.
#include "convert/convert_image.h"
#include "kernels/pack_bits.h"
#include "serialize/pixel_codec.h"

namespace zq {

namespace {

constexpr std::size_t packed_row_bytes(std::size_t width) {
    return width / 8 + (width % 8 != 0 ? 1 : 0);
}

std::vector<std::uint8_t> pack(const Image& image) {
    const auto width = static_cast<std::size_t>(image.record().width);
    const auto height = static_cast<std::size_t>(image.record().height);
    const std::size_t row_bytes = packed_row_bytes(width);
    std::vector<std::uint8_t> block(row_bytes * height);
    for (std::size_t y = 0; y < height; ++y) {
        pack_bits(image.row(static_cast<std::int32_t>(y)), block.data() + y * row_bytes, width);
    }
    return block;
}

class PackedCodec final : public PixelCodec {
  public:
    // The rebuilt image has 8 bits, whatever this one has.
    void encode(FlattenContext& context, Image& image) const override {
        if (image.type() == PixelType::kU8) {
            context.own_pixels(pack(image));
        } else {
            Image grey(Variant::kPrivate, {});
            convert_image(image, grey);
            context.own_pixels(pack(grey));
        }
        context.words.type = static_cast<std::uint32_t>(PixelType::kU8);
    }

    void decode(Image& image, const ZqFlattenContext& context,
                PixelMemory /*memory*/) const override {
        const auto block = block_bytes(context.pixelBlock, context.pixelBlockSize);
        const std::size_t row_bytes = packed_row_bytes(context.width);
        for (std::int32_t y = 0; y < image.record().height; ++y) {
            unpack_bits(block.data() + static_cast<std::size_t>(y) * row_bytes, image.row(y),
                        context.width);
        }
    }

    bool writes_all(const Image& image, const ZqFlattenContext& /*context*/) const override {
        return image.record().border == 0;
    }

    void quality(std::int32_t& value, bool set) override { fixed_quality(value, set); }

    void check(const ZqFlattenContext& context) const override {
        const bool fits = context.type == static_cast<std::uint32_t>(PixelType::kU8) &&
                          context.pixelBlockSize ==
                              std::uint64_t{packed_row_bytes(context.width)} * context.height;
        if (!fits) throw kInitializationError;
    }
};

}  // namespace

std::unique_ptr<PixelCodec> make_packed_codec() {
    return std::make_unique<PackedCodec>();
}

}  // namespace zq
