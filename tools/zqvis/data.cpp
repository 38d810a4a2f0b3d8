// zqvis data: the custom data that a PNG file carries.
#include <fmt/format.h>
#include <zqvissvc/errors.h>

#include <cstdint>
#include <functional>
#include <memory>

#include "batch.h"
#include "commands.h"
#include "failure.h"
#include "output_file.h"
#include "picture.h"
#include "streams.h"

namespace {

// The most that a value can have.
constexpr size_t kMostBytes = INT32_MAX;

struct Options {
    std::string file;
    std::string key;
    std::string value;
    std::string from;  // a file that holds the value
};

using Steps = std::function<std::string(const Options&)>;

std::unique_ptr<Picture> open(const Options& options) {
    return Picture::with_vision(Input(options.file).path());
}

// A file that is no PNG has no place for custom data; it is refused before it is replaced.
template <class Change>
void change(const Options& options, Change apply) {
    const auto picture = open(options);
    if (picture->file_type() != "PNG") throw Failure(ZQ_ERR_UNSUPPORTED_FILE_TYPE);
    apply(*picture);
    write_picture(*picture, {options.file, "PNG", true});
}

std::string list_keys(const Options& options) {
    std::string text;
    for (const std::string& key : open(options)->keys()) text += key + "\n";
    return text;
}

// The value's bytes, and nothing else.
std::string get_value(const Options& options) {
    const std::string value = open(options)->value(options.key);
    ByteOutput out(kStandardStream);
    out.write({reinterpret_cast<const uint8_t*>(value.data()), value.size()});
    out.commit();
    return {};
}

std::string set_value(const Options& options) {
    std::string value = options.value;
    if (!options.from.empty()) {
        const auto bytes = read_bytes(Input(options.from).path(), kMostBytes);
        value.assign(bytes.begin(), bytes.end());
    }
    change(options, [&](const Picture& picture) { picture.set_value(options.key, value); });
    return {};
}

std::string remove_key(const Options& options) {
    change(options, [&](const Picture& picture) { picture.remove_value(options.key); });
    return {};
}

CLI::App& add(CLI::App& data, Session& session, const std::shared_ptr<Options>& options,
              const char* name, const char* help, const Steps& steps) {
    CLI::App* command = data.add_subcommand(name, help);
    command->add_option("FILE", options->file, "A PNG file")->required();
    command->callback([options, &session, steps] {
        session.status = run_batch({options->file}, session.quiet,
                                   [&](const std::string&) { return steps(*options); });
    });
    return *command;
}

}  // namespace

void add_data(CLI::App& tool, Session& session) {
    CLI::App* data = tool.add_subcommand("data", "Custom data carried by a PNG file");
    data->require_subcommand(1);
    auto options = std::make_shared<Options>();
    const auto add_key = [&options](CLI::App& command) {
        command.add_option("KEY", options->key)->required();
    };
    add(*data, session, options, "list", "Lists the keys", list_keys);
    add_key(add(*data, session, options, "get", "Prints a value", get_value));
    add_key(add(*data, session, options, "remove", "Removes a key and its value", remove_key));
    CLI::App& setting =
        add(*data, session, options, "set", "Stores a value under a key", set_value);
    add_key(setting);
    CLI::Option* value = setting.add_option("VALUE", options->value);
    setting
        .add_option("--from", options->from, "The file that holds the value; - is standard input")
        ->excludes(value);
}
