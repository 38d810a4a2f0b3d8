// Pictures into files and standard output.
#include "output_file.h"

#include "failure.h"
#include "streams.h"

void add_output_option(CLI::App& command, OutputFile& output) {
    command.add_option("-o,--output", output.name, "Output file; - is standard output")->required();
    add_format_option(command, output.format);
}

void add_format_option(CLI::App& command, std::string& format) {
    command.add_option("--format", format, "Type of file; without it the extension decides")
        ->transform(CLI::IsMember(format_names(), CLI::ignore_case));
}

const Format& format_of(const OutputFile& output) {
    const Format* format =
        output.format.empty() ? format_of_path(output.name) : find_format(output.format);
    if (format == nullptr)
        throw CLI::ValidationError(output.name +
                                   ": the extension names no file type; use --format");
    return *format;
}

void write_picture(Picture& picture, const OutputFile& output, const ZqWriteOptions& options) {
    const Format& format = format_of(output);
    write_through_path(output.name, [&](const std::string& path) {
        check(output.vision ? picture.write_with_vision(path, options)
                            : picture.write(path, format.name, options),
              name_for_reports(output.name));
    });
}
