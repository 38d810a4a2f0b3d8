// The DLL or program that contains this code.
#pragma once

#include <windows.h>

namespace zq::platform {

inline HMODULE own_module() {
    HMODULE module = nullptr;
    GetModuleHandleExA(
        GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_UNCHANGED_REFCOUNT,
        reinterpret_cast<const char*>(&own_module), &module);
    return module;
}

}  // namespace zq::platform
