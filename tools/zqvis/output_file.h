// Where a command writes a picture, and as which type of file.
#ifndef ZQVIS_OUTPUT_FILE_H
#define ZQVIS_OUTPUT_FILE_H

#include <CLI/CLI.hpp>
#include <string>

#include "formats.h"
#include "picture.h"

struct OutputFile {
    std::string name;
    std::string format;   // empty: the extension decides
    bool vision = false;  // PNG with vision information
};

// Declare -o, which the command cannot do without, and --format.
void add_output_option(CLI::App& command, OutputFile& output);
void add_format_option(CLI::App& command, std::string& format);

// Throws CLI::ValidationError when neither the option nor the extension names a type of file.
const Format& format_of(const OutputFile& output);

void write_picture(Picture& picture, const OutputFile& output, const ZqWriteOptions& options = {});

#endif
