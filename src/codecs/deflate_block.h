// Blocks of a deflate stream (RFC 1951): from literals and matches to bits, each block in whichever
// of its three forms is the shortest.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace zq {

inline constexpr std::size_t kShortestMatch = 3;
inline constexpr std::size_t kLongestMatch = 258;
inline constexpr std::size_t kFarthestMatch = 32768;

// A literal's value, or a match.
class DeflateToken {
  public:
    static DeflateToken literal(std::uint8_t value) { return DeflateToken(value); }
    static DeflateToken match(std::size_t length, std::size_t distance) {
        return DeflateToken(static_cast<std::uint32_t>(distance << kShift | length));
    }
    bool is_match() const { return bits_ >> kShift != 0; }
    std::uint32_t value() const { return bits_ & ((1U << kShift) - 1); }  // or length
    std::uint32_t distance() const { return bits_ >> kShift; }

  private:
    static constexpr int kShift = 9;
    explicit DeflateToken(std::uint32_t bits) : bits_(bits) {}
    std::uint32_t bits_;
};

// How often each symbol of a block's two codes occurs.
struct DeflateCounts {
    static constexpr std::size_t kLiterals = 286;  // and lengths
    static constexpr std::size_t kDistances = 30;
    static constexpr std::size_t kEnd = 256;

    std::array<std::uint32_t, kLiterals> literals{};
    std::array<std::uint32_t, kDistances> distances{};

    void add(DeflateToken token);
    void add(const DeflateCounts& other);
    // Bits that ideal codes need, without those that tell lengths and distances apart.
    double ideal_bits() const;
};

// What things cost in the codes of a block, in bits.
struct DeflateCosts {
    std::array<std::uint8_t, 256> literals{};
    std::array<std::uint8_t, kLongestMatch + 1> lengths{};

    std::uint32_t match(std::size_t length, std::size_t distance) const {
        return lengths[length] + distance_cost(distance);
    }
    std::uint32_t distance_cost(std::size_t distance) const;
    std::array<std::uint8_t, DeflateCounts::kDistances> distances{};
};

class DeflateBlocks {
  public:
    // Appends to `out`, which must outlive this.
    explicit DeflateBlocks(std::vector<std::uint8_t>& out) : out_(out) {}

    // `plain` is what the tokens stand for, where that is at hand. Sets the costs of a further
    // block like this one. Throws std::bad_alloc.
    void put(std::span<const DeflateToken> tokens, const DeflateCounts& counts,
             std::optional<std::span<const std::uint8_t>> plain, bool is_last, DeflateCosts& costs);
    void put_stored(std::span<const std::uint8_t> plain, bool is_last);
    // Fills the last byte.
    void align();

  private:
    struct Codes;
    void put_bits(std::uint64_t bits, int count);
    void put_tokens(std::span<const DeflateToken> tokens, const Codes& codes);

    std::vector<std::uint8_t>& out_;
    std::uint64_t bits_ = 0;
    int held_ = 0;  // bits of those that are not in `out_`, below 8
};

}  // namespace zq
