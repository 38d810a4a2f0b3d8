// One use of libtiff: owns its handle, gives it a file, and keeps its messages from the process.
#pragma once

#include <tiffio.h>

#include <cstdint>
#include <span>

#include "files/input_file.h"
#include "files/output_file.h"

namespace zq {

// The file as libtiff sees it. The position is kept here: asking a C stream to seek to where it
// stands would make it drop its buffer.
struct TiffStream {
    InputFile* input = nullptr;
    OutputFile* output = nullptr;  // both null: every use fails
    std::uint64_t position = 0;
    std::uint64_t size = 0;
    bool short_read = false;  // some read came to the end of the file
    // What write() is to take for the bytes of `rows.first`: all of the rows.
    platform::Rows<const std::uint8_t> rows{};
    // Rows that write() took and that are not in the file yet, as the system takes many at once at
    // less cost. They end at `position`.
    platform::Rows<const std::uint8_t> waiting{};
    bool is_behind_rows = false;  // the file has to seek before it can go on
    bool has_failed = false;      // writing; then so does all that comes after it

    bool seek(std::uint64_t offset) noexcept;
    std::size_t read(void* bytes, std::size_t count) noexcept;
    std::size_t write(const void* bytes, std::size_t count) noexcept;

    // Of rows that write() took.
    bool write_waiting() noexcept;

  private:
    bool move_to(std::uint64_t offset) noexcept;
    bool write_bytes(const void* bytes, std::size_t count) noexcept;
    bool take_rows() noexcept;
    bool put(const void* bytes, std::size_t count) noexcept;
};

class TiffSession {
  public:
    // The file must outlive all calls but the destructor. Reading takes in the first directory:
    // throws kInvalidFileHeader, or kUnableToReadData when the file ends early. A file of unknown
    // size counts as empty.
    explicit TiffSession(InputFile& file);
    explicit TiffSession(OutputFile& file);
    // Writes nothing more.
    ~TiffSession();
    TiffSession(const TiffSession&) = delete;
    TiffSession& operator=(const TiffSession&) = delete;

    TIFF* tiff() const { return tiff_; }
    std::uint64_t file_size() const { return stream_.size; }

    // Rows of the file itself, past the stream's buffer. False unless all of them came.
    bool read_rows_at(std::uint64_t offset, platform::Rows<std::uint8_t> rows) noexcept;
    // A strip of samples as they are; they go from their rows to the file without a copy, at the
    // latest with the directory, and must stay until then. False on a failure, also of a strip
    // before.
    bool write_strip(std::uint32_t strip, platform::Rows<const std::uint8_t> rows) noexcept;
    // False unless all strips and the directory are in the file's stream.
    bool write_directory() noexcept;
    // Samples of the file itself, of so many bits, into the machine's byte order.
    void swap_samples(std::span<std::uint8_t> bytes, int bits) const;

  private:
    void open(const char* mode);

    TiffStream stream_;
    TIFF* tiff_ = nullptr;
};

}  // namespace zq
