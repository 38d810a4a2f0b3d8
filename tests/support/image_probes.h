// What tests of the image core share: thrown codes, whole images filled and compared byte by byte.
#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "base/error_codes.h"
#include "image/image.h"

namespace zqtest {

// The code that `action` throws; kSuccess when it throws none.
template <class Action>
GRLIBError_enum code_of(Action action) {
    try {
        action();
        return kSuccess;
    } catch (GRLIBError_enum code) {
        return code;
    }
}

// Byte `x` of a row, different from its neighbours in both directions.
inline std::uint8_t sample(std::int64_t x, std::int64_t y) {
    return static_cast<std::uint8_t>(x * 7 + y * 31 + 5);
}

// Calls visit(byte, x, y) for each byte of the image and its border: y from -border, x counts the
// bytes from the first one of the left border.
template <class Visit>
void each_byte(const zq::Image& image, std::int32_t border, Visit visit) {
    const zq::ImageRecord& record = image.record();
    const std::int32_t pixel_bytes = zq::bytes_per_pixel(image.type());
    for (std::int32_t y = -border; y < record.height + border; ++y) {
        std::uint8_t* row = image.pixel(-border, y);
        for (std::int32_t x = 0; x < (record.width + 2 * border) * pixel_bytes; ++x) {
            visit(row[x], x, y);
        }
    }
}

// Fills image and border.
inline void fill(const zq::Image& image) {
    each_byte(image, image.record().border,
              [](std::uint8_t& byte, std::int32_t x, std::int32_t y) { byte = sample(x, y); });
}

// Bytes of the image proper, top row first.
inline std::vector<std::uint8_t> pixels_of(const zq::Image& image) {
    std::vector<std::uint8_t> bytes;
    if (image.record().width > 0) {
        each_byte(image, 0,
                  [&](std::uint8_t& byte, std::int32_t, std::int32_t) { bytes.push_back(byte); });
    }
    return bytes;
}

// Whether nothing has touched a record since it was copied.
inline bool same_record(const zq::ImageRecord& a, const zq::ImageRecord& b) {
    const auto bytes = [](const zq::ImageRecord& record) {
        return std::string_view(reinterpret_cast<const char*>(&record), sizeof record);
    };
    return bytes(a) == bytes(b);
}

}  // namespace zqtest
