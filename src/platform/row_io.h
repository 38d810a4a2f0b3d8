// Rows of memory straight from and to files. Rows lie apart in memory and together in the file; the
// system gathers and scatters them, so that no byte is copied on the way.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>

namespace zq::platform {

template <class Byte>
struct Rows {
    Byte* first;
    std::ptrdiff_t stride;  // bytes from one row to the next in memory
    std::size_t row_bytes;  // bytes of a row that are moved
    std::size_t count;
};

// Both go past the stream's buffer. False with errno set on a failure, 0 at the end of the file.
// From an offset in the file; the stream stays where it is.
bool read_rows(std::FILE* stream, std::int64_t offset, Rows<std::uint8_t> rows);
// To where the stream stands, which is fit for nothing but the same again, seeking to an offset and
// closing afterwards.
bool write_rows(std::FILE* stream, Rows<const std::uint8_t> rows);

}  // namespace zq::platform
