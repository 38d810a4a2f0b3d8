// Checked arithmetic for sizes that come from outside: every helper throws kNotEnoughMemory instead
// of wrapping.
#pragma once

#include <concepts>
#include <limits>
#include <utility>

#include "base/error_codes.h"

namespace zq {

template <std::unsigned_integral T>
constexpr T checked_add(T a, T b) {
    if (b > std::numeric_limits<T>::max() - a) {
        throw kNotEnoughMemory;
    }
    return static_cast<T>(a + b);
}

template <std::unsigned_integral T>
constexpr T checked_mul(T a, T b) {
    if (a != 0 && b > std::numeric_limits<T>::max() / a) {
        throw kNotEnoughMemory;
    }
    return static_cast<T>(a * b);
}

// Narrows once, at the end of a chain of checked steps.
template <std::integral To, std::integral From>
constexpr To checked_narrow(From value) {
    if (!std::in_range<To>(value)) {
        throw kNotEnoughMemory;
    }
    return static_cast<To>(value);
}

}  // namespace zq
