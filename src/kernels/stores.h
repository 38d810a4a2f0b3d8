// How kernels write.
#pragma once

namespace zq {

// kStreamed writes past the cache: right for what is larger than it and not read again soon. Call
// finish_streaming (stream_copy.h) before another thread is told of what was written.
enum class Stores { kCached, kStreamed };

}  // namespace zq
