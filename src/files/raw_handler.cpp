// Reading files without a header.
#include "files/raw_handler.h"

#include <vector>

#include "base/checked.h"
#include "files/raw_rows.h"
#include "files/unsigned_grey.h"

namespace zq {

bool RawFileHandler::read_header() {
    if (target_.width == 0 || target_.height == 0) throw kIncompatibleImageSize;
    layout_ = raw_layout(parameters_);
    header_ = {.pixel_format = layout_.format,
               .type = layout_.type,
               .width = target_.width,
               .height = target_.height,
               .bits_per_pixel = layout_.bits_per_pixel};
    return true;
}

std::size_t RawFileHandler::line_bytes() const {
    const auto bits = static_cast<std::uint64_t>(layout_.bits_per_pixel) *
                      static_cast<std::uint64_t>(target_.width);
    return checked_narrow<std::size_t>((bits + 7) / 8);
}

std::size_t RawFileHandler::stride() const {
    if (layout_.line_stride == 0 || layout_.is_planar) return line_bytes();
    if (static_cast<std::size_t>(layout_.line_stride) < line_bytes()) throw kInvalidParameter;
    return static_cast<std::size_t>(layout_.line_stride);
}

void RawFileHandler::seek_to_data() {
    const auto lines = static_cast<std::uint64_t>(target_.height);
    const std::uint64_t bytes = checked_mul<std::uint64_t>(stride(), lines - 1);
    input().require(static_cast<std::uint64_t>(layout_.offset),
                    checked_add<std::uint64_t>(bytes, line_bytes()));
    input().seek(static_cast<std::uint64_t>(layout_.offset));
}

void RawFileHandler::read_lines(Image& image) {
    if (layout_.is_planar) {
        read_planes(image);
        return;
    }
    std::optional<UnsignedGreyRows> unsigned_rows;
    if (layout_.format == PixelFormat::kUnsigned16) unsigned_rows.emplace(image);
    std::vector<std::uint8_t> line(target_.height == 1 ? line_bytes() : stride());
    for (std::int32_t i = 0; i < target_.height; ++i) {
        const bool is_last = i + 1 == target_.height;
        input().read(line.data(), is_last ? line_bytes() : line.size(), kUnableToReadData);
        swap_samples({line.data(), line_bytes()}, layout_.swapped_bytes);
        const std::int32_t y = layout_.is_bottom_up ? target_.height - 1 - i : i;
        unpack_raw_row(layout_, line.data(), image.row(y), static_cast<std::size_t>(target_.width));
        if (unsigned_rows) unsigned_rows->add(y, 1);
    }
    if (unsigned_rows) image.set_sample_offset(unsigned_rows->offset());
}

// Each plane is a third of the data, which may be more than the picture needs.
std::uint64_t RawFileHandler::plane_bytes() const {
    if (input().size() == InputFile::kUnknownSize) {
        return static_cast<std::uint64_t>(target_.width) *
               static_cast<std::uint64_t>(target_.height);
    }
    return (static_cast<std::uint64_t>(input().size()) -
            static_cast<std::uint64_t>(layout_.offset)) /
           3;
}

void RawFileHandler::read_planes(Image& image) {
    const auto width = static_cast<std::size_t>(target_.width);
    std::vector<std::uint8_t> line(width);
    for (std::size_t channel = 0; channel < 3; ++channel) {
        input().seek(static_cast<std::uint64_t>(layout_.offset) + channel * plane_bytes());
        for (std::int32_t y = 0; y < target_.height; ++y) {
            input().read(line.data(), width, kUnableToReadData);
            std::uint8_t* pixel = image.row(y);
            for (std::size_t x = 0; x < width; ++x, pixel += 4) {
                pixel[2 - channel] = line[x];
                if (channel == 0) pixel[3] = 0;
            }
        }
    }
}

}  // namespace zq
