// Reading and writing integers of a stated byte order in plain bytes.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>

namespace zq {

constexpr std::uint16_t load_be16(const std::uint8_t* bytes) {
    return static_cast<std::uint16_t>(bytes[0] << 8 | bytes[1]);
}
constexpr std::uint32_t load_be32(const std::uint8_t* bytes) {
    return std::uint32_t{load_be16(bytes)} << 16 | load_be16(bytes + 2);
}
constexpr std::uint16_t load_le16(const std::uint8_t* bytes) {
    return static_cast<std::uint16_t>(bytes[1] << 8 | bytes[0]);
}
constexpr std::uint32_t load_le32(const std::uint8_t* bytes) {
    return std::uint32_t{bytes[3]} << 24 | std::uint32_t{bytes[2]} << 16 |
           std::uint32_t{bytes[1]} << 8 | bytes[0];
}
constexpr void store_be16(std::uint8_t* bytes, std::uint16_t value) {
    bytes[0] = static_cast<std::uint8_t>(value >> 8);
    bytes[1] = static_cast<std::uint8_t>(value);
}
constexpr void store_le16(std::uint8_t* bytes, std::uint16_t value) {
    bytes[0] = static_cast<std::uint8_t>(value);
    bytes[1] = static_cast<std::uint8_t>(value >> 8);
}
constexpr void store_le32(std::uint8_t* bytes, std::uint32_t value) {
    for (int i = 0; i < 4; ++i) {
        bytes[i] = static_cast<std::uint8_t>(value >> (8 * i));
    }
}
inline void store_le64(std::uint8_t* bytes, std::uint64_t value) {
    if constexpr (std::endian::native == std::endian::little) {
        std::memcpy(bytes, &value, sizeof value);
    } else {
        store_le32(bytes, static_cast<std::uint32_t>(value));
        store_le32(bytes + 4, static_cast<std::uint32_t>(value >> 32));
    }
}

}  // namespace zq
