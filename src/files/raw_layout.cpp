// Format numbers of headerless files.
#include "files/raw_layout.h"

#include <array>
#include <bit>

namespace zq {

namespace {

constexpr std::int32_t kPlanarCode = 9;
constexpr std::int32_t kStridedMode = 2;

// By file pixel format; those without bits do not exist as files.
struct Format {
    std::int32_t bits_per_pixel = 0;
    PixelType type = PixelType::kU8;
    std::int32_t sample_bytes = 1;
};
constexpr std::array<Format, 18> kFormats = {{
    {1},
    {2},
    {4},
    {8},
    {},
    {16, PixelType::kI16, 2},  // unsigned
    {16, PixelType::kI16, 2},
    {16, PixelType::kRgb, 2},  // 5, 6, 5 bits
    {24, PixelType::kRgb},
    {},
    {32, PixelType::kSgl, 4},  // unsigned integers
    {32, PixelType::kSgl, 4},  // signed integers
    {32, PixelType::kRgb},
    {32, PixelType::kSgl, 4},
    {48, PixelType::kRgbU64, 2},
    {64, PixelType::kComplex, 4},
    {},
    {32, PixelType::kHsl},
}};

// The numbers leave out the codes 4 and 16.
std::int64_t code_of_number(std::int32_t number) {
    std::int64_t code = number;
    if (code >= 4) ++code;
    if (code >= 16) ++code;
    return code;
}

}  // namespace

RawLayout raw_layout(const ZqRawParameters& parameters) {
    std::int64_t code = code_of_number(parameters.format);
    RawLayout layout;
    layout.is_planar = code == kPlanarCode;
    if (layout.is_planar) code = static_cast<std::int64_t>(PixelFormat::kRgb24);
    const bool exists = code >= 0 && code < static_cast<std::int64_t>(kFormats.size());
    const Format format = exists ? kFormats[static_cast<std::size_t>(code)] : Format{};
    if (format.bits_per_pixel == 0) throw kInvalidFileHeader;
    const bool strided = parameters.layoutMode == kStridedMode;
    if (strided && parameters.layout[0] < 0) throw kInvalidParameter;
    if (parameters.dataOffset < 0) throw kUnableToReadData;
    layout.format = static_cast<PixelFormat>(code);
    layout.type = format.type;
    layout.bits_per_pixel = format.bits_per_pixel;
    constexpr bool kMachineIsBig = std::endian::native == std::endian::big;
    if ((parameters.byteOrder != 0) != kMachineIsBig) layout.swapped_bytes = format.sample_bytes;
    layout.offset = parameters.dataOffset;
    if (strided) {
        layout.line_stride = parameters.layout[0];
        layout.is_bottom_up = parameters.layout[1] != 0;
    }
    return layout;
}

}  // namespace zq
