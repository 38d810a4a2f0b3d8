// Constant planes as their value, others as deflated differences from the left.
#include "serialize/quality_lossless.h"

#include "codecs/deflate.h"

namespace zq {

namespace {

constexpr std::uint8_t kConstant = 0;
constexpr std::uint8_t kDeflated = 1;

void to_differences(std::uint8_t* row, std::size_t width) {
    for (std::size_t x = width; x-- > 1;) {
        row[x] = static_cast<std::uint8_t>(row[x] - row[x - 1]);
    }
}

void from_differences(std::uint8_t* row, std::size_t width) {
    for (std::size_t x = 1; x < width; ++x) {
        row[x] = static_cast<std::uint8_t>(row[x] + row[x - 1]);
    }
}

}  // namespace

BytePlanes::BytePlanes(std::size_t plane_width, std::size_t plane_height, std::size_t plane_count)
    : width(plane_width),
      height(plane_height),
      planes(plane_count),
      bytes(std::make_unique_for_overwrite<std::uint8_t[]>(
          checked_mul(checked_mul(width, height), planes))) {}

void put_constant(Bytes& out, std::uint16_t value) {
    const std::uint8_t bytes[] = {kConstant, static_cast<std::uint8_t>(value),
                                  static_cast<std::uint8_t>(value >> 8)};
    put_bytes(out, bytes);
}

void put_planes(Bytes& out, BytePlanes& planes) {
    for (std::size_t row = 0; row < planes.planes * planes.height; ++row) {
        to_differences(planes.row(0, row), planes.width);
    }
    out.push_back(kDeflated);
    const OpenSection section(out);
    put_bytes(out, deflate_bytes(planes.all()));
    section.close();
}

LosslessPlane read_lossless(StreamReader& reader, std::size_t width, std::size_t height,
                            std::size_t planes) {
    LosslessPlane result;
    const std::uint8_t kind = reader.u8();
    if (kind == kConstant) {
        const auto bytes = reader.bytes(2);
        result.value = static_cast<std::uint16_t>(bytes[0] | bytes[1] << 8);
        return result;
    }
    if (kind != kDeflated) throw kInitializationError;
    const auto packed = reader.section();
    result.planes = std::make_unique<BytePlanes>(width, height, planes);
    if (!inflate_bytes(packed, result.planes->all())) throw kInitializationError;
    for (std::size_t row = 0; row < planes * height; ++row) {
        from_differences(result.planes->row(0, row), width);
    }
    return result;
}

}  // namespace zq
