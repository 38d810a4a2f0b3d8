// The plain codec: the image's rows with border and padding, as they lie in memory.
#include <algorithm>

#include "convert/copy_rows.h"
#include "serialize/pixel_codec.h"

namespace zq {

namespace {

// As many of the bytes from `start` on as there are.
template <class Byte>
std::span<Byte> part(std::span<Byte> bytes, std::size_t start, std::size_t count) {
    start = std::min(start, bytes.size());
    return bytes.subspan(start, std::min(count, bytes.size() - start));
}

class PlainCodec final : public PixelCodec {
  public:
    void encode(FlattenContext& context, Image& image) const override {
        const std::span<const std::uint8_t> rows = image.whole_rows();
        const ImageRecord& record = image.record();
        // Lines of a caller's buffer may be shorter than the rows; no block can tell that.
        if (record.rowPixels < record.width + 2 * std::int64_t{record.border}) {
            throw kInitializationError;
        }
        // What was in the memory before is nobody's business elsewhere.
        image.clear_padding();
        const auto row_count =
            static_cast<std::size_t>(record.height) + 2 * static_cast<std::size_t>(record.border);
        context.borrow_pixels(
            rows, rows.empty() ? 0 : row_count * static_cast<std::size_t>(image.row_stride()));
    }

    // Between images of different line widths the strides are pixel counts taken as bytes: exact
    // for pixels of one byte only. Readers and writers of all versions agree on that; do not widen
    // it.
    void decode(Image& image, const ZqFlattenContext& context,
                PixelMemory /*memory*/) const override {
        const auto from = block_bytes(context.pixelBlock, context.pixelBlockSize);
        const std::span<std::uint8_t> to = image.whole_rows();
        const auto to_line = static_cast<std::size_t>(image.record().rowPixels);
        const std::size_t from_line = context.lineWidth;
        if (writes_all(image, context)) {
            copy_block(to.data(), from.data(), std::min(to.size(), from.size()));
            return;
        }
        const std::size_t bytes = std::min(from_line, to_line);
        for (std::size_t row = 0; row < rows_of(context); ++row) {
            const std::span<std::uint8_t> there = part(to, row * to_line, bytes);
            const auto here = part(from, row * from_line, bytes);
            copy_block(there.data(), here.data(), std::min(there.size(), here.size()));
        }
    }

    bool writes_all(const Image& image, const ZqFlattenContext& context) const override {
        return static_cast<std::uint32_t>(image.record().rowPixels) == context.lineWidth;
    }

    void quality(std::int32_t& value, bool set) override { fixed_quality(value, set); }

    void check(const ZqFlattenContext& context) const override {
        const std::uint64_t columns = context.width + 2 * std::uint64_t{context.border};
        const std::uint64_t line_bytes =
            std::uint64_t{context.lineWidth} *
            static_cast<std::uint64_t>(
                bytes_per_pixel(to_pixel_type(static_cast<std::int32_t>(context.type))));
        const bool fits = context.lineWidth >= columns && line_bytes != 0 &&
                          context.pixelBlockSize % line_bytes == 0 &&
                          context.pixelBlockSize / line_bytes == rows_of(context);
        if (!fits) throw kInitializationError;
    }

  private:
    static std::uint64_t rows_of(const ZqFlattenContext& context) {
        return context.height + 2 * std::uint64_t{context.border};
    }
};

}  // namespace

std::unique_ptr<PixelCodec> make_plain_codec() {
    return std::make_unique<PlainCodec>();
}

}  // namespace zq
