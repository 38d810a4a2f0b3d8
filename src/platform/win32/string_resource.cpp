// The string table as a resource of a module.
#include "platform/string_resource.h"

#include <windows.h>

#include <algorithm>
#include <limits>

#include "platform/win32/own_module.h"

namespace zq::platform {

std::size_t load_string(ModuleHandle module, unsigned id, char* text, std::size_t capacity) {
    if (capacity == 0) return 0;
    text[0] = '\0';
    // The system looks at the low 16 bits only.
    if (id > std::numeric_limits<WORD>::max()) return 0;
    constexpr std::size_t kMost = std::numeric_limits<int>::max();
    auto* const owner = module != nullptr ? static_cast<HMODULE>(module) : own_module();
    const int length = LoadStringA(owner, id, text, static_cast<int>(std::min(capacity, kMost)));
    return static_cast<std::size_t>(std::max(length, 0));
}

}  // namespace zq::platform
