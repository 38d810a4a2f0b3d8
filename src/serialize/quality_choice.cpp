// Trials: encode, decode, compare.
#include "serialize/quality_choice.h"

#include <algorithm>
#include <limits>
#include <memory>
#include <string_view>
#include <vector>

#include "serialize/quality_errors.h"
#include "serialize/quality_payload.h"
#include "serialize/quality_sample.h"
#include "serialize/quality_seam.h"

namespace zq {

namespace {

constexpr std::int64_t kMostWhole = std::int64_t{1} << 17;
// Up to here they are tried as a whole where a sample does not tell.
constexpr std::int64_t kMostDoubted = std::int64_t{1} << 20;
// Of images up to here the touches are chosen, not only their share, as single pixels decide which
// quality is the truest.
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
// Where the lowest quality comes nearer than that, nothing can be relied on.
constexpr double kSurelyWorse = 1.5;
// What a sample says of the whole is not exact.
constexpr double kSampleMargin = 0.98;
constexpr double kSurelyTruer = 1.05;

class Trials {
  public:
    // `touches` is the quality that pixels are told exactly by.
    Trials(const QualitySample& sample, int touches)
        : sample_(sample),
          touches_(touches),
          measure_(error_measure_of(sample.picture().type())),
          result_(blank()),
          best_result_(blank()) {}

    // The squared error that is left; the best quality so far is kept, of equal ones the first.
    double attempt(int quality) {
        Bytes payload = made(quality);
        const double total = left_after_touches();
        if (quality != touches_) least_of_others_ = std::min(least_of_others_, total);
        if (best_.quality == 0 || total < margin_ * best_total_) {
            best_total_ = total;
            best_.quality = quality;
            result_.swap(best_result_);
            if (sample_.is_whole()) best_.payload = std::move(payload);
        }
        return total;
    }

    // Without a comparison; of a sample that is not the whole.
    void accept(int quality) {
        made(quality);
        best_.quality = quality;
        result_.swap(best_result_);
    }

    double best_total() const { return best_total_; }
    // Whether the quality itself is the truest, and not exact; lower ones have so many times its
    // error at least.
    bool is_truest_by(double factor) const {
        return best_.quality == touches_ && best_total_ > 0 &&
               least_of_others_ >= factor * best_total_;
    }
    QualityChoice take() {
        best_.errors = errors_of(*best_result_);
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

    // The payload, which result_ is decoded from.
    Bytes made(int quality) const {
        Bytes payload;
        put_payload(payload, sample_.picture(), quality);
        StreamReader reader(payload);
        read_payload(reader, *result_, PixelMemory::kUsed);
        return payload;
    }

    double left_after_touches() const {
        const PixelType type = result_->type();
        if (is_touched_) {
            std::vector<PixelError> errors = errors_of(*result_);
            return total_of(errors) - total_of(choose_touches(errors, type, touches_));
        }
        const Image& picture = sample_.picture();
        Errors errors;
        for (std::int32_t y = 0; y < picture.record().height; ++y) {
            measure_.add_row(picture.row(y), result_->row(y), picture.record().width, errors);
        }
        return errors.total * (1 - touched_part(errors.total, errors.pixels, type, touches_));
    }

    std::vector<PixelError> errors_of(const Image& result) const {
        const Image& picture = sample_.picture();
        const std::ptrdiff_t step = bytes_per_pixel(picture.type());
        std::vector<PixelError> errors;
        for (std::int32_t y = 0; y < picture.record().height; ++y) {
            const std::uint8_t* from = picture.row(y);
            const std::uint8_t* back = result.row(y);
            for (std::int32_t x = 0; x < picture.record().width; ++x) {
                const double squared = measure_.squared(from + x * step, back + x * step);
                if (squared == 0) continue;
                errors.push_back({sample_.index_of(x, y), squared});
            }
        }
        return errors;
    }

    const QualitySample& sample_;
    const int touches_;
    const ErrorMeasure measure_;
    const bool is_touched_ = pixels_of(sample_.picture()) <= kMostTouched;
    const double margin_ = sample_.is_whole() ? 1 : kSampleMargin;
    std::unique_ptr<Image> result_;
    std::unique_ptr<Image> best_result_;
    QualityChoice best_{};
    double best_total_ = 0;
    double least_of_others_ = std::numeric_limits<double>::infinity();
};

// Whether the error fell as evenly as it does in photographs.
bool search(Trials& trials, const Image& image, int quality) {
    double above = trials.attempt(quality);
    const std::int64_t pixels = pixels_of(image);
    const Evenness& limits = is_jpeg_type(image.type()) ? kJpeg : kWavelets;
    const bool to_the_lowest = pixels <= kMostSearched;
    const double far = to_the_lowest ? std::numeric_limits<double>::infinity() : limits.far;
    bool is_even = true;
    if (to_the_lowest && quality > 1) {
        is_even = trials.attempt(1) > kSurelyWorse * trials.best_total();
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

}  // namespace

QualityChoice choose_quality(const Image& image, int quality) {
    const QualitySample sample(image, kMostWhole);
    Trials trials(sample, quality);
    const bool is_jpeg = is_jpeg_type(image.type());
    const bool is_large = pixels_of(image) > kMostDoubted;
    if (is_jpeg && is_large && !sample.is_whole()) {
        // Trials would take too long. Photographs do without, as the steps of JPEG divide; drawn
        // patterns may get worse.
        trials.accept(quality);
        return trials.take();
    }
    const bool is_even = search(trials, image, quality);
    const bool is_clear =
        is_jpeg ? trials.is_truest_by(kSurelyTruer) : is_even && trials.is_truest_by(1);
    if (sample.is_whole() || is_large || is_clear) return trials.take();
    const QualitySample whole(image, kMostDoubted);
    Trials again(whole, quality);
    search(again, image, quality);
    return again.take();
}

}  // namespace zq
