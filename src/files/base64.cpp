// Three bytes are four digits.
#include "files/base64.h"

#include <algorithm>
#include <array>
#include <cstddef>

#include "base/checked.h"

namespace zq {

namespace {

constexpr std::string_view kDigits =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

constexpr std::array<std::int8_t, 256> kValues = [] {
    std::array<std::int8_t, 256> values{};
    values.fill(-1);
    for (std::size_t i = 0; i < kDigits.size(); ++i) {
        values[static_cast<std::uint8_t>(kDigits[i])] = static_cast<std::int8_t>(i);
    }
    return values;
}();

}  // namespace

std::string to_base64(std::span<const std::uint8_t> bytes) {
    std::string text;
    text.reserve(checked_mul<std::size_t>((bytes.size() + 2) / 3, 4));
    for (std::size_t at = 0; at < bytes.size(); at += 3) {
        const auto part = bytes.subspan(at, std::min<std::size_t>(3, bytes.size() - at));
        std::uint32_t group = 0;
        for (std::size_t i = 0; i < 3; ++i) group = group << 8 | (i < part.size() ? part[i] : 0U);
        for (std::size_t i = 0; i < 4; ++i) {
            text += i <= part.size() ? kDigits[group >> (18 - 6 * i) & 63] : '=';
        }
    }
    return text;
}

std::optional<std::vector<std::uint8_t>> from_base64(std::string_view text) {
    if (text.size() % 4 != 0) return std::nullopt;
    std::string_view digits = text;
    while (text.size() - digits.size() < 2 && digits.ends_with('=')) digits.remove_suffix(1);
    std::vector<std::uint8_t> bytes;
    bytes.reserve(text.size() / 4 * 3);
    std::uint32_t group = 0;
    int bits = 0;
    for (const char digit : digits) {
        const std::int8_t value = kValues[static_cast<std::uint8_t>(digit)];
        if (value < 0) return std::nullopt;
        group = (group << 6 | static_cast<std::uint32_t>(value)) & 0xFFFFFF;
        bits += 6;
        if (bits < 8) continue;
        bits -= 8;
        bytes.push_back(static_cast<std::uint8_t>(group >> bits));
    }
    // Bits that belong to no byte are zeros.
    if ((group & ((1U << bits) - 1)) != 0) return std::nullopt;
    return bytes;
}

}  // namespace zq
