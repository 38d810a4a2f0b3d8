// The system's own device contexts and windows; none elsewhere than on Windows.
#pragma once

#include <memory>

#include "platform/device_context.h"

namespace zq::platform {

// A context that the caller owns (HDC); null where there are none.
std::unique_ptr<DeviceContext> wrap_device_context(void* dc);

// The context of a window (HWND), given back with the object; null without one.
std::unique_ptr<DeviceContext> window_device_context(void* window);

// The window's client area; empty when it has none.
Box client_box(void* window);

// Whether bitmaps of more than 1024 pixels a side can be drawn at once.
bool can_display_large_bitmaps();

}  // namespace zq::platform
