// Trials: encode, decode, compare.
#include "serialize/quality_choice.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <limits>

#include "serialize/quality_payload.h"
#include "serialize/quality_seam.h"

namespace zq {

namespace {

constexpr std::int64_t kMostWhole = std::int64_t{1} << 17;
// Of images up to here the touches are chosen, not only their share, as single pixels decide which
// quality is the truest.
constexpr std::int64_t kMostTouched = std::int64_t{1} << 12;

std::int64_t pixels_of(const Image& image) {
    return std::int64_t{image.record().width} * image.record().height;
}

struct SampleShape {
    std::int32_t width, height, strips;
};
constexpr SampleShape kJpegSample = {1024, 32, 4};
constexpr SampleShape kWaveletSample = {256, 256, 1};
constexpr std::int32_t kBlock = 8;  // JPEG blocks come out the same wherever they stand

// How far back lower qualities are tried: where the error grows as evenly as it does in
// photographs, `least_back` and until it is kClearlyWorse times the best; where it does not, until
// it is `far` times the best, and to the lowest in small images, where colours that clip may make
// some low quality exact.
constexpr std::int64_t kMostSearched = std::int64_t{1} << 15;
constexpr double kClearlyWorse = 1.1;
struct Evenness {
    double least_ratio, most_ratio;  // from one quality to the next
    double far;
    int least_back;
};
constexpr Evenness kJpeg = {1, 1.3, 2, 2};
constexpr Evenness kWavelets = {1.015, 1.12, 8, 4};
// Where the lowest quality comes nearer than that, nothing can be relied on.
constexpr double kSurelyWorse = 1.5;
// What a sample says of the whole is not exact.
constexpr double kSampleMargin = 0.98;

double square(double value) {
    return value * value;
}

template <class Sample, std::size_t kSamples>
double squared_distance(const std::uint8_t* a, const std::uint8_t* b) {
    Sample left[kSamples];
    Sample right[kSamples];
    std::memcpy(left, a, sizeof(left));
    std::memcpy(right, b, sizeof(right));
    double sum = 0;
    for (std::size_t i = 0; i < kSamples; ++i) {
        sum += square(static_cast<double>(left[i]) - static_cast<double>(right[i]));
    }
    return std::isfinite(sum) ? sum : 0;  // what is not finite is kept exactly
}

double squared_hsl_distance(const std::uint8_t* a, const std::uint8_t* b) {
    const std::uint8_t hue = a[kHueByte];
    const std::uint8_t back = crossed_seam(hue, b[kHueByte]) ? own_side(b[kHueByte]) : b[kHueByte];
    return squared_distance<std::uint8_t, 2>(a, b) + square(hue - back);
}

using Distance = double (*)(const std::uint8_t*, const std::uint8_t*);
Distance distance_of(PixelType type) {
    switch (type) {
        case PixelType::kU8:
            return squared_distance<std::uint8_t, 1>;
        case PixelType::kI16:
            return squared_distance<std::int16_t, 1>;
        case PixelType::kSgl:
            return squared_distance<float, 1>;
        case PixelType::kComplex:
            return squared_distance<float, 2>;
        case PixelType::kRgb:
            return squared_distance<std::uint8_t, 3>;
        case PixelType::kHsl:
            return squared_hsl_distance;
        default:
            return squared_distance<std::uint16_t, 3>;
    }
}

// The image itself, or a small picture of parts of it: for JPEG four strips of whole blocks, spread
// from the top left to the bottom right; else one rectangle from the middle.
class Sample {
  public:
    explicit Sample(const Image& image) : image_(image), part_(Variant::kPrivate, {}) {
        const ImageRecord& record = image.record();
        if (pixels_of(image) <= kMostWhole) return;
        const SampleShape& shape = is_jpeg_type(image.type()) ? kJpegSample : kWaveletSample;
        const std::int32_t width = std::min(record.width, shape.width);
        const std::int32_t height = std::min(record.height / kBlock * kBlock, shape.height);
        if (height == 0) return;
        is_whole_ = false;
        strips_ = height == shape.height ? shape.strips : 1;
        strip_height_ = height / strips_;
        part_.reinitialise({.type = record.type, .width = width, .height = height, .border = 0});
        copy();
    }

    bool is_whole() const { return is_whole_; }
    const Image& picture() const { return is_whole_ ? image_ : part_; }
    std::uint64_t index_of(std::int32_t x, std::int32_t y) const {
        const auto width = static_cast<std::uint64_t>(image_.record().width);
        if (is_whole_) return static_cast<std::uint64_t>(y) * width + static_cast<std::uint64_t>(x);
        const Corner corner = corner_of(y / strip_height_);
        return static_cast<std::uint64_t>(corner.y + y % strip_height_) * width +
               static_cast<std::uint64_t>(corner.x + x);
    }

  private:
    struct Corner {
        std::int32_t x, y;
    };

    Corner corner_of(std::int32_t strip) const {
        const auto at = [&](std::int32_t room) {
            const std::int64_t middle = std::int64_t{room} * (2 * strip + 1) / (2 * strips_);
            return static_cast<std::int32_t>(middle / kBlock * kBlock);
        };
        return {at(image_.record().width - part_.record().width),
                at(image_.record().height - strip_height_)};
    }

    void copy() const {
        const std::ptrdiff_t pixel = bytes_per_pixel(image_.type());
        const auto line = static_cast<std::size_t>(part_.record().width * pixel);
        for (std::int32_t y = 0; y < part_.record().height; ++y) {
            const Corner corner = corner_of(y / strip_height_);
            std::memcpy(part_.row(y), image_.row(corner.y + y % strip_height_) + corner.x * pixel,
                        line);
        }
    }

    const Image& image_;
    Image part_;
    bool is_whole_ = true;
    std::int32_t strips_ = 1;
    std::int32_t strip_height_ = 1;
};

class Trials {
  public:
    // `touches` is the quality that pixels are told exactly by.
    Trials(const Sample& sample, int touches)
        : sample_(sample), touches_(touches), result_(Variant::kPrivate, {}) {
        const ImageRecord& record = sample.picture().record();
        result_.reinitialise(
            {.type = record.type, .width = record.width, .height = record.height, .border = 0});
    }

    // The squared error that is left; the best quality so far is kept, of equal ones the first.
    double attempt(int quality) {
        Bytes payload;
        put_payload(payload, sample_.picture(), quality);
        StreamReader reader(payload);
        read_payload(reader, result_, PixelMemory::kUsed);
        measure();
        const double total = left_after_touches();
        if (best_.quality == 0 || total < margin_ * best_total_) {
            best_total_ = total;
            best_.quality = quality;
            best_.errors.swap(errors_);
            if (sample_.is_whole()) {
                best_.payload = std::move(payload);
                if (result_.type() == PixelType::kHsl) {
                    best_.crossed_hues = zq::crossed_hues(sample_.picture(), result_);
                }
            }
        }
        return total;
    }

    double best_total() const { return best_total_; }
    QualityChoice take() { return std::move(best_); }

  private:
    double left_after_touches() {
        const double total = total_of(errors_);
        if (is_touched_) return total - total_of(choose_touches(errors_, result_.type(), touches_));
        return total * (1 - touched_part(errors_, result_.type(), touches_));
    }

    void measure() {
        const Image& picture = sample_.picture();
        const Distance distance = distance_of(picture.type());
        const std::ptrdiff_t pixel = bytes_per_pixel(picture.type());
        errors_.clear();
        for (std::int32_t y = 0; y < picture.record().height; ++y) {
            const std::uint8_t* from = picture.row(y);
            const std::uint8_t* back = result_.row(y);
            for (std::int32_t x = 0; x < picture.record().width; ++x) {
                const double squared = distance(from + x * pixel, back + x * pixel);
                if (squared == 0) continue;
                errors_.push_back({sample_.index_of(x, y), squared});
            }
        }
    }

    const Sample& sample_;
    const int touches_;
    const bool is_touched_ = pixels_of(sample_.picture()) <= kMostTouched;
    const double margin_ = sample_.is_whole() ? 1 : kSampleMargin;
    Image result_;
    std::vector<PixelError> errors_;
    QualityChoice best_{};
    double best_total_ = 0;
};

}  // namespace

QualityChoice choose_quality(const Image& image, int quality) {
    const Sample sample(image);
    Trials trials(sample, quality);
    double above = trials.attempt(quality);
    const bool is_jpeg = is_jpeg_type(image.type());
    // Steps of JPEG divide so that large pictures do not get worse.
    if (is_jpeg && !sample.is_whole()) return trials.take();
    const Evenness& limits = is_jpeg ? kJpeg : kWavelets;
    const bool to_the_lowest = pixels_of(image) <= kMostSearched;
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
        const double enough = is_even ? kClearlyWorse : far;
        if (!(is_even && is_near) && total > enough * trials.best_total()) break;
        above = total;
    }
    return trials.take();
}

}  // namespace zq
