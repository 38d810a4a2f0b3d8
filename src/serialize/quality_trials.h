// Trials of qualities on a sample: what is left of the error at one after another.
#pragma once

#include <memory>
#include <optional>
#include <vector>

#include "image/image.h"
#include "serialize/quality_choice.h"
#include "serialize/quality_errors.h"
#include "serialize/quality_round_trip.h"
#include "serialize/quality_sample.h"
#include "serialize/quality_stream.h"
#include "serialize/quality_touches.h"

namespace zq {

// Borrows the sample. Errors are squared, and add up over all that the sample stands for.
class Trials {
  public:
    // `touches` is the quality that pixels are told exactly by.
    Trials(const QualitySample& sample, int touches);

    // The error that touches leave; the best quality so far is kept, of equal ones the first.
    double attempt(int quality);
    double best_left() const { return best_left_; }
    // Whether `touches` itself is the truest quality, and not exact.
    bool is_truest() const;
    // Those tried that have up to so many times the best one's error.
    std::vector<int> near_best(double factor) const;

    // What touches take away of the error.
    double touched_error(int quality);

    // What has come out best; nothing else may be called then.
    QualityChoice take();
    // The quality given, whatever has been tried.
    QualityChoice take(int quality);

  private:
    struct Attempt {
        int quality;
        double left;
    };

    std::unique_ptr<Image> blank() const;
    std::optional<Bytes> make(int quality);
    Errors errors_in_result() const;
    double touched_part_of(const Errors& errors) const;
    double left_after_touches() const;
    std::vector<PixelError> pixel_errors(const Image& result) const;
    void add_pixel_errors(const SamplePart& part, const Image& result,
                          std::vector<PixelError>& errors) const;

    const QualitySample& sample_;
    const int touches_;
    const ErrorMeasure measure_;
    const bool is_touched_;  // the touches are chosen, not only their share
    std::optional<JpegRoundTrip> round_trip_;
    std::unique_ptr<Image> result_;       // of the last one made
    std::unique_ptr<Image> best_result_;  // of the best attempt
    std::vector<Attempt> attempts_;
    QualityChoice best_{};
    double best_left_ = 0;
};

}  // namespace zq
