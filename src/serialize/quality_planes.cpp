// Tiles of wavelet coefficients, each range-coded on its own.
#include "serialize/quality_planes.h"

#include <algorithm>
#include <cmath>
#include <memory>

#include "codecs/band_coder.h"
#include "codecs/wavelet.h"
#include "serialize/quality_samples.h"
#include "serialize/quality_steps.h"

namespace zq {

namespace {

// The ranges of a block and what follows from them.
struct Plan {
    PlaneLayout layout;
    SampleRanges ranges;
    std::array<SampleScale, kMostPlanes> scales;
    std::array<WaveletSteps, kMostPlanes> steps{};

    Plan(PixelType type, const SampleRanges& found)
        : layout(plane_layout(type)), ranges(found), scales{} {
        for (std::size_t i = 0; i < kMostPlanes; ++i) scales[i] = scale_of(ranges[i], layout);
    }
    // Then the ranges say all.
    bool is_constant() const {
        return std::all_of(ranges.begin(),
                           ranges.begin() + static_cast<std::ptrdiff_t>(layout.ranges),
                           [](const SampleRange& range) { return range.is_constant(); });
    }
};

// Memory for one tile, used for all of them in turn.
class Workbench {
  public:
    Workbench(const Image& image, std::size_t planes)
        : width_(std::min(kTileSide, image.record().width)),
          height_(std::min(kTileSide, image.record().height)),
          samples_(std::make_unique_for_overwrite<float[]>(planes * kTileSide *
                                                           static_cast<std::size_t>(height_))),
          spare_(std::make_unique_for_overwrite<float[]>(static_cast<std::size_t>(width_))),
          coder_(width_) {
        for (std::size_t i = 0; i < planes; ++i) {
            rows_[i] = samples_.get() + i * kTileSide * static_cast<std::size_t>(height_);
        }
    }

    const PlaneRows& rows() const { return rows_; }
    Tile tile(std::size_t plane, const PixelRect& rect) const {
        return {rows_[plane], rect.width, rect.height, kTileSide};
    }
    float* spare() { return spare_.get(); }
    BandCoder& coder() { return coder_; }

  private:
    std::int32_t width_, height_;
    std::unique_ptr<float[]> samples_;
    std::unique_ptr<float[]> spare_;
    PlaneRows rows_{};
    BandCoder coder_;
};

template <class Visit>
void for_each_tile(const Image& image, Visit&& visit) {
    const ImageRecord& record = image.record();
    for (std::int32_t y = 0; y < record.height; y += std::min(kTileSide, record.height - y)) {
        for (std::int32_t x = 0; x < record.width; x += std::min(kTileSide, record.width - x)) {
            visit(PixelRect{x, y, std::min(kTileSide, record.width - x),
                            std::min(kTileSide, record.height - y)});
        }
    }
}

float step_of(const WaveletStep& step) {
    return std::ldexp(1.0F, step.exponent);
}

void encode_tile(Bytes& out, const Image& image, const PixelRect& rect, const Plan& plan,
                 Workbench& bench) {
    load_tile(image, rect, plan.scales, bench.rows());
    RangeEncoder coder(out);
    for (std::size_t plane = 0; plane < plan.layout.planes; ++plane) {
        const Tile tile = bench.tile(plane, rect);
        forward_wavelet(tile, bench.spare());
        bench.coder().reset();
        const auto bands = bands_of(tile);
        for (std::size_t i = 0; i < bands.size(); ++i) {
            const WaveletStep& step = plan.steps[plane][i];
            bench.coder().encode(coder, bands[i], step_of(step), step.least);
        }
    }
    coder.finish();
}

void decode_tile(std::span<const std::uint8_t> bytes, const PixelRect& rect, const Plan& plan,
                 Workbench& bench) {
    RangeDecoder coder(bytes);
    for (std::size_t plane = 0; plane < plan.layout.planes; ++plane) {
        const Tile tile = bench.tile(plane, rect);
        bench.coder().reset();
        const auto bands = bands_of(tile);
        for (std::size_t i = 0; i < bands.size(); ++i) {
            bench.coder().decode(coder, bands[i], step_of(plan.steps[plane][i]));
        }
        inverse_wavelet(tile, bench.spare());
    }
}

bool is_sound(const SampleRange& range, const PlaneLayout& layout) {
    if (!std::isfinite(range.low) || !std::isfinite(range.high) || range.low > range.high) {
        return false;
    }
    return layout.is_float ||
           (range.low >= layout.least && range.high <= layout.most &&
            range.low == std::floor(range.low) && range.high == std::floor(range.high));
}

SampleRanges read_ranges(StreamReader& reader, const PlaneLayout& layout) {
    SampleRanges ranges{};
    for (std::size_t i = 0; i < layout.ranges; ++i) {
        ranges[i].low = reader.f32();
        ranges[i].high = reader.f32();
        if (!is_sound(ranges[i], layout)) throw kInitializationError;
    }
    if (layout.ranges == 1) ranges.fill(ranges[0]);
    return ranges;
}

void read_steps(StreamReader& reader, Plan& plan) {
    for (std::size_t plane = 0; plane < plan.layout.planes; ++plane) {
        for (WaveletStep& step : plan.steps[plane]) {
            step.exponent = static_cast<std::int8_t>(reader.u8());
            if (step.exponent < kFinestStep || step.exponent > kCoarsestStep)
                throw kInitializationError;
        }
    }
}

void clear(const PlaneRows& rows, const PixelRect& rect, std::size_t planes) {
    for (std::size_t i = 0; i < planes; ++i) {
        std::fill_n(rows[i], std::ptrdiff_t{kTileSide} * rect.height, 0.0F);
    }
}

}  // namespace

void put_planes_of(Bytes& out, const Image& image, int quality, const Image& whole) {
    const PlaneLayout layout = plane_layout(image.type());
    Plan plan(image.type(), measure(whole, layout));
    for (std::size_t i = 0; i < layout.ranges; ++i) {
        put_f32(out, plan.ranges[i].low);
        put_f32(out, plan.ranges[i].high);
    }
    for (std::size_t i = 0; i < layout.planes; ++i) {
        const bool is_colour = i > 0 && !layout.is_float;
        plan.steps[i] = wavelet_steps(quality, is_colour, finest_step(plan.ranges[i], layout));
        for (const WaveletStep& step : plan.steps[i]) {
            out.push_back(static_cast<std::uint8_t>(step.exponent));
        }
    }
    put_lossless(out, image);
    if (plan.is_constant()) return;
    Workbench bench(image, layout.planes);
    for_each_tile(image, [&](const PixelRect& rect) {
        const OpenSection section(out);
        encode_tile(out, image, rect, plan, bench);
        section.close();
    });
}

// Once everything has been read and all memory is there, nothing can fail: so tiles go straight to
// the image.
void read_planes_of(StreamReader& reader, Image& image) {
    const PlaneLayout layout = plane_layout(image.type());
    Plan plan(image.type(), read_ranges(reader, layout));
    read_steps(reader, plan);
    const LosslessPlane lossless =
        read_lossless(reader, static_cast<std::size_t>(image.record().width),
                      static_cast<std::size_t>(image.record().height), layout.lossless_planes);
    std::vector<std::span<const std::uint8_t>> streams;
    if (!plan.is_constant()) {
        for_each_tile(image, [&](const PixelRect&) { streams.push_back(reader.section()); });
    }
    reader.expect_end();
    Workbench bench(image, layout.planes);
    std::size_t next = 0;
    for_each_tile(image, [&](const PixelRect& rect) {
        if (streams.empty()) {
            clear(bench.rows(), rect, layout.planes);
        } else {
            decode_tile(streams[next++], rect, plan, bench);
        }
        store_tile(image, rect, plan.scales, plan.ranges, lossless, bench.rows());
    });
}

}  // namespace zq
