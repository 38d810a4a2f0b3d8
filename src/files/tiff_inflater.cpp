// Inflating strips of TIFF, and undoing their predictor (TIFF 6.0, section 14).
#include "files/tiff_inflater.h"

#include <algorithm>
#include <array>

#include "base/checked.h"
#include "base/error_codes.h"

namespace zq {

namespace {

std::uint16_t field_of(TIFF* tiff, ttag_t tag) {
    std::uint16_t value = 0;
    TIFFGetFieldDefaulted(tiff, tag, &value);
    return value;
}

template <class Sample>
void add_up(Sample* samples, std::size_t count, std::size_t step) {
    for (std::size_t i = step; i < count; ++i)
        samples[i] = static_cast<Sample>(samples[i] + samples[i - step]);
}

}  // namespace

bool TiffInflater::suits(TIFF* tiff, const TiffLayout& layout) {
    if (layout.compression != COMPRESSION_DEFLATE &&
        layout.compression != COMPRESSION_ADOBE_DEFLATE)
        return false;
    const int predictor = field_of(tiff, TIFFTAG_PREDICTOR);
    const bool whole_bytes = layout.bits == 8 || layout.bits == 16;
    return field_of(tiff, TIFFTAG_FILLORDER) == FILLORDER_MSB2LSB &&
           (predictor == PREDICTOR_NONE || (predictor == PREDICTOR_HORIZONTAL && whole_bytes));
}

TiffInflater::TiffInflater(TiffSession& session, const TiffLayout& layout, std::uint32_t strip)
    : session_(session),
      layout_(layout),
      row_bytes_(checked_narrow<std::size_t>(layout.row_bytes(layout.width))),
      has_differences_(field_of(session.tiff(), TIFFTAG_PREDICTOR) == PREDICTOR_HORIZONTAL),
      deflated_(session, strip) {}

// Returns the room that is left.
std::span<std::uint8_t> TiffInflater::inflate(std::span<std::uint8_t> room) {
    if (stream_.is_finished()) throw kUnableToReadData;
    const bool had_none = in_.empty();
    const std::size_t before = room.size();
    if (!stream_.inflate(in_, room)) throw kUnableToReadData;
    if (had_none && room.size() == before && !stream_.is_finished()) in_ = deflated_.next();
    return room;
}

void TiffInflater::add_up_differences(std::uint8_t* row) const {
    const auto step = static_cast<std::size_t>(layout_.separate ? 1 : layout_.samples);
    if (layout_.bits == 8) add_up(row, row_bytes_, step);
    if (layout_.bits == 16) add_up(reinterpret_cast<std::uint16_t*>(row), row_bytes_ / 2, step);
}

void TiffInflater::read_rows(std::span<std::uint8_t> rows) {
    for (std::span<std::uint8_t> room = rows; !room.empty();) room = inflate(room);
    session_.swap_samples(rows, layout_.bits);
    for (std::size_t at = 0; has_differences_ && at < rows.size(); at += row_bytes_)
        add_up_differences(&rows[at]);
}

void TiffInflater::finish(std::uint64_t spare_bytes) {
    std::array<std::uint8_t, 4096> passed_over;
    while (!stream_.is_finished()) {
        const std::size_t made = passed_over.size() - inflate(passed_over).size();
        if (made > spare_bytes) throw kUnableToReadData;
        spare_bytes -= made;
    }
}

}  // namespace zq
