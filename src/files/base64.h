// Base64 (RFC 4648, with padding).
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace zq {

std::string to_base64(std::span<const std::uint8_t> bytes);
// None for anything but what to_base64 gives.
std::optional<std::vector<std::uint8_t>> from_base64(std::string_view text);

}  // namespace zq
