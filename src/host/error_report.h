// Reports the results of entry points: source texts, the process-wide error mode, the last error.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>
#include <string>
#include <string_view>

#include "host/function_ids.h"

namespace zq::host {

// Writes status, code and source text into the cluster (null tolerated), remembers the result as
// the last one, shows it if the mode says so, and returns the code. In an inactive thread: only
// returns kSystemError. Throws kNotEnoughMemory when the thread's record cannot be made.
std::int32_t process_result(std::int32_t code, ZqErrorCluster* error, FunctionId function);

// The same under a name that the caller gives. A success is never shown.
std::int32_t process_result_as(std::int32_t code, ZqErrorCluster* error, std::string_view caller);

// 0 shows each processed result in a message box; 1 and 2 do not. A value above 2 becomes 2.
void set_error_mode(std::uint32_t mode);

// The result that was reported last, by any thread.
struct LastError {
    std::int32_t code = 0;
    FunctionId function =
        FunctionId::kNone;  // of the last failure; none when it was reported under another name
    std::int32_t message_id = 0;  // string id of the last failure's message
};
LastError last_error();

// Makes *source the source text of the last error: empty after a success, and for a failure without
// function id. Throws kNotEnoughMemory.
void set_last_source(ZqStringHandle* source);

// Message of a code from whichever registered table holds it, without a name.
std::string message_text(std::int32_t code);

// Makes *text hold the message of one of the library's own codes, cut to 127 bytes, and a
// terminating zero that counts. Throws kNullPointer and kNotEnoughMemory.
void set_error_text(std::int32_t code, ZqStringHandle* text);

}  // namespace zq::host
