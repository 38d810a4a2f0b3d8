// Modules over the system's module handles.
#include "platform/module.h"

#include <windows.h>

#include <string>
#include <vector>

#include "platform/win32/own_module.h"

namespace zq::platform {
namespace {

// The folder of the file that contains this code, with its last separator; empty when unknown.
// Wide, since not every folder has a name in the encoding of the C run-time.
std::wstring own_folder() {
    constexpr DWORD kLongestPath = 32768;
    std::vector<wchar_t> path(kLongestPath);
    const DWORD length = GetModuleFileNameW(own_module(), path.data(), kLongestPath);
    if (length == 0 || length == kLongestPath) return {};
    const std::wstring file(path.data(), length);
    return file.substr(0, file.find_last_of(L"\\/") + 1);
}

}  // namespace

ModuleHandle main_module() {
    return GetModuleHandleA(nullptr);
}

ModuleHandle loaded_module(const char* file_name) {
    return GetModuleHandleA(file_name);
}

ModuleHandle load_library(const char* name) {
    const std::string file_name = std::string(name) + ".dll";
    const std::wstring folder = own_folder();
    HMODULE module = nullptr;
    if (!folder.empty()) {
        const std::wstring beside = folder + std::wstring(file_name.begin(), file_name.end());
        module = LoadLibraryW(beside.c_str());
    }
    return module != nullptr ? module : LoadLibraryA(file_name.c_str());
}

void* find_symbol(ModuleHandle module, const char* name) {
    // GetProcAddress would take a null handle for the main program.
    if (module == nullptr) return nullptr;
    return reinterpret_cast<void*>(GetProcAddress(static_cast<HMODULE>(module), name));
}

}  // namespace zq::platform
