// Inflating with zlib, where nothing faster is at hand.
#include <zlib.h>

#include <algorithm>
#include <limits>

#include "base/error_codes.h"
#include "codecs/inflate_stream.h"

namespace zq {

struct InflateStream::State {
    z_stream stream{};
};

InflateStream::InflateStream() : state_(std::make_unique<State>()) {
    if (inflateInit(&state_->stream) != Z_OK) throw kNotEnoughMemory;
}

InflateStream::~InflateStream() {
    inflateEnd(&state_->stream);
}

bool InflateStream::inflate(std::span<const std::uint8_t>& in, std::span<std::uint8_t>& out) {
    if (is_finished_) return true;
    constexpr std::size_t kMost = std::numeric_limits<uInt>::max() / 2;
    z_stream& stream = state_->stream;
    const std::size_t given = std::min(in.size(), kMost), room = std::min(out.size(), kMost);
    stream.next_in = const_cast<Bytef*>(in.data());
    stream.avail_in = static_cast<uInt>(given);
    stream.next_out = out.data();
    stream.avail_out = static_cast<uInt>(room);
    const int result = ::inflate(&stream, Z_NO_FLUSH);
    in = in.subspan(given - stream.avail_in);
    out = out.subspan(room - stream.avail_out);
    is_finished_ = result == Z_STREAM_END;
    // Z_BUF_ERROR: nothing to take or no room.
    return result == Z_OK || result == Z_BUF_ERROR || is_finished_;
}

}  // namespace zq
