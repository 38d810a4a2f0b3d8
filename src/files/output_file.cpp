// Safe writing.
#include "files/output_file.h"

#include <cerrno>
#include <utility>

#include "files/stdio_errors.h"
#include "platform/file.h"

namespace zq {

OutputFile::OutputFile(const char* path)
    : target_(platform::resolve_path(path)), buffer_(std::make_unique<char[]>(kStreamBuffer)) {
    const platform::PathKind kind = platform::path_kind(target_.c_str());
    target_existed_ = kind != platform::PathKind::kAbsent;
    if (kind == platform::PathKind::kOther) {
        stream_.reset(platform::open_file(target_.c_str(), "wb"));
    } else {
        stream_.reset(platform::create_sibling(target_, written_));
    }
    if (!stream_) throw code_of_errno(errno);
    std::setvbuf(stream_.get(), buffer_.get(), _IOFBF, kStreamBuffer);
}

OutputFile::~OutputFile() {
    close();
    if (!written_.empty()) platform::remove_file(written_);
}

bool OutputFile::try_write(const void* bytes, std::size_t count) noexcept {
    errno = 0;
    if (std::fwrite(bytes, 1, count, stream_.get()) == count) return true;
    last_error_ = code_of_errno(errno);
    return false;
}

bool OutputFile::try_flush() noexcept {
    if (std::fflush(stream_.get()) == 0) return true;
    last_error_ = code_of_errno(errno);
    return false;
}

bool OutputFile::try_seek(std::uint64_t offset) noexcept {
    errno = 0;
    if (std::in_range<std::int64_t>(offset) &&
        platform::seek_to(stream_.get(), static_cast<std::int64_t>(offset))) {
        return true;
    }
    last_error_ = code_of_errno(errno);
    return false;
}

bool OutputFile::try_write_rows(platform::Rows<const std::uint8_t> rows) noexcept {
    if (platform::write_rows(stream_.get(), rows)) return true;
    last_error_ = code_of_errno(errno);
    return false;
}

void OutputFile::write(const void* bytes, std::size_t count) {
    if (!try_write(bytes, count)) throw last_error_;
}

void OutputFile::write_rows(platform::Rows<const std::uint8_t> rows) {
    if (!try_write_rows(rows)) throw last_error_;
}

bool OutputFile::close() noexcept {
    return !stream_ || std::fclose(stream_.release()) == 0;
}

void OutputFile::commit() {
    if (!try_flush()) throw last_error_;
    if (!close()) throw code_of_errno(errno);
    if (written_.empty()) return;
    if (!platform::replace_file(written_, target_)) throw code_of_errno(errno);
    written_.clear();
}

void OutputFile::abandon_in_place() noexcept {
    close();
    if (written_.empty() || target_existed_) return;
    if (platform::replace_file(written_, target_)) written_.clear();
}

}  // namespace zq
