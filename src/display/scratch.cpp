// Memory for the rows of one draw, kept for the next one.
#include "display/scratch.h"

#include <mutex>

#include "platform/mutex.h"

namespace zq {
namespace {

struct Kept {
    platform::Mutex mutex;
    std::vector<std::uint8_t> bytes;
};

Kept& kept() {
    static Kept block;
    return block;
}

}  // namespace

Scratch::Scratch() {
    const std::lock_guard lock(kept().mutex);
    bytes_.swap(kept().bytes);
}

Scratch::~Scratch() {
    const std::lock_guard lock(kept().mutex);
    if (bytes_.size() <= kMostKept && bytes_.size() > kept().bytes.size()) {
        bytes_.swap(kept().bytes);
    }
}

}  // namespace zq
