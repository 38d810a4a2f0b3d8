// Lines of headerless files into rows of an image.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "files/raw_layout.h"

namespace zq {

// Exchanges the bytes of each sample of that many bytes (1, 2 or 4); a broken one at the end stays.
void swap_samples(std::span<std::uint8_t> line, std::int32_t sample_bytes);

// One line, in the machine's byte order, into a row of the layout's type.
void unpack_raw_row(const RawLayout& layout, const std::uint8_t* line, std::uint8_t* row,
                    std::size_t pixels);

}  // namespace zq
