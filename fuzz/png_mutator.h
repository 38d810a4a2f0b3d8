// Mutated PNG files: their chunks get right check sums most of the time, since otherwise nothing
// behind the check would ever be reached.
#pragma once

#include <zlib.h>

#include <cstddef>
#include <cstdint>

#include "base/byte_order.h"

// The fuzzer brings it; the program that only replays kept inputs has none.
extern "C" __attribute__((weak)) std::size_t LLVMFuzzerMutate(std::uint8_t* bytes, std::size_t size,
                                                              std::size_t most);

namespace zqfuzz {

inline void mend_check_sums(std::uint8_t* bytes, std::size_t size) {
    constexpr std::size_t kSignature = 8;
    constexpr std::size_t kFrame = 12;  // length, name and check sum of a chunk
    for (std::size_t at = kSignature; at + kFrame <= size;) {
        const std::size_t length = zq::load_be32(bytes + at);
        if (length > size - at - kFrame) return;
        std::uint8_t* name = bytes + at + 4;
        const uLong sum = crc32(0, name, static_cast<uInt>(length + 4));
        for (std::size_t i = 0; i < 4; ++i) {
            name[4 + length + i] = static_cast<std::uint8_t>(sum >> (24 - 8 * i));
        }
        at += length + kFrame;
    }
}

// What a target's LLVMFuzzerCustomMutator does.
inline std::size_t mutate_png(std::uint8_t* bytes, std::size_t size, std::size_t most,
                              unsigned seed) {
    const std::size_t mutated = LLVMFuzzerMutate(bytes, size, most);
    if (seed % 8 != 0) mend_check_sums(bytes, mutated);
    return mutated;
}

}  // namespace zqfuzz
