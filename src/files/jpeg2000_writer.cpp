// Writing JPEG 2000: one tile, one quality layer.
#include "files/jpeg2000_writer.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <string_view>

#include "files/alpha_in_use.h"
#include "files/jpeg2000_box_writer.h"
#include "files/jpeg2000_rows.h"
#include "files/unsigned_grey.h"

namespace zq {

namespace {

constexpr std::int32_t kBestQuality = 1000;

enum class Wavelet : std::int32_t { kChosen = 0, kInteger = 1, kFloat = 2 };

struct Settings {
    std::int32_t quality = kBestQuality;
    bool lossless = true;
    Wavelet wavelet = Wavelet::kChosen;

    bool is_float() const {
        return wavelet == Wavelet::kFloat || (wavelet == Wavelet::kChosen && !lossless);
    }
};

// Indices of a colour table mean nothing when they are nearly right.
Settings settings_of(const WriteJob& job) {
    const WriteOptions& options = job.options;
    Settings settings;
    if (!options.present) return settings;
    settings.quality = options.words[0];
    settings.wavelet = static_cast<Wavelet>(options.words[2]);
    const bool all_kept = settings.quality == kBestQuality && settings.wavelet != Wavelet::kFloat;
    settings.lossless = options.words[1] == 1 || all_kept || !job.colour_table.empty();
    return settings;
}

// Decibels between the picture and what is kept of it, relative to the whole range of samples.
// Samples of more than 8 bits seldom use it, so theirs are relative to the range that they do use.
float psnr_of(std::int32_t quality, const opj_image_t& samples, const Jpeg2000Samples& layout) {
    const float wanted = 25.0F + static_cast<float>(quality) / 50.0F;
    if (layout.bits <= 8) return wanted;
    OPJ_INT32 lowest = INT32_MAX, highest = INT32_MIN;
    for (int i = 0; i < layout.colours; ++i) {
        const opj_image_comp_t& component = samples.comps[i];
        const OPJ_INT32* const end = component.data + std::size_t{component.w} * component.h;
        for (const OPJ_INT32* sample = component.data; sample != end; ++sample) {
            lowest = std::min(lowest, *sample);
            highest = std::max(highest, *sample);
        }
    }
    const auto used = static_cast<float>(std::max(highest - lowest, 1));
    return wanted + 20 * std::log10(static_cast<float>((1 << layout.bits) - 1) / used);
}

bool is_plain_codestream(const char* path) {
    const std::string_view name(path);
    const std::size_t dot = name.rfind('.');
    if (dot == std::string_view::npos) return false;
    const std::string_view extension = name.substr(dot + 1);
    constexpr std::array<std::string_view, 3> kPlain = {"j2k", "j2c", "jpc"};
    return std::any_of(kPlain.begin(), kPlain.end(), [extension](std::string_view plain) {
        const auto same = [](char a, char b) { return (a >= 'A' && a <= 'Z' ? a + 32 : a) == b; };
        return std::equal(extension.begin(), extension.end(), plain.begin(), plain.end(), same);
    });
}

struct Range {
    std::int32_t lowest = 0, highest = 0;  // 0 included
};

Range range_of(const PixelView& pixels) {
    Range range;
    for (std::int32_t y = 0; y < pixels.height; ++y) {
        const auto* row = reinterpret_cast<const std::int16_t*>(pixels.row(y));
        const auto [lowest, highest] = std::minmax_element(row, row + pixels.width);
        range = {std::min<std::int32_t>(range.lowest, *lowest),
                 std::max<std::int32_t>(range.highest, *highest)};
    }
    return range;
}

// Unsigned where no value is negative, in the bits that the image has, and where the values were
// unsigned in the file that they came from and would come back the same; else signed. Pixels that
// change a little may leave the range in which a reader takes unsigned samples as they are.
void choose_grey16(const PixelView& pixels, bool lossless, Jpeg2000Samples& samples) {
    samples.bits = 16;
    if (pixels.packing == Packing::kUnsigned16) return;
    const Range range = range_of(pixels);
    const std::int32_t depth = pixels.bit_depth;
    if (lossless && pixels.sample_offset == kWholeRangeOffset && range.highest > 0) {
        samples.offset = kWholeRangeOffset;
    } else if (range.lowest < 0) {
        samples.is_signed = true;
    } else if (depth > 8 && depth < 16 && range.highest < 1 << depth) {
        samples.bits = depth;
    } else {
        samples.is_signed = !lossless;
    }
}

Jpeg2000Samples samples_of(const WriteJob& job, bool plain) {
    const PixelView& pixels = job.pixels;
    Jpeg2000Samples samples;
    switch (pixels.type) {
        case PixelType::kU8:
            break;
        case PixelType::kI16:
            choose_grey16(pixels, settings_of(job).lossless, samples);
            break;
        default:
            samples.colours = 3;
            samples.bits = pixels.type == PixelType::kRgbU64 ? 16 : 8;
            samples.alpha = !plain && has_alpha(pixels);
            break;
    }
    return samples;
}

// A picture halves at most as often as its shorter side allows.
int resolutions_of(const PixelView& pixels) {
    constexpr int kMost = 6;
    const auto shorter = static_cast<std::uint32_t>(std::min(pixels.width, pixels.height));
    return std::min(kMost, static_cast<int>(std::bit_width(shorter)));
}

opj_cparameters_t parameters_of(const WriteJob& job, const Jpeg2000Samples& layout,
                                const opj_image_t& samples) {
    const Settings settings = settings_of(job);
    opj_cparameters_t parameters;
    opj_set_default_encoder_parameters(&parameters);
    static char comment[] = "Zorvane Kemo";  // only read
    parameters.cp_comment = comment;
    parameters.numresolution = resolutions_of(job.pixels);
    parameters.tcp_mct = layout.colours == 3 ? 1 : 0;
    parameters.irreversible = settings.is_float() ? 1 : 0;
    parameters.tcp_numlayers = 1;
    if (settings.lossless || settings.quality == kBestQuality) {
        parameters.cp_disto_alloc = 1;
        parameters.tcp_rates[0] = 0;  // all there is
    } else {
        parameters.cp_fixed_quality = 1;
        parameters.tcp_distoratio[0] = psnr_of(settings.quality, samples, layout);
    }
    return parameters;
}

}  // namespace

void Jpeg2000Writer::check(const WriteJob& job, const char* path) {
    check_interchangeable(job.pixels);
    if (job.options.present) {
        const auto& words = job.options.words;
        if (words[0] < 0 || words[0] > kBestQuality) throw kInvalidParameter;
        if (words[1] != 0 && words[1] != 1) throw kInvalidParameter;
        if (words[2] < 0 || words[2] > 2) throw kWaveletTransform;
    }
    const Settings settings = settings_of(job);
    if (settings.lossless && settings.is_float()) throw kLosslessFloat;
    if (!job.colour_table.empty() && is_plain_codestream(path)) throw kInvalidFileFormat;
}

Jpeg2000Writer::Jpeg2000Writer(OutputFile& file, const WriteJob& job, const char* path)
    : file_(file), job_(job), plain_(is_plain_codestream(path)), layout_(samples_of(job, plain_)) {}

void Jpeg2000Writer::write_boxes() {
    if (plain_) return;
    const PixelView& pixels = job_.pixels;
    const std::vector<std::uint8_t> boxes =
        jp2_boxes(layout_, static_cast<std::uint32_t>(pixels.width),
                  static_cast<std::uint32_t>(pixels.height), job_.colour_table);
    file_.write(boxes.data(), boxes.size());
}

void Jpeg2000Writer::fill_row(opj_image_t& samples, std::int32_t y) const {
    const PixelView& pixels = job_.pixels;
    const auto width = static_cast<std::size_t>(pixels.width);
    const std::size_t first = static_cast<std::size_t>(y) * width;
    const std::uint8_t* const bytes = pixels.row(y);
    const auto* const words = reinterpret_cast<const std::uint16_t*>(bytes);
    const auto row = [&](std::uint32_t i) { return samples.comps[i].data + first; };
    const std::array<SampleRow, 3> rgb = {row(0), layout_.colours == 3 ? row(1) : nullptr,
                                          layout_.colours == 3 ? row(2) : nullptr};
    const SampleRow alpha = layout_.alpha ? row(3) : nullptr;
    if (pixels.type == PixelType::kU8) {
        bytes_to_samples(bytes, rgb[0], width);
    } else if (pixels.packing == Packing::kUnsigned16) {
        words_to_samples(words, rgb[0], width);
    } else if (pixels.type == PixelType::kI16) {
        const auto* const values = reinterpret_cast<const std::int16_t*>(bytes);
        signed_words_to_samples(values, rgb[0], width, layout_.offset);
    } else if (pixels.type == PixelType::kRgbU64) {
        colour_to_samples(words, 4, rgb, alpha, width);
    } else {
        colour_to_samples(bytes, pixels.packing == Packing::kPacked24 ? 3 : 4, rgb, alpha, width);
    }
}

Jpeg2000Image Jpeg2000Writer::make_samples() const {
    const PixelView& pixels = job_.pixels;
    std::array<opj_image_cmptparm_t, 4> components{};
    for (opj_image_cmptparm_t& component : components) {
        component.dx = component.dy = 1;
        component.w = static_cast<OPJ_UINT32>(pixels.width);
        component.h = static_cast<OPJ_UINT32>(pixels.height);
        component.prec = static_cast<OPJ_UINT32>(layout_.bits);
        component.sgnd = layout_.is_signed ? 1 : 0;
    }
    Jpeg2000Image samples(
        opj_image_create(static_cast<OPJ_UINT32>(layout_.count()), components.data(),
                         layout_.colours == 3 ? OPJ_CLRSPC_SRGB : OPJ_CLRSPC_GRAY));
    if (!samples) throw kNotEnoughMemory;
    samples->x1 = components[0].w;
    samples->y1 = components[0].h;
    for (std::int32_t y = 0; y < pixels.height; ++y) fill_row(*samples, y);
    return samples;
}

void Jpeg2000Writer::write_codestream() {
    const Jpeg2000Image samples = make_samples();
    const Jpeg2000Stream stream = open_jpeg2000_output(file_);
    const Jpeg2000Codec codec(opj_create_compress(OPJ_CODEC_J2K));
    if (!codec) throw kNotEnoughMemory;
    opj_cparameters_t parameters = parameters_of(job_, layout_, *samples);
    const bool done = opj_setup_encoder(codec.get(), &parameters, samples.get()) == OPJ_TRUE &&
                      opj_start_compress(codec.get(), samples.get(), stream.get()) == OPJ_TRUE &&
                      opj_encode(codec.get(), stream.get()) == OPJ_TRUE &&
                      opj_end_compress(codec.get(), stream.get()) == OPJ_TRUE;
    if (done) return;
    throw file_.last_error() != kSuccess ? file_.last_error() : kUnableToWriteData;
}

}  // namespace zq
