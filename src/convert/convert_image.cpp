// Conversion of whole images.
#include "convert/convert_image.h"

#include "convert/convert_rows.h"
#include "convert/copy_rows.h"

namespace zq {

namespace {

// Makes room for the converted picture; a failure leaves the destination as it was.
void take_shape(const Image& source, Image& destination) {
    const Extent wanted = source.extent();
    destination.resize(wanted.width, wanted.height, wanted.border);
    const bool same_samples = source.type() == destination.type();
    destination.set_sample_offset(same_samples ? source.sample_offset() : 0);
}

std::size_t pixel_count(const Image& image) {
    return static_cast<std::size_t>(image.record().width) *
           static_cast<std::size_t>(image.record().height);
}

Stores stores_into(const Image& image) {
    return stores_for(pixel_count(image) * static_cast<std::size_t>(bytes_per_pixel(image.type())));
}

std::uint8_t* first_border_pixel(const Image& image) {
    const std::int32_t border = image.record().border;
    return image.row(-border) - std::ptrdiff_t{border} * bytes_per_pixel(image.type());
}

void copy_with_border(const Image& source, const Image& destination) {
    const auto with_border = [&](std::int32_t size) {
        return static_cast<std::size_t>(size) +
               2 * static_cast<std::size_t>(source.record().border);
    };
    copy_rows({first_border_pixel(source), source.row_stride()},
              {first_border_pixel(destination), destination.row_stride()},
              with_border(source.record().height),
              with_border(source.record().width) *
                  static_cast<std::size_t>(bytes_per_pixel(source.type())));
}

void convert_rows(const Image& source, Image& destination) {
    RowConverter converter(source.type(), destination.type(), {.bit_depth = source.bit_depth()},
                           stores_into(destination));
    const auto width = static_cast<std::size_t>(source.record().width);
    for (std::int32_t y = 0; y < source.record().height; ++y) {
        converter.convert(source.row(y), destination.row(y), width);
    }
}

// Each row goes at once where the exchange of the quadrants would take it.
void render_spectrum(const Image& source, Image& destination) {
    RowConverter converter(PixelType::kComplex, PixelType::kRgb,
                           {.scale = 128.0 / static_cast<double>(pixel_count(source))},
                           stores_into(destination));
    const std::int32_t height = source.record().height;
    const std::int32_t half_height = height / 2;
    const auto width = static_cast<std::size_t>(source.record().width);
    const std::size_t half = width / 2;
    constexpr std::size_t kFrom = kBytesPerPixel[3], kTo = kBytesPerPixel[4];
    for (std::int32_t y = 0; y < height; ++y) {
        const bool moves = y < 2 * half_height;
        const std::size_t moved = moves ? half : 0;
        const std::uint8_t* from = source.row(y);
        if (moves) {
            std::uint8_t* to = destination.row((y + half_height) % (2 * half_height));
            converter.convert(from, to + moved * kTo, moved);
            converter.convert(from + moved * kFrom, to, moved);
        }
        converter.convert(from + 2 * moved * kFrom, destination.row(y) + 2 * moved * kTo,
                          width - 2 * moved);
    }
}

}  // namespace

void convert_image(Image& source, Image& destination) {
    if (&source == &destination) return;
    take_shape(source, destination);
    if (pixel_count(source) == 0) return;
    if (source.type() == destination.type()) {
        copy_with_border(source, destination);
    } else if (source.type() == PixelType::kComplex && destination.type() == PixelType::kRgb) {
        render_spectrum(source, destination);
    } else {
        convert_rows(source, destination);
    }
}

void apply_colour_table(const Image& source, std::span<const std::uint32_t> table,
                        Image& destination) {
    if (source.type() != PixelType::kU8 || destination.type() != PixelType::kRgb) {
        throw kIncompatibleImageType;
    }
    take_shape(source, destination);
    const ImageRecord& record = source.record();
    for (std::int32_t y = 0; y < record.height; ++y) {
        const std::uint8_t* index = source.row(y);
        auto* pixel = reinterpret_cast<std::uint32_t*>(destination.row(y));
        for (std::int32_t x = 0; x < record.width; ++x) pixel[x] = table[index[x]];
    }
}

}  // namespace zq
