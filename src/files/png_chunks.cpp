// Bytes of the private chunks.
#include "files/png_chunks.h"

#include <algorithm>
#include <string_view>

#include "base/byte_order.h"

namespace zq {

namespace {

// Ends the fixed part of every private chunk.
constexpr std::string_view kKeyword = "ZQKEMO";

}  // namespace

SampleOffsetBytes make_sample_offset(std::int16_t offset) {
    SampleOffsetBytes bytes{};
    store_be16(bytes.data(), static_cast<std::uint16_t>(offset));
    std::copy(kKeyword.begin(), kKeyword.end(), bytes.begin() + 2);
    return bytes;
}

std::optional<std::int16_t> parse_sample_offset(std::span<const std::uint8_t> chunk) {
    if (chunk.size() != sizeof(SampleOffsetBytes)) return std::nullopt;
    if (!std::equal(kKeyword.begin(), kKeyword.end(), chunk.begin() + 2)) return std::nullopt;
    return static_cast<std::int16_t>(load_be16(chunk.data()));
}

}  // namespace zq
