// zqvis dump: the pixels of an image file as plain bytes.
#include <memory>

#include "batch.h"
#include "commands.h"
#include "picture.h"
#include "streams.h"

namespace {

struct Options {
    std::string file;
    std::string output;
};

void dump(const std::string& file, const std::string& output_name) {
    const Input input(file);
    const Picture picture(input.path());
    const int32_t height = picture.facts().height;
    ByteOutput output(output_name);
    for (int32_t y = 0; y < height; ++y) output.write(picture.row(y));
    output.commit();
}

}  // namespace

void add_dump(CLI::App& tool, Session& session) {
    CLI::App* command = tool.add_subcommand(
        "dump", "Writes the rows of an image as stored, top row first, unpadded");
    auto options = std::make_shared<Options>();
    command->add_option("FILE", options->file, "Image file; - is standard input")->required();
    command->add_option("-o,--output", options->output, "Output file; - is standard output")
        ->required();
    command->callback([options, &session] {
        session.status = run_batch({options->file}, session.quiet, [&](const std::string& file) {
            dump(file, options->output);
            return std::string();
        });
    });
}
