// Text chunks of PNG, and custom data as texts.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

#include "files/png_chunks.h"
#include "files/png_vision.h"
#include "serialize/custom_data.h"

namespace zq {

inline constexpr std::string_view kTextChunk = "tEXt";
inline constexpr std::string_view kDeflatedTextChunk = "zTXt";
inline constexpr std::string_view kVersionKeyword = "Version";
// Stands for an entry of custom data that no text chunk can hold as it is; its text is the key and
// the value in base64, a blank between them.
inline constexpr std::string_view kEscapeKeyword = "Vision custom data";

// Throw kUnableToWriteData for a text that no chunk can hold.
PngChunk make_text(const PngText& text);
PngChunk make_deflated_text(const PngText& text);

// None for a chunk that is damaged, or deflated and larger than `most` bytes. Throws
// kNotEnoughMemory and std::bad_alloc.
std::optional<PngText> parse_text(std::span<const std::uint8_t> chunk);
std::optional<PngText> parse_deflated_text(std::span<const std::uint8_t> chunk, std::size_t most);

// One text for each entry, in the store's order.
std::vector<PngText> texts_of(const CustomData& store);
// Null when there is no entry. Of texts with one keyword the first counts; a text that is empty is
// none. Without `escapes` the escape keyword is one like others.
std::unique_ptr<CustomData> custom_data_of(std::span<const PngText> texts, bool escapes);

}  // namespace zq
