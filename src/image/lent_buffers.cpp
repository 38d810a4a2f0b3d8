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

LentBuffers::LentBuffers() {
    // Made before this object, these outlive it.
    memory::prepare();
    PhysicalMemory::instance();
}

LentBuffers::~LentBuffers() {
    for (const auto& [key, loan] : loans_) {
        free_buffer(key.second, loan.source);
    }
}

void LentBuffers::lend(const void* image, std::uint8_t* buffer) {
    const std::lock_guard lock(mutex_);
    ++loans_[{image, buffer}].users;
}

bool LentBuffers::give_back(const void* image, std::uint8_t* buffer) noexcept {
    const std::lock_guard lock(mutex_);
    const auto found = loans_.find({image, buffer});
    if (found == loans_.end()) {
        return false;
    }
    end_one(found);
    return true;
}

bool LentBuffers::give_back_orphan(const void* image, std::uint8_t* buffer) noexcept {
    const std::lock_guard lock(mutex_);
    const auto found = loans_.find({image, buffer});
    if (found == loans_.end() || found->second.source == BufferSource::kNone) {
        return false;
    }
    end_one(found);
    return true;
}

void LentBuffers::orphan(const void* image, std::uint8_t* buffer, BufferSource source) noexcept {
    const std::lock_guard lock(mutex_);
    const auto found = loans_.find({image, buffer});
    if (found == loans_.end()) {
        free_buffer(buffer, source);
    } else if (source != BufferSource::kExternal) {
        found->second.source = source;
    }
}

void LentBuffers::end_one(Loans::iterator loan) noexcept {
    if (--loan->second.users == 0) {
        free_buffer(loan->first.second, loan->second.source);
        loans_.erase(loan);
    }
}

}  // namespace zq
