// Deflate in the zlib wrapping, whole blocks at once.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace zq {

// Deflate cannot grow data by more than this factor: what a block can inflate to is known from its
// size.
inline constexpr std::uint64_t kMostInflation = 1032;

inline constexpr int kDefaultDeflateLevel = -1;

// `level` is zlib's, 0 to 9. Throws kNotEnoughMemory.
std::vector<std::uint8_t> deflate_bytes(std::span<const std::uint8_t> bytes,
                                        int level = kDefaultDeflateLevel);

// Whether `packed` is one sound stream that fills `bytes` exactly; what `bytes` holds otherwise is
// undefined. Throws kNotEnoughMemory.
bool inflate_bytes(std::span<const std::uint8_t> packed, std::span<std::uint8_t> bytes);

// What one sound stream inflates to when nobody said how much that is; none when it is damaged or
// gives more than `most` bytes. Throws kNotEnoughMemory and std::bad_alloc.
std::optional<std::vector<std::uint8_t>> inflate_at_most(std::span<const std::uint8_t> packed,
                                                         std::size_t most);

}  // namespace zq
