// The parts of create_sibling that differ between systems.
#pragma once

#include <cstddef>
#include <cstdio>
#include <string>
#include <string_view>

namespace zq::platform {

// Length of the folder part of a path, its last separator included; 0 for a bare name.
std::size_t folder_length(std::string_view path);

// Creates `name` and opens it ("wb"); refuses an existing one with EEXIST. The new file has the
// permissions of `model` where that exists, and is refused with EACCES where that is read-only.
// Null with errno set on failure; then no file is left behind.
std::FILE* create_new_file(const std::string& name, const std::string& model);

}  // namespace zq::platform
