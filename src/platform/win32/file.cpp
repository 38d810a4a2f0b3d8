// Files over the C run-time and the system's file calls.
#include "platform/file.h"

#include <fcntl.h>
#include <io.h>
#include <sys/stat.h>
#include <windows.h>

#include <cerrno>

#include "platform/new_file.h"

namespace zq::platform {
namespace {

int errno_of(DWORD error) {
    switch (error) {
        case ERROR_FILE_NOT_FOUND:
        case ERROR_PATH_NOT_FOUND:
        case ERROR_INVALID_NAME:
            return ENOENT;
        case ERROR_ACCESS_DENIED:
        case ERROR_SHARING_VIOLATION:
        case ERROR_LOCK_VIOLATION:
        case ERROR_WRITE_PROTECT:
            return EACCES;
        case ERROR_TOO_MANY_OPEN_FILES:
            return EMFILE;
        case ERROR_NOT_ENOUGH_MEMORY:
        case ERROR_OUTOFMEMORY:
            return ENOMEM;
        case ERROR_DISK_FULL:
        case ERROR_HANDLE_DISK_FULL:
            return ENOSPC;
        default:
            return EIO;
    }
}

HANDLE open_existing(const char* path, DWORD access) {
    return CreateFileA(path, access, FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE,
                       nullptr, OPEN_EXISTING, 0, nullptr);
}

bool is_write_protected(const char* path) {
    const HANDLE handle = open_existing(path, GENERIC_WRITE);
    if (handle == INVALID_HANDLE_VALUE) return errno_of(GetLastError()) == EACCES;
    CloseHandle(handle);
    return false;
}

// False for consoles, the null device and the like. A file that cannot be looked at is a file.
bool is_on_disk(const char* path) {
    const HANDLE handle = open_existing(path, 0);
    if (handle == INVALID_HANDLE_VALUE) return true;
    const DWORD type = GetFileType(handle);
    CloseHandle(handle);
    return type == FILE_TYPE_DISK;
}

}  // namespace

std::FILE* open_file(const char* path, const char* mode) {
    return std::fopen(path, mode);
}

std::int64_t regular_size(std::FILE* stream) {
    struct _stat64 status {};
    if (_fstat64(_fileno(stream), &status) != 0 || !S_ISREG(status.st_mode)) return -1;
    return status.st_size;
}

std::int64_t position_of(std::FILE* stream) {
    return _ftelli64(stream);
}

bool seek_to(std::FILE* stream, std::int64_t position) {
    return _fseeki64(stream, position, SEEK_SET) == 0;
}

PathKind path_kind(const char* path) {
    const DWORD attributes = GetFileAttributesA(path);
    if (attributes == INVALID_FILE_ATTRIBUTES) return PathKind::kAbsent;
    const bool folder = (attributes & FILE_ATTRIBUTE_DIRECTORY) != 0;
    return !folder && is_on_disk(path) ? PathKind::kRegular : PathKind::kOther;
}

std::string resolve_path(const char* path) {
    return path;
}

std::size_t folder_length(std::string_view path) {
    return path.find_last_of("\\/:") + 1;
}

std::FILE* create_new_file(const std::string& name, const std::string& model) {
    if (is_write_protected(model.c_str())) {
        errno = EACCES;
        return nullptr;
    }
    // The access rights are those that the folder hands down.
    const int file = _open(name.c_str(), _O_WRONLY | _O_CREAT | _O_EXCL | _O_BINARY | _O_NOINHERIT,
                           _S_IREAD | _S_IWRITE);
    if (file < 0) return nullptr;
    std::FILE* stream = _fdopen(file, "wb");
    if (stream != nullptr) return stream;
    const int reason = errno;
    _close(file);
    DeleteFileA(name.c_str());
    errno = reason;
    return nullptr;
}

bool replace_file(const std::string& from, const std::string& to) {
    if (MoveFileExA(from.c_str(), to.c_str(), MOVEFILE_REPLACE_EXISTING)) return true;
    errno = errno_of(GetLastError());
    return false;
}

void remove_file(const std::string& path) {
    DeleteFileA(path.c_str());
}

}  // namespace zq::platform
