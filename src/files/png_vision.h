// What a PNG file with vision information carries beside the picture, between file and image.
#pragma once

#include <zqvissvc/files.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace zq {

// A keyword of 1 to 79 Latin-1 characters and a text without zero bytes.
struct PngText {
    std::string keyword;
    std::string text;
};

// By whom a file was written: text of its "Version".
inline constexpr std::string_view kPngVersion = "Zorvane Kemo Vision 7.1.0";

struct PngVision {
    ZqPngSettings settings{};
    // Payloads as they stand in the file before they are deflated; empty: none.
    std::vector<std::uint8_t> timing;
    std::vector<std::uint8_t> objects;
    std::vector<std::uint8_t> private_objects;
    // In the file's order, without the version.
    std::vector<PngText> texts;
    // As read; empty: none.
    std::string version;

    bool is_written_by(std::string_view version_or_later) const {
        return !version.empty() && version >= version_or_later;
    }
};

}  // namespace zq
