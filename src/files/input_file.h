// A file being read: the stream, its size where that can be known, and reads whose every shortfall
// becomes an error code.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

#include "base/error_codes.h"
#include "files/stream.h"
#include "platform/row_io.h"

namespace zq {

class InputFile {
  public:
    // Throws the mapped error number when the path cannot be opened.
    explicit InputFile(const char* path);

    // In bytes; kUnknownSize for what is no regular file.
    static constexpr std::int64_t kUnknownSize = -1;
    std::int64_t size() const { return size_; }

    // Throws the mapped error number; a stream without positions (a pipe) cannot be probed.
    void rewind();
    // Offset from the start. Throws kUnableToReadData.
    void seek(std::uint64_t offset);

    // False where the stream has no such position.
    bool try_seek(std::uint64_t offset) noexcept;

    // Bytes that came: fewer than asked for only at the end of the file or on a failure.
    std::size_t read_some(void* bytes, std::size_t count) noexcept;
    // All of them, or `short_read` is thrown.
    void read(void* bytes, std::size_t count, GRLIBError_enum short_read);
    // All of them, or the mapped error number is thrown (end of file: kFileIo).
    void read_header_bytes(void* bytes, std::size_t count);

    // All rows from here on, or kUnableToReadData is thrown. The stream stays where it is.
    void read_rows(platform::Rows<std::uint8_t> rows);
    // The same from an offset. False unless all came.
    bool try_read_rows_at(std::uint64_t offset, platform::Rows<std::uint8_t> rows) noexcept;

    // Throws kUnableToReadData when the file is known to end before `offset` + `count`. What a
    // header announces goes through here before memory is taken for it.
    void require(std::uint64_t offset, std::uint64_t count) const;

  private:
    // Declared before the stream, which uses it until it is closed.
    std::unique_ptr<char[]> buffer_;
    Stream stream_;
    std::int64_t size_ = kUnknownSize;
};

}  // namespace zq
