// What a write is asked to do: pixels, options and colour table, checked and free of host types.
#pragma once

#include <zqvissvc/files.h>

#include <array>
#include <cstdint>
#include <span>

#include "files/pixel_view.h"

namespace zq {

// The caller's option words; absent ones leave each format its defaults.
struct WriteOptions {
    bool present = false;
    std::array<std::int32_t, 3> words{};  // what they mean is each writer's to say

    static WriteOptions from(const ZqWriteOptions* options) {
        if (options == nullptr || options->present == 0) return {};
        return {true, {options->words[0], options->words[1], options->words[2]}};
    }
};

struct WriteJob {
    PixelView pixels;
    WriteOptions options;
    std::span<const std::uint32_t> colour_table;  // 0xAARRGGBB; empty: none
};

inline constexpr std::size_t kColourTableSize = 256;

}  // namespace zq
