// Files of the C library, closed at the end of their scope.
#pragma once

#include <cstdio>
#include <memory>
#include <string>

#include "image.h"

namespace zqbench {

using File = std::unique_ptr<std::FILE, int (*)(std::FILE*)>;

// Ends the program when there is no such file.
inline File open(const std::string& path, const char* mode) {
    File file(std::fopen(path.c_str(), mode), std::fclose);
    check(file != nullptr, "fopen");
    return file;
}

}  // namespace zqbench
