// Boxes of device contexts.
#include "platform/device_context.h"

#include <algorithm>

namespace zq {

Box intersect(const Box& a, const Box& b) {
    const Box common{std::max(a.left, b.left), std::max(a.top, b.top), std::min(a.right, b.right),
                     std::min(a.bottom, b.bottom)};
    return common.empty() ? Box{0, 0, 0, 0} : common;
}

Box covering(DeviceContext& dc, const Box& device) {
    if (device.empty()) return {0, 0, 0, 0};
    const Box logical = dc.to_logical(device);
    const Box again = dc.to_device(logical);
    return {logical.left - (again.left > device.left ? 1 : 0),
            logical.top - (again.top > device.top ? 1 : 0),
            logical.right + (again.right < device.right ? 1 : 0),
            logical.bottom + (again.bottom < device.bottom ? 1 : 0)};
}

}  // namespace zq
