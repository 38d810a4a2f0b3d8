// Writing an image to a file and reading one from it, whatever the format.
#pragma once

#include <cstdint>

#include "files/handler.h"
#include "files/write_job.h"

namespace zq {

// By type name or by type code. Throws kInvalidParameter for an empty path, kUnsupportedFileType
// for a type without a writer, and what the handler returns.
void write_file(const char* path, const char* type_name, const WriteJob& job);
void write_file(const char* path, std::int32_t type_code, const WriteJob& job);

// The target gets the type and size that the file holds, and keeps its border. False: nobody
// recognises the file, and nothing has changed. Throws kUnableToReadData for an empty path and what
// the handler returns. With parameters, which are present, the file has no header and is read
// by them, in the target's own size, instead of being probed.
[[nodiscard]] bool read_file(const char* path, Image& target, const ZqRawParameters* raw,
                             const Accept& accept);
// The same from an open file.
[[nodiscard]] bool read_file(InputFile& file, Image& target, const Accept& accept);

}  // namespace zq
