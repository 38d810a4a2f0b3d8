// Writing TIFF: tags, then strips, then the directory.
#include "files/tiff_writer.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <optional>

#include "files/tiff_samples.h"
#include "files/unsigned_grey.h"
#include "kernels/colour_rows.h"
#include "kernels/png_samples.h"

namespace zq {

namespace {

// About what a strip holds before it is compressed.
constexpr std::size_t kStripBytes = std::size_t{64} * 1024;
constexpr std::uint32_t kJpegBlockRows = 8;
constexpr std::int32_t kUnitCentimetre = 4;
constexpr std::int32_t kUnitMetre = 5;
constexpr std::int32_t kUnitInch = 8;

// The third option word. Its small numbers mean codecs; anything else is a compression tag, of
// which the file keeps 16 bits.
std::uint16_t compression_of(const WriteOptions& options) {
    switch (const std::int32_t word = options.present ? options.words[2] : 0) {
        case 0:
            return COMPRESSION_NONE;
        case 2:
            return COMPRESSION_JPEG;
        case 4:
            return COMPRESSION_PACKBITS;
        case 5:
            return COMPRESSION_DEFLATE;
        default:
            return static_cast<std::uint16_t>(word);
    }
}

bool is_lossless(std::uint16_t compression) {
    constexpr std::array kTags = {COMPRESSION_NONE, COMPRESSION_LZW, COMPRESSION_ADOBE_DEFLATE,
                                  COMPRESSION_PACKBITS, COMPRESSION_DEFLATE};
    return std::find(kTags.begin(), kTags.end(), compression) != kTags.end();
}

// JPEG has 8 bits, and would mix neighbouring indices of a colour table.
bool may_be_jpeg(const WriteJob& job) {
    const PixelType type = job.pixels.type;
    return (type == PixelType::kU8 && job.colour_table.empty()) || type == PixelType::kRgb;
}

int samples_of(PixelType type) {
    return type == PixelType::kRgb || type == PixelType::kRgbU64 ? 3 : 1;
}

int bits_of(PixelType type) {
    return type == PixelType::kI16 || type == PixelType::kRgbU64 ? 16 : 8;
}

void copy_shifted(const std::uint8_t* from, std::uint8_t* to, std::int32_t pixels) {
    const auto* values = reinterpret_cast<const std::uint16_t*>(from);
    auto* samples = reinterpret_cast<std::uint16_t*>(to);
    for (std::int32_t x = 0; x < pixels; ++x)
        samples[x] = static_cast<std::uint16_t>(values[x] ^ 0x8000U);
}

struct Resolution {
    std::uint16_t unit;
    float x;
    float y;
};

// None for a calibration that is no length on paper.
std::optional<Resolution> resolution_of(const Calibration& calibration) {
    const bool inch = calibration.unit == kUnitInch;
    // In double, so that a hundredth does not cost the last digit.
    const double steps = calibration.unit == kUnitMetre ? 0.01 : 1.0;
    if (!inch && calibration.unit != kUnitCentimetre && calibration.unit != kUnitMetre)
        return std::nullopt;
    const Resolution resolution = {
        static_cast<std::uint16_t>(inch ? RESUNIT_INCH : RESUNIT_CENTIMETER),
        static_cast<float>(steps / calibration.x_step),
        static_cast<float>(steps / calibration.y_step)};
    // The file has rationals of 32-bit numbers.
    const auto usable = [](float value) { return value > 0x1p-32F && value < 0x1p32F; };
    if (!usable(resolution.x) || !usable(resolution.y)) return std::nullopt;
    return resolution;
}

}  // namespace

void TiffWriter::check(const WriteJob& job) {
    const PixelView& pixels = job.pixels;
    check_interchangeable(pixels);
    const std::uint16_t compression = compression_of(job.options);
    const bool jpeg = compression == COMPRESSION_JPEG && may_be_jpeg(job);
    if (!jpeg && !is_lossless(compression)) throw kInvalidFileFormat;
    // The sides of a strip of JPEG.
    constexpr std::int32_t kLongestJpegSide = 65500;
    if (jpeg && pixels.width > kLongestJpegSide) throw kInvalidFileFormat;
}

TiffWriter::TiffWriter(OutputFile& file, const WriteJob& job, const char* name)
    : file_(file),
      job_(job),
      name_(name),
      session_(file),
      compression_(compression_of(job.options)),
      samples_(samples_of(job.pixels.type)),
      bits_(bits_of(job.pixels.type)),
      row_bytes_(static_cast<std::size_t>(job.pixels.width) *
                 static_cast<std::size_t>(samples_ * bits_ / 8)) {
    strip_rows_ = static_cast<std::uint32_t>(std::max<std::size_t>(kStripBytes / row_bytes_, 1));
    if (compression_ == COMPRESSION_JPEG)
        strip_rows_ = (strip_rows_ + kJpegBlockRows - 1) / kJpegBlockRows * kJpegBlockRows;
    choose_grey16();
}

// Values without a sign, and those that came from unsigned samples and would come back the same,
// are written unsigned, which every reader understands; others signed.
void TiffWriter::choose_grey16() {
    const PixelView& pixels = job_.pixels;
    if (pixels.type != PixelType::kI16 || pixels.packing == Packing::kUnsigned16) return;
    const auto any_row = [&pixels](auto test) {
        for (std::int32_t y = 0; y < pixels.height; ++y) {
            if (test(pixels.row(y))) return true;
        }
        return false;
    };
    const auto has_others = [&pixels](const std::uint8_t* row) {
        const auto* const values = reinterpret_cast<const std::int16_t*>(row);
        return std::any_of(values, values + pixels.width, [](auto v) { return v >= 0; });
    };
    const auto has_negatives = [this](const std::uint8_t* row) {
        return any_above_signed(row, row_bytes_);  // the same bit
    };
    if (pixels.sample_offset == kWholeRangeOffset && any_row(has_others)) {
        grey16_ = Grey16::kShifted;
    } else if (any_row(has_negatives)) {
        grey16_ = Grey16::kSigned;
    }
}

void TiffWriter::require(bool done) const {
    if (done) return;
    throw file_.last_error() != kSuccess ? file_.last_error() : kUnableToWriteData;
}

template <class Value>
void TiffWriter::set(ttag_t tag, Value value) {
    require(TIFFSetField(session_.tiff(), tag, value) == 1);
}

void TiffWriter::write_tags() {
    set_layout();
    set_colour_map();
    set_resolution();
    set(TIFFTAG_DOCUMENTNAME, name_);
    set(TIFFTAG_SOFTWARE, "Zorvane Kemo");
}

void TiffWriter::set_layout() {
    const bool palette = !job_.colour_table.empty();
    set(TIFFTAG_IMAGELENGTH, static_cast<std::uint32_t>(job_.pixels.height));
    set(TIFFTAG_IMAGEWIDTH, static_cast<std::uint32_t>(job_.pixels.width));
    set(TIFFTAG_BITSPERSAMPLE, bits_);
    if (bits_ == 16)
        set(TIFFTAG_SAMPLEFORMAT,
            grey16_ == Grey16::kSigned ? SAMPLEFORMAT_INT : SAMPLEFORMAT_UINT);
    set(TIFFTAG_PHOTOMETRIC, palette         ? PHOTOMETRIC_PALETTE
                             : samples_ == 3 ? PHOTOMETRIC_RGB
                                             : PHOTOMETRIC_MINISBLACK);
    set(TIFFTAG_COMPRESSION, static_cast<int>(compression_));
    set(TIFFTAG_FILLORDER, FILLORDER_MSB2LSB);
    set(TIFFTAG_ORIENTATION, ORIENTATION_TOPLEFT);
    set(TIFFTAG_PLANARCONFIG, PLANARCONFIG_CONTIG);
    set(TIFFTAG_ROWSPERSTRIP, strip_rows_);
    set(TIFFTAG_SAMPLESPERPIXEL, samples_);
}

// Entries 0xAARRGGBB, whose alpha has no place in the file.
void TiffWriter::set_colour_map() {
    if (job_.colour_table.empty()) return;
    std::array<std::array<std::uint16_t, kColourTableSize>, 3> maps{};
    for (std::size_t i = 0; i < kColourTableSize; ++i) {
        for (std::size_t c = 0; c < maps.size(); ++c) {
            const std::uint32_t value = job_.colour_table[i] >> (16 - 8 * c) & 0xFF;
            maps[c][i] = static_cast<std::uint16_t>(value * 257);
        }
    }
    require(TIFFSetField(session_.tiff(), TIFFTAG_COLORMAP, maps[0].data(), maps[1].data(),
                         maps[2].data()) == 1);
}

void TiffWriter::set_resolution() {
    const std::optional<Resolution> resolution = resolution_of(job_.pixels.calibration);
    if (!resolution) return;
    set(TIFFTAG_RESOLUTIONUNIT, static_cast<int>(resolution->unit));
    set(TIFFTAG_XRESOLUTION, resolution->x);
    set(TIFFTAG_YRESOLUTION, resolution->y);
}

void TiffWriter::copy_row(std::int32_t y, std::uint8_t* to) const {
    const PixelView& pixels = job_.pixels;
    const std::uint8_t* const from = pixels.row(y);
    const auto width = static_cast<std::size_t>(pixels.width);
    if (pixels.type == PixelType::kRgbU64) {
        bgra64_to_rgb48(reinterpret_cast<const std::uint16_t*>(from),
                        reinterpret_cast<std::uint16_t*>(to), width);
    } else if (pixels.packing == Packing::kPacked24) {
        bgr_to_rgb(from, to, width);
    } else if (pixels.type == PixelType::kRgb) {
        bgra_to_rgb(from, to, width);
    } else if (grey16_ == Grey16::kShifted) {
        copy_shifted(from, to, pixels.width);
    } else {
        std::memcpy(to, from, row_bytes_);
    }
}

// The file has the samples as they are in memory.
bool TiffWriter::is_direct() const {
    return compression_ == COMPRESSION_NONE && samples_ == 1 && grey16_ != Grey16::kShifted &&
           (bits_ == 8 || TIFFIsByteSwapped(session_.tiff()) == 0);
}

void TiffWriter::write_strip(std::uint32_t index, std::int32_t y, std::uint32_t rows) {
    if (is_direct()) {
        require(session_.write_strip(index,
                                     {job_.pixels.row(y), job_.pixels.stride, row_bytes_, rows}));
        return;
    }
    strip_.resize(row_bytes_ * rows);
    for (std::uint32_t i = 0; i < rows; ++i)
        copy_row(y + static_cast<std::int32_t>(i), &strip_[i * row_bytes_]);
    require(TIFFWriteEncodedStrip(session_.tiff(), index, strip_.data(),
                                  static_cast<tmsize_t>(strip_.size())) != -1);
}

void TiffWriter::write_rows() {
    const auto height = static_cast<std::uint32_t>(job_.pixels.height);
    std::uint32_t index = 0;
    for (std::uint32_t y = 0; y < height; ++index) {
        const std::uint32_t rows = std::min(strip_rows_, height - y);
        write_strip(index, static_cast<std::int32_t>(y), rows);
        y += rows;
    }
}

void TiffWriter::write_end() {
    require(session_.write_directory());
}

}  // namespace zq
