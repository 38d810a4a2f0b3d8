// zqvis error: the message of an error code.
#include <fmt/format.h>

#include <charconv>
#include <memory>
#include <nlohmann/json.hpp>
#include <optional>
#include <string_view>

#include "batch.h"
#include "commands.h"
#include "failure.h"

namespace {

struct Options {
    std::string code;
    bool json = false;
};

std::optional<int64_t> parse(std::string_view text, int base) {
    int64_t value = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value, base);
    if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
    return value;
}

// Decimal, or hexadecimal with 0x in front or a letter in it: a code as signed or as unsigned 32
// bits.
std::optional<ZqError> parse_code(std::string_view text) {
    const bool prefixed = text.starts_with("0x") || text.starts_with("0X");
    std::optional<int64_t> value = prefixed ? parse(text.substr(2), 16) : parse(text, 10);
    if (!value && !prefixed) value = parse(text, 16);
    if (!value || *value < INT32_MIN || *value > UINT32_MAX) return std::nullopt;
    return static_cast<ZqError>(static_cast<uint32_t>(*value));
}

void print(const Options& options) {
    const ZqError code = parse_code(options.code).value();
    const std::string message = message_of(code);
    if (!options.json) {
        fmt::print("{}\n", message);
        return;
    }
    const nlohmann::ordered_json object = {
        {"code", code},
        {"hex", fmt::format("0x{:08X}", static_cast<uint32_t>(code))},
        {"message", message}};
    fmt::print("{}\n", object.dump(2));
}

}  // namespace

void add_error(CLI::App& tool, Session& session) {
    CLI::App* command = tool.add_subcommand("error", "Prints the message of an error code");
    auto options = std::make_shared<Options>();
    command
        ->add_option("CODE", options->code,
                     "Decimal, or hexadecimal: -1074396120, 0xBFF60428, BFF60428")
        ->required()
        ->check([](const std::string& text) {
            return parse_code(text) ? std::string() : text + " is no 32-bit code";
        });
    command->add_flag("--json", options->json, "A JSON object");
    command->callback([options, &session] {
        print(*options);
        session.status = kDone;
    });
}
