// Fresh names beside a target, the same on every system.
#include "platform/file.h"

#include <array>
#include <cerrno>
#include <cstdio>
#include <random>

#include "platform/new_file.h"

namespace zq::platform {
namespace {

// Leaves room for the dots and the suffix in the 255 bytes that file systems allow.
constexpr std::size_t kLongestStem = 240;

std::string sibling_name(const std::string& path, unsigned random) {
    const std::size_t folder = folder_length(path);
    std::array<char, 8> suffix{};
    std::snprintf(suffix.data(), suffix.size(), "%06x", random & 0xFFFFFFU);
    return path.substr(0, folder) + '.' + path.substr(folder, kLongestStem) + '.' + suffix.data();
}

}  // namespace

std::FILE* create_sibling(const std::string& path, std::string& name) {
    constexpr int kAttempts = 100;
    std::random_device random;
    for (int attempt = 0; attempt < kAttempts; ++attempt) {
        name = sibling_name(path, random());
        std::FILE* stream = create_new_file(name, path);
        if (stream != nullptr) return stream;
        if (errno != EEXIST) break;
    }
    name.clear();
    return nullptr;
}

}  // namespace zq::platform
