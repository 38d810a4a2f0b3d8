// PackBits: a byte tells how many bytes follow as they are, or how often the next one comes.
#include "files/tiff_unpacker.h"

#include <algorithm>
#include <cstring>

namespace zq {

namespace {

constexpr std::ptrdiff_t kLongestRun = 128;
constexpr std::uint8_t kNothing = 128;

}  // namespace

bool TiffUnpacker::suits(TIFF* tiff, const TiffLayout& layout) {
    std::uint16_t order = FILLORDER_MSB2LSB;
    TIFFGetFieldDefaulted(tiff, TIFFTAG_FILLORDER, &order);
    return layout.compression == COMPRESSION_PACKBITS && order == FILLORDER_MSB2LSB;
}

void TiffUnpacker::read_row(std::span<std::uint8_t> row) {
    while (!row.empty()) {
        if (copied_ == 0 && repeated_ == 0) {
            row = unpack_whole_runs(row);
            if (row.empty()) return;
            start_run();
        }
        row = row.subspan(copied_ > 0 ? copy(row) : repeat(row));
    }
}

// As long as there is room for the longest run and bytes enough for it. A fixed number of bytes is
// copied faster than the right one; what is too much is overwritten by the runs that follow.
std::span<std::uint8_t> TiffUnpacker::unpack_whole_runs(std::span<std::uint8_t> room) {
    std::uint8_t* to = room.data();
    std::uint8_t* const to_end = to + room.size();
    const std::uint8_t* from = in_.data();
    const std::uint8_t* const from_end = from + in_.size();
    while (to_end - to >= kLongestRun && from_end - from > kLongestRun) {
        const std::uint8_t code = *from++;
        if (code < kNothing) {
            std::memcpy(to, from, kLongestRun);
            to += code + 1;
            from += code + 1;
        } else if (code > kNothing) {
            std::memset(to, *from++, kLongestRun);
            to += 257 - code;
        }
    }
    in_ = {from, from_end};
    return {to, to_end};
}

void TiffUnpacker::start_run() {
    std::uint8_t code = next_byte();
    while (code == kNothing) code = next_byte();
    if (code < kNothing) {
        copied_ = std::size_t{code} + 1;
    } else {
        repeated_ = std::size_t{257} - code;
        value_ = next_byte();
    }
}

std::size_t TiffUnpacker::copy(std::span<std::uint8_t> room) {
    if (in_.empty()) in_ = bytes_.next();
    const std::size_t count = std::min({copied_, room.size(), in_.size()});
    std::memcpy(room.data(), in_.data(), count);
    in_ = in_.subspan(count);
    copied_ -= count;
    return count;
}

std::size_t TiffUnpacker::repeat(std::span<std::uint8_t> room) {
    const std::size_t count = std::min(repeated_, room.size());
    std::memset(room.data(), value_, count);
    repeated_ -= count;
    return count;
}

std::uint8_t TiffUnpacker::next_byte() {
    if (in_.empty()) in_ = bytes_.next();
    const std::uint8_t byte = in_.front();
    in_ = in_.subspan(1);
    return byte;
}

}  // namespace zq
