// The background behind images.
#pragma once

#include <optional>

#include "platform/device_context.h"

namespace zq {

struct BackgroundBrush {
    std::uint32_t colour;  // 0x00BBGGRR, as the next
    std::uint32_t background_colour;
    std::int32_t style;
    std::int32_t hatch;
};

// Fills a box of logical units but for the excluded one, which is added to the clip region
// afterwards. Leaves the mapping one-to-one. Returns whether the last that was made, the brush or
// the region of the excluded box, could be given back.
bool paint_background(DeviceContext& dc, const Box& box, const std::optional<Box>& excluded,
                      const BackgroundBrush& brush);

// The same with the pattern of image displays.
void paint_display_background(DeviceContext& dc, const Box& box,
                              const std::optional<Box>& excluded);

}  // namespace zq
