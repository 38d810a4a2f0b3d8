// Bytes of the private chunks, and of pHYs beside them.
#include "files/png_chunks.h"

#include <algorithm>
#include <bit>
#include <cmath>

#include "base/byte_order.h"
#include "base/error_codes.h"
#include "codecs/deflate.h"

namespace zq {

namespace {

// Ends the fixed part of every private chunk.
constexpr std::string_view kKeyword = "ZQKEMO";
constexpr std::int32_t kMetre = 5;  // among the unit codes of images
constexpr std::uint8_t kPngMetre = 1;
constexpr float kLargestPngNumber = 2147483520.0F;  // the last float below 2^31
constexpr int kTimingLevel = 9;
constexpr int kObjectsLevel = 5;

void append_be32(std::vector<std::uint8_t>& bytes, std::uint32_t number) {
    for (int shift = 24; shift >= 0; shift -= 8) {
        bytes.push_back(static_cast<std::uint8_t>(number >> shift));
    }
}

void append_keyword(std::vector<std::uint8_t>& bytes) {
    bytes.insert(bytes.end(), kKeyword.begin(), kKeyword.end());
}

bool has_keyword(std::span<const std::uint8_t> chunk, std::size_t at) {
    return chunk.size() >= at + kKeyword.size() &&
           std::equal(kKeyword.begin(), kKeyword.end(), chunk.data() + at);
}

bool is_ours(std::span<const std::uint8_t> chunk, std::size_t keyword_at) {
    return chunk.size() == keyword_at + kKeyword.size() && has_keyword(chunk, keyword_at);
}

float load_float(const std::uint8_t* bytes) {
    return std::bit_cast<float>(load_be32(bytes));
}

bool is_step(float step) {
    return std::isfinite(step) && step != 0;
}

// Truncated; 0 and 2^31 are the ends of what the format can say.
std::uint32_t per_unit(float step) {
    const float count = 1.0F / step;
    if (!(count > 0)) return 0;
    return static_cast<std::uint32_t>(std::min(count, kLargestPngNumber));
}

// The quotient may be rounded to where its own reciprocal is truncated to one less.
float step_of(std::uint32_t count) {
    const float step = 1.0F / static_cast<float>(count);
    return per_unit(step) < count ? std::nextafter(step, 0.0F) : step;
}

}  // namespace

PngChunk make_chunk(std::string_view name) {
    PngChunk chunk;
    std::copy_n(name.begin(), 4, chunk.name.begin());
    return chunk;
}

PngChunk make_pixel_size(const Calibration& calibration) {
    PngChunk chunk = make_chunk(kPixelSizeChunk);
    append_be32(chunk.bytes, std::bit_cast<std::uint32_t>(calibration.x_step));
    append_be32(chunk.bytes, std::bit_cast<std::uint32_t>(calibration.y_step));
    chunk.bytes.push_back(static_cast<std::uint8_t>(std::clamp(calibration.unit, 0, 255)));
    append_keyword(chunk.bytes);
    return chunk;
}

PngChunk make_sample_offset(std::int16_t offset) {
    PngChunk chunk = make_chunk(kSampleOffsetChunk);
    chunk.bytes.resize(2);
    store_be16(chunk.bytes.data(), static_cast<std::uint16_t>(offset));
    append_keyword(chunk.bytes);
    return chunk;
}

PngChunk make_significant_bits(std::uint32_t bits) {
    PngChunk chunk = make_chunk(kSignificantBitsChunk);
    append_be32(chunk.bytes, bits);
    append_keyword(chunk.bytes);
    return chunk;
}

PngChunk make_payload(std::string_view name, std::span<const std::uint8_t> payload) {
    if (payload.size() > kLargestPayload) throw kUnableToWriteData;
    const int level = name == kTimingChunk ? kTimingLevel : kObjectsLevel;
    const std::vector<std::uint8_t> stream = deflate_bytes(payload, level);
    PngChunk chunk = make_chunk(name);
    chunk.bytes.reserve(4 + kKeyword.size() + stream.size());
    append_be32(chunk.bytes, static_cast<std::uint32_t>(payload.size()));
    append_keyword(chunk.bytes);
    chunk.bytes.insert(chunk.bytes.end(), stream.begin(), stream.end());
    return chunk;
}

std::optional<Calibration> parse_pixel_size(std::span<const std::uint8_t> chunk) {
    if (!is_ours(chunk, 9)) return std::nullopt;
    const Calibration calibration = {chunk[8], load_float(&chunk[0]), load_float(&chunk[4])};
    if (!is_step(calibration.x_step) || !is_step(calibration.y_step)) return std::nullopt;
    return calibration;
}

std::optional<std::int16_t> parse_sample_offset(std::span<const std::uint8_t> chunk) {
    if (!is_ours(chunk, 2)) return std::nullopt;
    return static_cast<std::int16_t>(load_be16(chunk.data()));
}

std::optional<std::uint32_t> parse_significant_bits(std::span<const std::uint8_t> chunk) {
    if (!is_ours(chunk, 4)) return std::nullopt;
    return load_be32(chunk.data());
}

std::optional<std::vector<std::uint8_t>> parse_payload(std::span<const std::uint8_t> chunk) {
    if (!has_keyword(chunk, 4)) return std::nullopt;
    const std::uint32_t stated = load_be32(chunk.data());
    const auto stream = chunk.subspan(4 + kKeyword.size());
    if (stated > kLargestPayload || stated > stream.size() * kMostInflation) return std::nullopt;
    std::vector<std::uint8_t> payload(stated);
    if (!inflate_bytes(stream, payload)) return std::nullopt;
    return payload;
}

PixelsPerUnit pixels_per_unit(const Calibration& calibration) {
    return {per_unit(calibration.x_step), per_unit(calibration.y_step), calibration.unit == kMetre};
}

std::optional<PixelsPerUnit> parse_pixels_per_unit(std::span<const std::uint8_t> chunk) {
    if (chunk.size() != 9) return std::nullopt;
    return PixelsPerUnit{load_be32(&chunk[0]), load_be32(&chunk[4]), chunk[8] == kPngMetre};
}

std::optional<Calibration> calibration_of(const PixelsPerUnit& pixels) {
    if (!pixels.is_metre || pixels.x == 0 || pixels.y == 0) return std::nullopt;
    return Calibration{kMetre, step_of(pixels.x), step_of(pixels.y)};
}

}  // namespace zq
