// Code lengths from the tree that is merged of the two rarest again and again; those that are too
// long are cut, and what that costs is taken from the others.
#include "codecs/huffman_code.h"

#include <algorithm>
#include <array>

namespace zq {

namespace {

constexpr std::size_t kMostSymbols = 320;
constexpr std::size_t kLongest = 15;

struct Leaf {
    std::uint32_t count;
    std::uint16_t symbol;
};

using Leaves = std::array<Leaf, kMostSymbols>;
using Depths = std::array<std::uint32_t, kLongest + 1>;

std::size_t gather(std::span<const std::uint32_t> counts, Leaves& leaves) {
    std::size_t used = 0;
    for (std::size_t i = 0; i < counts.size(); ++i) {
        if (counts[i] != 0) leaves[used++] = {counts[i], static_cast<std::uint16_t>(i)};
    }
    for (std::uint16_t i = 0; used < 2; ++i) {
        if (counts[i] == 0) leaves[used++] = {1, i};
    }
    std::sort(leaves.begin(), leaves.begin() + static_cast<std::ptrdiff_t>(used),
              [](const Leaf& a, const Leaf& b) {
                  return a.count != b.count ? a.count < b.count : a.symbol < b.symbol;
              });
    return used;
}

// How many leaves lie at each depth; those below `longest` count as lying there.
Depths count_depths(const Leaves& leaves, std::size_t used, std::size_t longest) {
    // Leaves first, then the inner nodes in the order of their making, which is that of their
    // counts.
    std::array<std::uint32_t, 2 * kMostSymbols> counts;
    std::array<std::uint16_t, 2 * kMostSymbols> parents;
    for (std::size_t i = 0; i < used; ++i) counts[i] = leaves[i].count;
    const std::size_t nodes = 2 * used - 1;
    std::size_t leaf = 0, inner = used;
    for (std::size_t made = used; made < nodes; ++made) {
        counts[made] = 0;
        for (int child = 0; child < 2; ++child) {
            const bool take_leaf = leaf < used && (inner == made || counts[leaf] <= counts[inner]);
            const std::size_t taken = take_leaf ? leaf++ : inner++;
            counts[made] += counts[taken];
            parents[taken] = static_cast<std::uint16_t>(made);
        }
    }
    std::array<std::uint16_t, 2 * kMostSymbols> depths;
    depths[nodes - 1] = 0;
    Depths result{};
    for (std::size_t i = nodes - 1; i-- > 0;) {
        depths[i] = static_cast<std::uint16_t>(depths[parents[i]] + 1);
        if (i < used) ++result[std::min<std::size_t>(depths[i], longest)];
    }
    return result;
}

// Makes the codes fit again: one of the longest joins, one step further down, the deepest leaf that
// still can go down.
void repair(Depths& depths, std::size_t longest) {
    std::uint64_t taken = 0;
    for (std::size_t i = 1; i <= longest; ++i) taken += std::uint64_t{depths[i]} << (longest - i);
    for (; taken > std::uint64_t{1} << longest; --taken) {
        std::size_t depth = longest - 1;
        while (depths[depth] == 0) --depth;
        --depths[depth];
        depths[depth + 1] += 2;
        --depths[longest];
    }
}

std::uint16_t reversed(std::uint32_t code, int length) {
    std::uint32_t result = 0;
    for (int i = 0; i < length; ++i) result |= (code >> i & 1) << (length - 1 - i);
    return static_cast<std::uint16_t>(result);
}

}  // namespace

void choose_code_lengths(std::span<const std::uint32_t> counts, int longest,
                         std::span<std::uint8_t> lengths) {
    Leaves leaves;
    const std::size_t used = gather(counts, leaves);
    const auto limit = static_cast<std::size_t>(longest);
    Depths depths = count_depths(leaves, used, limit);
    repair(depths, limit);
    std::fill(lengths.begin(), lengths.end(), std::uint8_t{0});
    std::size_t leaf = 0;
    for (std::size_t depth = limit; depth > 0; --depth) {
        for (std::uint32_t i = 0; i < depths[depth]; ++i) {
            lengths[leaves[leaf++].symbol] = static_cast<std::uint8_t>(depth);
        }
    }
}

void make_codes(std::span<const std::uint8_t> lengths, std::span<std::uint16_t> codes) {
    std::array<std::uint32_t, kLongest + 2> next{};
    for (const std::uint8_t length : lengths) {
        if (length != 0) ++next[length + 1U];
    }
    // From the number of codes of each length to the first code of the next.
    for (std::size_t i = 1; i < next.size(); ++i) next[i] = (next[i - 1] + next[i]) << 1;
    for (std::size_t i = 0; i < lengths.size(); ++i) {
        if (lengths[i] == 0) continue;
        codes[i] = reversed(next[lengths[i]]++, lengths[i]);
    }
}

}  // namespace zq
