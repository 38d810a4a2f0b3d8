// Writing PNG: libpng's chunks, and rows in the layout of the file. Rows that are no photograph's,
// or are not filtered, are libpng's to compress; stored ones are not.
#include "files/png_writer.h"

#include <algorithm>
#include <array>

#include "files/alpha_in_use.h"

#include "kernels/colour_rows.h"
#include "kernels/grey_range.h"
#include "kernels/png_samples.h"

namespace zq {

namespace {

constexpr std::int32_t kLargestSetting = 100;

void write_bytes(png_structp png, png_bytep bytes, std::size_t count) {
    auto* file = static_cast<OutputFile*>(png_get_io_ptr(png));
    if (!file->try_write(bytes, count)) PngSession::fail(png, file->last_error());
}

// The stream is flushed at the end, where a failure is seen.
void flush_nothing(png_structp) {}

std::int32_t lowest_of(const PixelView& pixels) {
    IntegerRange range;
    for (std::int32_t y = 0; y < pixels.height; ++y) {
        widen_range(reinterpret_cast<const std::int16_t*>(pixels.row(y)),
                    static_cast<std::size_t>(pixels.width), 1, 0, range);
    }
    return range.least;
}

// What the lowest value needs, whatever the image was read with.
std::int32_t choose_sample_offset(const PixelView& pixels) {
    if (pixels.packing == Packing::kUnsigned16) return 0;
    return std::min(lowest_of(pixels), 0);
}

}  // namespace

PngCompression png_compression(std::int32_t setting, int colour_type, bool has_transparency) {
    constexpr std::array<int, 5> kSingle = {PNG_FILTER_NONE, PNG_FILTER_SUB, PNG_FILTER_UP,
                                            PNG_FILTER_AVG, PNG_FILTER_PAETH};
    const std::int32_t strength = kLargestSetting - setting;
    const auto digit = static_cast<std::size_t>(strength % 10);
    PngCompression result{.level = std::min(strength / 10, 9)};
    if (digit < kSingle.size()) {
        result.filters = kSingle[digit];
    } else if (digit == kSingle.size()) {
        const bool photographic = (colour_type & PNG_COLOR_MASK_COLOR) != 0 &&
                                  (colour_type & PNG_COLOR_MASK_PALETTE) == 0;
        const bool grey_with_alpha = colour_type == PNG_COLOR_TYPE_GRAY_ALPHA;
        const bool all = (photographic || grey_with_alpha) && !has_transparency && strength >= 50;
        result.filters = all ? PNG_ALL_FILTERS : PNG_FILTER_NONE;
    }
    return result;
}

void PngWriter::check(const WriteJob& job) {
    const PixelView& pixels = job.pixels;
    const std::int32_t setting = job.options.words[0];
    if (job.options.present && (setting < 0 || setting > kLargestSetting)) throw kInvalidParameter;
    check_interchangeable(pixels);
}

PngWriter::PngWriter(OutputFile& file, const WriteJob& job, const PngVision* vision)
    : file_(file), job_(job), session_(PngSession::Use::kWrite) {
    if (vision != nullptr) settings_ = vision->settings;
    choose_layout();
    chunks_ = make_png_chunks(job.pixels, layout_, vision);
}

void PngWriter::choose_layout() {
    const PixelView& pixels = job_.pixels;
    layout_.depth = pixels.type == PixelType::kI16 || pixels.type == PixelType::kRgbU64 ? 16 : 8;
    switch (pixels.type) {
        case PixelType::kU8:
            layout_.colour_type =
                job_.colour_table.empty() ? PNG_COLOR_TYPE_GRAY : PNG_COLOR_TYPE_PALETTE;
            layout_.table_has_alpha =
                std::any_of(job_.colour_table.begin(), job_.colour_table.end(),
                            [](std::uint32_t entry) { return entry >> 24 != 0; });
            break;
        case PixelType::kI16:
            layout_.colour_type = PNG_COLOR_TYPE_GRAY;
            layout_.sample_offset = choose_sample_offset(pixels);
            if (layout_.sample_offset != 0) shifted_.resize(static_cast<std::size_t>(pixels.width));
            break;
        default:
            layout_.colour_type = has_alpha(pixels) ? PNG_COLOR_TYPE_RGB_ALPHA : PNG_COLOR_TYPE_RGB;
            break;
    }
}

// The functions up to set_transformations are called inside a step.

void PngWriter::set_header() {
    png_set_IHDR(session_.png(), session_.info(), static_cast<png_uint_32>(job_.pixels.width),
                 static_cast<png_uint_32>(job_.pixels.height), layout_.depth, layout_.colour_type,
                 PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
}

PngCompression PngWriter::compression() const {
    if (!job_.options.present) return {};
    return png_compression(job_.options.words[0], layout_.colour_type, layout_.table_has_alpha);
}

void PngWriter::set_compression() {
    const PngCompression chosen = compression();
    png_set_compression_level(session_.png(), chosen.level);
    png_set_filter(session_.png(), PNG_FILTER_TYPE_BASE, chosen.filters);
}

// libpng writes texts before chunks that it does not know; so it is given neither.
void PngWriter::write_chunks() {
    for (const PngChunk& chunk : chunks_) {
        png_write_chunk(session_.png(), chunk.name.data(), chunk.bytes.data(), chunk.bytes.size());
    }
}

void PngWriter::set_transformations() {
    const png_structp png = session_.png();
    if (layout_.depth == 16) png_set_swap(png);
    if ((layout_.colour_type & PNG_COLOR_MASK_COLOR) == 0 ||
        layout_.colour_type == PNG_COLOR_TYPE_PALETTE)
        return;
    png_set_bgr(png);
    if (layout_.colour_type == PNG_COLOR_TYPE_RGB && job_.pixels.packing != Packing::kPacked24) {
        png_set_filler(png, 0, PNG_FILLER_AFTER);
    }
}

void PngWriter::write_info() {
    session_.run(kUnableToWriteData, [this] {
        png_set_write_fn(session_.png(), &file_, write_bytes, flush_nothing);
        set_header();
        set_png_description(session_.png(), session_.info(), job_, layout_, settings_);
        set_compression();
        png_write_info(session_.png(), session_.info());
        write_chunks();
        set_transformations();
    });
    const PngCompression chosen = compression();
    if (chosen.filters == PNG_FILTER_NONE && chosen.level > 0) return;
    const std::size_t step = png_get_channels(session_.png(), session_.info()) *
                             static_cast<std::size_t>(layout_.depth / 8);
    const std::size_t row_bytes = static_cast<std::size_t>(job_.pixels.width) * step;
    if (chosen.level > 0 && !is_photograph(row_bytes, step)) return;
    pixels_.emplace(session_, chosen, row_bytes, step);
}

// By some rows from all over the picture. Drawings and tiny pictures are libpng's: they live from
// matches of all lengths.
bool PngWriter::is_photograph(std::size_t row_bytes, std::size_t step) {
    constexpr std::size_t kTiny = 65536, kDrawnPercent = 70;
    constexpr std::int32_t kSamples = 32;
    const std::int32_t height = job_.pixels.height;
    if (row_bytes < kTiny / static_cast<std::size_t>(height)) return false;
    std::vector<std::uint8_t> above(kPngMostStep + row_bytes), row = above, filtered(row_bytes);
    std::size_t sampled = 0, zeros = 0;
    for (std::int32_t i = 0; i < kSamples; ++i) {
        const auto y = static_cast<std::int32_t>(std::int64_t{height} * i / kSamples);
        if (y == 0) continue;
        put_row(y - 1, &above[kPngMostStep]);
        put_row(y, &row[kPngMostStep]);
        png_filter(PNG_FILTER_VALUE_PAETH, &row[kPngMostStep], &above[kPngMostStep], step,
                   filtered.data(), row_bytes);
        zeros +=
            static_cast<std::size_t>(std::count(filtered.begin(), filtered.end(), std::uint8_t{0}));
        sampled += row_bytes;
    }
    return zeros < sampled / 100 * kDrawnPercent;
}

const std::uint8_t* PngWriter::samples_of_row(std::int32_t y) {
    const std::uint8_t* row = job_.pixels.row(y);
    if (shifted_.empty()) return row;
    const auto* values = reinterpret_cast<const std::int16_t*>(row);
    for (std::size_t x = 0; x < shifted_.size(); ++x) {
        shifted_[x] = static_cast<std::uint16_t>(values[x] - layout_.sample_offset);
    }
    return reinterpret_cast<const std::uint8_t*>(shifted_.data());
}

// In the file's layout.
void PngWriter::put_row(std::int32_t y, std::uint8_t* to) {
    const std::uint8_t* from = samples_of_row(y);
    const auto width = static_cast<std::size_t>(job_.pixels.width);
    const bool has_alpha = layout_.colour_type == PNG_COLOR_TYPE_RGB_ALPHA;
    switch (job_.pixels.type) {
        case PixelType::kU8:
            std::memcpy(to, from, width);
            break;
        case PixelType::kI16:
            swap_bytes_16(from, to, width);
            break;
        case PixelType::kRgbU64:
            (has_alpha ? swap_red_blue_16 : bgra16_to_rgb16)(from, to, width);
            break;
        default:
            if (job_.pixels.packing == Packing::kPacked24) {
                bgr_to_rgb(from, to, width);
            } else {
                (has_alpha ? swap_red_blue : bgra_to_rgb)(from, to, width);
            }
            break;
    }
}

void PngWriter::write_rows() {
    if (pixels_) {
        for (std::int32_t y = 0; y < job_.pixels.height; ++y) {
            put_row(y, pixels_->row());
            pixels_->put_row();
        }
        return pixels_->finish();
    }
    session_.run(kUnableToWriteData, [this] {
        for (std::int32_t y = 0; y < job_.pixels.height; ++y) {
            png_write_row(session_.png(), samples_of_row(y));
        }
    });
}

// Nothing but the end itself stands behind the pixels; and libpng would miss those that it did not
// write.
void PngWriter::write_end() {
    session_.run(kUnableToWriteData, [this] {
        if (pixels_) {
            png_write_chunk(session_.png(), reinterpret_cast<png_const_bytep>("IEND"), nullptr, 0);
        } else {
            png_write_end(session_.png(), session_.info());
        }
    });
}

}  // namespace zq
