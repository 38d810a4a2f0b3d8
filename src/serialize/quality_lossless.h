// What the quality codec keeps exactly: alpha, and where floats are not finite.
#pragma once

#include <cstdint>
#include <memory>

#include "serialize/quality_stream.h"

namespace zq {

// Bytes of a width x height plane; some sample types take two planes, low bytes first. Not cleared.
struct BytePlanes {
    BytePlanes(std::size_t plane_width, std::size_t plane_height, std::size_t plane_count);

    std::uint8_t* row(std::size_t plane, std::size_t y) const {
        return bytes.get() + (plane * height + y) * width;
    }
    std::span<std::uint8_t> all() const { return {bytes.get(), width * height * planes}; }

    std::size_t width, height, planes;
    std::unique_ptr<std::uint8_t[]> bytes;
};

// Every sample is `value`.
void put_constant(Bytes& out, std::uint16_t value);
// `planes` is used up: its rows are left as differences.
void put_planes(Bytes& out, BytePlanes& planes);

// A section that was read: one value, or planes.
struct LosslessPlane {
    std::uint16_t value = 0;
    std::unique_ptr<BytePlanes> planes;  // null: every sample is `value`
};
// Throws kInitializationError, kNotEnoughMemory.
LosslessPlane read_lossless(StreamReader& reader, std::size_t width, std::size_t height,
                            std::size_t planes);

}  // namespace zq
