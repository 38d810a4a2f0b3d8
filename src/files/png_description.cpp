// What a PNG says of its picture.
#include "files/png_description.h"

#include <algorithm>
#include <array>

#include "files/png_texts.h"

namespace zq {

namespace {

// The unit codes of images end below this one.
constexpr std::int32_t kFirstUnknownUnit = 12;
constexpr std::int32_t kFullDepth = 16;

bool is_calibrated(const PixelView& pixels) {
    return pixels.calibration.x_step != 0 && pixels.calibration.y_step != 0;
}

void set_palette(png_structp png, png_infop info, std::span<const std::uint32_t> table,
                 bool has_alpha) {
    std::array<png_color, kColourTableSize> palette;
    std::array<png_byte, kColourTableSize> alpha;
    for (std::size_t i = 0; i < kColourTableSize; ++i) {
        const std::uint32_t entry = table[i];
        palette[i] = {static_cast<png_byte>(entry >> 16), static_cast<png_byte>(entry >> 8),
                      static_cast<png_byte>(entry)};
        alpha[i] = static_cast<png_byte>(entry >> 24);
    }
    png_set_PLTE(png, info, palette.data(), kColourTableSize);
    if (has_alpha) png_set_tRNS(png, info, alpha.data(), kColourTableSize, nullptr);
}

void set_calibration(png_structp png, png_infop info, const PixelView& pixels) {
    if (!is_calibrated(pixels)) return;
    if (pixels.calibration.unit >= kFirstUnknownUnit) png_warning(png, "unknown unit");
    const PixelsPerUnit count = pixels_per_unit(pixels.calibration);
    png_set_pHYs(png, info, count.x, count.y,
                 count.is_metre ? PNG_RESOLUTION_METER : PNG_RESOLUTION_UNKNOWN);
}

void set_significant_bits(png_structp png, png_infop info, std::int32_t bit_depth) {
    const auto bits = static_cast<png_byte>(bit_depth != 0 ? bit_depth : kFullDepth);
    const png_color_8 significant = {bits, bits, bits, bits, bits};
    png_set_sBIT(png, info, &significant);
}

// Of entries that are equally near the first counts.
png_byte nearest_entry(std::span<const std::uint32_t> table, const ZqPngSettings& settings) {
    std::size_t nearest = 0;
    std::int64_t least = INT64_MAX;
    for (std::size_t i = 0; i < table.size(); ++i) {
        const auto squared = [](std::int64_t entry, std::int64_t wanted) {
            const std::int64_t apart = entry - std::min<std::int64_t>(wanted, 255);
            return apart * apart;
        };
        const std::int64_t distance = squared(table[i] >> 16 & 255, settings.backgroundRed) +
                                      squared(table[i] >> 8 & 255, settings.backgroundGreen) +
                                      squared(table[i] & 255, settings.backgroundBlue);
        if (distance >= least) continue;
        least = distance;
        nearest = i;
    }
    return static_cast<png_byte>(nearest);
}

void set_background(png_structp png, png_infop info, const WriteJob& job, const PngLayout& layout,
                    const ZqPngSettings& settings) {
    const std::uint32_t most = layout.depth == 16 ? 65535 : 255;
    const auto sample = [most](std::uint32_t value) {
        return static_cast<png_uint_16>(std::min(value, most));
    };
    png_color_16 background{};
    background.index = nearest_entry(job.colour_table, settings);
    background.red = sample(settings.backgroundRed);
    background.green = sample(settings.backgroundGreen);
    background.blue = sample(settings.backgroundBlue);
    background.gray = static_cast<png_uint_16>(
        (77U * background.red + 150U * background.green + 29U * background.blue) >> 8);
    png_set_bKGD(png, info, &background);
}

// Values that make no colour space are a mere warning to libpng then: it leaves the chunk out.
void set_colour_space(png_structp png, png_infop info, const ZqPngSettings& settings) {
    png_set_benign_errors(png, 1);
    if (settings.gamma != 0) png_set_gAMA_fixed(png, info, settings.gamma);
    const std::int32_t* c = settings.chromaticities;
    if (std::all_of(c, c + 8, [](std::int32_t value) { return value == 0; })) return;
    png_set_cHRM_fixed(png, info, c[0], c[1], c[2], c[3], c[4], c[5], c[6], c[7]);
}

void add_payload(std::vector<PngChunk>& chunks, std::string_view name,
                 std::span<const std::uint8_t> payload) {
    if (!payload.empty()) chunks.push_back(make_payload(name, payload));
}

}  // namespace

void set_png_description(png_structp png, png_infop info, const WriteJob& job,
                         const PngLayout& layout, const ZqPngSettings& settings) {
    if (layout.colour_type == PNG_COLOR_TYPE_PALETTE) {
        set_palette(png, info, job.colour_table, layout.table_has_alpha);
    }
    set_calibration(png, info, job.pixels);
    if (layout.depth == 16) set_significant_bits(png, info, job.pixels.bit_depth);
    set_background(png, info, job, layout, settings);
    set_colour_space(png, info, settings);
}

std::vector<PngChunk> make_png_chunks(const PixelView& pixels, const PngLayout& layout,
                                      const PngVision* vision) {
    std::vector<PngChunk> chunks;
    if (is_calibrated(pixels)) chunks.push_back(make_pixel_size(pixels.calibration));
    if (layout.sample_offset != 0) {
        chunks.push_back(make_sample_offset(static_cast<std::int16_t>(layout.sample_offset)));
    }
    if (layout.depth == 16 && pixels.bit_depth != 0) {
        chunks.push_back(make_significant_bits(static_cast<std::uint32_t>(pixels.bit_depth)));
    }
    if (vision != nullptr) {
        add_payload(chunks, kTimingChunk, vision->timing);
        add_payload(chunks, kObjectsChunk, vision->objects);
        add_payload(chunks, kPrivateObjectsChunk, vision->private_objects);
    }
    chunks.push_back(make_deflated_text({std::string(kVersionKeyword), std::string(kPngVersion)}));
    if (vision != nullptr) {
        for (const PngText& text : vision->texts) chunks.push_back(make_text(text));
    }
    return chunks;
}

}  // namespace zq
