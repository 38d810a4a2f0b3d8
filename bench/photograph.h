// Samples like those of a photograph: soft shapes, edges and the noise of a sensor.
#pragma once

#include <cmath>
#include <cstdint>

namespace zqbench {

// Row y of a picture. `random` goes on from row to row. The fourth channel is 0.
template <class Sample>
void paint_row(Sample* at, std::int32_t width, std::int32_t y, int channels, double scale,
               std::uint32_t& random) {
    for (std::int32_t x = 0; x < width; ++x) {
        const double shade = 110 + 50 * std::sin(x * 0.02) + 40 * std::cos(y * 0.03 + x * 0.01);
        const int edge = (x / 37 + y / 53) % 7 == 0 ? 30 : 0;
        for (int i = 0; i < channels; ++i) {
            random = random * 1664525U + 1013904223U;
            const double sample = shade + edge + i * 5 + (random >> 28);
            *at++ = static_cast<Sample>(i == 3 ? 0 : scale * sample);
        }
    }
}

}  // namespace zqbench
