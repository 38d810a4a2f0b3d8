// Rows in blocks: scattering reads need page-sized pieces here, and a call for each row would cost
// more than the copy.
#include "platform/row_io.h"

#include <io.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <memory>
#include <new>

namespace zq::platform {
namespace {

constexpr std::size_t kBlockBytes = std::size_t{256} * 1024;
constexpr std::size_t kLargestCall = std::size_t{64} * 1024 * 1024;

bool read_all(int file, std::uint8_t* bytes, std::size_t count) {
    while (count > 0) {
        const int moved = _read(file, bytes, static_cast<unsigned>(std::min(count, kLargestCall)));
        if (moved == 0) errno = 0;
        if (moved <= 0) return false;
        bytes += moved;
        count -= static_cast<std::size_t>(moved);
    }
    return true;
}

bool write_all(int file, const std::uint8_t* bytes, std::size_t count) {
    while (count > 0) {
        const int moved = _write(file, bytes, static_cast<unsigned>(std::min(count, kLargestCall)));
        if (moved == 0) errno = ENOSPC;
        if (moved <= 0) return false;
        bytes += moved;
        count -= static_cast<std::size_t>(moved);
    }
    return true;
}

// Calls `move` for blocks of whole rows, in order: the first row, the number of rows.
template <class Byte, class Move>
bool for_each_block(const Rows<Byte>& rows, Move move) {
    const std::size_t most = std::max<std::size_t>(kBlockBytes / rows.row_bytes, 1);
    for (std::size_t row = 0; row < rows.count; row += most) {
        Byte* first = rows.first + static_cast<std::ptrdiff_t>(row) * rows.stride;
        if (!move(first, std::min(most, rows.count - row))) return false;
    }
    return true;
}

// Rows that lie together are one long row.
template <class Byte>
Rows<Byte> joined(Rows<Byte> rows) {
    if (rows.stride != static_cast<std::ptrdiff_t>(rows.row_bytes)) return rows;
    return {rows.first, rows.stride, rows.row_bytes * rows.count, 1};
}

// Calls `move` for every row, in order.
template <class Byte, class Move>
bool for_each_row(const Rows<Byte>& rows, Move move) {
    for (std::size_t row = 0; row < rows.count; ++row) {
        if (!move(rows.first + static_cast<std::ptrdiff_t>(row) * rows.stride)) return false;
    }
    return true;
}

// None where rows are long enough to go one by one, or have to for lack of memory.
std::unique_ptr<std::uint8_t[]> make_block(std::size_t row_bytes, std::size_t rows) {
    const bool useful = rows > 1 && row_bytes < kBlockBytes;
    return std::unique_ptr<std::uint8_t[]>(useful ? new (std::nothrow) std::uint8_t[kBlockBytes]
                                                  : nullptr);
}

bool read_joined(int file, const Rows<std::uint8_t>& rows) {
    if (rows.row_bytes == 0) return true;
    const std::unique_ptr<std::uint8_t[]> block = make_block(rows.row_bytes, rows.count);
    if (!block) {
        return for_each_row(rows,
                            [&](std::uint8_t* row) { return read_all(file, row, rows.row_bytes); });
    }
    return for_each_block(rows, [&](std::uint8_t* first, std::size_t count) {
        if (!read_all(file, block.get(), count * rows.row_bytes)) return false;
        for (std::size_t i = 0; i < count; ++i, first += rows.stride) {
            std::memcpy(first, block.get() + i * rows.row_bytes, rows.row_bytes);
        }
        return true;
    });
}

}  // namespace

// The stream counts on the file's position to be that behind its buffer.
bool read_rows(std::FILE* stream, std::int64_t offset, Rows<std::uint8_t> rows) {
    const int file = _fileno(stream);
    const std::int64_t behind_buffer = _telli64(file);
    if (behind_buffer < 0 || _lseeki64(file, offset, SEEK_SET) < 0) return false;
    const bool done = read_joined(file, joined(rows));
    const int reason = errno;
    if (_lseeki64(file, behind_buffer, SEEK_SET) < 0) return false;
    errno = reason;
    return done;
}

bool write_rows(std::FILE* stream, Rows<const std::uint8_t> given) {
    const Rows<const std::uint8_t> rows = joined(given);
    const int file = _fileno(stream);
    if (std::fflush(stream) != 0) return false;
    if (rows.row_bytes == 0) return true;
    const std::unique_ptr<std::uint8_t[]> block = make_block(rows.row_bytes, rows.count);
    if (!block) {
        return for_each_row(
            rows, [&](const std::uint8_t* row) { return write_all(file, row, rows.row_bytes); });
    }
    return for_each_block(rows, [&](const std::uint8_t* first, std::size_t count) {
        for (std::size_t i = 0; i < count; ++i, first += rows.stride) {
            std::memcpy(block.get() + i * rows.row_bytes, first, rows.row_bytes);
        }
        return write_all(file, block.get(), count * rows.row_bytes);
    });
}

}  // namespace zq::platform
