// Reading PNG. libpng delivers rows in the layout of the image's type, straight into the image.
#include "files/png_reader.h"

#include <cstring>

#include "base/checked.h"
#include "codecs/deflate.h"
#include "files/unsigned_grey.h"
#include "files/write_job.h"
#include "kernels/colour_rows.h"

namespace zq {

namespace {

void read_bytes(png_structp png, png_bytep bytes, std::size_t count) {
    auto* file = static_cast<InputFile*>(png_get_io_ptr(png));
    if (file->read_some(bytes, count) != count) PngSession::fail(png, kUnableToReadData);
}

// Everything but the picture is passed over unread: nothing that a file carries beside its pixels
// costs memory or can be wrong.
void skip_extras(png_structp png) {
    png_set_keep_unknown_chunks(png, PNG_HANDLE_CHUNK_NEVER, nullptr, -1);
}

}  // namespace

PngReader::PngReader(InputFile& file, std::optional<std::int16_t> sample_offset)
    : file_(file), session_(PngSession::Use::kRead), sample_offset_(sample_offset) {}

void PngReader::read_info() {
    const png_structp png = session_.png();
    const png_infop info = session_.info();
    session_.run(kInvalidFileHeader, [this, png, info] {
        png_set_read_fn(png, &file_, read_bytes);
        png_set_sig_bytes(png, kPngSignatureBytes);
        skip_extras(png);
        png_read_info(png, info);
    });
    width_ = png_get_image_width(png, info);
    height_ = png_get_image_height(png, info);
    depth_ = png_get_bit_depth(png, info);
    colour_type_ = png_get_color_type(png, info);
    channels_ = png_get_channels(png, info);
    interlaced_ = png_get_interlace_type(png, info) != PNG_INTERLACE_NONE;
    check_plausible();
}

void PngReader::check_plausible() const {
    if (file_.size() == InputFile::kUnknownSize) return;
    const std::uint64_t row_bits =
        std::uint64_t{width_} * static_cast<std::uint64_t>(bits_per_pixel());
    const std::uint64_t bytes = checked_mul<std::uint64_t>(row_bits, height_) / 8;
    if (bytes / kMostInflation > static_cast<std::uint64_t>(file_.size())) throw kUnableToReadData;
}

PixelType PngReader::pixel_type() const {
    if (colour_type_ == PNG_COLOR_TYPE_PALETTE) return PixelType::kU8;
    if (colour_type_ == PNG_COLOR_TYPE_GRAY) return depth_ == 16 ? PixelType::kI16 : PixelType::kU8;
    return depth_ == 16 ? PixelType::kRgbU64 : PixelType::kRgb;
}

PixelFormat PngReader::pixel_format() const {
    const bool wide = depth_ == 16;
    if (colour_type_ == PNG_COLOR_TYPE_RGB) return wide ? PixelFormat::kRgb48 : PixelFormat::kRgb24;
    if ((colour_type_ & PNG_COLOR_MASK_ALPHA) != 0) {
        return wide ? PixelFormat::kRgb64 : PixelFormat::kRgb32;
    }
    switch (depth_) {
        case 1:
            return PixelFormat::kGrey1;
        case 2:
            return PixelFormat::kGrey2;
        case 4:
            return PixelFormat::kGrey4;
        case 8:
            return PixelFormat::kGrey8;
        default:
            return PixelFormat::kGrey16;
    }
}

std::vector<std::uint32_t> PngReader::colour_table() const {
    if (colour_type_ != PNG_COLOR_TYPE_PALETTE) return {};
    png_colorp palette = nullptr;
    int count = 0;
    png_get_PLTE(session_.png(), session_.info(), &palette, &count);
    png_bytep alpha = nullptr;
    int alpha_count = 0;
    const bool has_alpha =
        png_get_tRNS(session_.png(), session_.info(), &alpha, &alpha_count, nullptr) != 0;
    std::vector<std::uint32_t> table(kColourTableSize, 0);
    for (int i = 0; i < count; ++i) {
        // With some alpha in the file, entries without one are opaque; without any, alpha is 0.
        const std::uint32_t a = !has_alpha ? 0 : i < alpha_count ? alpha[i] : 255;
        const png_color& c = palette[i];
        table[static_cast<std::size_t>(i)] =
            a << 24 | std::uint32_t{c.red} << 16 | std::uint32_t{c.green} << 8 | c.blue;
    }
    return table;
}

// The one layout whose rows are expanded here, which is much faster than libpng's way. Rows that
// are put together from several passes must have their final form all the time.
bool PngReader::is_plain_rgb() const {
    return colour_type_ == PNG_COLOR_TYPE_RGB && depth_ == 8 && !interlaced_ &&
           png_get_valid(session_.png(), session_.info(), PNG_INFO_tRNS) == 0;
}

// The functions up to read_row are called inside a step.

void PngReader::set_transformations() {
    const png_structp png = session_.png();
    if (depth_ == 16) png_set_swap(png);
    switch (pixel_type()) {
        case PixelType::kU8:
            png_set_packing(png);
            if (colour_type_ == PNG_COLOR_TYPE_GRAY) png_set_expand_gray_1_2_4_to_8(png);
            break;
        case PixelType::kI16:
            break;
        default:
            if (is_plain_rgb()) break;
            if ((colour_type_ & PNG_COLOR_MASK_COLOR) == 0) png_set_gray_to_rgb(png);
            if (png_get_valid(png, session_.info(), PNG_INFO_tRNS) != 0) png_set_tRNS_to_alpha(png);
            png_set_filler(png, 0, PNG_FILLER_AFTER);
            png_set_bgr(png);
            break;
    }
}

void PngReader::read_row(std::uint8_t* row) {
    png_read_row(session_.png(), packed_.empty() ? row : packed_.data(), nullptr);
    if (!packed_.empty()) rgb_to_bgra(packed_.data(), row, width_);
}

void PngReader::read_pixels(Image& image) {
    const png_structp png = session_.png();
    const bool is_16_bit_grey = pixel_type() == PixelType::kI16;
    int passes = 0;
    session_.run(kUnableToReadData, [this, png, &passes] {
        set_transformations();
        passes = png_set_interlace_handling(png);
        png_read_update_info(png, session_.info());
    });
    const auto row_bytes =
        static_cast<std::size_t>(width()) * static_cast<std::size_t>(bytes_per_pixel(image.type()));
    const std::size_t delivered = png_get_rowbytes(png, session_.info());
    if (is_plain_rgb()) {
        packed_.resize(delivered);
    } else if (delivered != row_bytes) {
        throw kUnableToReadData;
    }
    bool above_signed = false;
    session_.run(kUnableToReadData, [&] {
        for (int pass = 0; pass < passes; ++pass) {
            for (std::int32_t y = 0; y < height(); ++y) {
                read_row(image.row(y));
                if (is_16_bit_grey && pass + 1 == passes && !above_signed) {
                    above_signed = any_above_signed(image.row(y), row_bytes);
                }
            }
        }
        // A file that lacks its end is a file cut short.
        png_read_end(png, nullptr);
    });
    if (is_16_bit_grey) apply_sample_offset(image, above_signed);
}

// Samples are unsigned, pixels signed. A file that does not say what was subtracted from its
// samples, and has some that are too large, comes through with all of them moved down.
void PngReader::apply_sample_offset(Image& image, bool samples_above_signed) const {
    const std::int32_t offset = sample_offset_.value_or(
        static_cast<std::int16_t>(samples_above_signed ? kWholeRangeOffset : 0));
    image.set_sample_offset(offset);
    if (offset == 0 && !samples_above_signed) return;
    shift_unsigned_samples(image, offset);
}

}  // namespace zq
