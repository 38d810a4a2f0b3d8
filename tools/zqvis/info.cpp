// zqvis info: what image files hold.
#include <fmt/format.h>
#include <zqvissvc/image.h>

#include <memory>
#include <nlohmann/json.hpp>

#include "batch.h"
#include "commands.h"
#include "picture.h"
#include "streams.h"

namespace {

using Json = nlohmann::ordered_json;

struct Options {
    std::vector<std::string> files;
    bool json = false;
};

// The shortest number that is this float: 0.1, where the plain conversion gives 0.10000000149.
double shortest(float value) {
    return std::stod(fmt::format("{}", value));
}

uint64_t pixel_bytes(const Facts& facts) {
    return static_cast<uint64_t>(facts.width) * static_cast<uint64_t>(facts.height) *
           bytes_per_pixel(facts.type);
}

Json as_json(const std::string& file, const Picture& picture) {
    const Facts facts = picture.facts();
    return {{"file", file},
            {"file_type", picture.file_type()},
            {"pixel_type", Gen_ImageTypeToText(facts.type)},
            {"pixel_type_code", facts.type},
            {"width", facts.width},
            {"height", facts.height},
            {"bytes", pixel_bytes(facts)},
            {"calibration",
             {{"unit", facts.unit},
              {"x_step", shortest(facts.x_step)},
              {"y_step", shortest(facts.y_step)}}},
            {"bit_depth", facts.bit_depth},
            {"sample_offset", facts.sample_offset},
            {"colour_table_entries", picture.colour_table().size()},
            {"custom_keys", picture.keys()},
            {"vision_bytes",
             {{"objects", picture.vision_bytes(ZQ_VISION_OBJECTS)},
              {"private_objects", picture.vision_bytes(ZQ_VISION_PRIVATE_OBJECTS)},
              {"timing", picture.vision_bytes(ZQ_VISION_TIMING)}}}};
}

std::string as_text(const std::string& file, const Picture& picture) {
    const Facts facts = picture.facts();
    std::string text = file + "\n";
    const auto line = [&text](const char* name, const std::string& value) {
        text += fmt::format("  {:<15}{}\n", name, value);
    };
    line("file type", picture.file_type());
    line("pixel type", Gen_ImageTypeToText(facts.type));
    line("size", fmt::format("{} x {} pixels", facts.width, facts.height));
    line("bytes", fmt::format("{}", pixel_bytes(facts)));
    line("calibration",
         fmt::format("unit {}, {} x {} a pixel", facts.unit, facts.x_step, facts.y_step));
    line("bit depth", facts.bit_depth == 0 ? "not set" : fmt::format("{}", facts.bit_depth));
    line("sample offset", fmt::format("{}", facts.sample_offset));
    const size_t entries = picture.colour_table().size();
    line("colour table", entries == 0 ? "none" : fmt::format("{} entries", entries));
    for (const std::string& key : picture.keys())
        line("custom data", fmt::format("{}: {} bytes", key, picture.value(key).size()));
    const auto objects = [&](const char* name, int32_t part) {
        const size_t bytes = picture.vision_bytes(part);
        if (bytes > 0) line(name, fmt::format("{} bytes", bytes));
    };
    objects("objects", ZQ_VISION_OBJECTS);
    objects("private objects", ZQ_VISION_PRIVATE_OBJECTS);
    objects("timing", ZQ_VISION_TIMING);
    return text;
}

int run(const Options& options, bool quiet) {
    Json all = Json::array();
    const int status = run_batch(options.files, quiet, [&](const std::string& file) -> std::string {
        const Input input(file);
        const auto picture = Picture::with_vision(input.path());
        if (!options.json) return as_text(file, *picture);
        all.push_back(as_json(file, *picture));
        return {};
    });
    // File names may be in any encoding; JSON is always UTF-8.
    if (options.json) fmt::print("{}\n", all.dump(2, ' ', false, Json::error_handler_t::replace));
    return status;
}

}  // namespace

void add_info(CLI::App& tool, Session& session) {
    CLI::App* command = tool.add_subcommand("info", "Tells what image files hold");
    auto options = std::make_shared<Options>();
    command->add_option("FILE", options->files, "Image files; - is standard input")->required();
    command->add_flag("--json", options->json, "One JSON array, an object for each file");
    command->callback([options, &session] { session.status = run(*options, session.quiet); });
}
