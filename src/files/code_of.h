// The way back from exceptions to codes, for the file functions that return them.
#pragma once

#include "base/error_codes.h"

namespace zq {

// 0, the code that the steps threw, or kNotEnoughMemory for anything else thrown.
template <class Steps>
GRLIBError_enum code_of(Steps&& steps) noexcept {
    try {
        steps();
        return kSuccess;
    } catch (GRLIBError_enum code) {
        return code;
    } catch (...) {
        return kNotEnoughMemory;
    }
}

inline void throw_if_failed(GRLIBError_enum code) {
    if (code != kSuccess) throw code;
}

}  // namespace zq
