// Buffers that outside users still hold although their images are gone.
#pragma once

#include <cstdint>
#include <unordered_map>

#include "platform/mutex.h"

namespace zq {

// Who frees a buffer.
enum class BufferSource { kNone, kMemoryLayer, kPhysical, kExternal };

// Frees a buffer by its source; an external one stays its owner's.
void free_buffer(std::uint8_t* buffer, BufferSource source) noexcept;

// Threads: safe.
class LentBuffers {
  public:
    static LentBuffers& instance();
    ~LentBuffers();

    // Takes a buffer that `users` outside users hold.
    void adopt(std::uint8_t* buffer, BufferSource source, std::int32_t users);
    // One user is done; the last one's return frees the buffer. False for an address that is none
    // of these buffers.
    bool give_back(std::uint8_t* buffer);

  private:
    struct Orphan {
        BufferSource source;
        std::int32_t users;
    };
    platform::Mutex mutex_;
    std::unordered_map<std::uint8_t*, Orphan> orphans_;
};

}  // namespace zq
