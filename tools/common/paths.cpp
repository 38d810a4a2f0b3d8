// Between char and char8_t.
#include "paths.h"

std::filesystem::path path_of(const std::string& name) {
    return {std::u8string(name.begin(), name.end())};
}

std::string text_of(const std::filesystem::path& path) {
    const std::u8string name = path.u8string();
    return {name.begin(), name.end()};
}
