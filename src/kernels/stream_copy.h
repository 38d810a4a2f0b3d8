// Copying past the cache.
#pragma once

#include <cstddef>

namespace zq {

// memcpy for a destination that is not read again soon: it is written without being read into the
// cache first and without driving other data out of it. Call finish_streaming before another thread
// is told of the bytes.
void stream_copy(void* to, const void* from, std::size_t bytes);
void finish_streaming();

}  // namespace zq
