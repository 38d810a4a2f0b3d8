// libtiff's handle, its view of the file, and its limits.
#include "files/tiff_session.h"

#include <algorithm>
#include <limits>
#include <memory>

#include "files/tiff_directory.h"

namespace zq {

namespace {

// Largest single block that libtiff may take for a file: what the file can hold compressed, its
// strips inflated within reason, and room for the tables of a small one.
constexpr std::uint64_t kLeastLimit = std::uint64_t{8} << 20;
constexpr std::uint64_t kLimitFactor = 64;

// Much more than a call to the system costs, and still in the caches.
constexpr std::size_t kMostWaiting = std::size_t{1} << 20;

TiffStream& stream_of(thandle_t handle) {
    return *static_cast<TiffStream*>(handle);
}

tmsize_t read_bytes(thandle_t handle, void* bytes, tmsize_t count) {
    return static_cast<tmsize_t>(stream_of(handle).read(bytes, static_cast<std::size_t>(count)));
}

tmsize_t write_bytes(thandle_t handle, void* bytes, tmsize_t count) {
    return static_cast<tmsize_t>(stream_of(handle).write(bytes, static_cast<std::size_t>(count)));
}

toff_t seek(thandle_t handle, toff_t offset, int from) {
    TiffStream& stream = stream_of(handle);
    if (from == SEEK_CUR) offset += stream.position;
    if (from == SEEK_END) offset += stream.size;
    return stream.seek(offset) ? offset : static_cast<toff_t>(-1);
}

int leave_open(thandle_t) {
    return 0;
}

toff_t size_of(thandle_t handle) {
    return stream_of(handle).size;
}

// Not 0: the handlers of the process, which print, are not called.
int ignore_message(TIFF*, void*, const char*, const char*, va_list) {
    return 1;
}

struct OptionsFreer {
    void operator()(TIFFOpenOptions* options) const { TIFFOpenOptionsFree(options); }
};

tmsize_t memory_limit(std::uint64_t file_size) {
    constexpr auto kMost = static_cast<std::uint64_t>(std::numeric_limits<tmsize_t>::max());
    if (file_size > (kMost - kLeastLimit) / kLimitFactor)
        return std::numeric_limits<tmsize_t>::max();
    return static_cast<tmsize_t>(kLeastLimit + kLimitFactor * file_size);
}

}  // namespace

bool TiffStream::seek(std::uint64_t offset) noexcept {
    return offset == position || (write_waiting() && move_to(offset));
}

bool TiffStream::move_to(std::uint64_t offset) noexcept {
    const bool done = input != nullptr    ? input->try_seek(offset)
                      : output != nullptr ? output->try_seek(offset)
                                          : false;
    if (!done) {
        has_failed = has_failed || output != nullptr;
        return false;
    }
    position = offset;
    is_behind_rows = false;
    return true;
}

std::size_t TiffStream::read(void* bytes, std::size_t count) noexcept {
    if (input == nullptr) return 0;
    const std::size_t came = input->read_some(bytes, count);
    position += came;
    if (came < count) short_read = true;
    return came;
}

// libtiff does not look at what every seek and write came to.
std::size_t TiffStream::write(const void* bytes, std::size_t count) noexcept {
    has_failed = has_failed || !put(bytes, count);
    if (has_failed) return 0;
    position += count;
    size = std::max(size, position);
    return count;
}

bool TiffStream::put(const void* bytes, std::size_t count) noexcept {
    if (output == nullptr) return false;
    if (bytes == rows.first) return take_rows();
    if (!write_waiting()) return false;
    if (is_behind_rows && !move_to(position)) return false;
    return output->try_write(bytes, count);
}

bool TiffStream::take_rows() noexcept {
    const auto behind = [](const platform::Rows<const std::uint8_t>& some) {
        return some.first + some.stride * static_cast<std::ptrdiff_t>(some.count);
    };
    const bool goes_on = waiting.count > 0 && rows.stride == waiting.stride &&
                         rows.row_bytes == waiting.row_bytes && rows.first == behind(waiting);
    if (!goes_on && !write_waiting()) return false;
    const std::size_t before = waiting.count;
    if (!goes_on) waiting = rows;
    waiting.count = before + rows.count;
    return waiting.count * waiting.row_bytes < kMostWaiting || write_waiting();
}

bool TiffStream::write_waiting() noexcept {
    if (waiting.count > 0) {
        has_failed = has_failed || output == nullptr || !output->try_write_rows(waiting);
        is_behind_rows = true;
        waiting = {};
    }
    return !has_failed;
}

TiffSession::TiffSession(InputFile& file) {
    stream_.input = &file;
    stream_.size = static_cast<std::uint64_t>(std::max<std::int64_t>(file.size(), 0));
    check_tiff_directory(file);
    if (!file.try_seek(0)) throw kUnableToReadData;
    open("rm");
    if (tiff_ == nullptr) throw stream_.short_read ? kUnableToReadData : kInvalidFileHeader;
}

TiffSession::TiffSession(OutputFile& file) {
    stream_.output = &file;
    open("wl");
    if (tiff_ != nullptr) return;
    throw file.last_error() != kSuccess ? file.last_error() : kUnableToWriteData;
}

void TiffSession::open(const char* mode) {
    const std::unique_ptr<TIFFOpenOptions, OptionsFreer> options(TIFFOpenOptionsAlloc());
    if (!options) throw kNotEnoughMemory;
    if (stream_.input != nullptr) {
        TIFFOpenOptionsSetMaxSingleMemAlloc(options.get(), memory_limit(stream_.size));
    }
    TIFFOpenOptionsSetErrorHandlerExtR(options.get(), ignore_message, nullptr);
    TIFFOpenOptionsSetWarningHandlerExtR(options.get(), ignore_message, nullptr);
    tiff_ = TIFFClientOpenExt("", mode, &stream_, read_bytes, write_bytes, seek, leave_open,
                              size_of, nullptr, nullptr, options.get());
}

TiffSession::~TiffSession() {
    stream_.input = nullptr;
    stream_.output = nullptr;
    if (tiff_ != nullptr) TIFFClose(tiff_);
}

bool TiffSession::read_rows_at(std::uint64_t offset, platform::Rows<std::uint8_t> rows) noexcept {
    return stream_.input != nullptr && stream_.input->try_read_rows_at(offset, rows);
}

// libtiff hands on the address of a raw strip without looking at what is there.
bool TiffSession::write_strip(std::uint32_t strip,
                              platform::Rows<const std::uint8_t> rows) noexcept {
    stream_.rows = rows;
    const auto bytes = static_cast<tmsize_t>(rows.row_bytes * rows.count);
    const bool done =
        TIFFWriteRawStrip(tiff_, strip, const_cast<std::uint8_t*>(rows.first), bytes) == bytes;
    stream_.rows = {};
    return done;
}

bool TiffSession::write_directory() noexcept {
    return stream_.write_waiting() && TIFFWriteDirectory(tiff_) == 1 && !stream_.has_failed;
}

void TiffSession::swap_samples(std::span<std::uint8_t> bytes, int bits) const {
    if (TIFFIsByteSwapped(tiff_) == 0 || bits < 16) return;
    const auto samples = static_cast<tmsize_t>(bytes.size() / (static_cast<std::size_t>(bits) / 8));
    if (bits == 16) TIFFSwabArrayOfShort(reinterpret_cast<std::uint16_t*>(bytes.data()), samples);
    if (bits == 32) TIFFSwabArrayOfLong(reinterpret_cast<std::uint32_t*>(bytes.data()), samples);
    if (bits == 64) TIFFSwabArrayOfDouble(reinterpret_cast<double*>(bytes.data()), samples);
}

}  // namespace zq
