// Reports the results of entry points: source texts, the process-wide error mode, the last error.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>
#include <string_view>

#include "host/function_ids.h"

namespace zq::host {

// Error modes: 0 shows each processed result in a message box; 1 and 2 report through the error
// cluster only.
inline constexpr std::uint32_t kShowErrors = 0;
inline constexpr std::uint32_t kDefaultErrorMode = 2;

// Writes status, code and source text into the cluster (null tolerated), remembers the result as
// the last one, shows it if the mode says so, and returns the code. In an inactive thread: only
// returns kSystemError. Throws kNotEnoughMemory when the thread's record cannot be made.
std::int32_t process_result(std::int32_t code, ZqErrorCluster* error, FunctionId function);

// The same under a name that the caller gives.
std::int32_t process_result_as(std::int32_t code, ZqErrorCluster* error, std::string_view caller);

// A value above 2 becomes 2.
void set_error_mode(std::uint32_t mode);

// The last code cut to 16 bits, and the text of the last error if it was reported under a display
// name.
std::int16_t last_error(ZqStringHandle* source);

// Makes *text hold the message of one of the library's own codes, terminator included.
void set_error_text(std::int32_t code, ZqStringHandle* text);

}  // namespace zq::host
