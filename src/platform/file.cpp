// Fresh names beside a target, the same on every system.
#include "platform/file.h"

#include <array>
#include <cerrno>
#include <cstdio>
#include <random>

#include "platform/new_file.h"

namespace zq::platform {
namespace {

// ".target.1a2b3c"; for all but short names no longer than the target's, which may be as long as
// the system allows.
std::string sibling_name(const std::string& path, unsigned random) {
    constexpr std::size_t kAdded = 8;
    std::array<char, kAdded> suffix{};
    std::snprintf(suffix.data(), suffix.size(), ".%06x", random & 0xFFFFFFU);
    const std::size_t folder = folder_length(path);
    const std::size_t length = path.size() - folder;
    const std::size_t kept = length > 2 * kAdded ? length - kAdded : length;
    return path.substr(0, folder) + '.' + path.substr(folder, kept) + suffix.data();
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
