// Sizes on the command line.
#include "size.h"

#include <charconv>
#include <optional>
#include <string_view>

namespace {

std::optional<Size> parse_size(std::string_view text) {
    Size size = {};
    const char* const end = text.data() + text.size();
    const auto width = std::from_chars(text.data(), end, size.width);
    if (width.ec != std::errc() || width.ptr == end || *width.ptr != 'x') return std::nullopt;
    const auto height = std::from_chars(width.ptr + 1, end, size.height);
    if (height.ec != std::errc() || height.ptr != end) return std::nullopt;
    if (size.width < 1 || size.height < 1) return std::nullopt;
    return size;
}

std::string complaint(const std::string& value) {
    return parse_size(value) ? std::string() : value + " is no size";
}

}  // namespace

void add_size_option(CLI::App& command, std::string& text) {
    command.add_option("--size", text, "WIDTHxHEIGHT in pixels")->required()->check(complaint);
}

void add_size_option(CLI::App& command, const std::string& name, std::string& text,
                     const std::string& help) {
    command.add_option(name, text, help)->check(complaint);
}

Size to_size(const std::string& text) {
    return parse_size(text).value();
}
