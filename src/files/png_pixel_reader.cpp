// Reading the pixels of PNG: what one chunk lacks the next one has.
#include "files/png_pixel_reader.h"

#include <zlib.h>

#include <algorithm>
#include <cstring>
#include <string_view>

#include "base/byte_order.h"
#include "base/checked.h"
#include "base/error_codes.h"
#include "kernels/png_filters.h"

namespace zq {

namespace {

constexpr std::size_t kDeflatedBytes = std::size_t{32} << 10;
constexpr std::size_t kInflatedBytes = std::size_t{128} << 10;  // beside a row
constexpr std::uint32_t kLongestChunk = 0x7FFFFFFF;

}  // namespace

PngPixelReader::PngPixelReader(InputFile& file, const Head& head, std::size_t row_bytes,
                               std::size_t step)
    : file_(file),
      head_(head),
      row_bytes_(row_bytes),
      step_(step),
      deflated_(kDeflatedBytes),
      rows_(checked_add<std::size_t>(row_bytes, kInflatedBytes)) {
    open_chunk();
}

bool PngPixelReader::is_pixels() const {
    return std::string_view(reinterpret_cast<const char*>(&head_[4]), 4) == "IDAT";
}

void PngPixelReader::open_chunk() {
    left_ = load_be32(head_.data());
    if (left_ > kLongestChunk) throw kUnableToReadData;
    sum_ = static_cast<std::uint32_t>(crc32(0, &head_[4], 4));
}

void PngPixelReader::close_chunk() {
    std::array<std::uint8_t, 4> stated{};
    file_.read(stated.data(), stated.size(), kUnableToReadData);
    if (load_be32(stated.data()) != sum_) throw kUnableToReadData;
    file_.read(head_.data(), head_.size(), kUnableToReadData);
}

// More of the deflated stream; false when the last chunk is at its end.
bool PngPixelReader::fetch() {
    while (left_ == 0) {
        close_chunk();
        if (!is_pixels()) return false;
        open_chunk();
    }
    const auto part = static_cast<std::uint32_t>(std::min<std::size_t>(left_, deflated_.size()));
    file_.read(deflated_.data(), part, kUnableToReadData);
    sum_ = static_cast<std::uint32_t>(crc32(sum_, deflated_.data(), part));
    left_ -= part;
    in_ = std::span(deflated_).first(part);
    return true;
}

// Returns the bytes that came, at times none; there must be more of the stream.
std::size_t PngPixelReader::inflate(std::span<std::uint8_t> room) {
    if (stream_.is_finished()) throw kUnableToReadData;
    const bool had_none = in_.empty();
    const std::size_t before = room.size();
    if (!stream_.inflate(in_, room)) throw kUnableToReadData;
    const std::size_t made = before - room.size();
    const bool wants_more = had_none && made == 0 && !stream_.is_finished();
    if (wants_more && !fetch()) throw kUnableToReadData;
    return made;
}

void PngPixelReader::fill(std::size_t wanted) {
    std::memmove(rows_.data(), rows_.data() + begin_, end_ - begin_);
    end_ -= begin_;
    begin_ = 0;
    while (end_ < wanted) end_ += inflate(std::span(rows_).subspan(end_));
}

void PngPixelReader::read_row(const std::uint8_t* above, std::uint8_t* to) {
    if (end_ - begin_ <= row_bytes_) fill(row_bytes_ + 1);
    const int filter = rows_[begin_];
    if (filter >= kPngFilters) throw kUnableToReadData;
    png_unfilter(filter, &rows_[begin_] + 1, above, step_, to, row_bytes_);
    begin_ += row_bytes_ + 1;
}

PngPixelReader::Head PngPixelReader::finish() {
    while (!stream_.is_finished()) inflate(rows_);
    while (fetch()) {
    }
    return head_;
}

}  // namespace zq
