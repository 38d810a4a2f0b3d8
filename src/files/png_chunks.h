// The private PNG chunks: exact bytes, and nothing of libpng.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

#include "files/pixel_view.h"

namespace zq {

// Fixed-size chunks behind pHYs.
inline constexpr std::string_view kPixelSizeChunk = "unIt";
inline constexpr std::string_view kSampleOffsetChunk = "scAl";
inline constexpr std::string_view kSignificantBitsChunk = "usBd";
// Deflated payloads.
inline constexpr std::string_view kTimingChunk = "pmTI";
inline constexpr std::string_view kObjectsChunk = "zqEI";
inline constexpr std::string_view kPrivateObjectsChunk = "zqEi";

// A chunk to be written; what frames it (length, check sum) is the writer's.
struct PngChunk {
    std::array<std::uint8_t, 5> name{};  // ends with a zero
    std::vector<std::uint8_t> bytes;
};

// More than this is never deflated into a chunk nor inflated from one.
inline constexpr std::size_t kLargestPayload = std::size_t{256} << 20;

PngChunk make_chunk(std::string_view name);
PngChunk make_pixel_size(const Calibration& calibration);
PngChunk make_sample_offset(std::int16_t offset);
PngChunk make_significant_bits(std::uint32_t bits);
// Throws kUnableToWriteData for a payload above kLargestPayload, kNotEnoughMemory.
PngChunk make_payload(std::string_view name, std::span<const std::uint8_t> payload);

// None when the length or the keyword is wrong: such a chunk is somebody else's.
std::optional<Calibration> parse_pixel_size(std::span<const std::uint8_t> chunk);
std::optional<std::int16_t> parse_sample_offset(std::span<const std::uint8_t> chunk);
std::optional<std::uint32_t> parse_significant_bits(std::span<const std::uint8_t> chunk);
// None also when the deflated stream is damaged, has not the stated length or could never have it.
// Throws kNotEnoughMemory.
std::optional<std::vector<std::uint8_t>> parse_payload(std::span<const std::uint8_t> chunk);

// The standard chunk of the pixel size: pixels per unit, and whether the unit is the metre.
struct PixelsPerUnit {
    std::uint32_t x = 0;
    std::uint32_t y = 0;
    bool is_metre = false;
};
PixelsPerUnit pixels_per_unit(const Calibration& calibration);
std::optional<PixelsPerUnit> parse_pixels_per_unit(std::span<const std::uint8_t> chunk);
// None when it does not say how large a pixel is. What comes out of it gives the same numbers
// again.
std::optional<Calibration> calibration_of(const PixelsPerUnit& pixels);

}  // namespace zq
