// A device context and window in memory: handles, mapping and clipping.
#include "display/canvas.h"

#include <algorithm>
#include <limits>
#include <mutex>

#include "base/checked.h"
#include "base/error_codes.h"
#include "platform/mutex.h"

namespace zq {
namespace {

struct LivingCanvases {
    platform::Mutex mutex;
    std::vector<std::unique_ptr<Canvas>> list;
};

LivingCanvases& living() {
    static LivingCanvases canvases;
    return canvases;
}

std::size_t area(std::int32_t width, std::int32_t height) {
    if (width < 1 || height < 1 || width > Canvas::kLargestSide || height > Canvas::kLargestSide) {
        throw kInvalidParameter;
    }
    return checked_mul(static_cast<std::size_t>(width), static_cast<std::size_t>(height));
}

std::int32_t clamp(std::int64_t value) {
    return static_cast<std::int32_t>(std::clamp<std::int64_t>(
        value, std::numeric_limits<std::int32_t>::min(), std::numeric_limits<std::int32_t>::max()));
}

// Halves are rounded up.
std::int32_t scale(std::int32_t value, std::int32_t from, std::int32_t numerator,
                   std::int32_t denominator, std::int32_t to) {
    const std::int64_t twice =
        2 * (std::int64_t{value} - from) * std::int64_t{numerator} + denominator;
    const std::int64_t whole = 2 * std::int64_t{denominator};
    return clamp((twice >= 0 ? twice : twice - whole + 1) / whole + to);
}

// The system's regions take the corners of a box in any order.
Box in_order(const Box& box) {
    const auto [left, right] = std::minmax(box.left, box.right);
    const auto [top, bottom] = std::minmax(box.top, box.bottom);
    return {left, top, right, bottom};
}

// What is left of a box without another one: at most four boxes.
void subtract(const Box& box, const Box& hole, std::vector<Box>& rest) {
    const Box cut = intersect(box, hole);
    if (cut.empty()) {
        rest.push_back(box);
        return;
    }
    const Box parts[] = {{box.left, box.top, box.right, cut.top},
                         {box.left, cut.top, cut.left, cut.bottom},
                         {cut.right, cut.top, box.right, cut.bottom},
                         {box.left, cut.bottom, box.right, box.bottom}};
    for (const Box& part : parts) {
        if (!part.empty()) rest.push_back(part);
    }
}

}  // namespace

Canvas::Canvas(std::int32_t width, std::int32_t height)
    : width_(width), height_(height), pixels_(area(width, height)), clip_{bounds()} {}

void* Canvas::open(std::int32_t width, std::int32_t height) {
    auto canvas = std::make_unique<Canvas>(width, height);
    Canvas* handle = canvas.get();
    const std::lock_guard lock(living().mutex);
    living().list.push_back(std::move(canvas));
    return handle;
}

void Canvas::close(void* handle) {
    const std::lock_guard lock(living().mutex);
    if (std::erase_if(living().list, [&](const auto& one) { return one.get() == handle; }) == 0) {
        throw kNotAnObject;
    }
}

Canvas* Canvas::find(void* handle) {
    const std::lock_guard lock(living().mutex);
    for (const auto& one : living().list) {
        if (one.get() == handle) return one.get();
    }
    return nullptr;
}

Box Canvas::clip_box() {
    Box around{0, 0, 0, 0};
    for (const Box& box : clip_) {
        if (box.empty()) continue;
        around = around.empty()
                     ? box
                     : Box{std::min(around.left, box.left), std::min(around.top, box.top),
                           std::max(around.right, box.right), std::max(around.bottom, box.bottom)};
    }
    return covering(*this, around);
}

Box Canvas::to_logical(const Box& device) {
    const Mapping& m = mapping_;
    const auto x = [&](std::int32_t value) {
        return scale(value, m.viewport_origin.x, m.window_extent.x, m.viewport_extent.x,
                     m.window_origin.x);
    };
    const auto y = [&](std::int32_t value) {
        return scale(value, m.viewport_origin.y, m.window_extent.y, m.viewport_extent.y,
                     m.window_origin.y);
    };
    return {x(device.left), y(device.top), x(device.right), y(device.bottom)};
}

Box Canvas::to_device(const Box& logical) {
    const Mapping& m = mapping_;
    const auto x = [&](std::int32_t value) {
        return scale(value, m.window_origin.x, m.viewport_extent.x, m.window_extent.x,
                     m.viewport_origin.x);
    };
    const auto y = [&](std::int32_t value) {
        return scale(value, m.window_origin.y, m.viewport_extent.y, m.window_extent.y,
                     m.viewport_origin.y);
    };
    return {x(logical.left), y(logical.top), x(logical.right), y(logical.bottom)};
}

void Canvas::exclude_clip(const Box& device) {
    std::vector<Box> rest;
    for (const Box& box : clip_) subtract(box, in_order(device), rest);
    clip_ = std::move(rest);
}

void Canvas::include_clip(const Box& device) {
    exclude_clip(device);
    const Box added = intersect(in_order(device), bounds());
    if (!added.empty()) clip_.push_back(added);
}

}  // namespace zq
