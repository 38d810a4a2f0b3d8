// Which pixels are told exactly, and how.
#include "serialize/quality_touches.h"

#include <algorithm>
#include <cstring>
#include <numeric>

#include "serialize/quality_pixel_list.h"

namespace zq {

namespace {

// Of the squared error, for each quality: 0.0002 dB of a large picture. In small ones that would be
// less than one pixel, and of small errors less than one unit.
constexpr double kPart = 5e-5;
constexpr double kPartOfPixel = 1.001;  // so that equal errors leave no two qualities equal
constexpr double kUnits = 4;
constexpr double kMostPart = 0.005;

double part_of(double total, std::size_t pixels, PixelType type) {
    const bool is_float = type == PixelType::kSgl || type == PixelType::kComplex;
    const double part = std::max(kPart, kPartOfPixel / static_cast<double>(pixels));
    return is_float ? part : std::max(part, std::min(kUnits / total, kMostPart));
}

std::size_t pixel_bytes(const Image& image) {
    return static_cast<std::size_t>(bytes_per_pixel(image.type()));
}

// Largest first, each that still fits: the errors of the pixels taken add up to `wanted` as nearly
// as can be from below. They are moved to the front; returns how many they are.
std::size_t take_up_to(std::span<PixelError> errors, double wanted) {
    constexpr std::size_t kSorted = 512;
    const auto sorted = static_cast<std::ptrdiff_t>(std::min(kSorted, errors.size()));
    std::partial_sort(errors.begin(), errors.begin() + sorted, errors.end(),
                      [](const PixelError& a, const PixelError& b) {
                          return a.squared != b.squared ? a.squared > b.squared : a.index < b.index;
                      });
    std::size_t taken = 0;
    for (PixelError& error : errors) {
        if (error.squared > wanted) continue;
        wanted -= error.squared;
        std::swap(errors[taken++], error);
    }
    return taken;
}

// Calls `visit` with the index and the bytes of each pixel.
template <class Visit>
void for_each_touch(std::span<const std::uint8_t> touches, const Image& image, Visit&& visit) {
    for_each_listed(touches, image, [&](std::uint64_t index, StreamReader& reader) {
        visit(index, reader.bytes(pixel_bytes(image)));
    });
}

}  // namespace

double total_of(std::span<const PixelError> errors) {
    return std::accumulate(errors.begin(), errors.end(), 0.0,
                           [](double sum, const PixelError& e) { return sum + e.squared; });
}

double touched_part(double total, std::size_t pixels, PixelType type, int quality) {
    return total > 0 ? std::min(quality * part_of(total, pixels, type), 1.0) : 1.0;
}

std::span<PixelError> choose_touches(std::span<PixelError> errors, PixelType type, int quality) {
    const double total = total_of(errors);
    const double part = touched_part(total, errors.size(), type, quality);
    return part < 1 ? errors.first(take_up_to(errors, part * total)) : errors;
}

void put_touches(Bytes& out, const Image& image, std::span<PixelError> errors, int quality) {
    const OpenSection section(out);
    const auto taken = choose_touches(errors, image.type(), quality);
    std::ranges::sort(taken, {}, &PixelError::index);
    PixelListWriter list(out);
    for (const PixelError& error : taken) {
        list.put(error.index);
        put_bytes(out, {pixel_at(image, error.index), pixel_bytes(image)});
    }
    section.close();
}

std::span<const std::uint8_t> read_touches(StreamReader& reader, const Image& image) {
    const auto touches = reader.section();
    for_each_touch(touches, image, [](std::uint64_t, std::span<const std::uint8_t>) {});
    return touches;
}

void apply_touches(std::span<const std::uint8_t> touches, const Image& image) {
    for_each_touch(touches, image, [&](std::uint64_t index, std::span<const std::uint8_t> pixel) {
        std::memcpy(pixel_at(image, index), pixel.data(), pixel.size());
    });
}

}  // namespace zq
