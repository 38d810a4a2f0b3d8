// Trials: encode, decode, compare.
#include "serialize/quality_choice.h"

#include <algorithm>
#include <limits>
#include <memory>
#include <optional>
#include <string_view>
#include <vector>

#include "serialize/quality_blocks.h"
#include "serialize/quality_errors.h"
#include "serialize/quality_payload.h"
#include "serialize/quality_round_trip.h"
#include "serialize/quality_sample.h"
#include "serialize/quality_seam.h"

namespace zq {

namespace {

constexpr std::int64_t kMostWhole = std::int64_t{1} << 17;
// Up to here they are tried as a whole where a sample does not tell.
constexpr std::int64_t kMostDoubted = std::int64_t{1} << 20;
constexpr std::int64_t kMostDoubtedWavelets = std::int64_t{1} << 21;
// Of images up to here, and where every block is tried once, the touches are chosen, not only their
// share, as single pixels decide which quality is the truest.
constexpr std::int64_t kMostTouched = std::int64_t{1} << 12;

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
constexpr Evenness kWavelets = {1.015, 1.12, 1.1, 8, 4};
// The squared error of a sample up to which rounding has its part in it.
constexpr double kRounding = 2;
// Where the lowest quality comes nearer than that, nothing can be relied on.
constexpr double kSurelyWorse = 1.5;
constexpr double kSurelyTruer = 1.05;

const std::uint8_t* at(const Image& image, std::int32_t x, std::int32_t y) {
    return image.row(y) + x * bytes_per_pixel(image.type());
}

class Trials {
  public:
    // `touches` is the quality that pixels are told exactly by.
    Trials(const QualitySample& sample, int touches)
        : sample_(sample),
          touches_(touches),
          measure_(error_measure_of(sample.picture().type())),
          result_(blank()),
          best_result_(blank()) {
        if (is_jpeg_type(sample.picture().type())) round_trip_.emplace(sample.picture());
    }

    // The squared error that is left; the best quality so far is kept, of equal ones the first.
    double attempt(int quality) {
        std::optional<Bytes> payload = made(quality);
        const double total = left_after_touches();
        if (quality != touches_) least_of_others_ = std::min(least_of_others_, total);
        if (best_.quality == 0 || total < sample_.confidence() * best_total_) {
            best_total_ = total;
            best_.quality = quality;
            result_.swap(best_result_);
            if (sample_.is_whole()) best_.payload = std::move(payload);
        }
        return total;
    }

    // Without a comparison; of a sample that is not exact. The squared error, touches not counted.
    double accept(int quality) {
        made(quality);
        best_.quality = quality;
        result_.swap(best_result_);
        best_.errors = errors_of(*best_result_);
        return total_of(best_.errors);
    }

    double best_total() const { return best_total_; }
    // Whether the quality itself is the truest, and not exact; lower ones have so many times its
    // error at least.
    bool is_truest_by(double factor) const {
        return best_.quality == touches_ && best_total_ > 0 &&
               least_of_others_ >= factor * best_total_;
    }
    QualityChoice take() {
        if (best_.errors.empty()) best_.errors = errors_of(*best_result_);
        if (sample_.is_whole() && best_result_->type() == PixelType::kHsl) {
            best_.crossed_hues = zq::crossed_hues(sample_.picture(), *best_result_);
        }
        return std::move(best_);
    }

  private:
    std::unique_ptr<Image> blank() const {
        const ImageRecord& record = sample_.picture().record();
        auto image = std::make_unique<Image>(Variant::kPrivate, std::string_view());
        image->reinitialise(
            {.type = record.type, .width = record.width, .height = record.height, .border = 0});
        return image;
    }

    // Makes result_; also the payload, where that takes one.
    std::optional<Bytes> made(int quality) const {
        if (round_trip_) {
            round_trip_->decode(quality, *result_);
            return std::nullopt;
        }
        Bytes payload;
        put_payload(payload, sample_.picture(), quality, sample_.image());
        StreamReader reader(payload);
        read_payload(reader, *result_, PixelMemory::kUsed);
        return payload;
    }

    // Over all that the sample stands for, without touches.
    Errors errors_in(const Image& result) const {
        Errors all;
        for (const SamplePart& part : sample_.parts()) {
            Errors errors;
            for (std::int32_t y = part.y; y < part.y + part.height; ++y) {
                measure_.add_row(at(sample_.picture(), part.x, y), at(result, part.x, y),
                                 part.width, errors);
            }
            all.total += part.count * errors.total;
            all.pixels += errors.pixels;
        }
        return all;
    }

    double left_after_touches() const {
        const PixelType type = result_->type();
        const Errors errors = errors_in(*result_);
        if (!is_touched_) {
            return errors.total * (1 - touched_part(errors.total, errors.pixels, type, touches_));
        }
        std::vector<PixelError> pixels = errors_of(*result_);
        return errors.total - total_of(choose_touches(pixels, type, touches_));
    }

    std::vector<PixelError> errors_of(const Image& result) const {
        const std::ptrdiff_t step = bytes_per_pixel(result.type());
        std::vector<PixelError> errors;
        errors.reserve(static_cast<std::size_t>(pixels_of(result)));
        for (const SamplePart& part : sample_.parts()) {
            std::uint64_t index = part.index;
            for (std::int32_t y = part.y; y < part.y + part.height; ++y) {
                const std::uint8_t* from = at(sample_.picture(), part.x, y);
                const std::uint8_t* back = at(result, part.x, y);
                for (std::int32_t x = 0; x < part.width; ++x) {
                    const double squared = measure_.squared(from + x * step, back + x * step);
                    if (squared == 0) continue;
                    errors.push_back({index + static_cast<std::uint64_t>(x), squared});
                }
                index += sample_.image_width();
            }
        }
        return errors;
    }

    const QualitySample& sample_;
    const int touches_;
    const ErrorMeasure measure_;
    const bool is_touched_ =
        (sample_.is_exact() && !sample_.is_whole()) || pixels_of(sample_.picture()) <= kMostTouched;
    std::optional<JpegRoundTrip> round_trip_;
    std::unique_ptr<Image> result_;
    std::unique_ptr<Image> best_result_;
    QualityChoice best_{};
    double best_total_ = 0;
    double least_of_others_ = std::numeric_limits<double>::infinity();
};

// Whether the error fell as evenly as it does in photographs.
bool search(Trials& trials, const QualitySample& sample, int quality) {
    double above = trials.attempt(quality);
    const Image& picture = sample.picture();
    const Evenness& limits = is_jpeg_type(picture.type()) ? kJpeg : kWavelets;
    const bool to_the_lowest = sample.is_exact() && pixels_of(picture) <= kMostSearched;
    const double far = to_the_lowest ? std::numeric_limits<double>::infinity() : limits.far;
    // Of few different blocks any quality may be the truest.
    bool is_even = sample.is_whole() || !to_the_lowest;
    if (to_the_lowest && quality > 1) {
        is_even = trials.attempt(1) > kSurelyWorse * trials.best_total() && is_even;
    }
    // The lowest has been tried then.
    const int lowest = to_the_lowest ? 2 : 1;
    for (int lower = quality - 1; lower >= lowest && trials.best_total() > 0; --lower) {
        const double total = trials.attempt(lower);
        is_even =
            is_even && total > limits.least_ratio * above && total < limits.most_ratio * above;
        const bool is_near = quality - lower < limits.least_back;
        const double enough = is_even ? limits.enough : far;
        if (!(is_even && is_near) && total > enough * trials.best_total()) break;
        above = total;
    }
    return is_even;
}

QualityChoice best_of(const QualitySample& sample, int quality) {
    Trials trials(sample, quality);
    search(trials, sample, quality);
    return trials.take();
}

bool repeats_itself(const Image& picture) {
    return !different_blocks(picture).empty();
}

double samples_of(const Image& image) {
    const int channels = image.type() == PixelType::kU8 ? 1 : 3;
    return static_cast<double>(pixels_of(image)) * channels;
}

QualityChoice choose_large_jpeg(const Image& image, const QualitySample& strips, int quality) {
    // More trials would take too long. Photographs do without, as the steps of JPEG divide.
    Trials trials(strips, quality);
    const double error = trials.accept(quality);
    const bool is_nearly_exact = error < kRounding * samples_of(strips.picture());
    if (!is_nearly_exact && !has_few_values(strips.picture())) return trials.take();
    return best_of(QualitySample::lattice_of(image), quality);
}

}  // namespace

QualityChoice choose_quality(const Image& image, int quality) {
    if (pixels_of(image) <= kMostWhole) return best_of(QualitySample::whole_of(image), quality);
    const bool is_jpeg = is_jpeg_type(image.type());
    const QualitySample sample = QualitySample::strips_of(image);
    if (is_jpeg && repeats_itself(sample.picture())) {
        if (const auto blocks = QualitySample::blocks_of(image)) return best_of(*blocks, quality);
    }
    if (is_jpeg && pixels_of(image) > kMostDoubted) {
        return choose_large_jpeg(image, sample, quality);
    }
    Trials trials(sample, quality);
    const bool is_even = search(trials, sample, quality);
    const bool is_clear =
        is_jpeg ? trials.is_truest_by(kSurelyTruer) : is_even && trials.is_truest_by(1);
    if (is_clear) return trials.take();
    if (pixels_of(image) <= (is_jpeg ? kMostDoubted : kMostDoubtedWavelets)) {
        return best_of(QualitySample::whole_of(image), quality);
    }
    const auto tiles = QualitySample::tiles_of(image);
    return tiles ? best_of(*tiles, quality) : trials.take();
}

}  // namespace zq
