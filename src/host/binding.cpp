// Lazy binding of one host function.
#include "host/binding.h"

#include <array>
#include <cstdio>

#include "host/module.h"
#include "host/run_hooks.h"

namespace zq::host {

void* Binding::find() {
    platform::ModuleHandle module = host_module();
    if (module == nullptr) return nullptr;
    void* address = cached(module);
    if (address == nullptr) {
        address = platform::find_symbol(module, name_);
        if (address != nullptr) remember(module, address);
    }
    return address;
}

void* Binding::find_or_report() {
    void* address = find();
    if (address != nullptr) return address;
    std::array<char, 128> text;
    if (host_module() == nullptr) {
        std::snprintf(text.data(), text.size(),
                      "DATAFLUX.LIB was not called from a Dataflux process.");
    } else {
        std::snprintf(text.data(), text.size(), "DATAFLUX.LIB could not locate \"%s\".", name_);
    }
    show_modal_box("Fatal Error", text.data());
    return nullptr;
}

void* Binding::cached(platform::ModuleHandle module) const {
    const std::uint32_t before = sequence_.load(std::memory_order_acquire);
    platform::ModuleHandle known = module_.load(std::memory_order_acquire);
    void* address = address_.load(std::memory_order_acquire);
    const bool consistent = before % 2 == 0 && sequence_.load(std::memory_order_relaxed) == before;
    return consistent && known == module ? address : nullptr;
}

void Binding::remember(platform::ModuleHandle module, void* address) {
    std::uint32_t sequence = sequence_.load(std::memory_order_relaxed);
    // Another writer is at work: this thread does without the cache for once.
    if (sequence % 2 != 0 ||
        !sequence_.compare_exchange_strong(sequence, sequence + 1, std::memory_order_acquire)) {
        return;
    }
    module_.store(module, std::memory_order_release);
    address_.store(address, std::memory_order_release);
    sequence_.store(sequence + 2, std::memory_order_release);
}

}  // namespace zq::host
