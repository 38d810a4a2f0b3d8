// Whether exhaustive loops run in full: not under a sanitizer, and not as 32-bit code, which is
// emulated. They are shorter then, but never left out.
#pragma once

namespace zqtest {

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
inline constexpr bool kInstrumented = true;
#else
inline constexpr bool kInstrumented = false;
#endif

inline constexpr bool kThorough = !kInstrumented && sizeof(void*) == 8;

}  // namespace zqtest
