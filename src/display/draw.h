// Drawing pixels into a device context, one-to-one and zoomed.
#pragma once

#include <cstdint>
#include <optional>

#include "display/dib_rows.h"
#include "platform/device_context.h"

namespace zq {

// The view that drawing flags name, still without size. Throws kBufferMode for unknown flags.
ShownPixels view_for_flags(std::uint32_t flags);
inline constexpr std::uint32_t kBottomUp = 1;

struct DrawOptions {
    bool bottom_up = false;
    bool large_bitmaps = true;  // else equal sizes are drawn in tiles
};

// Draws a box of the view into a box of logical units. Nothing happens for an empty view or box or
// one that leaves the view. Throws kNotEnoughMemory.
void draw(DeviceContext& dc, const ShownPixels& view, const Box& source, const Box& destination,
          const DrawOptions& options);

struct ZoomedPlace {
    std::int32_t zoom = 1;
    Point offset{0, 0};  // device pixels that lie left of and above the client area
    Box client{0, 0, 0, 0};
};

// Draws the whole view at an integer zoom, centred or scrolled, and the background around it; no
// view: the background alone.
void draw_zoomed(DeviceContext& dc, const std::optional<ShownPixels>& view,
                 const ZoomedPlace& place, const DrawOptions& options);

}  // namespace zq
