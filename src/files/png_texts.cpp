// Texts: their chunks, and which entries of custom data fit into them.
#include "files/png_texts.h"

#include <algorithm>
#include <utility>

#include "base/error_codes.h"
#include "codecs/deflate.h"
#include "files/base64.h"

namespace zq {

namespace {

constexpr std::size_t kLongestKeyword = 79;
constexpr std::size_t kLongestChunk = 0x7FFFFFFF;
constexpr std::uint8_t kDeflate = 0;  // the only compression method there is

std::span<const std::uint8_t> bytes_of(std::string_view text) {
    return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

std::string string_of(std::span<const std::uint8_t> bytes) {
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

void append(PngChunk& chunk, std::span<const std::uint8_t> bytes) {
    if (bytes.size() > kLongestChunk - chunk.bytes.size()) throw kUnableToWriteData;
    chunk.bytes.insert(chunk.bytes.end(), bytes.begin(), bytes.end());
}

PngChunk begin_text(std::string_view name, const PngText& text) {
    PngChunk chunk = make_chunk(name);
    append(chunk, bytes_of(text.keyword));
    chunk.bytes.push_back(0);
    return chunk;
}

// What follows the keyword's end; none when the keyword is no keyword.
std::optional<std::span<const std::uint8_t>> behind_keyword(std::span<const std::uint8_t> chunk,
                                                            std::string& keyword) {
    const auto end = std::find(chunk.begin(), chunk.end(), std::uint8_t{0});
    const auto length = static_cast<std::size_t>(end - chunk.begin());
    if (end == chunk.end() || length == 0 || length > kLongestKeyword) return std::nullopt;
    keyword = string_of(chunk.first(length));
    return chunk.subspan(length + 1);
}

// Latin-1 without control characters and without the blank that looks like no blank.
bool is_printable(char character) {
    const auto code = static_cast<std::uint8_t>(character);
    return (code >= 32 && code <= 126) || code >= 161;
}

bool is_keyword(std::string_view key) {
    if (key.empty() || key.size() > kLongestKeyword) return false;
    if (key.front() == ' ' || key.back() == ' ' || key.find("  ") != std::string_view::npos) {
        return false;
    }
    if (key == kVersionKeyword || key == kEscapeKeyword) return false;
    return std::all_of(key.begin(), key.end(), is_printable);
}

bool is_text(std::span<const std::uint8_t> value) {
    return std::find(value.begin(), value.end(), std::uint8_t{0}) == value.end();
}

PngText text_of(std::string_view key, std::span<const std::uint8_t> value) {
    if (is_keyword(key) && is_text(value)) return {std::string(key), string_of(value)};
    return {std::string(kEscapeKeyword), to_base64(bytes_of(key)) + ' ' + to_base64(value)};
}

struct Entry {
    std::string key;
    std::vector<std::uint8_t> value;
};

std::optional<Entry> unescape(std::string_view text) {
    const std::size_t blank = text.find(' ');
    if (blank == std::string_view::npos) return std::nullopt;
    const auto key = from_base64(text.substr(0, blank));
    auto value = from_base64(text.substr(blank + 1));
    if (!key || !value || !is_text(*key)) return std::nullopt;
    return Entry{string_of(*key), std::move(*value)};
}

Entry entry_of(const PngText& text, bool escapes) {
    if (escapes && text.keyword == kEscapeKeyword) {
        if (auto entry = unescape(text.text)) return std::move(*entry);
    }
    const auto value = bytes_of(text.text);
    return {text.keyword, {value.begin(), value.end()}};
}

}  // namespace

PngChunk make_text(const PngText& text) {
    PngChunk chunk = begin_text(kTextChunk, text);
    append(chunk, bytes_of(text.text));
    return chunk;
}

PngChunk make_deflated_text(const PngText& text) {
    PngChunk chunk = begin_text(kDeflatedTextChunk, text);
    chunk.bytes.push_back(kDeflate);
    append(chunk, deflate_bytes(bytes_of(text.text)));
    return chunk;
}

std::optional<PngText> parse_text(std::span<const std::uint8_t> chunk) {
    PngText text;
    const auto rest = behind_keyword(chunk, text.keyword);
    if (!rest) return std::nullopt;
    text.text = string_of(*rest);
    return text;
}

std::optional<PngText> parse_deflated_text(std::span<const std::uint8_t> chunk, std::size_t most) {
    PngText text;
    const auto rest = behind_keyword(chunk, text.keyword);
    if (!rest || rest->empty() || rest->front() != kDeflate) return std::nullopt;
    const auto inflated = inflate_at_most(rest->subspan(1), most);
    if (!inflated) return std::nullopt;
    text.text = string_of(*inflated);
    return text;
}

std::vector<PngText> texts_of(const CustomData& store) {
    std::vector<PngText> texts;
    texts.reserve(store.entries().size());
    for (const auto& [key, value] : store.entries()) texts.push_back(text_of(key, value));
    return texts;
}

std::unique_ptr<CustomData> custom_data_of(std::span<const PngText> texts, bool escapes) {
    auto store = std::make_unique<CustomData>();
    for (const PngText& text : texts) {
        const Entry entry = entry_of(text, escapes);
        if (entry.value.empty() || store->entries().contains(entry.key)) continue;
        store->put(entry.key, entry.value);
    }
    return store->entries().empty() ? nullptr : std::move(store);
}

}  // namespace zq
