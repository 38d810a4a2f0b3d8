// Modules over the dynamic loader.
#include "platform/module.h"

#include <dlfcn.h>

#include <string>
#include <string_view>

namespace zq::platform {
namespace {

// "dfrt" is "libdfrt.so" here.
std::string shared_object_name(std::string_view name) {
    return "lib" + std::string(name) + ".so";
}

// The folder of the file that contains this code, with its last slash; empty when unknown.
std::string own_folder() {
    Dl_info own{};
    if (dladdr(reinterpret_cast<void*>(&load_library), &own) == 0 || own.dli_fname == nullptr) {
        return {};
    }
    const std::string_view file(own.dli_fname);
    return std::string(file.substr(0, file.rfind('/') + 1));
}

ModuleHandle find_loaded(const char* file_name) {
    void* module = dlopen(file_name, RTLD_LAZY | RTLD_NOLOAD);
    if (module != nullptr) dlclose(module);
    return module;
}

}  // namespace

ModuleHandle main_module() {
    static const ModuleHandle program = dlopen(nullptr, RTLD_LAZY);
    return program;
}

ModuleHandle loaded_module(const char* file_name) {
    if (ModuleHandle module = find_loaded(file_name)) return module;
    std::string_view stem(file_name);
    if (stem.ends_with(".dll")) stem.remove_suffix(4);
    return find_loaded(shared_object_name(stem).c_str());
}

ModuleHandle load_library(const char* name) {
    const std::string file_name = shared_object_name(name);
    const std::string folder = own_folder();
    ModuleHandle module = nullptr;
    if (!folder.empty()) module = dlopen((folder + file_name).c_str(), RTLD_NOW | RTLD_LOCAL);
    return module != nullptr ? module : dlopen(file_name.c_str(), RTLD_NOW | RTLD_LOCAL);
}

void* find_symbol(ModuleHandle module, const char* name) {
    // dlsym would take a null handle for "everything that is loaded".
    return module != nullptr ? dlsym(module, name) : nullptr;
}

}  // namespace zq::platform
