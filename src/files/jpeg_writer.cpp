// Writing JPEG. Where colours are subsampled or packed, libjpeg takes the rows as they lie in the
// image; else it gets planes.
#include "files/jpeg_writer.h"

#include <algorithm>
#include <array>
#include <cmath>

#include "files/jpeg_units.h"

namespace zq {

namespace {

constexpr std::int32_t kBestQuality = 1000;
constexpr std::int32_t kDefaultQuality = 750;
constexpr std::int32_t kFullColourQuality = 900;  // from here on colours keep their full resolution
constexpr JDIMENSION kRowsAtOnce = 16;

std::int32_t quality_of(const WriteOptions& options) {
    return options.present ? options.words[0] : kDefaultQuality;
}

// Tenths of the library's scale, which begins with 1.
int libjpeg_quality(std::int32_t quality) {
    return std::max((quality + 5) / 10, 1);
}

// Whether each colour is a word in memory; those of a caller's buffer may lie anywhere.
bool are_words(const PixelView& pixels) {
    constexpr std::size_t kWord = sizeof(std::uint32_t);
    return pixels.packing != Packing::kPacked24 &&
           reinterpret_cast<std::uintptr_t>(pixels.first) % kWord == 0 &&
           static_cast<std::size_t>(pixels.stride) % kWord == 0;
}

std::uint16_t density_of(float step) {
    constexpr float kMost = 65535;
    if (!(step >= 1)) return 1;  // no number, too
    return static_cast<std::uint16_t>(std::lround(std::min(step, kMost)));
}

}  // namespace

void JpegWriter::check(const WriteJob& job) {
    const PixelView& pixels = job.pixels;
    const std::int32_t quality = quality_of(job.options);
    if (quality < 0 || quality > kBestQuality) throw kInvalidParameter;
    if (pixels.type != PixelType::kU8 && pixels.type != PixelType::kRgb) {
        throw kIncompatibleImageType;
    }
    if (pixels.width == 0 || pixels.height == 0) throw kImageTooSmall;
    if (pixels.width > JPEG_MAX_DIMENSION || pixels.height > JPEG_MAX_DIMENSION) {
        throw kIncompatibleImageSize;
    }
}

JpegWriter::JpegWriter(OutputFile& file, const WriteJob& job) : sink_(file), job_(job) {
    const bool grey = job.pixels.type == PixelType::kU8;
    const bool full_colour = quality_of(job.options) >= kFullColourQuality;
    if (grey || (full_colour && are_words(job.pixels))) band_.emplace(!grey, job.pixels.width);
}

// The functions up to set_density are called inside a step.

void JpegWriter::configure() {
    const PixelView& pixels = job_.pixels;
    const bool grey = pixels.type == PixelType::kU8;
    const bool packed = pixels.packing == Packing::kPacked24;
    const std::int32_t quality = quality_of(job_.options);
    jpeg().image_width = static_cast<JDIMENSION>(pixels.width);
    jpeg().image_height = static_cast<JDIMENSION>(pixels.height);
    jpeg().input_components = grey ? 1 : packed ? 3 : 4;
    jpeg().in_color_space = grey ? JCS_GRAYSCALE : packed ? JCS_EXT_BGR : JCS_EXT_BGRX;
    jpeg_set_defaults(&jpeg());
    jpeg().raw_data_in = band_ ? TRUE : FALSE;
    jpeg_set_quality(&jpeg(), libjpeg_quality(quality), TRUE);
    if (!grey && quality >= kFullColourQuality) {
        jpeg().comp_info[0].h_samp_factor = 1;
        jpeg().comp_info[0].v_samp_factor = 1;
    }
}

void JpegWriter::set_density() {
    const Calibration& calibration = job_.pixels.calibration;
    jpeg().density_unit = density_of_unit(calibration.unit);
    jpeg().X_density = density_of(calibration.x_step);
    jpeg().Y_density = density_of(calibration.y_step);
}

void JpegWriter::write_info() {
    session_.run(kUnableToWriteData, [this] {
        sink_.attach(jpeg());
        configure();
        set_density();
        jpeg_start_compress(&jpeg(), TRUE);
    });
}

void JpegWriter::write_rows() {
    const PixelView& view = job_.pixels;
    const JpegPixels pixels = {view.first, view.stride, view.width, view.height};
    session_.run(kUnableToWriteData, [this, &pixels] {
        while (band_ && jpeg().next_scanline < jpeg().image_height) band_->write(jpeg(), pixels);
        std::array<JSAMPROW, kRowsAtOnce> rows;
        while (jpeg().next_scanline < jpeg().image_height) {
            const JDIMENSION first = jpeg().next_scanline;
            const JDIMENSION count = std::min(kRowsAtOnce, jpeg().image_height - first);
            for (JDIMENSION i = 0; i < count; ++i) {
                // Only read, whatever libjpeg's type says.
                rows[i] =
                    const_cast<JSAMPROW>(job_.pixels.row(static_cast<std::int32_t>(first + i)));
            }
            jpeg_write_scanlines(&jpeg(), rows.data(), count);
        }
    });
}

void JpegWriter::write_end() {
    session_.run(kUnableToWriteData, [this] { jpeg_finish_compress(&jpeg()); });
}

}  // namespace zq
