// Big-endian fields of JPEG 2000 files: of a box or marker segment in memory, and of the file.
#pragma once

#include <array>
#include <cstdint>
#include <span>
#include <vector>

#include "base/byte_order.h"
#include "files/input_file.h"

namespace zq {

// Fields in order. Reading beyond the end throws kInvalidFileHeader. Borrowed bytes.
class Jpeg2000Fields {
  public:
    explicit Jpeg2000Fields(std::span<const std::uint8_t> bytes) : bytes_(bytes) {}

    std::size_t left() const { return bytes_.size(); }
    std::uint8_t u8() { return *take(1); }
    std::uint16_t u16() { return load_be16(take(2)); }
    std::uint32_t u32() { return load_be32(take(4)); }

  private:
    const std::uint8_t* take(std::size_t count) {
        if (bytes_.size() < count) throw kInvalidFileHeader;
        const std::uint8_t* const first = bytes_.data();
        bytes_ = bytes_.subspan(count);
        return first;
    }

    std::span<const std::uint8_t> bytes_;
};

// A position in the file, in front of `end`. Going beyond throws kUnableToReadData.
class Jpeg2000Cursor {
  public:
    // The file must outlive the cursor, which alone moves it.
    Jpeg2000Cursor(InputFile& file, std::uint64_t start, std::uint64_t end)
        : file_(file), at_(start), end_(end) {
        seek(start);
    }

    std::uint64_t position() const { return at_; }
    std::uint64_t left() const { return end_ - at_; }

    std::uint16_t u16() { return load_be16(take<2>().data()); }
    std::uint32_t u32() { return load_be32(take<4>().data()); }
    std::uint64_t u64() {
        const std::uint64_t high = u32();
        return high << 32 | u32();
    }
    std::vector<std::uint8_t> bytes(std::size_t count) {
        require(count);
        std::vector<std::uint8_t> all(count);
        file_.read(all.data(), count, kUnableToReadData);
        at_ += count;
        return all;
    }
    void seek(std::uint64_t position) {
        if (position > end_ || !file_.try_seek(position)) throw kUnableToReadData;
        at_ = position;
    }
    void skip(std::uint64_t count) {
        require(count);
        if (count != 0) seek(at_ + count);
    }

  private:
    void require(std::uint64_t count) const {
        if (count > left()) throw kUnableToReadData;
    }
    template <std::size_t kCount>
    std::array<std::uint8_t, kCount> take() {
        require(kCount);
        std::array<std::uint8_t, kCount> bytes;
        file_.read(bytes.data(), kCount, kUnableToReadData);
        at_ += kCount;
        return bytes;
    }

    InputFile& file_;
    std::uint64_t at_;
    std::uint64_t end_;
};

}  // namespace zq
