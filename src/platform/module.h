// Modules of the process (DLLs, shared objects, the main program) and the symbols that they export.
#pragma once

namespace zq::platform {

// A module as the system names it (HMODULE, or a handle of dlopen). Null: none.
using ModuleHandle = void*;

// The main program. Borrowed; valid for the life of the process. Elsewhere than on Windows its
// symbols include those of the libraries that it was linked with.
ModuleHandle main_module();

// A module that is already loaded under this file name ("dfrt.dll"; elsewhere that name or
// "libdfrt.so"), or null. Never loads anything and takes no lasting reference.
ModuleHandle loaded_module(const char* file_name);

// Loads a library by its bare name ("zqkemomem" is zqkemomem.dll or libzqkemomem.so), or null: from
// beside this library or else from where the system looks. Never unloaded.
ModuleHandle load_library(const char* name);

// Address of an exported symbol, or null; null for a null module.
void* find_symbol(ModuleHandle module, const char* name);

template <class Function>
Function find_function(ModuleHandle module, const char* name) {
    return reinterpret_cast<Function>(find_symbol(module, name));
}

}  // namespace zq::platform
