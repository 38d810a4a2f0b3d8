// Plain blocks of the host: bytes whose number is the size of the block.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>
#include <span>

namespace zq::host {

// Makes *target (a null handle is given a DS block) hold exactly these bytes, which must not lie in
// host memory. Throws kNullPointer for a null target and kNotEnoughMemory; the block then is what
// it was.
void set_block(ZqHandle* target, std::span<const std::uint8_t> bytes);

}  // namespace zq::host
