// Streams of the row deflater through zlib, and zlib's through the piecewise inflater.
#include <gtest/gtest.h>
#include <zlib.h>

#include <algorithm>
#include <array>
#include <functional>
#include <random>
#include <vector>

#include "codecs/deflate.h"
#include "codecs/huffman_code.h"
#include "codecs/inflate_stream.h"
#include "codecs/row_deflater.h"

namespace zq {
namespace {

using Bytes = std::vector<std::uint8_t>;

Bytes deflated(const Bytes& bytes, int level, std::size_t part) {
    RowDeflater deflater(level);
    for (std::size_t at = 0; at < bytes.size(); at += part) {
        deflater.put(std::span(bytes).subspan(at, std::min(part, bytes.size() - at)));
    }
    deflater.finish();
    return deflater.out();
}

Bytes bytes_by(std::size_t count, const std::function<std::uint32_t(std::size_t)>& at) {
    Bytes bytes(count);
    for (std::size_t i = 0; i < count; ++i) bytes[i] = static_cast<std::uint8_t>(at(i));
    return bytes;
}

TEST(RowDeflaterTest, ZlibGivesEveryStreamBack) {
    std::mt19937 random(6);
    const auto noise = [&](std::uint32_t mask) {
        return [&random, mask](std::size_t) { return static_cast<std::uint32_t>(random()) & mask; };
    };
    struct Case {
        const char* name;
        Bytes bytes;
    };
    constexpr std::size_t kLong = 700'001;  // the window moves
    const Case cases[] = {
        {"nothing", {}},
        {"one byte", {7}},
        {"seven bytes", bytes_by(7, [](std::size_t) { return 1U; })},
        {"a run", bytes_by(3'000'000, [](std::size_t) { return 0U; })},
        {"noise", bytes_by(kLong, noise(255))},
        {"few values", bytes_by(kLong, noise(3))},
        {"period 32768",
         bytes_by(kLong, [](std::size_t i) { return (i & 32767) * 2654435761U >> 13; })},
        {"period 32769",
         bytes_by(kLong, [](std::size_t i) { return i % 32769 * 2654435761U >> 13; })},
        {"turns", bytes_by(kLong,
                           [&](std::size_t i) {
                               return i / 50'000 % 3 == 0 ? 0
                                                          : static_cast<std::uint32_t>(random()) >>
                                                                (i / 50'000 % 8);
                           })},
        {"skewed", bytes_by(kLong,
                            [&](std::size_t) {
                                return static_cast<std::uint32_t>(
                                    std::countr_zero(random() | 1U << 31));
                            })},
    };
    for (const Case& c : cases) {
        for (int level = 0; level <= 9; ++level) {
            SCOPED_TRACE(testing::Message() << c.name << ", level " << level);
            const Bytes packed = deflated(c.bytes, level, level % 2 == 0 ? 977 : 400'000);
            Bytes back(c.bytes.size());
            ASSERT_TRUE(inflate_bytes(packed, back));
            ASSERT_EQ(back, c.bytes);
            EXPECT_LE(packed.size(), compressBound(static_cast<uLong>(c.bytes.size())));
        }
    }
}

TEST(HuffmanCodeTest, LengthsFitAndFormACompleteCode) {
    std::array<std::uint32_t, 40> counts{};
    counts[0] = counts[1] = 1;
    for (std::size_t i = 2; i < counts.size(); ++i) counts[i] = counts[i - 1] + counts[i - 2];
    for (const int longest : {7, 15}) {
        for (std::size_t used = 0; used <= counts.size(); ++used) {
            std::array<std::uint32_t, 40> some{};
            std::copy_n(counts.begin(), used, some.begin());
            std::array<std::uint8_t, 40> lengths{};
            choose_code_lengths(some, longest, lengths);
            std::uint32_t taken = 0;
            for (std::size_t i = 0; i < lengths.size(); ++i) {
                EXPECT_LE(lengths[i], longest);
                EXPECT_TRUE(some[i] == 0 || lengths[i] != 0);
                if (lengths[i] != 0) taken += 1U << (longest - lengths[i]);
            }
            EXPECT_EQ(taken, 1U << longest) << used << " symbols, at most " << longest;
        }
    }
}

struct Inflated {
    bool is_sound, is_finished;
    Bytes bytes;
};

Inflated inflate_in_parts(const Bytes& packed, std::size_t in_part, std::size_t out_part) {
    InflateStream stream;
    Inflated result{true, false, {}};
    std::span<const std::uint8_t> in;
    for (std::size_t at = 0; result.is_sound && !stream.is_finished();) {
        Bytes part(out_part);
        std::span<std::uint8_t> room(part);
        if (in.empty() && at < packed.size()) {
            in = std::span(packed).subspan(at, std::min(in_part, packed.size() - at));
            at += in.size();
        }
        const bool is_last = at == packed.size() && in.empty();
        result.is_sound = stream.inflate(in, room);
        const std::size_t made = out_part - room.size();
        result.bytes.insert(result.bytes.end(), part.data(), part.data() + made);
        if (is_last && made == 0) break;  // all is taken, and nothing comes
    }
    result.is_finished = stream.is_finished();
    return result;
}

TEST(InflateStreamTest, PiecesOfAnySizeGiveTheWhole) {
    std::mt19937 random(7);
    const Bytes bytes =
        bytes_by(100'000, [&](std::size_t i) { return i % 5000 < 2500 ? i >> 4 : random() & 15; });
    const Bytes packed = deflate_bytes(bytes);
    for (const std::size_t in : {1, 7, 4096}) {
        for (const std::size_t out : {1, 333, 70'000}) {
            const Inflated result = inflate_in_parts(packed, in, out);
            EXPECT_TRUE(result.is_sound && result.is_finished) << in << ' ' << out;
            EXPECT_EQ(result.bytes, bytes);
        }
    }
}

TEST(InflateStreamTest, DamageIsFoundAndATruncatedStreamIsNotFinished) {
    const Bytes bytes = bytes_by(3000, [](std::size_t i) { return i * i >> 3; });
    const Bytes packed = deflate_bytes(bytes);
    for (std::size_t i = 0; i < packed.size(); ++i) {
        const Bytes cut(packed.begin(), packed.begin() + static_cast<std::ptrdiff_t>(i));
        EXPECT_FALSE(inflate_in_parts(cut, 64, 512).is_finished) << i;
        for (const unsigned bit : {1U, 32U}) {
            Bytes damaged = packed;
            damaged[i] = static_cast<std::uint8_t>(damaged[i] ^ bit);
            const Inflated result = inflate_in_parts(damaged, 64, 512);
            // Some bits of the stream's head are only advice.
            EXPECT_TRUE(!result.is_sound || !result.is_finished || result.bytes == bytes) << i;
        }
    }
}

}  // namespace
}  // namespace zq
