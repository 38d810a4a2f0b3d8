// The record that the library keeps for each thread that enters it; sibling libraries reach it too.
#pragma once

#include <zqvissvc/slots.h>

namespace zq::host {

// The calling thread's record, made on first use; lives until the thread ends. Throws
// kNotEnoughMemory.
ZqThreadRecordData& thread_record();

// Whether host-facing entry points of the calling thread work at all. Throws kNotEnoughMemory.
bool thread_is_active();

}  // namespace zq::host
