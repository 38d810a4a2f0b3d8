// Host module selection.
#include "host/module.h"

#include <atomic>

#include "platform/thread.h"

namespace zq::host {
namespace {

std::atomic<std::int32_t> g_thread_slot{-1};
std::atomic<platform::ModuleHandle> g_module{nullptr};

// The main program if it is a host. What it exports stays exported, so "yes" is remembered.
platform::ModuleHandle main_program_host() {
    static std::atomic<platform::ModuleHandle> known{nullptr};
    platform::ModuleHandle module = known.load(std::memory_order_acquire);
    if (module != nullptr) return module;
    module = platform::main_module();
    if (platform::find_symbol(module, "gDFRTVersion") == nullptr &&
        platform::find_symbol(module, "AZNewHandle") == nullptr) {
        return nullptr;
    }
    known.store(module, std::memory_order_release);
    return module;
}

}  // namespace

platform::ModuleHandle host_module() {
    const std::int32_t slot = g_thread_slot.load(std::memory_order_acquire);
    if (slot != -1) {
        platform::ModuleHandle module = platform::foreign_slot_value(slot);
        if (module != nullptr) return module;
    }
    if (platform::ModuleHandle module = g_module.load(std::memory_order_acquire)) return module;
    if (platform::ModuleHandle module = main_program_host()) return module;
    return platform::loaded_module("dfrt.dll");
}

void set_host_module(platform::ModuleHandle module) {
    g_module.store(module, std::memory_order_release);
}

void set_host_thread_slot(std::int32_t index) {
    g_thread_slot.store(index, std::memory_order_release);
}

}  // namespace zq::host
