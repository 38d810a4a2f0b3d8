// Pieces of a strip.
#include "files/tiff_strip_bytes.h"

#include <algorithm>

#include "base/error_codes.h"

namespace zq {

namespace {

constexpr std::size_t kPieceBytes = std::size_t{16} << 10;

// Files announce more than they have, and still have all that the pixels need.
std::uint64_t bytes_in_file(const TiffSession& session, std::uint64_t position,
                            std::uint64_t announced) {
    const std::uint64_t size = session.file_size();
    return std::min(announced, size - std::min(position, size));
}

}  // namespace

TiffStripBytes::TiffStripBytes(TiffSession& session, std::uint32_t strip)
    : session_(session),
      position_(TIFFGetStrileOffset(session.tiff(), strip)),
      left_(bytes_in_file(session, position_, TIFFGetStrileByteCount(session.tiff(), strip))),
      bytes_(std::make_unique_for_overwrite<std::uint8_t[]>(kPieceBytes)) {
    if (position_ == 0) throw kUnableToReadData;
}

std::span<const std::uint8_t> TiffStripBytes::next() {
    const auto count = static_cast<std::size_t>(std::min<std::uint64_t>(left_, kPieceBytes));
    const auto stride = static_cast<std::ptrdiff_t>(count);
    if (count == 0 || !session_.read_rows_at(position_, {bytes_.get(), stride, count, 1}))
        throw kUnableToReadData;
    position_ += count;
    left_ -= count;
    return {bytes_.get(), count};
}

}  // namespace zq
