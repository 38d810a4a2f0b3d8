// The bytes of the quality codec's blocks: writing them, and reading them within their bounds. All
// numbers are little-endian.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

#include "base/byte_order.h"
#include "base/checked.h"

namespace zq {

using Bytes = std::vector<std::uint8_t>;

inline void put_bytes(Bytes& out, std::span<const std::uint8_t> bytes) {
    out.insert(out.end(), bytes.begin(), bytes.end());
}
inline void put_u32(Bytes& out, std::uint32_t value) {
    std::uint8_t bytes[4];
    store_le32(bytes, value);
    put_bytes(out, bytes);
}
inline void put_f32(Bytes& out, float value) {
    put_u32(out, std::bit_cast<std::uint32_t>(value));
}

// A length that is written when the bytes that it counts are there. Throws kNotEnoughMemory when
// they are too many for it.
class OpenSection {
  public:
    explicit OpenSection(Bytes& out) : out_(out), at_(out.size()) { put_u32(out, 0); }
    void close() const {
        store_le32(out_.data() + at_, checked_narrow<std::uint32_t>(out_.size() - at_ - 4));
    }

  private:
    Bytes& out_;
    std::size_t at_;
};

// Every read throws kInitializationError where the bytes end.
class StreamReader {
  public:
    explicit StreamReader(std::span<const std::uint8_t> bytes) : left_(bytes) {}

    std::span<const std::uint8_t> bytes(std::size_t count) {
        if (count > left_.size()) throw kInitializationError;
        const auto result = left_.first(count);
        left_ = left_.subspan(count);
        return result;
    }
    std::uint8_t u8() { return bytes(1)[0]; }
    std::uint32_t u32() { return load_le32(bytes(4).data()); }
    float f32() { return std::bit_cast<float>(u32()); }
    std::span<const std::uint8_t> section() { return bytes(u32()); }
    // Seven bits a byte, the lowest first; the highest bit says that more come. Below 2^63.
    std::uint64_t number() {
        std::uint64_t value = 0;
        for (int shift = 0; shift < 63; shift += 7) {
            const std::uint8_t byte = u8();
            value |= std::uint64_t{byte & 0x7FU} << shift;
            if (byte < 0x80) return value;
        }
        throw kInitializationError;
    }
    bool at_end() const { return left_.empty(); }
    void expect_end() const {
        if (!left_.empty()) throw kInitializationError;
    }

  private:
    std::span<const std::uint8_t> left_;
};

}  // namespace zq
