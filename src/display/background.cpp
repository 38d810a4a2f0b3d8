// The background behind images.
#include "display/background.h"

namespace zq {
namespace {

constexpr Pattern kPattern = {0x00, 0x00, 0xCC, 0xCC, 0x00, 0x00, 0xCC, 0xCC};
constexpr std::uint32_t kWhite = 0xFFFFFF;

Brush make_brush(const BackgroundBrush& wanted, std::uint32_t button_face) {
    Brush brush{.colour = wanted.colour,
                .text_colour = wanted.colour,
                .background_colour = wanted.background_colour};
    switch (wanted.style) {
        case 0:
            return brush;
        case 1:
            brush.kind = Brush::Kind::kNone;
            return brush;
        case 2:
            brush.kind = Brush::Kind::kHatch;
            brush.hatch = wanted.hatch;
            return brush;
        case 3:
        case 5:
        case 6:
        case 7:
        case 8:
            brush.kind = Brush::Kind::kPattern;
            brush.pattern = kPattern;
            brush.text_colour = button_face;
            brush.background_colour = kWhite;
            return brush;
        default:
            brush.kind = Brush::Kind::kUnknown;
            return brush;
    }
}

}  // namespace

bool paint_background(DeviceContext& dc, const Box& box, const std::optional<Box>& excluded,
                      const BackgroundBrush& wanted) {
    const Box device = dc.to_device(box);
    const Box hole = excluded ? dc.to_device(*excluded) : Box{0, 0, 0, 0};
    if (excluded) dc.exclude_clip(hole);
    dc.set_mapping({});
    const bool filled = dc.fill(device, make_brush(wanted, dc.button_face()));
    if (excluded) dc.include_clip(hole);
    return filled || excluded.has_value();
}

void paint_display_background(DeviceContext& dc, const Box& box,
                              const std::optional<Box>& excluded) {
    paint_background(dc, box, excluded, {dc.button_face(), kWhite, 3, 0});
}

}  // namespace zq
