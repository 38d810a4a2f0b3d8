// Encode, decode, compare.
#include "serialize/quality_trials.h"

#include <algorithm>
#include <span>
#include <string_view>
#include <utility>

#include "serialize/quality_payload.h"
#include "serialize/quality_seam.h"

namespace zq {

namespace {

// Of images up to here, and where every block is tried once, the touches are chosen, not only their
// share, as single pixels decide which quality is the truest.
constexpr std::int64_t kMostTouched = std::int64_t{1} << 12;

const std::uint8_t* at(const Image& image, std::int32_t x, std::int32_t y) {
    return image.row(y) + x * bytes_per_pixel(image.type());
}

// Whether `next` counts as the part on its left does.
bool continues(const SamplePart& part, const SamplePart& next) {
    return next.x == part.x + part.width && next.y == part.y && next.height == part.height &&
           next.count == part.count;
}

// Where few pixels are off, those of equal parts are added, so that each quality finds more of them
// to tell.
void add_equal_errors(std::span<const SamplePart> parts, std::span<const std::size_t> ends,
                      std::vector<PixelError>& errors) {
    constexpr std::size_t kEnough = 512;
    std::size_t before = 0;
    for (std::size_t copy = 0; errors.size() < kEnough && errors.size() != before; ++copy) {
        before = errors.size();
        for (std::size_t i = 0, at = 0; i < parts.size(); at = ends[i++]) {
            if (copy >= parts[i].others.size()) continue;
            for (; at < ends[i]; ++at) {
                const std::uint64_t place = errors[at].index - parts[i].index;
                errors.push_back({parts[i].others[copy] + place, errors[at].squared});
            }
        }
    }
}

}  // namespace

Trials::Trials(const QualitySample& sample, int touches)
    : sample_(sample),
      touches_(touches),
      measure_(error_measure_of(sample.picture().type())),
      is_touched_((sample.is_exact() && !sample.is_whole()) ||
                  pixels_of(sample.picture()) <= kMostTouched) {
    if (is_jpeg_type(sample.picture().type())) round_trip_.emplace(sample.picture());
}

double Trials::attempt(int quality) {
    std::optional<Bytes> payload = make(quality);
    const double left = left_after_touches();
    attempts_.push_back({quality, left});
    if (best_.quality == 0 || left < sample_.confidence() * best_left_) {
        best_left_ = left;
        best_.quality = quality;
        result_.swap(best_result_);
        if (sample_.is_whole()) best_.payload = std::move(payload);
    }
    return left;
}

bool Trials::is_truest() const {
    return best_.quality == touches_ && best_left_ > 0 &&
           std::ranges::all_of(attempts_,
                               [&](const Attempt& other) { return other.left >= best_left_; });
}

std::vector<int> Trials::near_best(double factor) const {
    std::vector<int> qualities;
    for (const Attempt& attempt : attempts_) {
        if (attempt.left <= factor * best_left_) qualities.push_back(attempt.quality);
    }
    return qualities;
}

double Trials::touched_error(int quality) {
    make(quality);
    const Errors errors = errors_in_result();
    return errors.total * touched_part_of(errors);
}

QualityChoice Trials::take() {
    best_.errors = pixel_errors(*best_result_);
    if (sample_.is_whole() && best_result_->type() == PixelType::kHsl) {
        best_.crossed_hues = zq::crossed_hues(sample_.picture(), *best_result_);
    }
    return std::move(best_);
}

QualityChoice Trials::take(int quality) {
    make(quality);
    return {
        .quality = quality, .payload = {}, .errors = pixel_errors(*result_), .crossed_hues = {}};
}

std::unique_ptr<Image> Trials::blank() const {
    const ImageRecord& record = sample_.picture().record();
    auto image = std::make_unique<Image>(Variant::kPrivate, std::string_view());
    image->reinitialise(
        {.type = record.type, .width = record.width, .height = record.height, .border = 0});
    return image;
}

// Makes result_; also the payload, where that takes one.
std::optional<Bytes> Trials::make(int quality) {
    if (result_ == nullptr) result_ = blank();
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

Errors Trials::errors_in_result() const {
    Errors all;
    const auto parts = sample_.parts();
    for (std::size_t i = 0; i < parts.size();) {
        const SamplePart& first = parts[i++];
        std::int32_t width = first.width;
        while (i < parts.size() && continues(parts[i - 1], parts[i])) width += parts[i++].width;
        Errors errors;
        for (std::int32_t y = first.y; y < first.y + first.height; ++y) {
            measure_.add_row(at(sample_.picture(), first.x, y), at(*result_, first.x, y), width,
                             errors);
        }
        all.total += first.count * errors.total;
        all.pixels += errors.pixels;
    }
    return all;
}

double Trials::touched_part_of(const Errors& errors) const {
    return touched_part(errors.total, errors.pixels, result_->type(), touches_);
}

double Trials::left_after_touches() const {
    const Errors errors = errors_in_result();
    if (!is_touched_) return errors.total * (1 - touched_part_of(errors));
    std::vector<PixelError> pixels = pixel_errors(*result_);
    return errors.total - total_of(choose_touches(pixels, result_->type(), touches_));
}

std::vector<PixelError> Trials::pixel_errors(const Image& result) const {
    std::vector<PixelError> errors;
    errors.reserve(static_cast<std::size_t>(pixels_of(result)));
    std::vector<std::size_t> ends;  // of the errors of each part
    for (const SamplePart& part : sample_.parts()) {
        add_pixel_errors(part, result, errors);
        ends.push_back(errors.size());
    }
    add_equal_errors(sample_.parts(), ends, errors);
    return errors;
}

void Trials::add_pixel_errors(const SamplePart& part, const Image& result,
                              std::vector<PixelError>& errors) const {
    const std::ptrdiff_t step = bytes_per_pixel(result.type());
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

}  // namespace zq
