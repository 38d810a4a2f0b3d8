// Names of files, which are UTF-8 everywhere (on Windows by the programs' manifests), as paths of
// the standard library, which takes plain characters for another set there.
#ifndef ZQTOOLS_PATHS_H
#define ZQTOOLS_PATHS_H

#include <filesystem>
#include <string>

// Both throw std::filesystem::filesystem_error for what is no text, on Windows.
std::filesystem::path path_of(const std::string& name);
std::string text_of(const std::filesystem::path& path);

#endif
