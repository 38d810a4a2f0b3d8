// Conversion of whole images.
#include "convert/convert_image.h"

#include <cstring>

#include "convert/convert_rows.h"

namespace zq {

namespace {

// Makes room for the converted picture; a failure leaves the destination as it was.
void take_shape(const Image& source, Image& destination) {
    const Extent wanted = source.extent();
    const std::int32_t old_border = destination.extent().border;
    destination.set_border(wanted.border);
    try {
        destination.resize(wanted.width, wanted.height, std::nullopt, ResizeMode::kPlain);
    } catch (...) {
        destination.set_border(old_border);
        throw;
    }
}

void copy_rows(const Image& source, Image& destination) {
    const auto bytes = static_cast<std::size_t>(source.record().width) *
                       static_cast<std::size_t>(bytes_per_pixel(source.type()));
    for (std::int32_t y = 0; y < source.record().height; ++y) {
        std::memcpy(destination.row(y), source.row(y), bytes);
    }
}

}  // namespace

void convert_image(Image& source, Image& destination) {
    if (&source == &destination) return;
    const bool same_type = source.type() == destination.type();
    const ConvertRow convert_row = find_row_conversion(source.type(), destination.type());
    if (!same_type && convert_row == nullptr) throw kIncompatibleImageType;
    take_shape(source, destination);
    if (same_type) {
        copy_rows(source, destination);
        return;
    }
    const ImageRecord& record = source.record();
    for (std::int32_t y = 0; y < record.height; ++y) {
        convert_row(source.row(y), destination.row(y), record.width, source.bit_depth());
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
