// Sizes on the command line.
#ifndef ZQVIS_SIZE_H
#define ZQVIS_SIZE_H

#include <CLI/CLI.hpp>
#include <cstdint>
#include <string>

// In pixels; both sides are at least 1.
struct Size {
    int32_t width, height;
};

// Declares a required --size WIDTHxHEIGHT that is checked and kept as text.
void add_size_option(CLI::App& command, std::string& text);
// The same under another name, not required.
void add_size_option(CLI::App& command, const std::string& name, std::string& text,
                     const std::string& help);
// Of a text that the option took.
Size to_size(const std::string& text);

#endif
