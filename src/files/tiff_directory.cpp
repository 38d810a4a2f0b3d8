// Entries of 12 bytes: tag, type, count, and the values or where they are (TIFF 6.0, section 2).
#include "files/tiff_directory.h"

#include <array>
#include <cstdint>

#include "base/byte_order.h"

namespace zq {

namespace {

constexpr std::uint16_t kFirstPrivateTag = 32768;
constexpr std::size_t kEntryBytes = 12;
constexpr std::uint64_t kInlineBytes = 4;

struct Fields {
    bool big_endian;

    std::uint16_t word(const std::uint8_t* at) const {
        return big_endian ? load_be16(at) : static_cast<std::uint16_t>(at[0] | at[1] << 8);
    }
    std::uint32_t dword(const std::uint8_t* at) const {
        return big_endian ? load_be32(at) : load_le32(at);
    }
};

// By type code; 0 for those that the format does not have.
std::uint64_t bytes_of_type(std::uint16_t type) {
    constexpr std::array<std::uint8_t, 14> kBytes = {0, 1, 1, 2, 4, 8, 1, 1, 2, 4, 8, 4, 8, 4};
    return type < kBytes.size() ? kBytes[type] : 0;
}

}  // namespace

void check_tiff_directory(InputFile& file) {
    std::array<std::uint8_t, 8> header;
    if (!file.try_seek(0)) throw kUnableToReadData;
    file.read(header.data(), header.size(), kUnableToReadData);
    const Fields fields{header[0] == 'M'};
    const std::uint32_t start = fields.dword(&header[4]);
    if (start < header.size()) throw kInvalidFileHeader;
    std::array<std::uint8_t, 2> count;
    if (!file.try_seek(start)) throw kUnableToReadData;
    file.read(count.data(), count.size(), kUnableToReadData);
    const std::uint64_t entries = fields.word(count.data());
    file.require(std::uint64_t{start} + count.size(), entries * kEntryBytes + 4);
    for (std::uint64_t i = 0; i < entries; ++i) {
        std::array<std::uint8_t, kEntryBytes> entry;
        file.read(entry.data(), entry.size(), kUnableToReadData);
        const std::uint64_t bytes = bytes_of_type(fields.word(&entry[2])) * fields.dword(&entry[4]);
        if (fields.word(entry.data()) < kFirstPrivateTag && bytes > kInlineBytes)
            file.require(fields.dword(&entry[8]), bytes);
    }
}

}  // namespace zq
