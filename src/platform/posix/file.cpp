// Files over the POSIX calls.
#include "platform/file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <memory>

#include "platform/new_file.h"

namespace zq::platform {
namespace {

constexpr mode_t kPermissions = 0777;

// Gives an open file the owner, where the system lets us, and the permissions of another.
bool copy_permissions(int file, const struct stat& model) {
    // The permissions come last: a change of owner may take some away.
    [[maybe_unused]] const int ignored = fchown(file, model.st_uid, model.st_gid);
    return fchmod(file, model.st_mode & kPermissions) == 0;
}

std::FILE* discard(int file, const std::string& name) {
    const int reason = errno;
    close(file);
    unlink(name.c_str());
    errno = reason;
    return nullptr;
}

}  // namespace

std::FILE* open_file(const char* path, const char* mode) {
    return std::fopen(path, (std::string(mode) + 'e').c_str());
}

std::int64_t regular_size(std::FILE* stream) {
    struct stat status {};
    if (fstat(fileno(stream), &status) != 0 || !S_ISREG(status.st_mode)) return -1;
    return status.st_size;
}

std::int64_t position_of(std::FILE* stream) {
    return ftello(stream);
}

bool seek_to(std::FILE* stream, std::int64_t position) {
    return fseeko(stream, position, SEEK_SET) == 0;
}

PathKind path_kind(const char* path) {
    struct stat status {};
    if (stat(path, &status) != 0) return PathKind::kAbsent;
    return S_ISREG(status.st_mode) ? PathKind::kRegular : PathKind::kOther;
}

std::string resolve_path(const char* path) {
    const std::unique_ptr<char, decltype(&std::free)> resolved(realpath(path, nullptr), std::free);
    return resolved ? resolved.get() : path;
}

std::size_t folder_length(std::string_view path) {
    return path.rfind('/') + 1;
}

std::FILE* create_new_file(const std::string& name, const std::string& model) {
    struct stat status {};
    const bool exists = stat(model.c_str(), &status) == 0;
    if (exists && faccessat(AT_FDCWD, model.c_str(), W_OK, AT_EACCESS) != 0) return nullptr;
    // Without a model the system applies the umask; with one, nobody else may look in before the
    // permissions are set.
    const mode_t mode = exists ? S_IRUSR | S_IWUSR : mode_t{0666};
    const int file = open(name.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode);
    if (file < 0) return nullptr;
    if (exists && !copy_permissions(file, status)) return discard(file, name);
    std::FILE* stream = fdopen(file, "wb");
    return stream != nullptr ? stream : discard(file, name);
}

bool replace_file(const std::string& from, const std::string& to) {
    return std::rename(from.c_str(), to.c_str()) == 0;
}

void remove_file(const std::string& path) {
    unlink(path.c_str());
}

}  // namespace zq::platform
