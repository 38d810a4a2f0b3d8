// Which qualities are tried, and on what.
#include "serialize/quality_choice.h"

#include <algorithm>
#include <limits>
#include <optional>
#include <span>
#include <utility>
#include <vector>

#include "serialize/quality_blocks.h"
#include "serialize/quality_payload.h"
#include "serialize/quality_round_trip.h"
#include "serialize/quality_sample.h"
#include "serialize/quality_trials.h"

namespace zq {

namespace {

constexpr std::int64_t kMostWhole = std::int64_t{1} << 17;
// Of images up to here JPEG compares the few qualities that a sample leaves.
constexpr std::int64_t kMostCompared = std::int64_t{1} << 22;
constexpr std::int64_t kMostComparedDrawn = std::int64_t{1} << 24;
// Up to here wavelets find touches in the image itself, beyond in four tiles of it.
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
// Where fewer pixels of a sample are off, touches have too little to choose from.
constexpr std::size_t kFewPixels = 1024;
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

// In all of these touches come from the same sample at every quality, so that they grow with it,
// unless too few of its pixels are off.

// By the whole image, of the qualities that a sample leaves.
int truest_of(const Image& image, std::span<const int> qualities, Trials& touches) {
    if (qualities.size() == 1) return qualities.front();
    const std::vector<double> errors = squared_errors(image, qualities);
    int best = qualities.front();
    double least = std::numeric_limits<double>::infinity();
    for (std::size_t i = 0; i < qualities.size(); ++i) {
        const double left = errors[i] - touches.touched_error(qualities[i]);
        if (left < least) {
            least = left;
            best = qualities[i];
        }
    }
    return best;
}

QualityChoice choose_jpeg(const Image& image, int quality) {
    const QualitySample lattice = QualitySample::lattice_of(image);
    const QualitySample whole = QualitySample::whole_of(image);
    Trials trials(lattice, quality);
    search(trials, lattice, quality, kJpeg);
    if (trials.best_left() == 0) return best_of(whole, quality);
    const int best = truest_of(image, trials.near_best(kClearOfLattice), trials);
    QualityChoice choice = trials.take(best);
    return choice.errors.size() >= kFewPixels ? std::move(choice)
                                              : Trials(whole, quality).take(best);
}

double samples_of(const Image& image) {
    return static_cast<double>(pixels_of(image)) * (image.type() == PixelType::kU8 ? 1 : 3);
}

// Large pictures go by fives up to 80, where a single step may tell so little that only the whole
// picture would show it. In between touches alone make the difference.
int told_of(int quality) {
    return quality < 80 ? std::max(quality / 5 * 5, 1) : quality;
}

// There is no time for more than the strips where photographs are large.
QualityChoice choose_large_jpeg(const Image& image, const QualitySample& strips, int quality) {
    const int told = told_of(quality);
    Trials trials(strips, quality);
    const bool is_even = search(trials, strips, told, kLargeJpeg);
    const bool is_rounded = trials.best_left() < kRounding * samples_of(strips.picture());
    if (is_even && !is_rounded) return trials.take();
    const QualitySample lattice = QualitySample::lattice_of(image);
    Trials more(lattice, quality);
    search(more, lattice, told, kJpeg);
    const double clear = pixels_of(image) <= kMostComparedDrawn ? kClearOfLattice : 1;
    const int best = truest_of(image, more.near_best(clear), trials);
    QualityChoice choice = trials.take(best);
    return choice.errors.size() >= kFewPixels ? std::move(choice) : more.take(best);
}

QualityChoice choose_wavelets(const Image& image, int quality) {
    const QualitySample part = QualitySample::strips_of(image);
    Trials trials(part, quality);
    const bool is_clear = search(trials, part, quality, kWavelets) && trials.is_truest();
    const auto larger = pixels_of(image) <= kMostWholeWavelets
                            ? std::optional(QualitySample::whole_of(image))
                            : QualitySample::tiles_of(image);
    if (!larger) return trials.take();
    Trials more(*larger, quality);
    if (is_clear) {
        more.attempt(quality);
    } else {
        search(more, *larger, quality, kWavelets);
    }
    return more.take();
}

}  // namespace

QualityChoice choose_quality(const Image& image, int quality) {
    if (pixels_of(image) <= kMostWhole) return best_of(QualitySample::whole_of(image), quality);
    if (!is_jpeg_type(image.type())) return choose_wavelets(image, quality);
    const QualitySample strips = QualitySample::strips_of(image);
    if (repeats_itself(strips.picture())) {
        if (const auto blocks = QualitySample::blocks_of(image)) return best_of(*blocks, quality);
    }
    return pixels_of(image) <= kMostCompared ? choose_jpeg(image, quality)
                                             : choose_large_jpeg(image, strips, quality);
}

}  // namespace zq
