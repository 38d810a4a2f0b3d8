// Deflate in the zlib wrapping, whole blocks at once.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

namespace zq {

// Throws kNotEnoughMemory.
std::vector<std::uint8_t> deflate_bytes(std::span<const std::uint8_t> bytes);

// Whether `packed` is one sound stream that fills `bytes` exactly; what `bytes` holds otherwise is
// undefined. Throws kNotEnoughMemory.
bool inflate_bytes(std::span<const std::uint8_t> packed, std::span<std::uint8_t> bytes);

}  // namespace zq
