// File types by name and by extension.
#ifndef ZQTOOLS_FORMATS_H
#define ZQTOOLS_FORMATS_H

#include <string>
#include <string_view>
#include <vector>

struct Format {
    const char* name;  // as the library knows it
    const char* extension;
    bool keeps_colour_table;
};

std::vector<std::string> format_names();

// Null when there is none. The name must be one of format_names() but for letter case.
const Format* find_format(std::string_view name);
const Format* format_of_path(const std::string& path);

#endif
