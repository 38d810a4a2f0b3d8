// The rules of each pair of pixel types, pixel by pixel. Colours of 16 bits a channel are not
// scaled when they come from or go to types of other depths, unless a bit depth says so.
#include "convert/convert_rows.h"

#include <algorithm>
#include <array>

namespace zq {

namespace {

// In memory order.
template <class Channel>
struct Colour {
    Channel blue, green, red, alpha;
};
using Rgb = Colour<std::uint8_t>;
using RgbU64 = Colour<std::uint16_t>;

template <class Channel>
Colour<Channel> grey(Channel value) {
    return {value, value, value, 0};
}

template <class Channel>
std::int32_t mean(const Colour<Channel>& colour) {
    return (colour.blue + colour.green + colour.red) / 3;
}

void convert(std::uint8_t from, std::int16_t& to, std::int32_t) {
    to = from;
}
void convert(std::uint8_t from, Rgb& to, std::int32_t) {
    to = grey(from);
}
void convert(std::uint8_t from, RgbU64& to, std::int32_t) {
    to = grey<std::uint16_t>(from);
}
void convert(std::int16_t from, std::uint8_t& to, std::int32_t bit_depth) {
    to = reduce_to_8_bits(from, bit_depth);
}
void convert(std::int16_t from, Rgb& to, std::int32_t bit_depth) {
    to = grey(reduce_to_8_bits(from, bit_depth));
}
void convert(std::int16_t from, RgbU64& to, std::int32_t) {
    to = grey(static_cast<std::uint16_t>(std::max<std::int16_t>(from, 0)));
}
void convert(Rgb from, std::uint8_t& to, std::int32_t) {
    to = static_cast<std::uint8_t>(mean(from));
}
void convert(Rgb from, std::int16_t& to, std::int32_t) {
    to = static_cast<std::int16_t>(mean(from));
}
void convert(Rgb from, RgbU64& to, std::int32_t) {
    to = {from.blue, from.green, from.red, from.alpha};
}
void convert(const RgbU64& from, Rgb& to, std::int32_t bit_depth) {
    to = {reduce_to_8_bits(from.blue, bit_depth), reduce_to_8_bits(from.green, bit_depth),
          reduce_to_8_bits(from.red, bit_depth), reduce_to_8_bits(from.alpha, bit_depth)};
}
void convert(const RgbU64& from, std::uint8_t& to, std::int32_t bit_depth) {
    Rgb reduced;
    convert(from, reduced, bit_depth);
    to = static_cast<std::uint8_t>(mean(reduced));
}
void convert(const RgbU64& from, std::int16_t& to, std::int32_t) {
    to = static_cast<std::int16_t>(std::min(mean(from), 32767));
}

template <class From, class To>
void convert_row(const void* source, void* destination, std::int32_t width,
                 std::int32_t bit_depth) {
    const auto* from = static_cast<const From*>(source);
    auto* to = static_cast<To*>(destination);
    for (std::int32_t x = 0; x < width; ++x) convert(from[x], to[x], bit_depth);
}

struct Conversion {
    PixelType from;
    PixelType to;
    ConvertRow row;
};

constexpr std::array kConversions = {
    Conversion{PixelType::kU8, PixelType::kI16, convert_row<std::uint8_t, std::int16_t>},
    Conversion{PixelType::kU8, PixelType::kRgb, convert_row<std::uint8_t, Rgb>},
    Conversion{PixelType::kU8, PixelType::kRgbU64, convert_row<std::uint8_t, RgbU64>},
    Conversion{PixelType::kI16, PixelType::kU8, convert_row<std::int16_t, std::uint8_t>},
    Conversion{PixelType::kI16, PixelType::kRgb, convert_row<std::int16_t, Rgb>},
    Conversion{PixelType::kI16, PixelType::kRgbU64, convert_row<std::int16_t, RgbU64>},
    Conversion{PixelType::kRgb, PixelType::kU8, convert_row<Rgb, std::uint8_t>},
    Conversion{PixelType::kRgb, PixelType::kI16, convert_row<Rgb, std::int16_t>},
    Conversion{PixelType::kRgb, PixelType::kRgbU64, convert_row<Rgb, RgbU64>},
    Conversion{PixelType::kRgbU64, PixelType::kU8, convert_row<RgbU64, std::uint8_t>},
    Conversion{PixelType::kRgbU64, PixelType::kI16, convert_row<RgbU64, std::int16_t>},
    Conversion{PixelType::kRgbU64, PixelType::kRgb, convert_row<RgbU64, Rgb>},
};

}  // namespace

ConvertRow find_row_conversion(PixelType from, PixelType to) {
    for (const Conversion& conversion : kConversions) {
        if (conversion.from == from && conversion.to == to) return conversion.row;
    }
    return nullptr;
}

}  // namespace zq
