// Deflate blocks. A dynamic block tells its two codes first, itself in a third code.
#include "codecs/deflate_block.h"

#include <algorithm>
#include <bit>
#include <cmath>

#include "base/byte_order.h"
#include "codecs/huffman_code.h"

namespace zq {

namespace {

constexpr int kLongestCode = 15;
constexpr int kLongestLengthCode = 7;  // of the code of code lengths
constexpr std::size_t kLengthSymbols = 19;
constexpr std::size_t kMostStored = 65535;
constexpr std::size_t kMostTokenBytes = 6;
constexpr int kStored = 0, kFixed = 1, kDynamic = 2;

struct Class {
    std::uint8_t symbol;
    std::uint8_t extra_bits;
    std::uint16_t first;
};

// Symbols of lengths, counted from 257.
constexpr auto kLengths = [] {
    std::array<Class, kLongestMatch + 1> table{};
    std::size_t length = kShortestMatch;
    for (std::uint8_t symbol = 0; symbol < 28; ++symbol) {
        const auto extra = static_cast<std::uint8_t>(symbol < 8 ? 0 : symbol / 4 - 1);
        const std::size_t first = length;
        for (; length < first + (std::size_t{1} << extra) && length < kLongestMatch; ++length) {
            table[length] = {symbol, extra, static_cast<std::uint16_t>(first)};
        }
    }
    table[kLongestMatch] = {28, 0, kLongestMatch};
    return table;
}();

std::size_t distance_symbol(std::size_t distance) {
    const std::size_t behind = distance - 1;
    if (behind < 4) return behind;
    const auto top = static_cast<std::size_t>(std::bit_width(behind)) - 1;
    return 2 * top + (behind >> (top - 1) & 1);
}

int distance_extra_bits(std::size_t symbol) {
    return symbol < 4 ? 0 : static_cast<int>(symbol / 2 - 1);
}

std::size_t first_distance(std::size_t symbol) {
    return symbol < 4 ? symbol + 1 : ((2 + symbol % 2) << (symbol / 2 - 1)) + 1;
}

// Code lengths of a block's two codes as they are told: runs folded.
struct Header {
    std::size_t literals = 0, distances = 0;  // symbols that are told
    std::array<std::uint8_t, DeflateCounts::kLiterals + DeflateCounts::kDistances> symbols{};
    std::array<std::uint8_t, DeflateCounts::kLiterals + DeflateCounts::kDistances> repeats{};
    std::size_t count = 0;
    std::array<std::uint8_t, kLengthSymbols> lengths{};
    std::size_t told = 0;  // of the lengths above, in their own order
    std::uint32_t bits = 0;
};

constexpr std::array<std::uint8_t, kLengthSymbols> kOrder = {16, 17, 18, 0, 8,  7, 9,  6, 10, 5,
                                                             11, 4,  12, 3, 13, 2, 14, 1, 15};
constexpr std::array<int, kLengthSymbols> kRepeatBits = {0, 0, 0, 0, 0, 0, 0, 0, 0, 0,
                                                         0, 0, 0, 0, 0, 0, 2, 3, 7};

void fold(std::span<const std::uint8_t> lengths, Header& header) {
    const auto tell = [&header](std::size_t symbol, std::size_t repeat) {
        header.symbols[header.count] = static_cast<std::uint8_t>(symbol);
        header.repeats[header.count++] = static_cast<std::uint8_t>(repeat);
    };
    for (std::size_t i = 0; i < lengths.size();) {
        std::size_t run = 1;
        while (i + run < lengths.size() && lengths[i + run] == lengths[i]) ++run;
        i += run;
        const std::size_t length = lengths[i - 1];
        if (length != 0) {
            tell(length, 0);
            --run;
        }
        for (std::size_t most = length == 0 ? 138 : 6; run >= 3;) {
            const std::size_t part = std::min(run, most);
            if (length != 0) {
                tell(16, part - 3);
            } else {
                tell(part < 11 ? 17 : 18, part < 11 ? part - 3 : part - 11);
            }
            run -= part;
        }
        for (; run > 0; --run) tell(length, 0);
    }
}

Header make_header(std::span<const std::uint8_t> literals,
                   std::span<const std::uint8_t> distances) {
    Header header;
    header.literals = literals.size();
    while (header.literals > 257 && literals[header.literals - 1] == 0) --header.literals;
    header.distances = distances.size();
    while (header.distances > 1 && distances[header.distances - 1] == 0) --header.distances;
    std::array<std::uint8_t, DeflateCounts::kLiterals + DeflateCounts::kDistances> all{};
    std::copy_n(literals.begin(), header.literals, all.begin());
    std::copy_n(distances.begin(), header.distances, &all[header.literals]);
    fold({all.data(), header.literals + header.distances}, header);

    std::array<std::uint32_t, kLengthSymbols> counts{};
    for (std::size_t i = 0; i < header.count; ++i) ++counts[header.symbols[i]];
    choose_code_lengths(counts, kLongestLengthCode, header.lengths);
    header.told = kLengthSymbols;
    while (header.told > 4 && header.lengths[kOrder[header.told - 1]] == 0) --header.told;
    header.bits = static_cast<std::uint32_t>(5 + 5 + 4 + 3 * header.told);
    for (std::size_t i = 0; i < kLengthSymbols; ++i) {
        header.bits += counts[i] * static_cast<std::uint32_t>(header.lengths[i] + kRepeatBits[i]);
    }
    return header;
}

}  // namespace

// Both codes of a block.
struct DeflateBlocks::Codes {
    std::array<std::uint8_t, DeflateCounts::kLiterals + 2> literal_lengths{};
    std::array<std::uint16_t, DeflateCounts::kLiterals + 2> literals{};
    std::array<std::uint8_t, DeflateCounts::kDistances + 2> distance_lengths{};
    std::array<std::uint16_t, DeflateCounts::kDistances + 2> distances{};

    void make() {
        make_codes(literal_lengths, literals);
        make_codes(distance_lengths, distances);
    }

    static Codes fixed() {
        Codes codes;
        for (std::size_t i = 0; i < codes.literal_lengths.size(); ++i) {
            codes.literal_lengths[i] = i < 144 ? 8 : i < 256 ? 9 : i < 280 ? 7 : 8;
        }
        codes.distance_lengths.fill(5);
        codes.make();
        return codes;
    }

    static Codes best(const DeflateCounts& counts) {
        Codes codes;
        choose_code_lengths(counts.literals, kLongestCode,
                            std::span(codes.literal_lengths).first(DeflateCounts::kLiterals));
        choose_code_lengths(counts.distances, kLongestCode,
                            std::span(codes.distance_lengths).first(DeflateCounts::kDistances));
        codes.make();
        return codes;
    }

    std::uint64_t bits_of(const DeflateCounts& counts) const {
        std::uint64_t bits = 0;
        for (std::size_t i = 0; i < counts.literals.size(); ++i) {
            bits += std::uint64_t{counts.literals[i]} * literal_lengths[i];
        }
        for (std::size_t length = kShortestMatch; length <= kLongestMatch; ++length) {
            const Class& c = kLengths[length];
            if (length == c.first) {
                bits += std::uint64_t{counts.literals[257U + c.symbol]} * c.extra_bits;
            }
        }
        for (std::size_t i = 0; i < counts.distances.size(); ++i) {
            bits += std::uint64_t{counts.distances[i]} *
                    static_cast<std::uint64_t>(distance_lengths[i] + distance_extra_bits(i));
        }
        return bits;
    }

    // What does not occur is taken to be rare, not impossible.
    void tell(DeflateCosts& costs) const {
        constexpr std::uint8_t kRareLiteral = 12, kRareDistance = 8;
        const auto cost = [](std::uint8_t length, std::uint8_t rare) {
            return length != 0 ? length : rare;
        };
        for (std::size_t i = 0; i < costs.literals.size(); ++i) {
            costs.literals[i] = cost(literal_lengths[i], kRareLiteral);
        }
        for (std::size_t i = kShortestMatch; i <= kLongestMatch; ++i) {
            const std::uint8_t symbol =
                cost(literal_lengths[257U + kLengths[i].symbol], kRareLiteral);
            costs.lengths[i] = static_cast<std::uint8_t>(symbol + kLengths[i].extra_bits);
        }
        for (std::size_t i = 0; i < costs.distances.size(); ++i) {
            costs.distances[i] = static_cast<std::uint8_t>(
                cost(distance_lengths[i], kRareDistance) + distance_extra_bits(i));
        }
    }
};

void DeflateCounts::add(DeflateToken token) {
    if (!token.is_match()) {
        ++literals[token.value()];
        return;
    }
    ++literals[257U + kLengths[token.value()].symbol];
    ++distances[distance_symbol(token.distance())];
}

void DeflateCounts::add(const DeflateCounts& other) {
    for (std::size_t i = 0; i < kLiterals; ++i) literals[i] += other.literals[i];
    for (std::size_t i = 0; i < kDistances; ++i) distances[i] += other.distances[i];
}

double DeflateCounts::ideal_bits() const {
    const auto bits_of = [](std::span<const std::uint32_t> counts) {
        float sum = 0, all = 0;
        for (const std::uint32_t count : counts) {
            if (count == 0) continue;
            const auto number = static_cast<float>(count);
            all += number;
            sum -= number * std::log2(number);
        }
        return all > 0 ? static_cast<double>(sum + all * std::log2(all)) : 0.0;
    };
    return bits_of(literals) + bits_of(distances);
}

std::uint32_t DeflateCosts::distance_cost(std::size_t distance) const {
    return distances[distance_symbol(distance)];
}

void DeflateBlocks::put_bits(std::uint64_t bits, int count) {
    bits_ |= bits << held_;
    for (held_ += count; held_ >= 8; held_ -= 8, bits_ >>= 8) {
        out_.push_back(static_cast<std::uint8_t>(bits_));
    }
}

void DeflateBlocks::align() {
    if (held_ > 0) put_bits(0, 8 - held_);
}

void DeflateBlocks::put_stored(std::span<const std::uint8_t> plain, bool is_last) {
    do {
        const std::span<const std::uint8_t> part = plain.first(std::min(plain.size(), kMostStored));
        plain = plain.subspan(part.size());
        put_bits(is_last && plain.empty() ? 1 : 0, 1);
        put_bits(kStored, 2);
        align();
        put_bits(part.size(), 16);
        put_bits(part.size() ^ 0xFFFF, 16);
        out_.insert(out_.end(), part.begin(), part.end());
    } while (!plain.empty());
}

// Eight bytes are stored at once; those that are no bits yet are stored again.
void DeflateBlocks::put_tokens(std::span<const DeflateToken> tokens, const Codes& codes) {
    const std::size_t start = out_.size();
    out_.resize(start + tokens.size() * kMostTokenBytes + 2 * sizeof(std::uint64_t));
    std::uint8_t* at = out_.data() + start;
    std::uint64_t bits = bits_;
    int held = held_;
    const auto store = [&] {
        store_le64(at, bits);
        at += held / 8;
        bits >>= held / 8 * 8;
        held %= 8;
    };
    const auto add = [&](std::uint64_t more, int count) {
        bits |= more << held;
        held += count;
    };
    const auto add_symbol = [&](std::size_t symbol) {
        add(codes.literals[symbol], codes.literal_lengths[symbol]);
    };
    for (std::size_t i = 0; i < tokens.size(); ++i) {
        const std::uint32_t value = tokens[i].value();
        if (!tokens[i].is_match()) {
            add_symbol(value);
            // Three literals fit into a word.
            for (int more = 0; more < 2 && i + 1 < tokens.size() && !tokens[i + 1].is_match();
                 ++more) {
                add_symbol(tokens[++i].value());
            }
            store();
            continue;
        }
        const Class& length = kLengths[value];
        add_symbol(257U + length.symbol);
        add(value - length.first, length.extra_bits);
        const std::size_t symbol = distance_symbol(tokens[i].distance());
        add(codes.distances[symbol], codes.distance_lengths[symbol]);
        add(tokens[i].distance() - first_distance(symbol), distance_extra_bits(symbol));
        store();
    }
    add_symbol(DeflateCounts::kEnd);
    store();
    out_.resize(static_cast<std::size_t>(at - out_.data()));
    bits_ = bits & ((std::uint64_t{1} << held) - 1);
    held_ = held;
}

void DeflateBlocks::put(std::span<const DeflateToken> tokens, const DeflateCounts& counts,
                        std::optional<std::span<const std::uint8_t>> plain, bool is_last,
                        DeflateCosts& costs) {
    static const Codes kFixedCodes = Codes::fixed();
    DeflateCounts all = counts;
    ++all.literals[DeflateCounts::kEnd];
    const Codes best = Codes::best(all);
    const Header header =
        make_header(std::span(best.literal_lengths).first(DeflateCounts::kLiterals),
                    std::span(best.distance_lengths).first(DeflateCounts::kDistances));
    const std::uint64_t dynamic_bits = header.bits + best.bits_of(all);
    const std::uint64_t fixed_bits = kFixedCodes.bits_of(all);
    best.tell(costs);
    const std::uint64_t least = std::min(dynamic_bits, fixed_bits);
    if (plain && plain->size() + 4 + 5 * (plain->size() / kMostStored) < least / 8) {
        return put_stored(*plain, is_last);
    }
    put_bits(is_last ? 1 : 0, 1);
    if (fixed_bits <= dynamic_bits) {
        put_bits(kFixed, 2);
        return put_tokens(tokens, kFixedCodes);
    }
    put_bits(kDynamic, 2);
    put_bits(header.literals - 257, 5);
    put_bits(header.distances - 1, 5);
    put_bits(header.told - 4, 4);
    for (std::size_t i = 0; i < header.told; ++i) put_bits(header.lengths[kOrder[i]], 3);
    std::array<std::uint16_t, kLengthSymbols> codes{};
    make_codes(header.lengths, codes);
    for (std::size_t i = 0; i < header.count; ++i) {
        const std::uint8_t symbol = header.symbols[i];
        put_bits(codes[symbol], header.lengths[symbol]);
        put_bits(header.repeats[i], kRepeatBits[symbol]);
    }
    put_tokens(tokens, best);
}

}  // namespace zq
