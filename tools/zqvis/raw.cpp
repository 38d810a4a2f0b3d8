// zqvis raw: a file without a header into a picture.
#include <zqvissvc/files.h>

#include <limits>
#include <memory>
#include <string>

#include "batch.h"
#include "commands.h"
#include "output_file.h"
#include "picture.h"
#include "size.h"
#include "streams.h"

namespace {

struct Options {
    std::string file;
    OutputFile output;
    std::string size;
    int32_t format = 0;
    int32_t offset = 0;
    bool big_endian = false;
};

int run(const Options& options, bool quiet) {
    format_of(options.output);  // wrong usage, before anything is done
    return run_batch({options.file}, quiet, [&](const std::string& file) {
        const Input input(file);
        const Size size = to_size(options.size);
        Picture picture(ZQ_TYPE_U8, size.width, size.height);
        picture.read_raw(input.path(), {.present = 1,
                                        .format = options.format,
                                        .dataOffset = options.offset,
                                        .layoutMode = 0,
                                        .layout = {},
                                        .byteOrder = options.big_endian ? 1 : 0});
        write_picture(picture, options.output);
        return std::string();
    });
}

}  // namespace

void add_raw(CLI::App& tool, Session& session) {
    CLI::App* command = tool.add_subcommand("raw", "Turns a file without a header into a picture");
    auto options = std::make_shared<Options>();
    command->add_option("RAW", options->file, "Pixels, row after row; - is standard input")
        ->required();
    add_output_option(*command, options->output);
    add_size_option(*command, options->size);
    command
        ->add_option(
            "--raw-format", options->format,
            "0 to 3 grey of 1, 2, 4, 8 bits; 4 unsigned, 5 signed 16 bits; 6 colour of 5, 6, 5 "
            "bits; 7 red, green, blue; 8 the same in planes; 9 unsigned, 10 signed 32 bits; "
            "11 RGB, 12 float, 13 48-bit colour, 14 complex, 15 HSL as images hold them")
        ->required()
        ->check(CLI::Range(0, 15));
    command->add_option("--offset", options->offset, "Bytes in front of the pixels")
        ->check(CLI::Range(0, std::numeric_limits<int32_t>::max()))
        ->capture_default_str();
    command->add_flag("--big-endian", options->big_endian, "The high byte of a sample comes first");
    command->callback([options, &session] { session.status = run(*options, session.quiet); });
}
