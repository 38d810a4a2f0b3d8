// Units of a JFIF density and of an image's calibration.
#pragma once

#include <cstdint>

namespace zq {

inline constexpr std::int32_t kUnitCentimetre = 4;
inline constexpr std::int32_t kUnitInch = 8;
inline constexpr std::uint8_t kDensityNone = 0;
inline constexpr std::uint8_t kDensityInch = 1;
inline constexpr std::uint8_t kDensityCentimetre = 2;

constexpr std::int32_t unit_of_density(std::uint8_t density_unit) {
    if (density_unit == kDensityInch) return kUnitInch;
    return density_unit == kDensityCentimetre ? kUnitCentimetre : 0;
}

constexpr std::uint8_t density_of_unit(std::int32_t unit) {
    if (unit == kUnitInch) return kDensityInch;
    return unit == kUnitCentimetre ? kDensityCentimetre : kDensityNone;
}

}  // namespace zq
