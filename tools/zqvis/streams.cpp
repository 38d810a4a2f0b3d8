// Standard streams through temporary files, and whole outputs or none.
#include "streams.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <random>
#include <utility>

#include "console.h"
#include "failure.h"

namespace fs = std::filesystem;

namespace {

std::string random_name() {
    static std::random_device device;
    return "zqvis-" + std::to_string(device()) + std::to_string(device());
}

struct Close {
    void operator()(std::FILE* stream) const { std::fclose(stream); }
};
using Stream = std::unique_ptr<std::FILE, Close>;

Stream open(const std::string& path, const char* mode) {
    Stream stream(std::fopen(path.c_str(), mode));
    if (stream == nullptr) fail_with_errno(path);
    return stream;
}

void close(Stream stream, const std::string& path) {
    if (std::fclose(stream.release()) != 0) fail_with_errno(path);
}

void copy(std::FILE* from, std::FILE* to, const std::string& report_as) {
    std::array<char, 65536> block = {};
    while (const size_t bytes = std::fread(block.data(), 1, block.size(), from))
        if (std::fwrite(block.data(), 1, bytes, to) != bytes) fail_with_errno(report_as);
    if (std::ferror(from) != 0 || std::fflush(to) != 0) fail_with_errno(report_as);
}

}  // namespace

std::string name_for_reports(const std::string& output) {
    return output == kStandardStream ? "standard output" : output;
}

TemporaryFolder::TemporaryFolder() {
    std::error_code error;
    const fs::path parent = fs::temp_directory_path(error);
    if (error) throw Failure(error);
    do {
        path_ = parent / random_name();
    } while (!fs::create_directory(path_, error) && !error);
    if (error) throw Failure(error, text_of(path_));
    fs::permissions(path_, fs::perms::owner_all, error);
}

TemporaryFolder::~TemporaryFolder() {
    std::error_code ignored;
    fs::remove_all(path_, ignored);
}

Input::Input(const std::string& name) : path_(name) {
    if (name != kStandardStream) return;
    folder_ = std::make_unique<TemporaryFolder>();
    path_ = folder_->file("input");
    make_binary(stdin);
    Stream staged = open(path_, "wb");
    copy(stdin, staged.get(), path_);
    close(std::move(staged), path_);
}

// Memory grows with what the file holds, not with what it is said to hold.
std::vector<uint8_t> read_bytes(const std::string& path, size_t most) {
    constexpr size_t kAtOnce = size_t{1} << 20;
    const Stream file(std::fopen(path.c_str(), "rb"));
    if (file == nullptr) fail_with_errno({});
    std::vector<uint8_t> bytes;
    while (bytes.size() < most) {
        const size_t done = bytes.size(), wanted = std::min(most - done, kAtOnce);
        bytes.resize(done + wanted);
        const size_t got = std::fread(bytes.data() + done, 1, wanted, file.get());
        if (got == wanted) continue;
        if (std::ferror(file.get()) != 0) fail_with_errno({});
        bytes.resize(done + got);
        break;
    }
    return bytes;
}

void write_through_path(const std::string& output,
                        const std::function<void(const std::string&)>& write) {
    if (output != kStandardStream) {
        write(output);
        return;
    }
    const TemporaryFolder folder;
    const std::string staged = folder.file("output");
    write(staged);
    const Stream stream = open(staged, "rb");
    make_binary(stdout);
    copy(stream.get(), stdout, name_for_reports(output));
}

// A device or a pipe cannot be replaced by a new file; its bytes go straight in.
ByteOutput::ByteOutput(const std::string& name) : name_(name_for_reports(name)) {
    if (name == kStandardStream) {
        make_binary(stdout);
        stream_ = stdout;
        return;
    }
    std::error_code error;
    const fs::file_status status = fs::status(path_of(name), error);
    if (fs::is_regular_file(status) || !fs::exists(status))
        beside_ = text_of(path_of(name).parent_path() / random_name());
    stream_ = std::fopen((beside_.empty() ? name_ : beside_).c_str(), "wb");
    if (stream_ != nullptr) return;
    beside_.clear();
    fail_with_errno(name_);
}

ByteOutput::~ByteOutput() {
    if (stream_ != nullptr && stream_ != stdout) std::fclose(stream_);
    if (!beside_.empty()) std::remove(beside_.c_str());
}

void ByteOutput::write(std::span<const uint8_t> bytes) {
    if (std::fwrite(bytes.data(), 1, bytes.size(), stream_) != bytes.size()) fail_with_errno(name_);
}

void ByteOutput::commit() {
    std::FILE* stream = std::exchange(stream_, nullptr);
    if ((stream == stdout ? std::fflush(stream) : std::fclose(stream)) != 0) fail_with_errno(name_);
    if (beside_.empty()) return;
    std::error_code error;
    fs::rename(path_of(beside_), path_of(name_), error);
    if (error) throw Failure(error, name_);
    beside_.clear();
}
