// Slots of the system, for ForeignSlot.
#include "support/foreign_slot/foreign_slot.h"

#include <windows.h>

namespace zqtest {

ForeignSlot::ForeignSlot() : index_(static_cast<std::int32_t>(TlsAlloc())) {}

ForeignSlot::~ForeignSlot() {
    TlsFree(static_cast<DWORD>(index_));
}

void ForeignSlot::set(void* value) {
    TlsSetValue(static_cast<DWORD>(index_), value);
}

}  // namespace zqtest
