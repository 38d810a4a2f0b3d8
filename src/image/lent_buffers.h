// Buffers that outside users hold: counted from the moment they are lent, so that a user can return
// one at any time, also while its image is being disposed and after that.
#pragma once

#include <cstdint>
#include <map>
#include <utility>

#include "platform/mutex.h"

namespace zq {

// Who frees a buffer.
enum class BufferSource { kNone, kMemoryLayer, kPhysical, kExternal };

// Frees a buffer by its source; an external one stays its owner's.
void free_buffer(std::uint8_t* buffer, BufferSource source) noexcept;

// A buffer is known by its image's handle (never followed) and its address together. Threads: safe.
class LentBuffers {
  public:
    static LentBuffers& instance();
    LentBuffers();
    ~LentBuffers();
    LentBuffers(const LentBuffers&) = delete;
    LentBuffers& operator=(const LentBuffers&) = delete;

    // One more user; throws std::bad_alloc.
    void lend(const void* image, std::uint8_t* buffer);
    // One user is done; when the image is gone, the last one's return frees the buffer. False when
    // nobody holds such a buffer.
    bool give_back(const void* image, std::uint8_t* buffer) noexcept;
    // The same for a buffer whose image is gone; false for any other.
    bool give_back_orphan(const void* image, std::uint8_t* buffer) noexcept;
    // The image is going: frees its buffer at once when nobody holds it, else leaves it to its
    // users.
    void orphan(const void* image, std::uint8_t* buffer, BufferSource source) noexcept;

  private:
    struct Loan {
        std::int32_t users = 0;
        BufferSource source = BufferSource::kNone;  // set when the users have to free the buffer
    };
    using Loans = std::map<std::pair<const void*, std::uint8_t*>, Loan>;
    void end_one(Loans::iterator loan) noexcept;

    platform::Mutex mutex_;
    Loans loans_;
};

}  // namespace zq
