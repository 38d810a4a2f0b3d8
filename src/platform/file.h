// Files as the readers and writers need them: C streams with error numbers, and the safe
// replacement of a target.
#pragma once

#include <cstdint>
#include <cstdio>
#include <string>

namespace zq::platform {

// fopen; on failure null with errno set. Paths are in the encoding of the C run-time.
std::FILE* open_file(const char* path, const char* mode);

// Size in bytes of a regular file behind an open stream; -1 when it is no regular file. The
// position stays.
std::int64_t regular_size(std::FILE* stream);

// Where an open stream stands, in bytes from the start; -1 with errno set when it cannot tell.
std::int64_t position_of(std::FILE* stream);

// Moves an open stream to so many bytes from the start, also beyond the end and beyond what a long
// holds. False with errno set.
bool seek_to(std::FILE* stream, std::int64_t position);

// What stands at a path now (symbolic links followed).
enum class PathKind { kAbsent, kRegular, kOther };
PathKind path_kind(const char* path);

// The path with symbolic links resolved where the target exists; else the path itself.
std::string resolve_path(const char* path);

// Makes and opens ("wb") a new file with a fresh name in the folder of `path`, never an existing
// one, with the permissions that `path` has (or a new file gets). Refused when `path` is
// write-protected, though the folder would let it be replaced. Stores the name; null, an empty name
// and errno set on failure.
std::FILE* create_sibling(const std::string& path, std::string& name);

// Puts `from` in the place of `to` (same folder), atomically where the system can. False with errno
// set on failure.
bool replace_file(const std::string& from, const std::string& to);

// Removes a file; failures are ignored.
void remove_file(const std::string& path);

}  // namespace zq::platform
