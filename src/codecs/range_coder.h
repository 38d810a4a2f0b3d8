// An adaptive binary range coder: each decision costs about what it tells, given how the decisions
// of the same context went before. Any bytes decode to something, so a decoder cannot fail.
#pragma once

#include <algorithm>
#include <cstdint>
#include <span>
#include <vector>

namespace zq {

// How likely a 0 is, in 1/65536, from a quick and a slow average; in 1/4096 for the coder, where it
// stays within 4 to 4091.
class BitModel {
  public:
    std::uint32_t zero() const { return (std::uint32_t{quick_} + slow_) >> 5; }
    void saw(bool one) {
        const std::uint32_t target = one ? 0 : 0xFFFF;
        quick_ = moved(quick_, target, 4);
        slow_ = moved(slow_, target, 7);
    }

  private:
    static std::uint16_t moved(std::uint32_t from, std::uint32_t target, int rate) {
        return static_cast<std::uint16_t>(target == 0 ? from - (from >> rate)
                                                      : from + ((target - from) >> rate));
    }

    std::uint16_t quick_ = 0x8000;
    std::uint16_t slow_ = 0x8000;
};

inline constexpr std::uint32_t kRangeFloor = 1U << 24;

class RangeEncoder {
  public:
    explicit RangeEncoder(std::vector<std::uint8_t>& out) : out_(out) {}

    void put(bool one, BitModel& model) {
        const std::uint32_t zero_part = (range_ >> 12) * model.zero();
        if (one) {
            low_ += zero_part;
            range_ -= zero_part;
        } else {
            range_ = zero_part;
        }
        model.saw(one);
        while (range_ < kRangeFloor) shift();
    }

    // The lowest `count` bits, at most 24, all values alike.
    void put_bits(std::uint32_t value, int count) {
        for (; count > 0; count -= 8) {
            const int some = std::min(count, 8);
            range_ >>= some;
            low_ += std::uint64_t{range_} * (value >> (count - some) & ((1U << some) - 1));
            while (range_ < kRangeFloor) shift();
        }
    }

    void finish() {
        for (int i = 0; i < 5; ++i) shift();
    }

  private:
    // Moves the topmost byte out. One that a carry may still change waits, with the 255s behind it.
    void shift() {
        if (low_ < 0xFF000000U || low_ >= 0x100000000U) {
            const auto carry = static_cast<std::uint8_t>(low_ >> 32);
            if (started_) out_.push_back(static_cast<std::uint8_t>(waiting_ + carry));
            started_ = true;
            out_.insert(out_.end(), full_bytes_, static_cast<std::uint8_t>(0xFF + carry));
            full_bytes_ = 0;
            waiting_ = static_cast<std::uint8_t>(low_ >> 24);
        } else {
            ++full_bytes_;
        }
        low_ = (low_ & 0x00FFFFFFU) << 8;
        range_ <<= 8;
    }

    std::vector<std::uint8_t>& out_;
    std::uint64_t low_ = 0;
    std::uint32_t range_ = 0xFFFFFFFF;
    std::size_t full_bytes_ = 0;
    std::uint8_t waiting_ = 0;
    bool started_ = false;
};

// Behind the last byte it reads zeros.
class RangeDecoder {
  public:
    explicit RangeDecoder(std::span<const std::uint8_t> bytes)
        : next_(bytes.data()), end_(bytes.data() + bytes.size()) {
        for (int i = 0; i < 4; ++i) code_ = code_ << 8 | next_byte();
    }

    bool get(BitModel& model) {
        const std::uint32_t zero_part = (range_ >> 12) * model.zero();
        const bool one = code_ >= zero_part;
        if (one) {
            code_ -= zero_part;
            range_ -= zero_part;
        } else {
            range_ = zero_part;
        }
        model.saw(one);
        while (range_ < kRangeFloor) shift();
        return one;
    }

    std::uint32_t get_bits(int count) {
        std::uint32_t value = 0;
        for (; count > 0; count -= 8) {
            const int some = std::min(count, 8);
            range_ >>= some;
            const std::uint32_t part = std::min(code_ / range_, (1U << some) - 1);
            code_ -= part * range_;
            value = value << some | part;
            while (range_ < kRangeFloor) shift();
        }
        return value;
    }

  private:
    std::uint32_t next_byte() { return next_ != end_ ? *next_++ : 0U; }
    void shift() {
        code_ = code_ << 8 | next_byte();
        range_ <<= 8;
    }

    const std::uint8_t* next_;
    const std::uint8_t* end_;
    std::uint32_t range_ = 0xFFFFFFFF;
    std::uint32_t code_ = 0;
};

}  // namespace zq
