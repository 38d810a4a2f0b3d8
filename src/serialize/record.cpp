// Layouts of the record's versions.
#include "serialize/record.h"

#include <cstring>

#include "base/error_codes.h"

namespace zq {

namespace {

constexpr std::size_t kWordBytes = 4;
constexpr std::size_t kReferenceWords = 3;  // of a record by reference

// Records are little-endian; the one place where words change their order.
std::uint32_t in_record_order(std::uint32_t word, std::endian machine) {
    return machine == std::endian::little ? word : __builtin_bswap32(word);
}

std::uint32_t load_word(const std::uint8_t* bytes, std::endian machine) {
    std::uint32_t word = 0;
    std::memcpy(&word, bytes, sizeof word);
    return in_record_order(word, machine);
}

// The first word after the version that a version has.
std::size_t first_word(std::uint32_t version) {
    switch (version) {
        case kOldestVersion:
            return static_cast<std::size_t>(RecordWord::kSourceImage);
        case kStringVersion:
            return static_cast<std::size_t>(RecordWord::kSetting);
        case kNewestVersion:
            return static_cast<std::size_t>(RecordWord::kKind);
        default:
            throw kInitializationError;
    }
}

// Places of the words that the header has; 0 is the version's.
struct Places {
    std::size_t first, end;
};
Places places_of(const RecordHeader& header) {
    if (header.kind() == FlattenKind::kByReference) return {1, kReferenceWords};
    return {first_word(header[RecordWord::kVersion]), static_cast<std::size_t>(RecordWord::kCount)};
}

}  // namespace

std::size_t RecordHeader::size() const {
    const Places places = places_of(*this);
    return (1 + places.end - places.first) * kWordBytes;
}

std::uint64_t RecordHeader::record_size() const {
    if (kind() == FlattenKind::kByReference) return size();
    return std::uint64_t{size()} + (*this)[RecordWord::kPixelSize] +
           (*this)[RecordWord::kAttachmentSize] + (*this)[RecordWord::kNameLength] +
           (*this)[RecordWord::kPropertySize];
}

void RecordHeader::write(std::span<std::uint8_t> bytes, std::endian machine) const {
    const Places places = places_of(*this);
    std::uint8_t* to = bytes.data();
    const auto store = [&](std::uint32_t word) {
        word = in_record_order(word, machine);
        std::memcpy(to, &word, sizeof word);
        to += sizeof word;
    };
    store(words_[0]);
    for (std::size_t i = places.first; i < places.end; ++i) store(words_[i]);
}

RecordHeader RecordHeader::read(std::span<const std::uint8_t> record, std::endian machine) {
    const auto need = [&](std::size_t bytes) {
        if (record.size() < bytes) throw kInitializationError;
    };
    need(kWordBytes);
    RecordHeader header(load_word(record.data(), machine));
    if (header[RecordWord::kVersion] >= kNewestVersion) {
        need(kReferenceWords * kWordBytes);
        header[RecordWord::kKind] = load_word(record.data() + kWordBytes, machine);
    }
    need(header.size());
    const bool has_kind = header[RecordWord::kVersion] == kNewestVersion;
    if (has_kind && header.kind() > FlattenKind::kByReference) throw kFlattenKind;
    const Places places = places_of(header);
    const std::uint8_t* from = record.data() + kWordBytes;
    for (std::size_t i = places.first; i < places.end; ++i, from += kWordBytes) {
        header.words_[i] = load_word(from, machine);
    }
    if (header.record_size() != record.size()) throw kInitializationError;
    return header;
}

RecordBlocks blocks_of(const RecordHeader& header, std::span<const std::uint8_t> record) {
    std::size_t start = header.size();
    const auto next = [&](RecordWord size) {
        const std::span<const std::uint8_t> block = record.subspan(start, header[size]);
        start += block.size();
        return block;
    };
    if (header.kind() == FlattenKind::kByReference) return {};
    RecordBlocks blocks;
    blocks.pixels = next(RecordWord::kPixelSize);
    blocks.attachment = next(RecordWord::kAttachmentSize);
    blocks.name = next(RecordWord::kNameLength);
    blocks.properties = next(RecordWord::kPropertySize);
    return blocks;
}

}  // namespace zq
