// What drawing needs of a device context; the system's own and the canvas in memory implement it.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace zq {

struct Point {
    std::int32_t x, y;
    bool operator==(const Point&) const = default;
};

// Right and bottom are exclusive.
struct Box {
    std::int32_t left, top, right, bottom;
    bool operator==(const Box&) const = default;
    bool empty() const { return left >= right || top >= bottom; }
    std::int64_t width() const { return std::int64_t{right} - left; }
    std::int64_t height() const { return std::int64_t{bottom} - top; }
};

// The common part; empty when there is none.
Box intersect(const Box& a, const Box& b);

enum class MapMode : std::int32_t { kText = 1, kAnisotropic = 8 };

// Logical units to device pixels: (logical - window origin) * viewport extent / window extent +
// viewport origin.
struct Mapping {
    MapMode mode = MapMode::kText;
    Point window_origin{0, 0};
    Point viewport_origin{0, 0};
    Point window_extent{1, 1};
    Point viewport_extent{1, 1};

    bool one_to_one() const { return window_extent == viewport_extent; }
};

// A bitmap as the system's blit takes it. Rows are `stride()` bytes apart and lie in memory from
// the top, or from the bottom of what is shown.
struct Dib {
    const std::uint8_t* bits = nullptr;
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::int32_t bits_per_pixel = 8;  // 8 grey, 24, 32
    bool bottom_up = false;
    std::int32_t first_row = 0;  // of the image that the bitmap holds rows of

    std::size_t stride() const {
        return (static_cast<std::size_t>(width) * static_cast<std::size_t>(bits_per_pixel / 8) +
                3) &
               ~std::size_t{3};
    }
};

using Pattern = std::array<std::uint8_t, 8>;  // rows from the top, the highest bit leftmost

struct Brush {
    // kNone paints nothing; kUnknown cannot be made.
    enum class Kind { kPlain, kNone, kHatch, kPattern, kUnknown };
    Kind kind = Kind::kPlain;
    std::int32_t hatch = 0;
    Pattern pattern{};         // a bit that is set has the background colour
    std::uint32_t colour = 0;  // 0x00BBGGRR, as all three
    std::uint32_t text_colour = 0;
    std::uint32_t background_colour = 0;
};

class DeviceContext {
  public:
    virtual ~DeviceContext() = default;

    virtual Mapping mapping() = 0;
    virtual void set_mapping(const Mapping& mapping) = 0;
    // The smallest box around what can be drawn to, in logical units.
    virtual Box clip_box() = 0;
    virtual Box to_logical(const Box& device) = 0;
    virtual Box to_device(const Box& logical) = 0;
    // Device pixels. include_clip adds the box whatever was clipped before.
    virtual void exclude_clip(const Box& device) = 0;
    virtual void include_clip(const Box& device) = 0;
    // Colour-on-colour stretching with the brush origin at (0, 0).
    virtual void set_stretching() = 0;
    // Draws the source box of the bitmap, which lies inside, into a box of logical units. Of a
    // bottom-up bitmap the box counts rows as memory does.
    virtual void stretch(const Dib& dib, const Box& source, const Box& destination) = 0;
    // Which source rows that needs; none: all, or the system alone knows.
    virtual std::vector<std::int32_t> rows_to_stretch(const Box& /*source*/,
                                                      const Box& /*destination*/,
                                                      bool /*bottom_up*/) {
        return {};
    }
    // Device pixels, brush origin at the box's corner; returns whether the brush could be made.
    virtual bool fill(const Box& device, const Brush& brush) = 0;
    virtual std::uint32_t button_face() = 0;  // 0x00BBGGRR
};

// The smallest box of logical units around one of device pixels; (0, 0) to (0, 0) for an empty one.
Box covering(DeviceContext& dc, const Box& device);

}  // namespace zq
