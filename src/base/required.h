// Pointers that a caller must not leave null.
#pragma once

#include "base/error_codes.h"

namespace zq {

// Throws kNullPointer.
template <class T>
T& required(T* pointer) {
    if (pointer == nullptr) throw kNullPointer;
    return *pointer;
}

}  // namespace zq
