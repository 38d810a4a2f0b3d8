// Squared distances.
#include "serialize/quality_errors.h"

#include <cmath>
#include <cstring>

#include "kernels/squared_error.h"
#include "serialize/quality_seam.h"

namespace zq {

namespace {

double square(double value) {
    return value * value;
}

template <class Sample, std::size_t kSamples>
double squared_distance(const std::uint8_t* a, const std::uint8_t* b) {
    Sample left[kSamples];
    Sample right[kSamples];
    std::memcpy(left, a, sizeof(left));
    std::memcpy(right, b, sizeof(right));
    if constexpr (sizeof(Sample) == 1) {
        int whole = 0;
        for (std::size_t i = 0; i < kSamples; ++i) {
            whole += (left[i] - right[i]) * (left[i] - right[i]);
        }
        return whole;
    }
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

template <Distance kDistance, int kStep>
void add_row(const std::uint8_t* row, const std::uint8_t* back, std::int32_t pixels,
             Errors& errors) {
    for (std::int32_t x = 0; x < pixels; ++x, row += kStep, back += kStep) {
        const double squared = kDistance(row, back);
        errors.total += squared;
        errors.pixels += squared != 0 ? 1 : 0;
    }
}

template <auto kKernel>
void add_byte_row(const std::uint8_t* row, const std::uint8_t* back, std::int32_t pixels,
                  Errors& errors) {
    const SquaredError error = kKernel(row, back, static_cast<std::size_t>(pixels));
    errors.total += static_cast<double>(error.total);
    errors.pixels += error.pixels;
}

template <Distance kDistance, int kStep>
constexpr ErrorMeasure measure_by() {
    return {kDistance, add_row<kDistance, kStep>};
}

}  // namespace

ErrorMeasure error_measure_of(PixelType type) {
    switch (type) {
        case PixelType::kU8:
            return {squared_distance<std::uint8_t, 1>, add_byte_row<squared_error_u8>};
        case PixelType::kI16:
            return measure_by<squared_distance<std::int16_t, 1>, 2>();
        case PixelType::kSgl:
            return measure_by<squared_distance<float, 1>, 4>();
        case PixelType::kComplex:
            return measure_by<squared_distance<float, 2>, 8>();
        case PixelType::kRgb:
            return {squared_distance<std::uint8_t, 3>, add_byte_row<squared_error_bgrx>};
        case PixelType::kHsl:
            return measure_by<squared_hsl_distance, 4>();
        default:
            return measure_by<squared_distance<std::uint16_t, 3>, 8>();
    }
}

}  // namespace zq
