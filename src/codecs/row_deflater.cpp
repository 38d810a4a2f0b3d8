// Matches by chains of positions with the same hash, and blocks that end where the statistics turn.
#include "codecs/row_deflater.h"

#include <zlib.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>

namespace zq {

namespace {

constexpr std::size_t kNewBytes = std::size_t{256} << 10;
// The search stops where a whole match could not be seen, until the end is known.
constexpr std::size_t kAhead = kLongestMatch + 8;
constexpr std::size_t kWindow = kFarthestMatch + kNewBytes;
constexpr int kHashBits = 15;
constexpr std::size_t kHashed = 6;       // bytes; the shortest match at any distance
constexpr std::size_t kShortestRun = 4;  // the shortest of one byte repeated
constexpr std::size_t kChunk = 8192;     // tokens
constexpr std::size_t kMostTokens = 16 * kChunk;
constexpr double kHeaderBits = 700;   // of a block, roughly
constexpr std::size_t kWeighed = 32;  // literals of a match that are summed up one by one

std::uint64_t load(const std::uint8_t* bytes) {
    std::uint64_t word;
    std::memcpy(&word, bytes, sizeof word);
    return word;
}

std::size_t common_length(const std::uint8_t* a, const std::uint8_t* b, std::size_t most) {
    std::size_t length = 0;
    for (; length + sizeof(std::uint64_t) <= most; length += sizeof(std::uint64_t)) {
        const std::uint64_t differ = load(a + length) ^ load(b + length);
        if (differ == 0) continue;
        const int same = std::endian::native == std::endian::little ? std::countr_zero(differ)
                                                                    : std::countl_zero(differ);
        return length + static_cast<std::size_t>(same / 8);
    }
    while (length < most && a[length] == b[length]) ++length;
    return length;
}

std::uint64_t hashed_bytes(const std::uint8_t* bytes) {
    constexpr int kOther = 8 * (8 - static_cast<int>(kHashed));
    return std::endian::native == std::endian::little ? load(bytes) << kOther
                                                      : load(bytes) >> kOther;
}

}  // namespace

RowDeflater::Effort RowDeflater::effort_of(int level) {
    static constexpr std::array<Effort, 10> kEfforts = {{{0, 0, 0},
                                                         {1, 0, 16},
                                                         {1, 0, 32},
                                                         {2, 0, 32},
                                                         {4, 16, 64},
                                                         {8, 16, 64},
                                                         {16, 64, 128},
                                                         {32, 64, 128},
                                                         {128, 258, 258},
                                                         {512, 258, 258}}};
    return kEfforts[static_cast<std::size_t>(std::clamp(level, 0, 9))];
}

RowDeflater::RowDeflater(int level)
    : effort_(effort_of(level)), is_stored_(level == 0), blocks_(out_), window_(kWindow) {
    out_ = {0x78, static_cast<std::uint8_t>(level < 2 ? 0x01 : level < 6 ? 0x5E : 0x9C)};
    if (level > 6) out_[1] = 0xDA;
    costs_.literals.fill(7);
    costs_.lengths.fill(9);
    for (std::size_t i = 0; i < costs_.distances.size(); ++i) {
        costs_.distances[i] = static_cast<std::uint8_t>(3 + i / 2);
    }
    if (is_stored_) return;
    heads_.resize(std::size_t{1} << kHashBits);
    previous_.resize(kFarthestMatch);
    tokens_.reserve(kMostTokens);
}

void RowDeflater::put(std::span<const std::uint8_t> bytes) {
    while (!bytes.empty()) {
        if (filled_ == kWindow) deflate(false);
        const std::size_t part = std::min(bytes.size(), kWindow - filled_);
        std::memcpy(&window_[filled_], bytes.data(), part);
        sum_ = static_cast<std::uint32_t>(adler32(sum_, bytes.data(), static_cast<uInt>(part)));
        filled_ += part;
        bytes = bytes.subspan(part);
    }
}

void RowDeflater::finish() {
    deflate(true);
    blocks_.align();
    for (int shift = 24; shift >= 0; shift -= 8) {
        out_.push_back(static_cast<std::uint8_t>(sum_ >> shift));
    }
}

void RowDeflater::deflate(bool is_last) {
    if (is_stored_) {
        blocks_.put_stored({window_.data(), filled_}, is_last);
        filled_ = 0;
        return;
    }
    if (is_last) {
        tokenize(filled_);
        DeflateCounts counts = block_counts_;
        counts.add(chunk_counts_);
        put_block(tokens_.size(), block_bytes_ + chunk_bytes_, counts, true);
    } else {
        tokenize(filled_ - kAhead);
        slide();
    }
}

void RowDeflater::slide() {
    const std::size_t gone = at_ - kFarthestMatch;
    std::memmove(window_.data(), &window_[gone], filled_ - gone);
    filled_ -= gone;
    at_ -= gone;
    remembered_ -= gone;
    base_ += static_cast<std::uint32_t>(gone);
}

void RowDeflater::tokenize(std::size_t end) {
    while (at_ < end) {
        Match match = find(at_);
        if (match.gain <= 0) {
            pass_literals(end);
            continue;
        }
        missed_ = 0;
        while (match.length < effort_.lazy && at_ + 1 < end) {
            const Match next = find(at_ + 1);
            if (next.gain <= match.gain) break;
            add(DeflateToken::literal(window_[at_]), 1);
            match = next;
        }
        const std::size_t start = at_;
        add(DeflateToken::match(match.length, match.distance), match.length);
        const std::size_t last = std::min(at_, filled_ - std::min(filled_, sizeof(std::uint64_t)));
        remembered_ = std::max(remembered_, start);
        while (remembered_ < last) remember(remembered_);
    }
}

// The longer nothing was found, the fewer positions are looked at.
void RowDeflater::pass_literals(std::size_t end) {
    constexpr std::size_t kPatience = 64, kMostPassed = 4;
    const std::size_t passed = std::min({1 + missed_++ / kPatience, kMostPassed, end - at_});
    for (std::size_t i = 0; i < passed; ++i) add(DeflateToken::literal(window_[at_]), 1);
}

// Puts a position into the tables; how far back the last one with the same hash is, in numbers that
// may be anything when there is none.
std::size_t RowDeflater::remember(std::size_t at) {
    constexpr std::uint64_t kScatter = 0x9E3779B97F4A7C15;
    const std::uint64_t hash = hashed_bytes(&window_[at]) * kScatter >> (64 - kHashBits);
    const std::uint32_t position = base_ + static_cast<std::uint32_t>(at);
    std::uint32_t& head = heads_[static_cast<std::size_t>(hash)];
    const std::uint32_t back = position - head;
    previous_[position % kFarthestMatch] = head;
    head = position;
    remembered_ = at + 1;
    return back;
}

void RowDeflater::weigh(std::size_t at, std::size_t length, std::size_t distance,
                        Match& best) const {
    std::uint32_t literals = 0;
    const std::size_t weighed = std::min(length, kWeighed);
    for (std::size_t i = 0; i < weighed; ++i) literals += costs_.literals[window_[at + i]];
    literals += static_cast<std::uint32_t>(length - weighed);
    const auto gain = static_cast<std::int32_t>(literals - costs_.match(length, distance));
    if (gain > best.gain) best = {length, distance, gain};
}

RowDeflater::Match RowDeflater::find(std::size_t at) {
    Match best;
    if (filled_ - at < sizeof(std::uint64_t)) return best;
    const std::uint8_t* here = &window_[at];
    const std::size_t most = std::min(kLongestMatch, filled_ - at);
    std::size_t longest = kHashed - 1;
    if (at > 0 && std::memcmp(here, here - 1, kShortestRun) == 0) {
        const std::size_t length = common_length(here, here - 1, most);
        weigh(at, length, 1, best);
        longest = std::max(longest, length);
    }
    const std::uint32_t position = base_ + static_cast<std::uint32_t>(at);
    std::size_t distance = at < remembered_ ? 0 : remember(at);
    const std::uint64_t wanted = hashed_bytes(here);
    const std::size_t farthest = std::min(at, kFarthestMatch);
    std::size_t last = 0;
    for (std::size_t i = 0; i < effort_.depth && longest < effort_.nice; ++i) {
        if (distance <= last || distance > farthest) break;
        last = distance;
        const std::uint8_t* there = here - distance;
        if (longest < most && there[longest] == here[longest] && hashed_bytes(there) == wanted) {
            const std::size_t length = common_length(here, there, most);
            if (length > longest) {
                weigh(at, length, distance, best);
                longest = length;
            }
        }
        const auto next = position - static_cast<std::uint32_t>(distance);
        distance = position - previous_[next % kFarthestMatch];
    }
    return best;
}

void RowDeflater::add(DeflateToken token, std::size_t bytes) {
    tokens_.push_back(token);
    chunk_counts_.add(token);
    chunk_bytes_ += bytes;
    at_ += bytes;
    if (tokens_.size() - block_tokens_ == kChunk) end_chunk();
}

// The chunk joins the block where one code for both costs less than two.
void RowDeflater::end_chunk() {
    DeflateCounts joined = block_counts_;
    joined.add(chunk_counts_);
    const double joined_bits = joined.ideal_bits(), chunk_bits = chunk_counts_.ideal_bits();
    if (block_tokens_ > 0 &&
        (joined_bits > block_bits_ + chunk_bits + kHeaderBits || tokens_.size() >= kMostTokens)) {
        put_block(block_tokens_, block_bytes_, block_counts_, false);
        block_counts_ = chunk_counts_;
        block_bits_ = chunk_bits;
        block_bytes_ = chunk_bytes_;
    } else {
        block_counts_ = joined;
        block_bits_ = joined_bits;
        block_bytes_ += chunk_bytes_;
    }
    block_tokens_ = tokens_.size();
    chunk_counts_ = {};
    chunk_bytes_ = 0;
}

void RowDeflater::put_block(std::size_t tokens, std::size_t bytes, const DeflateCounts& counts,
                            bool is_last) {
    const std::size_t behind = block_bytes_ + chunk_bytes_;
    std::optional<std::span<const std::uint8_t>> plain;
    if (behind <= at_) plain = std::span(window_).subspan(at_ - behind, bytes);
    blocks_.put(std::span(tokens_).first(tokens), counts, plain, is_last, costs_);
    tokens_.erase(tokens_.begin(), tokens_.begin() + static_cast<std::ptrdiff_t>(tokens));
}

}  // namespace zq
