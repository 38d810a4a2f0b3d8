// The one translation of C-library stream failures into error codes.
#pragma once

#include <cerrno>

#include "base/error_codes.h"

namespace zq {

// 0, which a stream reports at the end of a file, counts as "any other".
constexpr GRLIBError_enum code_of_errno(int error_number) {
    switch (error_number) {
        case ENOENT:
            return kFileNotFound;
        case ENOMEM:
            return kNotEnoughMemory;
        case EACCES:
            return kFileAccessDenied;
        case EINVAL:
            return kInvalidParameter;
        case EMFILE:
            return kTooManyFilesOpen;
        case ENOSPC:
            return kDiskFull;
        default:
            return kFileIo;
    }
}

}  // namespace zq
