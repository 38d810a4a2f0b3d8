// Arrays of counted strings of the host.
#pragma once

#include <zqvissvc/types.h>

#include <span>
#include <string_view>

namespace zq::host {

// Makes *target (a null handle is given a block) hold exactly these texts, which must not lie in
// host memory. The strings are new ones; those that the array held are disposed. Throws
// kNullPointer for a null target and kNotEnoughMemory; the array and its strings then are what they
// were.
void set_string_array(ZqStringArrayHandle* target, std::span<const std::string_view> texts);

}  // namespace zq::host
