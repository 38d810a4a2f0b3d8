// Checked reading.
#include "files/input_file.h"

#include <cerrno>
#include <limits>
#include <utility>

#include "base/checked.h"
#include "files/stdio_errors.h"
#include "platform/file.h"

namespace zq {

namespace {

// Larger reads go past it.
constexpr std::size_t kInputBuffer = std::size_t{16} * 1024;
constexpr auto kLastPosition = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());

}  // namespace

InputFile::InputFile(const char* path)
    : buffer_(std::make_unique<char[]>(kInputBuffer)), stream_(platform::open_file(path, "rb")) {
    if (!stream_) throw code_of_errno(errno);
    size_ = platform::regular_size(stream_.get());
    // Refused only for lack of memory of the C library's own; it then goes on with its default.
    std::setvbuf(stream_.get(), buffer_.get(), _IOFBF, kInputBuffer);
}

void InputFile::rewind() {
    std::clearerr(stream_.get());
    if (std::fseek(stream_.get(), 0, SEEK_SET) != 0) throw code_of_errno(errno);
}

void InputFile::seek(std::uint64_t offset) {
    if (!try_seek(offset)) throw kUnableToReadData;
}

bool InputFile::try_seek(std::uint64_t offset) noexcept {
    return std::in_range<std::int64_t>(offset) &&
           platform::seek_to(stream_.get(), static_cast<std::int64_t>(offset));
}

std::size_t InputFile::read_some(void* bytes, std::size_t count) noexcept {
    return std::fread(bytes, 1, count, stream_.get());
}

void InputFile::read(void* bytes, std::size_t count, GRLIBError_enum short_read) {
    if (read_some(bytes, count) != count) throw short_read;
}

void InputFile::read_header_bytes(void* bytes, std::size_t count) {
    if (read_some(bytes, count) == count) return;
    throw code_of_errno(std::ferror(stream_.get()) != 0 ? errno : 0);
}

void InputFile::read_rows(platform::Rows<std::uint8_t> rows) {
    const std::int64_t here = platform::position_of(stream_.get());
    if (here < 0 || !try_read_rows_at(static_cast<std::uint64_t>(here), rows))
        throw kUnableToReadData;
}

bool InputFile::try_read_rows_at(std::uint64_t offset, platform::Rows<std::uint8_t> rows) noexcept {
    const std::uint64_t bytes = std::uint64_t{rows.row_bytes} * rows.count;
    return std::in_range<std::int64_t>(offset) && bytes <= kLastPosition - offset &&
           platform::read_rows(stream_.get(), static_cast<std::int64_t>(offset), rows);
}

void InputFile::require(std::uint64_t offset, std::uint64_t count) const {
    if (size_ == kUnknownSize) return;
    if (checked_add(offset, count) > static_cast<std::uint64_t>(size_)) throw kUnableToReadData;
}

}  // namespace zq
