// Which qualities are tried, and on what.
#include "serialize/quality_choice.h"

#include <limits>
#include <span>

#include "serialize/quality_blocks.h"
#include "serialize/quality_payload.h"
#include "serialize/quality_sample.h"
#include "serialize/quality_trials.h"

namespace zq {

namespace {

constexpr std::int64_t kMostWhole = std::int64_t{1} << 17;
// Of images up to here JPEG compares the few qualities that a sample leaves.
constexpr std::int64_t kMostCompared = std::int64_t{1} << 22;
// Wavelets try the whole image where a sample does not tell.
constexpr std::int64_t kMostWholeWavelets = std::int64_t{1} << 21;

// How far back lower qualities are tried: where the error grows as evenly as it does in
// photographs, `least_back` and until it is `enough` times the best; where it does not, until
// it is `far` times the best, and to the lowest in small images, where colours that clip may make
// some low quality exact.
constexpr std::int64_t kMostSearched = std::int64_t{1} << 15;
struct Evenness {
    double least_ratio, most_ratio;  // from one quality to the next
    double enough, far;
    int least_back;
};
constexpr Evenness kJpeg = {1, 1.3, 1.25, 2, 2};
constexpr Evenness kLargeJpeg = {0.999, 1.3, 1.1, 2, 2};
constexpr Evenness kWavelets = {1.015, 1.12, 1.1, 8, 4};
// Where the lowest quality comes nearer than that, nothing can be relied on.
constexpr double kSurelyWorse = 1.5;
// The mean squared error up to which rounding to whole samples has its part in it.
constexpr double kRounding = 2;
// A quality is the truest if all others have that many times its error in a lattice.
constexpr double kClearOfLattice = 1.02;

// Whether the error fell as evenly as it does in photographs.
bool search(Trials& trials, const QualitySample& sample, int quality, const Evenness& limits) {
    double above = trials.attempt(quality);
    const bool to_the_lowest = sample.is_exact() && pixels_of(sample.picture()) <= kMostSearched;
    const double far = to_the_lowest ? std::numeric_limits<double>::infinity() : limits.far;
    // Of few different blocks any quality may be the truest.
    bool is_even = sample.is_whole() || !to_the_lowest;
    if (to_the_lowest && quality > 1) {
        is_even = trials.attempt(1) > kSurelyWorse * trials.best_left() && is_even;
    }
    // The lowest has been tried then.
    const int lowest = to_the_lowest ? 2 : 1;
    for (int lower = quality - 1; lower >= lowest && trials.best_left() > 0; --lower) {
        const double total = trials.attempt(lower);
        is_even =
            is_even && total > limits.least_ratio * above && total < limits.most_ratio * above;
        const bool is_near = quality - lower < limits.least_back;
        const double enough = is_even ? limits.enough : far;
        if (!(is_even && is_near) && total > enough * trials.best_left()) break;
        above = total;
    }
    return is_even;
}

const Evenness& limits_for(const Image& image) {
    return is_jpeg_type(image.type()) ? kJpeg : kWavelets;
}

QualityChoice best_of(const QualitySample& sample, int quality) {
    Trials trials(sample, quality);
    search(trials, sample, quality, limits_for(sample.image()));
    return trials.take();
}

bool repeats_itself(const Image& picture) {
    return !different_blocks(picture).empty();
}

// With the touches that the strips give.
int truest_of(const Image& image, std::span<const int> qualities, int quality, Trials& strips) {
    const QualitySample sample = QualitySample::whole_of(image);
    Trials whole(sample, quality);
    int best = quality;
    double least = std::numeric_limits<double>::infinity();
    for (const int candidate : qualities) {
        const double left = whole.error(candidate) - strips.touched_error(candidate);
        if (left < least) {
            least = left;
            best = candidate;
        }
    }
    return best;
}

double samples_of(const Image& image) {
    return static_cast<double>(pixels_of(image)) * (image.type() == PixelType::kU8 ? 1 : 3);
}

// Touches always come from the strips, so that they grow with the quality.
QualityChoice choose_jpeg(const Image& image, const QualitySample& strips, int quality) {
    const bool is_large = pixels_of(image) > kMostCompared;
    Trials touched(strips, quality);
    // There is no time for more where photographs are large.
    if (is_large && search(touched, strips, quality, kLargeJpeg) &&
        touched.best_left() > kRounding * samples_of(strips.picture())) {
        return touched.take();
    }
    const QualitySample lattice = QualitySample::lattice_of(image);
    Trials trials(lattice, quality);
    search(trials, lattice, quality, kJpeg);
    // Where the samples are empty there is little in the image, but they do not tell what.
    const bool is_blank = trials.best_left() == 0 || touched.error(quality) == 0;
    if (is_large) return is_blank ? trials.take() : touched.take(trials.best_quality());
    if (is_blank) return best_of(QualitySample::whole_of(image), quality);
    const auto near = trials.near_best(kClearOfLattice);
    return touched.take(near.size() == 1 ? near.front() : truest_of(image, near, quality, touched));
}

QualityChoice choose_wavelets(const Image& image, int quality) {
    const QualitySample sample = QualitySample::strips_of(image);
    Trials trials(sample, quality);
    if (search(trials, sample, quality, kWavelets) && trials.is_truest()) return trials.take();
    if (pixels_of(image) <= kMostWholeWavelets) {
        return best_of(QualitySample::whole_of(image), quality);
    }
    const auto tiles = QualitySample::tiles_of(image);
    return tiles ? best_of(*tiles, quality) : trials.take();
}

}  // namespace

QualityChoice choose_quality(const Image& image, int quality) {
    if (pixels_of(image) <= kMostWhole) return best_of(QualitySample::whole_of(image), quality);
    if (!is_jpeg_type(image.type())) return choose_wavelets(image, quality);
    const QualitySample strips = QualitySample::strips_of(image);
    if (repeats_itself(strips.picture())) {
        if (const auto blocks = QualitySample::blocks_of(image)) return best_of(*blocks, quality);
    }
    return choose_jpeg(image, strips, quality);
}

}  // namespace zq
