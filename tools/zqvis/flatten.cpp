// zqvis flatten and unflatten: image files into flattened images and back.
#include <zqvissvc/errors.h>

#include <algorithm>
#include <cstdint>
#include <functional>
#include <limits>
#include <memory>
#include <string>
#include <vector>

#include "batch.h"
#include "commands.h"
#include "failure.h"
#include "output_file.h"
#include "picture.h"
#include "streams.h"

namespace {

// Their places are the library's numbers.
const std::vector<std::string> kCodecs = {"plain", "quality", "packed"};
const std::vector<std::string> kKinds = {"value", "properties"};

int32_t number_of(const std::vector<std::string>& names, const std::string& name) {
    return static_cast<int32_t>(std::ranges::find(names, name) - names.begin());
}

struct FlattenArguments {
    std::string file;
    std::string output;
    std::string codec = kCodecs.front();
    std::string kind = kKinds.front();
    int32_t quality = 750;
};

struct UnflattenArguments {
    std::string record;
    OutputFile output;
};

// No record has a place for a colour table, so it is applied: the colours stay right.
void flatten(const std::string& file, const FlattenArguments& arguments) {
    const Input input(file);
    auto picture = std::make_unique<Picture>(input.path());
    if (!picture->colour_table().empty()) picture = picture->with_colours_applied();
    const std::string record =
        picture->flattened({number_of(kCodecs, arguments.codec), number_of(kKinds, arguments.kind),
                            arguments.quality});
    ByteOutput output(arguments.output);
    output.write({reinterpret_cast<const uint8_t*>(record.data()), record.size()});
    output.commit();
}

void unflatten(const std::string& file, const OutputFile& output) {
    constexpr size_t kLongest = std::numeric_limits<int32_t>::max();  // of a host string
    const Input input(file);
    const std::vector<uint8_t> record = read_bytes(input.path(), kLongest + 1);
    if (record.size() > kLongest) throw Failure(ZQ_ERR_NOT_ENOUGH_MEMORY);
    Picture picture(Record{{reinterpret_cast<const char*>(record.data()), record.size()}});
    write_picture(picture, output);
}

int run_one(const std::string& file, bool quiet,
            const std::function<void(const std::string&)>& work) {
    return run_batch({file}, quiet, [&](const std::string& name) {
        work(name);
        return std::string();
    });
}

}  // namespace

void add_flatten(CLI::App& tool, Session& session) {
    CLI::App* command =
        tool.add_subcommand("flatten", "Turns an image file into a flattened image");
    auto arguments = std::make_shared<FlattenArguments>();
    command->add_option("FILE", arguments->file, "Image file; - is standard input")->required();
    command->add_option("-o,--output", arguments->output, "Record; - is standard output")
        ->required();
    command
        ->add_option("--codec", arguments->codec,
                     "Pixels as they are; with losses; one bit each, set where not 0")
        ->transform(CLI::IsMember(kCodecs, CLI::ignore_case))
        ->capture_default_str();
    command->add_option("--quality", arguments->quality, "Of the quality codec; 1000 is the best")
        ->check(CLI::Range(0, 1000))
        ->capture_default_str();
    command
        ->add_option("--kind", arguments->kind,
                     "Pixels and bit depth, or calibration and custom data too")
        ->transform(CLI::IsMember(kKinds, CLI::ignore_case))
        ->capture_default_str();
    command->callback([arguments, &session] {
        session.status = run_one(arguments->file, session.quiet,
                                 [&](const std::string& file) { flatten(file, *arguments); });
    });
}

void add_unflatten(CLI::App& tool, Session& session) {
    CLI::App* command =
        tool.add_subcommand("unflatten", "Turns a flattened image into an image file");
    auto arguments = std::make_shared<UnflattenArguments>();
    command->add_option("RECORD", arguments->record, "Record; - is standard input")->required();
    add_output_option(*command, arguments->output);
    command->callback([arguments, &session] {
        format_of(arguments->output);  // wrong usage, before anything is done
        session.status = run_one(arguments->record, session.quiet, [&](const std::string& file) {
            unflatten(file, arguments->output);
        });
    });
}
