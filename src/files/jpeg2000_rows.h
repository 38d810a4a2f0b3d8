// Rows of 32-bit samples, as OpenJPEG has them, to and from rows of pixels. No alignment beyond
// that of the types; nothing overlaps.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace zq {

using SampleRow = std::int32_t*;

// In place: values of `bits` over the whole range of `to` bits, rounded. Nothing happens when both
// are the same.
void spread_samples(SampleRow row, std::size_t count, int bits, int to);

// In place: luminance and two chrominances, which are `bits` wide and unsigned, to red, green, blue
// (ITU-T T.800, annex I: sYCC), rounded and clipped.
void ycc_to_rgb_samples(const std::array<SampleRow, 3>& rows, std::size_t count, int bits);

// Truncates.
void samples_to_bytes(const std::int32_t* row, std::uint8_t* to, std::size_t count);
void samples_to_words(const std::int32_t* row, std::uint16_t* to, std::size_t count);

// Red, green, blue, and alpha where `alpha` is not null (else 0), to pixels of four channels in the
// order blue, green, red, alpha.
void samples_to_colour(const std::array<SampleRow, 3>& rgb, const std::int32_t* alpha,
                       std::uint8_t* to, std::size_t count);
void samples_to_colour(const std::array<SampleRow, 3>& rgb, const std::int32_t* alpha,
                       std::uint16_t* to, std::size_t count);

// In place: pixels whose colours are multiplied by their alpha get straight ones; those of alpha 0
// stay.
void divide_by_alpha(std::uint8_t* pixels, std::size_t count);
void divide_by_alpha(std::uint16_t* pixels, std::size_t count);

// The other way.
void bytes_to_samples(const std::uint8_t* from, SampleRow row, std::size_t count);
void words_to_samples(const std::uint16_t* from, SampleRow row, std::size_t count);
void signed_words_to_samples(const std::int16_t* from, SampleRow row, std::size_t count,
                             std::int32_t offset);
// `channels` (3 or 4) values a pixel, of which `alpha`, where it is not null, gets the fourth.
void colour_to_samples(const std::uint8_t* from, std::size_t channels,
                       const std::array<SampleRow, 3>& rgb, SampleRow alpha, std::size_t count);
void colour_to_samples(const std::uint16_t* from, std::size_t channels,
                       const std::array<SampleRow, 3>& rgb, SampleRow alpha, std::size_t count);

}  // namespace zq
