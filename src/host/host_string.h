// Counted strings of the host.
#pragma once

#include <zqvissvc/types.h>

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace zq::host {

// The bytes of a string; empty for a null handle, a negative count, and a count that its block has
// no room for (where the host tells sizes). Valid until a host call that may move blocks.
std::string_view view(ZqStringHandle string);

// Makes *target (a null handle is given a block) hold the text, which must not lie in host memory.
// Throws kNullPointer for a null target and kNotEnoughMemory; the string then is what it was.
void set_string(ZqStringHandle* target, std::string_view text);

// The same from another host string.
void copy_string(ZqStringHandle* target, ZqStringHandle source);

// Makes the string longer by that many bytes, or, to replace what it holds, that many bytes long.
// The bytes are the caller's to fill, the first one is returned. Throws as set_string does.
enum class Extension { kAppend, kReplace };
std::uint8_t* extend_string(ZqStringHandle* target, std::size_t bytes, Extension extension);

}  // namespace zq::host
