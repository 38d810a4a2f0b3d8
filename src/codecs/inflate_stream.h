// Inflates one stream in the zlib wrapping piece by piece, in little memory.
#pragma once

#include <cstdint>
#include <memory>
#include <span>

namespace zq {

class InflateStream {
  public:
    InflateStream();  // throws kNotEnoughMemory or std::bad_alloc
    ~InflateStream();
    InflateStream(const InflateStream&) = delete;
    InflateStream& operator=(const InflateStream&) = delete;

    // Takes from the front of `in` and fills the front of `out`; both are what is left then. With
    // `in` empty and room in `out`, a call that changes neither wants more. False: the stream is
    // damaged, and of no more use.
    bool inflate(std::span<const std::uint8_t>& in, std::span<std::uint8_t>& out);
    // The whole stream came out, and its check sum is right.
    bool is_finished() const { return is_finished_; }

  private:
    struct State;
    std::unique_ptr<State> state_;
    bool is_finished_ = false;
};

}  // namespace zq
