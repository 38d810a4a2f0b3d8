// Entry points: drawing, and canvases to draw on.
#include <zqvissvc/display.h>

#include <memory>
#include <optional>

#include "display/background.h"
#include "display/canvas.h"
#include "display/draw.h"
#include "host/boundary.h"
#include "image/image_lock.h"
#include "image/lifecycle.h"
#include "platform/drawing.h"

using namespace zq;

namespace {

// A canvas, or a context of the system that is given back at the end.
class Target {
  public:
    static Target of_context(void* dc) {
        Canvas* canvas = Canvas::find(dc);
        return {canvas, canvas == nullptr ? platform::wrap_device_context(dc) : nullptr};
    }
    static Target of_window(void* window) {
        Canvas* canvas = Canvas::find(window);
        return {canvas, canvas == nullptr ? platform::window_device_context(window) : nullptr};
    }
    DeviceContext& require() const {
        if (DeviceContext* dc = get()) return *dc;
        throw kBufferNullPath;
    }
    DeviceContext* get() const { return canvas_ != nullptr ? canvas_ : system_.get(); }

  private:
    Target(Canvas* canvas, std::unique_ptr<DeviceContext> system)
        : canvas_(canvas), system_(std::move(system)) {}

    Canvas* canvas_;
    std::unique_ptr<DeviceContext> system_;
};

Target target_of(void* window, void* dc) {
    return dc != nullptr ? Target::of_context(dc) : Target::of_window(window);
}

Canvas& require_canvas(void* handle) {
    if (Canvas* canvas = Canvas::find(handle)) return *canvas;
    throw kNotAnObject;
}

ZoomedPlace place_in(void* window, std::int32_t zoom, Point offset) {
    const Canvas* canvas = Canvas::find(window);
    return {zoom, offset, canvas != nullptr ? canvas->bounds() : platform::client_box(window)};
}

DrawOptions options_for(bool bottom_up) {
    return {bottom_up, platform::can_display_large_bitmaps()};
}

Box to_box(const ZqCoordinates& c) {
    return {c.left, c.top, c.right, c.bottom};
}

// Nothing for an empty rectangle and for one that no memory holds.
std::optional<ShownPixels> buffer_view(ShownPixels view, const void* pixels, std::int64_t width,
                                       std::int64_t height) {
    constexpr std::int64_t kMost = 0x7FFFFFFF;
    if (width < 1 || height < 1 || width > kMost || height > kMost) return std::nullopt;
    const auto row_bytes = static_cast<std::uint64_t>(width) * view.pixel_bytes();
    if (static_cast<std::uint64_t>(height) > static_cast<std::uint64_t>(PTRDIFF_MAX) / row_bytes) {
        return std::nullopt;
    }
    view.pixels = static_cast<const std::uint8_t*>(pixels);
    view.width = static_cast<std::int32_t>(width);
    view.height = static_cast<std::int32_t>(height);
    view.line_width = view.width;
    return view;
}

// What fails once the arguments are checked is not told.
template <class Drawing>
void draw_silently(const Drawing& drawing) {
    try {
        drawing();
    } catch (GRLIBError_enum) {
    } catch (const std::bad_alloc&) {
    }
}

// Ends silently for an image that is disposed while the draw waits for it.
void draw_image(DeviceContext& dc, ImageHandle image, const ZoomedPlace& place,
                const DrawOptions& options) {
    std::optional<LockedImage> locked;
    try {
        locked.emplace(image);
    } catch (GRLIBError_enum) {
        return;
    }
    ShownPixels view = ShownPixels::of(**locked);
    if (view.pixels == nullptr) view.width = view.height = 0;
    draw_zoomed(dc, view, place, options);
}

struct Plot {
    const void* pixels;
    std::int32_t left, top, width, height, x, y;
    std::uint32_t flags;
};

void plot(DeviceContext& dc, const Plot& p) {
    if (p.pixels == nullptr) throw kBufferNullBuffer;
    const ShownPixels format = view_for_flags(p.flags);
    const std::int64_t right = std::int64_t{p.left} + p.width;
    const std::int64_t bottom = std::int64_t{p.top} + p.height;
    const std::optional<ShownPixels> view = buffer_view(format, p.pixels, right, bottom);
    const std::int64_t end_x = std::int64_t{p.x} + p.width;
    const std::int64_t end_y = std::int64_t{p.y} + p.height;
    if (!view || end_x > INT32_MAX || end_y > INT32_MAX || p.width < 1 || p.height < 1) return;
    draw_silently([&] {
        draw(dc, *view, {p.left, p.top, view->width, view->height},
             {p.x, p.y, static_cast<std::int32_t>(end_x), static_cast<std::int32_t>(end_y)},
             options_for((p.flags & kBottomUp) != 0));
    });
}

std::int32_t scaled_by(std::int32_t value, std::int32_t by, std::int32_t over) {
    if (over == 0) return -1;
    const std::int64_t product = std::int64_t{value} * by;
    const bool negative = (product < 0) != (over < 0);
    const std::int64_t size = product < 0 ? -product : product;
    const std::int64_t divisor = over < 0 ? -std::int64_t{over} : over;
    const std::int64_t quotient = (size + divisor / 2) / divisor;
    if (quotient > INT32_MAX) return -1;
    return static_cast<std::int32_t>(negative ? -quotient : quotient);
}

std::int32_t wrapping_difference(std::int32_t a, std::int32_t b) {
    return static_cast<std::int32_t>(static_cast<std::uint32_t>(a) - static_cast<std::uint32_t>(b));
}

std::int32_t wrapping_sum(std::int32_t a, std::int32_t b) {
    return static_cast<std::int32_t>(static_cast<std::uint32_t>(a) + static_cast<std::uint32_t>(b));
}

}  // namespace

uint32_t ZQ_CALL Gen_PlotImageToDC(ZqDeviceContext dc, const void* pixels, int32_t left,
                                   int32_t top, int32_t width, int32_t height, int32_t x, int32_t y,
                                   uint32_t flags) {
    return static_cast<uint32_t>(host::run_core([&] {
        plot(Target::of_context(dc).require(), {pixels, left, top, width, height, x, y, flags});
    }));
}

uint32_t ZQ_CALL Gen_PlotImage(ZqWindow window, const void* pixels, int32_t left, int32_t top,
                               int32_t width, int32_t height, int32_t x, int32_t y,
                               uint32_t flags) {
    return static_cast<uint32_t>(host::run_core([&] {
        plot(Target::of_window(window).require(), {pixels, left, top, width, height, x, y, flags});
    }));
}

uint32_t ZQ_CALL Gen_PlotZoomedImage(ZqWindow window, const void* pixels, int32_t zoom,
                                     int32_t width, int32_t height, int32_t xOffset,
                                     int32_t yOffset, uint32_t flags, ZqDeviceContext dc) {
    return static_cast<uint32_t>(host::run_core([&] {
        const Target target = target_of(window, dc);
        DeviceContext& context = target.require();
        std::optional<ShownPixels> view;
        if (pixels != nullptr) {
            // Without pixels it is an image still: of 0 x 0.
            view =
                buffer_view(view_for_flags(flags), pixels, width, height).value_or(ShownPixels{});
        }
        draw_silently([&] {
            draw_zoomed(context, view, place_in(window, zoom, {xOffset, yOffset}),
                        options_for((flags & kBottomUp) != 0));
        });
    }));
}

ZqError ZQ_CALL ZqDrawImage(ZqWindow window, ZqImageHandle image, int32_t zoom, int32_t xOffset,
                            int32_t yOffset, int32_t bottomUp, ZqDeviceContext dc) {
    return host::run_core([&] {
        const Target target = target_of(window, dc);
        DeviceContext& context = target.require();
        const ZoomedPlace place = place_in(window, zoom, {xOffset, yOffset});
        if (image == nullptr) return draw_zoomed(context, std::nullopt, place, {});
        if (!is_live_image(image)) throw kNotAnImage;
        draw_image(context, image, place, options_for(bottomUp != 0));
    });
}

uint32_t ZQ_CALL Gen_GetImageClientPos(ZqWindow window, int32_t x, int32_t y, int32_t xOffset,
                                       int32_t yOffset, ZqCoordinates* rectangle) {
    return static_cast<uint32_t>(host::run_core([&] {
        const Target target = Target::of_window(window);
        const Mapping mapping = target.require().mapping();
        if (rectangle == nullptr) throw kNullPointer;
        const auto scaled = [](std::int32_t value, std::int32_t logical, std::int32_t device) {
            return scaled_by(value, logical, device);
        };
        const std::int32_t scaled_x = scaled(x, mapping.window_extent.x, mapping.viewport_extent.x);
        const std::int32_t scaled_y = scaled(y, mapping.window_extent.y, mapping.viewport_extent.y);
        const std::int32_t left = wrapping_difference(scaled_x, xOffset);
        const std::int32_t top = wrapping_difference(scaled_y, yOffset);
        *rectangle = {left, top, wrapping_sum(left, scaled_x), wrapping_sum(top, scaled_y)};
    }));
}

int32_t ZQ_CALL DrawImageBackground2(ZqDeviceContext dc, const ZqCoordinates* rectangle,
                                     const ZqCoordinates* excluded, uint32_t colour,
                                     uint32_t backgroundColour, int32_t brushStyle, int32_t hatch) {
    std::int32_t result = 0;
    const ZqError code = host::run_core([&] {
        const Target target = Target::of_context(dc);
        if (target.get() == nullptr || rectangle == nullptr) return;
        std::optional<Box> hole;
        if (excluded != nullptr) hole = to_box(*excluded);
        const bool done = paint_background(target.require(), to_box(*rectangle), hole,
                                           {colour, backgroundColour, brushStyle, hatch});
        result = done ? 1 : 0;
    });
    return code == 0 ? result : 0;
}

int32_t ZQ_CALL CanDisplayLargeBitmaps(void) {
    return platform::can_display_large_bitmaps() ? 1 : 0;
}

ZqError ZQ_CALL ZqNewCanvas(int32_t width, int32_t height, ZqDeviceContext* canvas) {
    return host::run_core([&] {
        if (canvas == nullptr) throw kNullPointer;
        *canvas = Canvas::open(width, height);
    });
}

ZqError ZQ_CALL ZqDisposeCanvas(ZqDeviceContext canvas) {
    return host::run_core([&] { Canvas::close(canvas); });
}

uint32_t* ZQ_CALL ZqGetCanvasPixels(ZqDeviceContext canvas) {
    Canvas* found = Canvas::find(canvas);
    return found == nullptr ? nullptr : found->pixels();
}

ZqError ZQ_CALL ZqSetCanvasClip(ZqDeviceContext canvas, const ZqCoordinates* clip) {
    return host::run_core([&] {
        Canvas& found = require_canvas(canvas);
        found.set_clip(clip == nullptr ? found.bounds() : to_box(*clip));
    });
}
