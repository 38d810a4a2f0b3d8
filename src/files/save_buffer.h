// Writes a caller's plain pixel buffer to a file; codes are those of the buffer-level functions.
#pragma once

#include <cstdint>

namespace zq {

// Rows lie packed, top row first; the buffer must hold height rows of the size that kind and bits
// per pixel imply. Throws kBufferNullPath, kBufferNullBuffer, kBufferExtension, kBufferKind,
// kBufferNotEnoughMemory, and kBufferWriteFailed for any other failure of the write.
void save_buffer(const char* path, const std::uint8_t* buffer, std::int32_t bits_per_pixel,
                 std::int32_t kind, std::int32_t width, std::int32_t height);

}  // namespace zq
