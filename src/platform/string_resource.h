// The library's own string table: a resource of the DLL on Windows, compiled in elsewhere.
#pragma once

#include <cstddef>

#include "platform/module.h"

namespace zq::platform {

// Copies string `id` of a module's table into `text` (at most `capacity` bytes with the terminator,
// cut when longer). A null module is this library; other modules have tables on Windows only.
// Returns the length without terminator; 0 when there is no such string, and `text` is then empty.
std::size_t load_string(ModuleHandle module, unsigned id, char* text, std::size_t capacity);

}  // namespace zq::platform
