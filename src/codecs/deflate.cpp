// zlib's one-call functions over spans.
#include "codecs/deflate.h"

#include <zlib.h>

#include <algorithm>

#include "base/checked.h"

namespace zq {

std::vector<std::uint8_t> deflate_bytes(std::span<const std::uint8_t> bytes, int level) {
    const auto count = checked_narrow<uLong>(bytes.size());
    uLongf size = compressBound(count);
    if (size < count) throw kNotEnoughMemory;
    std::vector<std::uint8_t> packed(size);
    if (compress2(packed.data(), &size, bytes.data(), count, level) != Z_OK) {
        throw kNotEnoughMemory;
    }
    packed.resize(size);
    return packed;
}

bool inflate_bytes(std::span<const std::uint8_t> packed, std::span<std::uint8_t> bytes) {
    auto size = checked_narrow<uLongf>(bytes.size());
    auto used = checked_narrow<uLong>(packed.size());
    const int result = uncompress2(bytes.data(), &size, packed.data(), &used);
    if (result == Z_MEM_ERROR) throw kNotEnoughMemory;
    return result == Z_OK && size == bytes.size() && used == packed.size();
}

std::optional<std::vector<std::uint8_t>> inflate_at_most(std::span<const std::uint8_t> packed,
                                                         std::size_t most) {
    most = static_cast<std::size_t>(
        std::min<std::uint64_t>(most, std::uint64_t{packed.size()} * kMostInflation));
    std::vector<std::uint8_t> bytes;
    std::size_t room = std::min(most, packed.size());
    for (;;) {
        bytes.resize(room);
        auto size = checked_narrow<uLongf>(room);
        auto used = checked_narrow<uLong>(packed.size());
        const int result = uncompress2(bytes.data(), &size, packed.data(), &used);
        if (result == Z_MEM_ERROR) throw kNotEnoughMemory;
        if (result == Z_OK && used == packed.size()) {
            bytes.resize(size);
            return bytes;
        }
        if (result != Z_BUF_ERROR || room == most) return std::nullopt;
        room = room > most / 4 ? most : 4 * room;
    }
}

}  // namespace zq
