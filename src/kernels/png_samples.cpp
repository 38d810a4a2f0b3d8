// Loops that a compiler turns into vectors by itself.
#include "kernels/png_samples.h"

#include <bit>
#include <cstring>

namespace zq {

namespace {

std::uint16_t swapped(std::uint16_t sample) {
    if constexpr (std::endian::native == std::endian::big) return sample;
    return static_cast<std::uint16_t>(sample << 8 | sample >> 8);
}

std::uint16_t load(const std::uint8_t* from) {
    std::uint16_t sample;
    std::memcpy(&sample, from, sizeof sample);
    return swapped(sample);
}

void store(std::uint16_t sample, std::uint8_t* to) {
    std::memcpy(to, &sample, sizeof sample);
}

}  // namespace

void swap_bytes_16(const std::uint8_t* __restrict from, std::uint8_t* __restrict to,
                   std::size_t samples) {
    for (std::size_t i = 0; i < samples; ++i) store(load(from + 2 * i), to + 2 * i);
}

void swap_red_blue(const std::uint8_t* __restrict from, std::uint8_t* __restrict to,
                   std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i, from += 4, to += 4) {
        to[0] = from[2];
        to[1] = from[1];
        to[2] = from[0];
        to[3] = from[3];
    }
}

void bgr_to_rgb(const std::uint8_t* __restrict from, std::uint8_t* __restrict to,
                std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i, from += 3, to += 3) {
        to[0] = from[2];
        to[1] = from[1];
        to[2] = from[0];
    }
}

void swap_red_blue_16(const std::uint8_t* __restrict from, std::uint8_t* __restrict to,
                      std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i, from += 8, to += 8) {
        store(load(from), to + 4);
        store(load(from + 2), to + 2);
        store(load(from + 4), to);
        store(load(from + 6), to + 6);
    }
}

void rgb16_to_bgra16(const std::uint8_t* __restrict from, std::uint8_t* __restrict to,
                     std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i, from += 6, to += 8) {
        store(load(from), to + 4);
        store(load(from + 2), to + 2);
        store(load(from + 4), to);
        store(0, to + 6);
    }
}

void bgra16_to_rgb16(const std::uint8_t* __restrict from, std::uint8_t* __restrict to,
                     std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i, from += 8, to += 6) {
        store(load(from + 4), to);
        store(load(from + 2), to + 2);
        store(load(from), to + 4);
    }
}

}  // namespace zq
