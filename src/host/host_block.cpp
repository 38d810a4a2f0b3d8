// Plain blocks of the host.
#include "host/host_block.h"

#include <cstring>

#include "base/checked.h"
#include "host/services.h"

namespace zq::host {

void set_block(ZqHandle* target, std::span<const std::uint8_t> bytes) {
    if (target == nullptr) throw kNullPointer;
    const auto size = checked_narrow<std::int32_t>(bytes.size());
    ZqHandle handle = *target;
    if (handle == nullptr) {
        handle = ds_new_handle(size);
    } else if (ds_set_handle_size(handle, size) != 0) {
        throw kNotEnoughMemory;
    }
    if (handle == nullptr || *handle == nullptr) throw kNotEnoughMemory;
    if (!bytes.empty()) std::memcpy(*handle, bytes.data(), bytes.size());
    *target = handle;
}

}  // namespace zq::host
