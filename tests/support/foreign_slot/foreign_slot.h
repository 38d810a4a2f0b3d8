// A thread-local slot as a host makes it, with the system's own calls.
#pragma once

#include <cstdint>

namespace zqtest {

class ForeignSlot {
  public:
    ForeignSlot();
    ~ForeignSlot();
    ForeignSlot(const ForeignSlot&) = delete;
    ForeignSlot& operator=(const ForeignSlot&) = delete;

    std::int32_t index() const { return index_; }

    // Sets the calling thread's value.
    void set(void* value);

  private:
    std::int32_t index_;
};

}  // namespace zqtest
