// The table of file types that the tool can ask the library for. Whether the library has them is
// the library's to say.
#include "formats.h"

#include <algorithm>
#include <array>

#include "paths.h"

namespace {

constexpr std::array kFormats = {
    Format{"BMP", ".bmp", true},
    Format{"AIPD", ".aipd", false},
    Format{"TIFF", ".tif", true},
    Format{"JPEG", ".jpg", false},
    Format{"PNG", ".png", true},
    Format{"JPEG2000", ".jp2", true},
    // The plain code stream: of the same name, after the one that stands for it.
    Format{"JPEG2000", ".j2k", false},
};

struct Alias {
    const char* extension;
    const char* usual;
};
constexpr std::array kAliases = {Alias{".tiff", ".tif"}, Alias{".jpeg", ".jpg"},
                                 Alias{".apd", ".aipd"}, Alias{".j2c", ".j2k"},
                                 Alias{".jpc", ".j2k"}};

char lower(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

bool equal_but_for_case(std::string_view a, std::string_view b) {
    return std::ranges::equal(a, b, {}, lower, lower);
}

}  // namespace

std::vector<std::string> format_names() {
    std::vector<std::string> names;
    for (const Format& format : kFormats)
        if (find_format(format.name) == &format) names.emplace_back(format.name);
    return names;
}

const Format* find_format(std::string_view name) {
    const auto* const found = std::ranges::find_if(
        kFormats, [name](const Format& format) { return equal_but_for_case(format.name, name); });
    return found == kFormats.end() ? nullptr : found;
}

const Format* format_of_path(const std::string& path) {
    const std::string given = text_of(path_of(path).extension());
    std::string_view extension = given;
    for (const Alias& alias : kAliases)
        if (equal_but_for_case(alias.extension, given)) extension = alias.usual;
    const auto* const found = std::ranges::find_if(kFormats, [extension](const Format& format) {
        return equal_but_for_case(format.extension, extension);
    });
    return found == kFormats.end() ? nullptr : found;
}
