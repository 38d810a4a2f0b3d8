// Deflate for filtered rows of pictures, whose bytes are noise around 0: short matches cost more
// than they save there, so that only long ones are looked for, and each is weighed against its
// literals. Much faster than a search for all matches, and no worse.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

#include "codecs/deflate_block.h"

namespace zq {

class RowDeflater {
  public:
    // `level` has the range of zlib's, 0 (stored) to 9. Throws std::bad_alloc.
    explicit RowDeflater(int level);

    // Appends to the stream. Throw std::bad_alloc.
    void put(std::span<const std::uint8_t> bytes);
    void finish();

    // What is ready of one stream in the zlib wrapping; whoever takes it away clears it.
    std::vector<std::uint8_t>& out() { return out_; }

  private:
    struct Effort {
        std::size_t depth;  // candidates for a match
        std::size_t lazy;   // a match shorter than this is weighed against the next position's
        std::size_t nice;   // one this long is taken
    };
    struct Match {
        std::size_t length = 0;
        std::size_t distance = 0;
        std::int32_t gain = 0;  // bits, against literals
    };
    static Effort effort_of(int level);

    void deflate(bool is_last);
    void tokenize(std::size_t end);
    void pass_literals(std::size_t end);
    Match find(std::size_t at);
    void weigh(std::size_t at, std::size_t length, std::size_t distance, Match& best) const;
    std::size_t remember(std::size_t at);
    void add(DeflateToken token, std::size_t bytes);
    void end_chunk();
    void put_block(std::size_t tokens, std::size_t bytes, const DeflateCounts& counts,
                   bool is_last);
    void slide();

    Effort effort_;
    bool is_stored_;
    std::uint32_t sum_ = 1;  // Adler-32
    std::vector<std::uint8_t> out_;
    DeflateBlocks blocks_;

    std::vector<std::uint8_t> window_;
    std::size_t filled_ = 0;
    std::size_t at_ = 0;          // the next byte to be told
    std::size_t remembered_ = 0;  // the next position that goes into the tables
    std::size_t missed_ = 0;      // positions without a match in a row
    std::uint32_t base_ = 1;      // position in the stream of the window's first byte, modulo 2^32
    std::vector<std::uint32_t> heads_;     // by hash: the last position
    std::vector<std::uint32_t> previous_;  // by position: the one before with the same hash

    // The block so far, and the chunk behind it that may become one of its own.
    std::vector<DeflateToken> tokens_;
    DeflateCounts block_counts_, chunk_counts_;
    double block_bits_ = 0;
    std::size_t block_tokens_ = 0, block_bytes_ = 0, chunk_bytes_ = 0;
    DeflateCosts costs_;
};

}  // namespace zq
