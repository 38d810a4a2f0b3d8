// zlib's one-call functions over spans.
#include "codecs/deflate.h"

#include <zlib.h>

#include "base/checked.h"

namespace zq {

std::vector<std::uint8_t> deflate_bytes(std::span<const std::uint8_t> bytes) {
    const auto count = checked_narrow<uLong>(bytes.size());
    uLongf size = compressBound(count);
    if (size < count) throw kNotEnoughMemory;
    std::vector<std::uint8_t> packed(size);
    if (compress2(packed.data(), &size, bytes.data(), count, Z_DEFAULT_COMPRESSION) != Z_OK) {
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

}  // namespace zq
