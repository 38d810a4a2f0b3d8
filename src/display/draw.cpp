// Drawing pixels into a device context.
#include "display/draw.h"

#include <algorithm>
#include <limits>

#include "display/background.h"
#include "display/scratch.h"

namespace zq {
namespace {

constexpr std::int32_t kTile = 1024;
constexpr std::int32_t kLargestZoom = 16;

Box inflate(const Box& box, std::int32_t x, std::int32_t y) {
    const auto moved = [](std::int32_t value, std::int32_t by) {
        return static_cast<std::int32_t>(std::clamp<std::int64_t>(
            std::int64_t{value} + by, std::numeric_limits<std::int32_t>::min(),
            std::numeric_limits<std::int32_t>::max()));
    };
    return {moved(box.left, -x), moved(box.top, -y), moved(box.right, x), moved(box.bottom, y)};
}

bool lies_inside(const Box& source, const ShownPixels& view) {
    return source.left >= 0 && source.top >= 0 && source.right <= view.width &&
           source.bottom <= view.height && !source.empty();
}

// The same part of a box seen upside down: its rows lie as far from the other end.
Box upside_down(const Box& part, const Box& whole) {
    const std::int64_t top = std::int64_t{whole.top} + whole.bottom - part.bottom;
    return {part.left, static_cast<std::int32_t>(top), part.right,
            static_cast<std::int32_t>(top + part.height())};
}

// Every tile is a bitmap of its own, as high as its band; seen upside down, the last rows are the
// first band.
void stretch_tiles(DeviceContext& dc, const Dib& dib, const Box& source, const Box& destination) {
    for (std::int32_t y = source.top, height = 0; y < source.bottom; y += height) {
        height = std::min(kTile, source.bottom - y);
        const std::int32_t above = y - source.top;
        const std::int32_t first = dib.bottom_up ? source.bottom - above - height : y;
        Dib band = dib;
        band.bits += static_cast<std::size_t>(first) * dib.stride();
        band.height = height;
        const std::int32_t to_y = destination.top + above;
        for (std::int32_t x = source.left, width = 0; x < source.right; x += width) {
            width = std::min(kTile, source.right - x);
            const std::int32_t to_x = destination.left + (x - source.left);
            dc.stretch(band, {x, 0, x + width, height}, {to_x, to_y, to_x + width, to_y + height});
        }
    }
}

struct Extents {
    std::int32_t viewport, window;
};

Extents extents_for(std::int32_t zoom) {
    if (zoom >= 1) return {std::min(zoom, kLargestZoom), 1};
    if (zoom <= -1) return {1, -std::max(zoom, -kLargestZoom)};
    return {1, 1};
}

// Where an image of so many device pixels starts on an axis of the client area.
std::int32_t origin_on_axis(std::int64_t size, std::int64_t client, std::int32_t offset) {
    const std::int64_t d = -std::int64_t{offset};
    std::int64_t origin = (client - size) / 2;
    if (size + (d < 1 ? d : 2 * d) >= client) {
        origin = d;
    } else if (d < 1 && size >= client) {
        origin = client - size;
    }
    return static_cast<std::int32_t>(
        std::clamp<std::int64_t>(origin, std::numeric_limits<std::int32_t>::min(),
                                 std::numeric_limits<std::int32_t>::max()));
}

// Rounded to the nearest, halves up.
std::int64_t scaled(std::int32_t size, Extents extents) {
    return (std::int64_t{size} * extents.viewport + extents.window / 2) / extents.window;
}

}  // namespace

ShownPixels view_for_flags(std::uint32_t flags) {
    switch (flags & ~kBottomUp) {
        case 0:
            return {.type = PixelType::kU8};
        case 2:
            return {.type = PixelType::kRgb, .packed_colour = true};
        case 4:
            return {.type = PixelType::kRgb};
        case 8:
            return {.type = PixelType::kI16, .right_shift = 2};
        case 16:
            return {.type = PixelType::kI16, .right_shift = 4};
        case 32:
            return {.type = PixelType::kI16, .right_shift = 6};
        case 64:
            return {.type = PixelType::kI16, .right_shift = 8};
        default:
            throw kBufferMode;
    }
}

void draw(DeviceContext& dc, const ShownPixels& view, const Box& source_box,
          const Box& destination_box, const DrawOptions& options) {
    Box source = source_box;
    Box destination = destination_box;
    const Mapping mapping = dc.mapping();
    if (source == destination) {
        const Point& window = mapping.window_extent;
        const Point& viewport = mapping.viewport_extent;
        source = intersect(source, inflate(dc.clip_box(), window.x > viewport.x ? 1 : 0,
                                           window.y > viewport.y ? 1 : 0));
        destination = source;
        if (source.empty()) return;
        if (options.bottom_up) source = upside_down(destination, source_box);
    }
    if (!lies_inside(source, view)) return;
    Scratch scratch;
    Part part{.box = source, .rows = {}};
    if (!fits_in_place(view)) {
        part.rows = dc.rows_to_stretch(source, destination, options.bottom_up);
    }
    Dib dib = make_dib(view, scratch.bytes(), part);
    source.top -= dib.first_row;
    source.bottom -= dib.first_row;
    dib.bottom_up = options.bottom_up;
    const bool equal_sizes =
        source.width() == destination.width() && source.height() == destination.height();
    if (!mapping.one_to_one() || !equal_sizes) dc.set_stretching();
    const bool large = source.width() > kTile || source.height() > kTile;
    if (!options.large_bitmaps && equal_sizes && large) {
        stretch_tiles(dc, dib, source, destination);
    } else {
        dc.stretch(dib, source, destination);
    }
}

void draw_zoomed(DeviceContext& dc, const std::optional<ShownPixels>& view,
                 const ZoomedPlace& place, const DrawOptions& options) {
    if (!view) {
        dc.set_mapping({});
        paint_display_background(dc, place.client, std::nullopt);
        return;
    }
    const Extents extents = extents_for(place.zoom);
    Mapping mapping;
    mapping.mode = MapMode::kAnisotropic;
    mapping.viewport_extent = {extents.viewport, extents.viewport};
    mapping.window_extent = {extents.window, extents.window};
    mapping.viewport_origin = {
        origin_on_axis(scaled(view->width, extents), place.client.width(), place.offset.x),
        origin_on_axis(scaled(view->height, extents), place.client.height(), place.offset.y)};
    dc.set_mapping(mapping);
    const Box whole{0, 0, view->width, view->height};
    const Box clip = dc.clip_box();
    if (!clip.empty() && intersect(clip, whole) != clip) {
        paint_display_background(dc, clip, whole);
        dc.set_mapping(mapping);
    }
    draw(dc, *view, whole, whole, options);
}

}  // namespace zq
