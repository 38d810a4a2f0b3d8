// Unsigned 16-bit samples to signed pixels, in place. Any number of samples; nothing beyond the row
// is touched.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

// sample + offset, saturated to -32768...32767; the offset lies in that range, too.
void shift_samples(std::uint16_t* samples, std::size_t count, std::int32_t offset);

}  // namespace zq
