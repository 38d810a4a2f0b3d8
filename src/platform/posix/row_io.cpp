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

// transfer(done, pieces, count) moves what follows the first `done` bytes; as readv and writev do,
// it returns how much.
template <class Transfer>
bool transfer_rows(Rows<std::uint8_t> rows, const Transfer& transfer) {
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
        const ssize_t moved = transfer(done, pieces.data(), static_cast<int>(count));
        if (moved < 0 && errno == EINTR) continue;
        if (moved == 0) errno = 0;
        if (moved <= 0) return false;
        done += static_cast<std::size_t>(moved);
    }
    return true;
}

}  // namespace

bool read_rows(std::FILE* stream, std::int64_t offset, Rows<std::uint8_t> rows) {
    const int file = fileno(stream);
    return transfer_rows(rows, [file, offset](std::size_t done, const iovec* pieces, int count) {
        return preadv(file, pieces, count, offset + static_cast<off_t>(done));
    });
}

bool write_rows(std::FILE* stream, Rows<const std::uint8_t> rows) {
    if (std::fflush(stream) != 0) return false;
    auto* first = const_cast<std::uint8_t*>(rows.first);  // what iovec wants; only read here
    const int file = fileno(stream);
    return transfer_rows({first, rows.stride, rows.row_bytes, rows.count},
                         [file](std::size_t, const iovec* pieces, int count) {
                             return writev(file, pieces, count);
                         });
}

}  // namespace zq::platform
