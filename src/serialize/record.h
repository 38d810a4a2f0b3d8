// The bytes of a flattened image: a header of 32-bit words and four blocks behind it.
#pragma once

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <span>

namespace zq {

inline constexpr std::uint32_t kOldestVersion = 0x00070000;  // read only
inline constexpr std::uint32_t kStringVersion = 0x00070100;
inline constexpr std::uint32_t kNewestVersion = 0x00080000;

enum class FlattenKind : std::uint32_t { kByValue = 0, kWithProperties = 1, kByReference = 2 };

// Places of the words in the newest version's header, which has them all. Older versions lack some
// after the first; theirs are 0.
enum class RecordWord : std::size_t {
    kVersion,
    kKind,
    kReferencedImage,
    kKeepName,
    kPropertySize,
    kSetting,
    kHostCookie,
    kNameLength,
    kSourceImage,
    kType,
    kWidth,
    kHeight,
    kBorder,
    kImageWord6,
    kImageWord7,
    kLineWidth,
    kCodecId,
    kPixelSize,
    kAttachmentSize,
    kCount
};

class RecordHeader {
  public:
    explicit RecordHeader(std::uint32_t version) { (*this)[RecordWord::kVersion] = version; }

    std::uint32_t& operator[](RecordWord word) { return words_[static_cast<std::size_t>(word)]; }
    std::uint32_t operator[](RecordWord word) const {
        return words_[static_cast<std::size_t>(word)];
    }
    FlattenKind kind() const { return static_cast<FlattenKind>((*this)[RecordWord::kKind]); }

    // Bytes of the header, and of header and blocks together.
    std::size_t size() const;
    std::uint64_t record_size() const;

    // `bytes` are size() bytes. `machine` is the byte order of the words in memory.
    void write(std::span<std::uint8_t> bytes, std::endian machine = std::endian::native) const;

    // Throws kInitializationError for bytes that are not exactly one record, kFlattenKind for a
    // kind that does not exist.
    static RecordHeader read(std::span<const std::uint8_t> record,
                             std::endian machine = std::endian::native);

  private:
    std::array<std::uint32_t, static_cast<std::size_t>(RecordWord::kCount)> words_{};
};

// Where the blocks of a record lie.
struct RecordBlocks {
    std::span<const std::uint8_t> pixels, attachment, name, properties;
};
RecordBlocks blocks_of(const RecordHeader& header, std::span<const std::uint8_t> record);

}  // namespace zq
