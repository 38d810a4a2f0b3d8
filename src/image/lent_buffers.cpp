// Keeping lent buffers alive until their last user returns them.
#include "image/lent_buffers.h"

#include <mutex>

#include "image/memory.h"
#include "image/physical_memory.h"

namespace zq {

void free_buffer(std::uint8_t* buffer, BufferSource source) noexcept {
    if (source == BufferSource::kMemoryLayer) {
        memory::release(buffer);
    } else if (source == BufferSource::kPhysical) {
        PhysicalMemory::instance().release(buffer);
    }
}

LentBuffers& LentBuffers::instance() {
    static LentBuffers the_buffers;
    return the_buffers;
}

LentBuffers::~LentBuffers() {
    for (const auto& [buffer, orphan] : orphans_) {
        free_buffer(buffer, orphan.source);
    }
}

void LentBuffers::adopt(std::uint8_t* buffer, BufferSource source, std::int32_t users) {
    const std::lock_guard lock(mutex_);
    orphans_[buffer] = {source, users};
}

bool LentBuffers::give_back(std::uint8_t* buffer) {
    const std::lock_guard lock(mutex_);
    const auto found = orphans_.find(buffer);
    if (found == orphans_.end()) {
        return false;
    }
    if (--found->second.users == 0) {
        free_buffer(buffer, found->second.source);
        orphans_.erase(found);
    }
    return true;
}

}  // namespace zq
