// Which module is the host: the one that exports the services bound by name.
#pragma once

#include <cstdint>

#include "platform/module.h"

namespace zq::host {

// The calling thread's host module; null when there is none. In this order: the value of the
// thread-local slot that was handed in, the module that was handed in, the main program if it
// exports host services, a loaded dfrt.dll.
platform::ModuleHandle host_module();

// Null clears it.
void set_host_module(platform::ModuleHandle module);

// -1 clears it.
void set_host_thread_slot(std::int32_t index);

}  // namespace zq::host
