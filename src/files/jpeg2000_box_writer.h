// The boxes in front of the code stream of a JP2 file (ITU-T T.800, annex I).
#pragma once

#include <cstdint>
#include <span>
#include <vector>

namespace zq {

struct Jpeg2000Samples;

// Everything up to the code stream, which is the last box and reaches to the end of the file, so
// that nothing needs to be filled in later. `table`: 256 entries 0xAARRGGBB, or empty.
std::vector<std::uint8_t> jp2_boxes(const Jpeg2000Samples& samples, std::uint32_t width,
                                    std::uint32_t height, std::span<const std::uint32_t> table);

}  // namespace zq
