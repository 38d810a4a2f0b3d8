// Length-limited Huffman codes as deflate (RFC 1951, 3.2.2) wants them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

namespace zq {

// Sets the lengths, 0 for what does not occur, none above `longest`; at least two symbols get one,
// so that every code is complete. At most 320 symbols. Counts sum up to less than 2^32.
void choose_code_lengths(std::span<const std::uint32_t> counts, int longest,
                         std::span<std::uint8_t> lengths);

// The codes of those lengths, their bits in the order in which they are sent.
void make_codes(std::span<const std::uint8_t> lengths, std::span<std::uint16_t> codes);

}  // namespace zq
