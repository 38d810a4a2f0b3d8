// A file being written. An existing regular file, or an absent one, is written beside its place and
// put there at the end, so that a failed write never damages what was there; anything else (a
// device, a pipe) is written directly.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

#include "base/error_codes.h"
#include "files/stream.h"
#include "platform/row_io.h"

namespace zq {

class OutputFile {
  public:
    // Throws the mapped error number when the file cannot be made.
    explicit OutputFile(const char* path);
    // Without commit: closes, and removes what was begun.
    ~OutputFile();
    OutputFile(const OutputFile&) = delete;
    OutputFile& operator=(const OutputFile&) = delete;

    // False on a failure; last_error() then says why.
    bool try_write(const void* bytes, std::size_t count) noexcept;
    bool try_flush() noexcept;
    // Offset from the start. For formats that go back to what they wrote; what has no positions (a
    // pipe) cannot hold those.
    bool try_seek(std::uint64_t offset) noexcept;
    // Behind rows nothing but rows can be written without seeking first.
    bool try_write_rows(platform::Rows<const std::uint8_t> rows) noexcept;
    GRLIBError_enum last_error() const { return last_error_; }

    // Throw the mapped error number.
    void write(const void* bytes, std::size_t count);
    void write_rows(platform::Rows<const std::uint8_t> rows);

    // Closes the file and puts it in its place. Throws the mapped error number; the place then
    // holds what it held before.
    void commit();

    // Closes the file, ignoring failures, and keeps what was written: under the target's name when
    // nothing stood there, else it is removed like any failed write.
    void abandon_in_place() noexcept;

  private:
    bool close() noexcept;

    std::string target_;
    std::string written_;  // name of the file beside the target; empty: written directly
    bool target_existed_ = false;
    GRLIBError_enum last_error_ = kSuccess;
    std::unique_ptr<char[]> buffer_;
    Stream stream_;
};

}  // namespace zq
