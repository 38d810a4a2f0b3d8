// Thread identity, spin pause and thread-local slots. Fiber-local slots serve as thread-local ones
// because only they tell when a thread ends.
#include "platform/thread.h"

#include <windows.h>

#include <memory>
#include <new>

namespace zq::platform {
namespace {

// What a slot really holds. The system's callback has its own calling convention and gets nothing
// but the value, so the value brings its release function along.
struct SlotEntry {
    void (*release)(void*);
    void* value;
};

void WINAPI release_entry(void* slot_value) {
    const std::unique_ptr<SlotEntry> entry(static_cast<SlotEntry*>(slot_value));
    if (entry && entry->value != nullptr) entry->release(entry->value);
}

SlotEntry* find_entry(std::uintptr_t key) {
    return static_cast<SlotEntry*>(FlsGetValue(static_cast<DWORD>(key)));
}

}  // namespace

std::uintptr_t current_thread() {
    return GetCurrentThreadId();
}

void pause_spin() {
    SwitchToThread();
}

void* foreign_slot_value(std::int32_t index) {
    return index < 0 ? nullptr : TlsGetValue(static_cast<DWORD>(index));
}

ThreadSlot::ThreadSlot(void (*release)(void*)) : release_(release) {
    key_ = FlsAlloc(release_entry);
    valid_ = key_ != FLS_OUT_OF_INDEXES;
}

ThreadSlot::~ThreadSlot() {
    if (valid_) FlsFree(static_cast<DWORD>(key_));
}

void* ThreadSlot::get() const {
    const SlotEntry* entry = valid_ ? find_entry(key_) : nullptr;
    return entry != nullptr ? entry->value : nullptr;
}

bool ThreadSlot::set(void* value) {
    if (!valid_) return false;
    if (SlotEntry* entry = find_entry(key_)) {
        entry->value = value;
        return true;
    }
    std::unique_ptr<SlotEntry> entry(new (std::nothrow) SlotEntry{release_, value});
    if (!entry || !FlsSetValue(static_cast<DWORD>(key_), entry.get())) return false;
    static_cast<void>(entry.release());
    return true;
}

}  // namespace zq::platform
