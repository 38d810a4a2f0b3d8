// Reads a file into a buffer of its own that the caller gives back.
#pragma once

#include <cstdint>

namespace zq {

struct LoadedBuffer {
    std::uint8_t* pixels;     // pixel (0, 0)
    std::int32_t width;       // pixels
    std::int32_t height;      // rows
    std::int32_t line_width;  // pixels from one row to the next
    std::int32_t type;        // pixel type code
};

// The mode names the pixel type: 0 U8, 4 RGB, any with one of the bits 0x78 I16. Throws the codes
// of the buffer-level functions: kBufferMode, kBufferReadFailed, kBufferNotEnoughMemory.
LoadedBuffer load_buffer(const char* path, std::int32_t mode);

// Nothing happens for a pointer that load_buffer did not give out, or that was given back before.
void free_loaded_buffer(const void* pixels) noexcept;

}  // namespace zq
