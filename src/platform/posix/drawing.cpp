// No device contexts of the system here.
#include "platform/drawing.h"

namespace zq::platform {

std::unique_ptr<DeviceContext> wrap_device_context(void* /*dc*/) {
    return nullptr;
}

std::unique_ptr<DeviceContext> window_device_context(void* /*window*/) {
    return nullptr;
}

Box client_box(void* /*window*/) {
    return {0, 0, 0, 0};
}

bool can_display_large_bitmaps() {
    return true;
}

}  // namespace zq::platform
