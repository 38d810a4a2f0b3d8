// Decoding of run-length coded pixels: pairs of bytes, each a run (count, value) or an escape
// (0, what). Lines come in the order of the header.
#include "files/bmp_rle.h"

#include <algorithm>
#include <array>
#include <cstring>

#include "files/bmp_rows.h"

namespace zq {

namespace {

// A run of two bytes covers 255 pixels at most. Pictures whose pixels are mostly skipped may have
// fewer bytes; up to this size they cost nothing worth a refusal.
constexpr std::uint64_t kMostPixelsAByte = 128;
constexpr std::uint64_t kAlwaysPlausible = std::uint64_t{1} << 20;

// Second byte of an escape; from 3 on a count of pixels that follow as they are.
enum Escape : std::uint8_t { kEndOfLine = 0, kEndOfPicture = 1, kDelta = 2 };

// The file's bytes, a block at a time.
class RleBytes {
  public:
    explicit RleBytes(InputFile& file) : file_(file) {}

    bool try_take(std::uint8_t* bytes, std::size_t count) {
        if (end_ - next_ < count) refill();
        if (end_ - next_ < count) return false;
        std::memcpy(bytes, &block_[next_], count);
        next_ += count;
        return true;
    }
    void take(std::uint8_t* bytes, std::size_t count) {
        if (!try_take(bytes, count)) throw kUnableToReadData;
    }

  private:
    void refill() {
        std::copy(block_.begin() + next_, block_.begin() + end_, block_.begin());
        end_ -= next_;
        next_ = 0;
        end_ += file_.read_some(&block_[end_], block_.size() - end_);
    }

    InputFile& file_;
    std::array<std::uint8_t, 4096> block_;
    std::size_t next_ = 0;
    std::size_t end_ = 0;
};

using Pair = std::array<std::uint8_t, 2>;

class RleDecoder {
  public:
    RleDecoder(InputFile& file, const BmpHeader& header, Image& image)
        : file_(file),
          bytes_(file),
          header_(header),
          image_(image),
          values_(index_values(header)) {}

    void decode() {
        while (y_ < header_.height && !is_last_row_full()) {
            const auto [count, value] = pair();
            if (count > 0) {
                run(count, value);
            } else if (value == kEndOfLine) {
                x_ = 0;
                ++y_;
            } else if (value == kEndOfPicture) {
                return;
            } else if (value == kDelta) {
                const auto [right, down] = pair();
                x_ += right;
                y_ += down;
            } else {
                literal(value);
            }
        }
        check_end();
    }

  private:
    bool is_last_row_full() const { return y_ == header_.height - 1 && x_ >= header_.width; }

    // The end mark, perhaps behind an end of line. Some writers leave it out; whether it, or more,
    // was cut off is then seen from the size that the header gives.
    void check_end() {
        constexpr Pair kLineEnd = {0, kEndOfLine}, kPictureEnd = {0, kEndOfPicture};
        Pair mark{};
        bool there = bytes_.try_take(mark.data(), mark.size());
        if (there && mark == kLineEnd) there = bytes_.try_take(mark.data(), mark.size());
        if (there && mark == kPictureEnd) return;
        file_.require(header_.data_offset, header_.data_bytes);
    }

    Pair pair() {
        Pair bytes;
        bytes_.take(bytes.data(), bytes.size());
        return bytes;
    }

    bool is_rle4() const { return header_.compression == BmpCompression::kRle4; }

    // Of `count` pixels from here on, those that lie in the row.
    std::size_t inside(std::size_t count) const {
        if (x_ >= header_.width) return 0;
        return std::min(count, static_cast<std::size_t>(header_.width - x_));
    }

    std::uint8_t* here() const {
        const auto y = static_cast<std::int32_t>(y_);
        return image_.row(header_.top_down ? y : header_.height - 1 - y) + x_;
    }

    void run(std::size_t count, std::uint8_t value) {
        const std::size_t visible = inside(count);
        if (visible > 0 && !is_rle4()) {
            std::memset(here(), values_[value], visible);
        } else if (visible > 0) {
            const std::array<std::uint8_t, 2> two = {values_[value >> 4], values_[value & 15]};
            std::uint8_t* pixel = here();
            for (std::size_t i = 0; i < visible; ++i) pixel[i] = two[i % 2];
        }
        x_ += static_cast<std::int64_t>(count);
    }

    // Filled up to a multiple of two bytes.
    void literal(std::size_t count) {
        std::array<std::uint8_t, 256> bytes;
        const std::size_t used = is_rle4() ? (count + 1) / 2 : count;
        bytes_.take(bytes.data(), (used + 1) / 2 * 2);
        const std::size_t visible = inside(count);
        std::uint8_t* pixel = visible > 0 ? here() : nullptr;
        for (std::size_t i = 0; i < visible; ++i) {
            const int nibbles = bytes[is_rle4() ? i / 2 : i];
            pixel[i] = values_[static_cast<std::size_t>(
                !is_rle4() ? nibbles : (i % 2 == 0 ? nibbles >> 4 : nibbles & 15))];
        }
        x_ += static_cast<std::int64_t>(count);
    }

    InputFile& file_;
    RleBytes bytes_;
    const BmpHeader& header_;
    Image& image_;
    std::array<std::uint8_t, 256> values_;
    // The next pixel; lines count as the file has them. Both may lie beyond the picture.
    std::int64_t x_ = 0;
    std::int64_t y_ = 0;
};

}  // namespace

void check_bmp_rle_plausible(const BmpHeader& header, const InputFile& file) {
    file.require(header.data_offset, 0);
    if (file.size() == InputFile::kUnknownSize) return;
    const std::uint64_t pixels =
        static_cast<std::uint64_t>(header.width) * static_cast<std::uint64_t>(header.height);
    const std::uint64_t bytes = static_cast<std::uint64_t>(file.size()) - header.data_offset;
    if (pixels > kAlwaysPlausible && pixels / kMostPixelsAByte > bytes) throw kUnableToReadData;
}

void read_bmp_rle(InputFile& file, const BmpHeader& header, Image& image) {
    for (std::int32_t y = 0; y < header.height; ++y) {
        std::memset(image.row(y), 0, static_cast<std::size_t>(header.width));
    }
    RleDecoder(file, header, image).decode();
}

}  // namespace zq
