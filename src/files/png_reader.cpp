// Reading PNG. Rows of common layouts are decoded here; libpng delivers all others in the layout of
// the image's type, straight into the image.
#include "files/png_reader.h"

#include <cstring>

#include "base/checked.h"
#include "codecs/deflate.h"
#include "files/png_pixel_reader.h"
#include "files/write_job.h"
#include "kernels/colour_rows.h"
#include "kernels/png_samples.h"

namespace zq {

namespace {

// Everything but the picture is passed over unread: nothing that a file carries beside its pixels
// costs memory or can be wrong.
void skip_extras(png_structp png) {
    png_set_keep_unknown_chunks(png, PNG_HANDLE_CHUNK_NEVER, nullptr, -1);
}

}  // namespace

PngReader::PngReader(InputFile& file, std::optional<std::int16_t> sample_offset)
    : file_(file), session_(PngSession::Use::kRead), sample_offset_(sample_offset) {}

void PngReader::read_bytes(png_structp png, png_bytep bytes, std::size_t count) {
    auto& reader = *static_cast<PngReader*>(png_get_io_ptr(png));
    const bool is_head = count == reader.head_.size();
    if (is_head && reader.head_is_next_) {
        reader.head_is_next_ = false;
        std::memcpy(bytes, reader.head_.data(), count);
        return;
    }
    if (reader.file_.read_some(bytes, count) != count) PngSession::fail(png, kUnableToReadData);
    if (is_head) std::memcpy(reader.head_.data(), bytes, count);
}

void PngReader::read_info() {
    const png_structp png = session_.png();
    const png_infop info = session_.info();
    session_.run(kInvalidFileHeader, [this, png, info] {
        png_set_read_fn(png, this, read_bytes);
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

// Whole bytes in one pass, with no colour that stands for transparency.
bool PngReader::is_common() const {
    const bool has_key = (colour_type_ & PNG_COLOR_MASK_PALETTE) == 0 &&
                         (colour_type_ & PNG_COLOR_MASK_COLOR) != 0 &&
                         png_get_valid(session_.png(), session_.info(), PNG_INFO_tRNS) != 0;
    return depth_ >= 8 && !interlaced_ && !has_key && colour_type_ != PNG_COLOR_TYPE_GRAY_ALPHA;
}

// Called inside a step.
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
            if ((colour_type_ & PNG_COLOR_MASK_COLOR) == 0) png_set_gray_to_rgb(png);
            if (png_get_valid(png, session_.info(), PNG_INFO_tRNS) != 0) png_set_tRNS_to_alpha(png);
            png_set_filler(png, 0, PNG_FILLER_AFTER);
            png_set_bgr(png);
            break;
    }
}

void PngReader::read_uncommon(Image& image) {
    const png_structp png = session_.png();
    int passes = 0;
    session_.run(kUnableToReadData, [this, png, &passes] {
        set_transformations();
        passes = png_set_interlace_handling(png);
        png_read_update_info(png, session_.info());
    });
    const auto row_bytes =
        static_cast<std::size_t>(width()) * static_cast<std::size_t>(bytes_per_pixel(image.type()));
    if (png_get_rowbytes(png, session_.info()) != row_bytes) throw kUnableToReadData;
    session_.run(kUnableToReadData, [&] {
        for (int pass = 0; pass < passes; ++pass) {
            for (std::int32_t y = 0; y < height(); ++y) {
                png_read_row(png, image.row(y), nullptr);
                if (unsigned_rows_ && pass + 1 == passes) unsigned_rows_->add(y, 1);
            }
        }
    });
}

void PngReader::place_row(const std::uint8_t* from, std::uint8_t* to) const {
    const bool has_alpha = colour_type_ == PNG_COLOR_TYPE_RGB_ALPHA;
    switch (pixel_type()) {
        case PixelType::kI16:
            return swap_bytes_16(from, to, width_);
        case PixelType::kRgb:
            return (has_alpha ? swap_red_blue : rgb_to_bgra)(from, to, width_);
        default:
            return (has_alpha ? swap_red_blue_16 : rgb16_to_bgra16)(from, to, width_);
    }
}

// libpng has read the head of the first chunk of pixels, and goes on behind the last.
void PngReader::read_common(Image& image) {
    const auto step = static_cast<std::size_t>(bits_per_pixel()) / 8;
    const std::size_t row_bytes = checked_mul<std::size_t>(width_, step);
    PngPixelReader pixels(file_, head_, row_bytes, step);
    const bool is_direct = pixel_type() == PixelType::kU8;
    std::vector<std::uint8_t> row(is_direct ? 0 : row_bytes), above(row_bytes);
    const std::uint8_t* before = above.data();
    for (std::int32_t y = 0; y < height(); ++y) {
        std::uint8_t* to = image.row(y);
        if (is_direct) {
            pixels.read_row(before, to);
            before = to;
            continue;
        }
        pixels.read_row(above.data(), row.data());
        place_row(row.data(), to);
        if (unsigned_rows_) unsigned_rows_->add(y, 1);
        std::swap(row, above);
    }
    head_ = pixels.finish();
    head_is_next_ = true;
    session_.run(kUnableToReadData, [this] {
        // libpng would look for the end of what it did not inflate.
        png_set_keep_unknown_chunks(session_.png(), PNG_HANDLE_CHUNK_NEVER,
                                    reinterpret_cast<png_const_bytep>("IDAT"), 1);
    });
}

// Samples are unsigned, pixels signed. A file that does not say what was subtracted from its
// samples, and has some that are too large, comes through with all of them moved down.
void PngReader::read_pixels(Image& image) {
    if (pixel_type() == PixelType::kI16) unsigned_rows_.emplace(image, sample_offset_);
    if (is_common()) {
        read_common(image);
    } else {
        read_uncommon(image);
    }
    // A file that lacks its end is a file cut short.
    session_.run(kUnableToReadData, [this] { png_read_end(session_.png(), nullptr); });
    if (unsigned_rows_) image.set_sample_offset(unsigned_rows_->offset());
}

}  // namespace zq
