// Buffers to files: which image a buffer is, which format a path names, and the older error codes.
#include "files/save_buffer.h"

#include <array>
#include <cstdint>
#include <limits>
#include <string>
#include <string_view>

#include "files/code_of.h"
#include "files/image_files.h"

namespace zq {

namespace {

struct BufferLayout {
    PixelType type;
    Packing packing;
    std::int32_t pixel_bytes;
};

constexpr BufferLayout kGrey8 = {PixelType::kU8, Packing::kNative, 1};
constexpr BufferLayout kGrey16 = {PixelType::kI16, Packing::kUnsigned16, 2};
constexpr BufferLayout kRgb32 = {PixelType::kRgb, Packing::kNative, 4};
constexpr BufferLayout kRgb24 = {PixelType::kRgb, Packing::kPacked24, 3};
constexpr BufferLayout kRgb64 = {PixelType::kRgbU64, Packing::kNative, 8};

struct LayoutRule {
    std::int32_t kind;
    std::int32_t fewest_bits;
    std::int32_t most_bits;
    BufferLayout layout;
};

constexpr std::int32_t kAnyBelow = std::numeric_limits<std::int32_t>::min();
constexpr std::int32_t kAnyAbove = std::numeric_limits<std::int32_t>::max();
constexpr std::int32_t kHighestKind = 17;

// The first rule that fits counts. Fewer than 8 bits of kind 17 are taken for 64-bit colour:
// callers rely on it.
constexpr std::array kLayoutRules = {
    LayoutRule{0, 32, 32, kRgb32},
    LayoutRule{4, 24, 24, kRgb24},
    LayoutRule{4, kAnyBelow, kAnyAbove, kRgb32},
    LayoutRule{13, 24, 24, kRgb24},
    LayoutRule{17, 8, 8, kGrey8},
    LayoutRule{17, 1, 7, kRgb64},
    LayoutRule{17, 9, 16, kGrey16},
    LayoutRule{17, 24, 24, kRgb24},
    LayoutRule{17, 17, 32, kRgb32},
    LayoutRule{17, 33, kAnyAbove, kRgb64},
};

// Throws kBufferKind.
const BufferLayout& layout_of(std::int32_t kind, std::int32_t bits_per_pixel) {
    for (const LayoutRule& rule : kLayoutRules) {
        if (kind == rule.kind && bits_per_pixel >= rule.fewest_bits &&
            bits_per_pixel <= rule.most_bits) {
            return rule.layout;
        }
    }
    throw kBufferKind;
}

struct FormatRule {
    std::string_view extension;
    std::int32_t type_code;
    std::array<std::int32_t, 4> options;  // the first is 0 where none are given
};

constexpr std::array kFormatRules = {
    FormatRule{"BMP", 0, {}},
    FormatRule{"TIF", 2, {1, 0, 0, 0}},
    FormatRule{"TIFF", 2, {1, 0, 0, 0}},
    FormatRule{"PNG", 4, {100, 0, 0, 0}},
    FormatRule{"JPG", 3, {8, 750, 0, 0}},
    FormatRule{"JPEG", 3, {8, 750, 0, 0}},
};

std::string upper_case(std::string_view text) {
    std::string result(text);
    for (char& c : result) {
        if (c >= 'a' && c <= 'z') c = static_cast<char>(c - 'a' + 'A');
    }
    return result;
}

// Throws kBufferExtension.
const FormatRule& format_of(std::string_view extension) {
    const std::string wanted = upper_case(extension);
    for (const FormatRule& rule : kFormatRules) {
        if (rule.extension == wanted) return rule;
    }
    throw kBufferExtension;
}

GRLIBError_enum buffer_code(GRLIBError_enum code) {
    switch (code) {
        case kSuccess:
            return kSuccess;
        case kNotEnoughMemory:
            return kBufferNotEnoughMemory;
        case kIncompatibleImageType:
            return kBufferKind;
        default:
            return kBufferWriteFailed;
    }
}

// Throws kBufferWriteFailed for sizes that no buffer can have.
PixelView view_of_buffer(const BufferLayout& layout, const std::uint8_t* buffer, std::int32_t width,
                         std::int32_t height) {
    if (width <= 0 || height <= 0) throw kBufferWriteFailed;
    const std::int64_t stride = std::int64_t{width} * layout.pixel_bytes;
    if (stride > std::numeric_limits<std::ptrdiff_t>::max() / height) throw kBufferWriteFailed;
    return {.type = layout.type,
            .packing = layout.packing,
            .width = width,
            .height = height,
            .first = buffer,
            .stride = static_cast<std::ptrdiff_t>(stride)};
}

}  // namespace

void save_buffer(const char* path, const std::uint8_t* buffer, std::int32_t bits_per_pixel,
                 std::int32_t kind, std::int32_t width, std::int32_t height) {
    if (path == nullptr) throw kBufferNullPath;
    if (buffer == nullptr) throw kBufferNullBuffer;
    const std::string_view name(path);
    const std::size_t dot = name.rfind('.');
    if (dot == std::string_view::npos) throw kBufferExtension;
    if (kind < 0 || kind > kHighestKind) throw kBufferKind;
    const BufferLayout& layout = layout_of(kind, bits_per_pixel);
    const FormatRule& format = format_of(name.substr(dot + 1));
    const auto& words = format.options;
    const WriteJob job = {.pixels = view_of_buffer(layout, buffer, width, height),
                          .options = {words[0] != 0, {words[1], words[2], words[3]}},
                          .colour_table = {}};
    throw_if_failed(buffer_code(code_of([&] { write_file(path, format.type_code, job); })));
}

}  // namespace zq
