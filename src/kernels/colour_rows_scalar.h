// The obvious loops: what the fast ones must equal, and the remainders of rows.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq::scalar {

inline void rgb_to_bgra(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i, source += 3, destination += 4) {
        destination[0] = source[2];
        destination[1] = source[1];
        destination[2] = source[0];
        destination[3] = 0;
    }
}

inline void bgr_to_bgra(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i, source += 3, destination += 4) {
        destination[0] = source[0];
        destination[1] = source[1];
        destination[2] = source[2];
        destination[3] = 0;
    }
}

inline void bgra_to_bgr(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i, source += 4, destination += 3) {
        destination[0] = source[0];
        destination[1] = source[1];
        destination[2] = source[2];
    }
}

inline void bgra_to_rgb(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i, source += 4, destination += 3) {
        destination[0] = source[2];
        destination[1] = source[1];
        destination[2] = source[0];
    }
}

}  // namespace zq::scalar
