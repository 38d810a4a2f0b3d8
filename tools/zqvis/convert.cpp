// zqvis convert: image files into other types of file and of pixel.
#include <fmt/format.h>

#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string_view>

#include "batch.h"
#include "commands.h"
#include "failure.h"
#include "formats.h"
#include "output_file.h"
#include "paths.h"
#include "picture.h"
#include "streams.h"

namespace fs = std::filesystem;

namespace {

struct Options {
    std::vector<std::string> files;
    std::string output;
    std::string folder;
    std::string format;
    std::string type;
    std::string tiff_compression;
    std::optional<int32_t> quality;
    std::optional<int32_t> png_compression;
    bool vision = false;
};

using Names = std::map<std::string, int32_t, std::less<>>;

const Names kPixelTypes = {{"u8", ZQ_TYPE_U8},       {"i16", ZQ_TYPE_I16},
                           {"float", ZQ_TYPE_SGL},   {"complex", ZQ_TYPE_COMPLEX},
                           {"rgb", ZQ_TYPE_RGB},     {"hsl", ZQ_TYPE_HSL},
                           {"rgb64", ZQ_TYPE_RGBU64}};

// Values of the TIFF option word. 5 means deflate; LZW, whose tag that is, is reached by the same
// low half of the word.
const Names kTiffCompressions = {
    {"none", 1}, {"jpeg", 2}, {"lzw", 0x10005}, {"packbits", 4}, {"deflate", 5}};

// Nothing for an option that was not given; the parser has refused other names.
std::optional<int32_t> value_of(const Names& names, const std::string& name) {
    if (name.empty()) return std::nullopt;
    return names.at(name);
}

std::vector<std::string> names_of(const Names& names) {
    std::vector<std::string> all;
    for (const auto& [name, value] : names) all.push_back(name);
    return all;
}

[[noreturn]] void refuse_usage(const std::string& message) {
    throw CLI::ValidationError(message);
}

const Format& output_format(const Options& options) {
    if (!options.format.empty()) return *find_format(options.format);
    if (!options.folder.empty()) refuse_usage("--out-dir needs --format");
    return format_of({options.output, {}});
}

std::string output_of(const Options& options, const Format& format, const std::string& file) {
    if (options.folder.empty()) return options.output;
    const std::string stem = file == kStandardStream ? "stdin" : text_of(path_of(file).stem());
    return text_of(path_of(options.folder) / path_of(stem + format.extension));
}

// Two inputs must not become one output; found before anything is written.
void refuse_collisions(const Options& options, const Format& format) {
    std::map<std::string, std::string> inputs;
    for (const std::string& file : options.files) {
        const std::string output = output_of(options, format, file);
        const auto [other, is_new] = inputs.emplace(output, file);
        if (!is_new)
            refuse_usage(
                fmt::format("{} and {} would both become {}", other->second, file, output));
    }
}

// Each option goes to the type of file that knows it and is ignored by the others.
ZqWriteOptions write_options(const Options& options, std::string_view format) {
    ZqWriteOptions written = {};
    const auto set = [&written](int word, std::optional<int32_t> value) {
        if (!value) return;
        written.present = 1;
        written.words[word] = *value;
    };
    if (format == "PNG") set(0, options.png_compression);
    if (format == "JPEG" || format == "JPEG2000") set(0, options.quality);
    if (format == "TIFF") set(2, value_of(kTiffCompressions, options.tiff_compression));
    return written;
}

// A colour table that the output cannot hold is applied, so that the colours stay right.
std::unique_ptr<Picture> read(const std::string& path, const Options& options,
                              const Format& format) {
    auto picture = options.vision ? Picture::with_vision(path) : std::make_unique<Picture>(path);
    const std::optional<int32_t> type = value_of(kPixelTypes, options.type);
    const bool stays_u8 = type.value_or(ZQ_TYPE_U8) == ZQ_TYPE_U8;
    if (!picture->colour_table().empty() && !(stays_u8 && format.keeps_colour_table))
        picture = picture->with_colours_applied();
    if (type && picture->facts().type != *type) picture = picture->converted(*type);
    return picture;
}

void convert(const std::string& file, const Options& options, const Format& format) {
    const Input input(file);
    const std::unique_ptr<Picture> picture = read(input.path(), options, format);
    write_picture(*picture, {output_of(options, format, file), format.name, options.vision},
                  write_options(options, format.name));
}

int run(const Options& options, bool quiet) {
    if (options.output.empty() && options.folder.empty())
        refuse_usage("one of -o and --out-dir is needed");
    const Format& format = output_format(options);
    if (options.vision && std::string_view(format.name) != "PNG")
        refuse_usage("--vision needs an output of type PNG");
    if (options.folder.empty() && options.files.size() > 1)
        refuse_usage("several files need --out-dir");
    refuse_collisions(options, format);
    return run_batch(options.files, quiet, [&](const std::string& file) {
        std::error_code error;
        if (!options.folder.empty()) fs::create_directories(path_of(options.folder), error);
        if (error) throw Failure(error, options.folder);
        convert(file, options, format);
        return std::string();
    });
}

}  // namespace

void add_convert(CLI::App& tool, Session& session) {
    CLI::App* command = tool.add_subcommand("convert", "Converts image files");
    auto options = std::make_shared<Options>();
    command->add_option("FILE", options->files, "Image files; - is standard input")->required();
    CLI::Option* output =
        command->add_option("-o,--output", options->output, "Output file; - is standard output");
    command
        ->add_option("--out-dir", options->folder,
                     "Folder for the outputs; made when it does not exist")
        ->excludes(output);
    const auto one_of = [command](const char* name, std::string& target, const char* help,
                                  const std::vector<std::string>& names) {
        command->add_option(name, target, help)->transform(CLI::IsMember(names, CLI::ignore_case));
    };
    add_format_option(*command, options->format);
    one_of("--type", options->type, "Type of pixel", names_of(kPixelTypes));
    one_of("--tiff-compression", options->tiff_compression, "TIFF", names_of(kTiffCompressions));
    command->add_option("--quality", options->quality, "JPEG, JPEG2000")
        ->check(CLI::Range(0, 1000));
    command
        ->add_option("--png-compression", options->png_compression,
                     "PNG: 0 is the smallest file, 100 is not compressed")
        ->check(CLI::Range(0, 100));
    command->add_flag("--vision", options->vision,
                      "Vision information goes along, from PNG to PNG");
    command->callback([options, &session] { session.status = run(*options, session.quiet); });
}
