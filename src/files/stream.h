// Ownership and buffering of C streams, shared by reading and writing.
#pragma once

#include <cstddef>
#include <cstdio>
#include <memory>

namespace zq {

struct StreamCloser {
    void operator()(std::FILE* stream) const { std::fclose(stream); }
};
using Stream = std::unique_ptr<std::FILE, StreamCloser>;

// Enough to make the many small records of a format cheap, and no more than a processor's
// first-level caches keep beside the pixels.
inline constexpr std::size_t kStreamBuffer = std::size_t{64} * 1024;

}  // namespace zq
