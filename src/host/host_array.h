// One-dimensional host arrays of unsigned 32-bit elements.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>
#include <span>

namespace zq::host {

// The elements; empty for a null handle and for a negative count. Valid until the next host call.
std::span<const std::uint32_t> view(ZqArrayU32Handle array);

// Makes *target (a null handle is given a block) hold the elements, which must not lie in host
// memory. Throws kNullPointer for a null target and kNotEnoughMemory; the array then is what it
// was.
void set_array(ZqArrayU32Handle* target, std::span<const std::uint32_t> elements);

}  // namespace zq::host
