// Inflating with ISA-L, about three times as fast as zlib.
#include <isa-l/igzip_lib.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <limits>

#include "codecs/inflate_stream.h"

namespace zq {

// ISA-L steps back over bytes that it took earlier. So it is given a buffer that always has those
// in front of the new ones, and its place in there is its own.
struct InflateStream::State {
    static constexpr std::size_t kBack = 32;  // it steps back by 8 bytes at most
    static constexpr std::size_t kNew = std::size_t{16} << 10;

    inflate_state stream;
    std::array<std::uint8_t, kBack + kNew> input{};
    int stalls = 0;

    void refill(std::span<const std::uint8_t>& in) {
        const std::size_t taken = std::min(in.size(), kNew);
        if (taken == 0) return;
        std::memmove(input.data(), stream.next_in - kBack, kBack);
        std::memcpy(&input[kBack], in.data(), taken);
        stream.next_in = &input[kBack];
        stream.avail_in = static_cast<std::uint32_t>(taken);
        in = in.subspan(taken);
    }
};

InflateStream::InflateStream() : state_(std::make_unique<State>()) {
    isal_inflate_init(&state_->stream);
    state_->stream.crc_flag = ISAL_ZLIB;
    state_->stream.next_in = &state_->input[State::kBack];
}

InflateStream::~InflateStream() = default;

bool InflateStream::inflate(std::span<const std::uint8_t>& in, std::span<std::uint8_t>& out) {
    if (is_finished_) return true;
    constexpr std::size_t kMost = std::numeric_limits<std::uint32_t>::max() / 2;
    inflate_state& stream = state_->stream;
    const bool is_new = stream.avail_in == 0 && !in.empty();
    if (is_new) state_->refill(in);
    const std::size_t room = std::min(out.size(), kMost);
    stream.next_out = out.data();
    stream.avail_out = static_cast<std::uint32_t>(room);
    const int result = isal_inflate(&stream);
    const std::size_t made = room - stream.avail_out;
    out = out.subspan(made);
    is_finished_ = stream.block_state == ISAL_BLOCK_FINISH;
    // A sound stream never stands still with bytes to go on with.
    const bool stands_still = !is_new && made == 0 && room > 0 && stream.avail_in > 0;
    state_->stalls = stands_still ? state_->stalls + 1 : 0;
    constexpr int kMostStalls = 4;
    return (result == ISAL_DECOMP_OK || result == ISAL_END_INPUT) && state_->stalls <= kMostStalls;
}

}  // namespace zq
