// The private PNG chunks: exact bytes, and nothing of libpng.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <span>

namespace zq {

inline constexpr std::array<std::uint8_t, 5> kSampleOffsetChunk = {'s', 'c', 'A', 'l', 0};

using SampleOffsetBytes = std::array<std::uint8_t, 8>;

SampleOffsetBytes make_sample_offset(std::int16_t offset);

// None when the length or the keyword is wrong: such a chunk is somebody else's.
std::optional<std::int16_t> parse_sample_offset(std::span<const std::uint8_t> chunk);

}  // namespace zq
