// Conversions between pixel types, one row at a time: each pair of types is a chain of kernels.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "convert/copy_rows.h"
#include "image/pixel_type.h"

namespace zq {

// What a chain needs to know besides the pixels.
struct ConversionSettings {
    std::int32_t bit_depth = 0;  // of the source image, 0 when not set
    double scale = 1.0;          // of a magnitude that becomes 8 bits
};

// Converts rows of any length from one type to another; not from a type to itself. One thread at a
// time. Pixels may have any alignment; source and destination do not overlap.
class RowConverter {
  public:
    RowConverter(PixelType from, PixelType to, const ConversionSettings& settings, Stores stores);
    ~RowConverter();
    RowConverter(const RowConverter&) = delete;
    RowConverter& operator=(const RowConverter&) = delete;

    void convert(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);

    // One kernel. `stores` counts only for those that can write past the cache.
    struct Pass {
        void (*run)(const void* from, void* to, std::size_t pixels,
                    const ConversionSettings& settings, Stores stores) = nullptr;
        bool can_stream = false;
    };
    // Those that are not needed have no kernel; they are at the end.
    using Passes = std::array<Pass, 3>;

  private:
    static constexpr std::size_t kPixelsAtOnce = 512;
    using Scratch = std::array<std::uint8_t, kPixelsAtOnce * 8>;

    void convert_some(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);

    const Passes& passes_;
    ConversionSettings settings_;
    Stores stores_;
    std::size_t from_bytes_;
    std::size_t to_bytes_;
    alignas(64) std::array<Scratch, 2> scratch_;
};

}  // namespace zq
