// Rows over scattering reads and gathering writes.
#include "platform/row_io.h"

#include <sys/uio.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>

namespace zq::platform {
namespace {

// Well below what any system takes at once, and enough to make the calls cheap.
constexpr std::size_t kMostPieces = 256;

using Transfer = ssize_t (*)(int, const iovec*, int);

bool transfer_rows(int file, Rows<std::uint8_t> rows, Transfer transfer) {
    if (rows.stride == static_cast<std::ptrdiff_t>(rows.row_bytes)) {
        rows.row_bytes *= rows.count;
        rows.count = 1;
    }
    const std::size_t total = rows.row_bytes * rows.count;
    std::array<iovec, kMostPieces> pieces;
    for (std::size_t done = 0; done < total;) {
        const std::size_t row = done / rows.row_bytes;
        std::size_t skip = done % rows.row_bytes;  // a system may stop inside a row
        const std::size_t count = std::min(kMostPieces, rows.count - row);
        for (std::size_t i = 0; i < count; ++i, skip = 0) {
            auto* first = rows.first + static_cast<std::ptrdiff_t>(row + i) * rows.stride;
            pieces[i] = {first + skip, rows.row_bytes - skip};
        }
        const ssize_t moved = transfer(file, pieces.data(), static_cast<int>(count));
        if (moved < 0 && errno == EINTR) continue;
        if (moved == 0) errno = 0;
        if (moved <= 0) return false;
        done += static_cast<std::size_t>(moved);
    }
    return true;
}

}  // namespace

bool read_rows(std::FILE* stream, Rows<std::uint8_t> rows) {
    // The system's position is ahead of the stream's by what the stream has buffered.
    const off_t position = ftello(stream);
    if (position < 0 || lseek(fileno(stream), position, SEEK_SET) < 0) return false;
    return transfer_rows(fileno(stream), rows, readv);
}

bool write_rows(std::FILE* stream, Rows<const std::uint8_t> rows) {
    if (std::fflush(stream) != 0) return false;
    auto* first = const_cast<std::uint8_t*>(rows.first);  // what iovec wants; only read here
    return transfer_rows(fileno(stream), {first, rows.stride, rows.row_bytes, rows.count}, writev);
}

}  // namespace zq::platform
