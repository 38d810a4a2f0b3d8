// Which pixels are told exactly, and how.
#include "serialize/quality_touches.h"

#include <algorithm>
#include <cstring>
#include <numeric>

namespace zq {

namespace {

// Of the squared error, for each quality: 0.0002 dB of a large picture. In small ones that would be
// less than one pixel, and of small errors less than one unit.
constexpr double kPart = 5e-5;
constexpr double kPartOfPixel = 0.5;
constexpr double kUnits = 4;
constexpr double kMostPart = 0.005;

double part_of(double total, std::size_t pixels, bool is_float) {
    const double part = std::max(kPart, kPartOfPixel / static_cast<double>(pixels));
    return is_float ? part : std::max(part, std::min(kUnits / total, kMostPart));
}

std::size_t pixel_bytes(const Image& image) {
    return static_cast<std::size_t>(bytes_per_pixel(image.type()));
}

std::uint8_t* pixel_at(const Image& image, std::uint64_t index) {
    const auto width = static_cast<std::uint64_t>(image.record().width);
    return image.row(static_cast<std::int32_t>(index / width)) +
           static_cast<std::size_t>(index % width) * pixel_bytes(image);
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

// Seven bits a byte, the lowest first; the highest bit says that more come.
void put_number(Bytes& out, std::uint64_t value) {
    for (; value > 0x7F; value >>= 7) out.push_back(static_cast<std::uint8_t>(value | 0x80));
    out.push_back(static_cast<std::uint8_t>(value));
}

std::uint64_t read_number(StreamReader& reader) {
    std::uint64_t value = 0;
    for (int shift = 0; shift < 63; shift += 7) {
        const std::uint8_t byte = reader.u8();
        value |= std::uint64_t{byte & 0x7FU} << shift;
        if (byte < 0x80) return value;
    }
    throw kInitializationError;
}

// Calls `visit` with the index and the bytes of each pixel.
template <class Visit>
void for_each_touch(std::span<const std::uint8_t> touches, const Image& image, Visit&& visit) {
    const std::uint64_t pixels = static_cast<std::uint64_t>(image.record().width) *
                                 static_cast<std::uint64_t>(image.record().height);
    StreamReader reader(touches);
    for (std::uint64_t next = 0; !reader.at_end(); ++next) {
        const std::uint64_t skipped = read_number(reader);
        if (next >= pixels || skipped >= pixels - next) throw kInitializationError;
        next += skipped;
        visit(next, reader.bytes(pixel_bytes(image)));
    }
}

}  // namespace

void put_touches(Bytes& out, const Image& image, std::span<PixelError> errors, int quality) {
    const OpenSection section(out);
    const double total =
        std::accumulate(errors.begin(), errors.end(), 0.0,
                        [](double sum, const PixelError& error) { return sum + error.squared; });
    const bool is_float = image.type() == PixelType::kSgl || image.type() == PixelType::kComplex;
    if (total > 0) {
        const double part = quality * part_of(total, errors.size(), is_float);
        const auto taken = errors.first(take_up_to(errors, part * total));
        std::ranges::sort(taken, {}, &PixelError::index);
        std::uint64_t next = 0;
        for (const PixelError& error : taken) {
            put_number(out, error.index - next);
            put_bytes(out, {pixel_at(image, error.index), pixel_bytes(image)});
            next = error.index + 1;
        }
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
