// Flattened images taken apart and put together word by word.
#pragma once

#include <gtest/gtest.h>
#include <zqvissvc/flatten.h>
#include <zqvissvc/image.h>

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "refhost/refhost.h"

namespace zqtest {

// Places of the header's words in the newest version.
enum Word {
    kVersion,
    kKind,
    kReference,
    kKeepName,
    kPropertySize,
    kSetting,
    kCookie,
    kNameLength,
    kSource,
    kType,
    kWidth,
    kHeight,
    kBorder,
    kWord6,
    kWord7,
    kLine,
    kCodec,
    kPixelSize,
    kAttachmentSize,
    kWordCount
};

inline void put_word(std::string& bytes, uint32_t word) {
    for (int i = 0; i < 4; ++i) bytes += static_cast<char>(word >> (8 * i));
}

inline uint32_t word_at(const std::string& bytes, size_t offset) {
    uint32_t word = 0;
    for (size_t i = 0; i < 4; ++i)
        word |= uint32_t{static_cast<uint8_t>(bytes.at(offset + i))} << (8 * i);
    return word;
}

// A record as its fields; sizes are those of the blocks.
struct Record {
    std::vector<uint32_t> words = std::vector<uint32_t>(kWordCount);
    std::string pixels, attachment, name, properties;

    static size_t first_word(uint32_t version) {
        return version == 0x00080000 ? 1 : version == 0x00070100 ? 5 : 8;
    }

    explicit Record(uint32_t version = 0x00080000) { words[kVersion] = version; }
    // A whole record.
    explicit Record(const std::string& bytes) : Record(word_at(bytes, 0)) {
        size_t at = 4;
        for (size_t i = first_word(words[0]); i < kWordCount; ++i, at += 4) {
            words[i] = word_at(bytes, at);
        }
        const auto block = [&](Word size) {
            at += words[size];
            return bytes.substr(at - words[size], words[size]);
        };
        pixels = block(kPixelSize);
        attachment = block(kAttachmentSize);
        name = block(kNameLength);
        properties = block(kPropertySize);
    }

    std::string bytes() const {
        std::vector<uint32_t> header = words;
        header[kPixelSize] = static_cast<uint32_t>(pixels.size());
        header[kAttachmentSize] = static_cast<uint32_t>(attachment.size());
        header[kNameLength] = static_cast<uint32_t>(name.size());
        header[kPropertySize] = static_cast<uint32_t>(properties.size());
        std::string all;
        put_word(all, header[kVersion]);
        for (size_t i = first_word(header[kVersion]); i < kWordCount; ++i) put_word(all, header[i]);
        return all + pixels + attachment + name + properties;
    }
};

// A record of a grey picture whose bytes count up, border and padding included.
inline Record grey_record(uint32_t version, uint32_t width, uint32_t height, uint32_t border,
                          uint32_t line) {
    Record record(version);
    record.words[kWidth] = width;
    record.words[kHeight] = height;
    record.words[kBorder] = border;
    record.words[kLine] = line;
    record.words[kSource] = 0x1234ABCD;
    for (uint32_t i = 0; i < line * (height + 2 * border); ++i) {
        record.pixels += static_cast<char>(i);
    }
    return record;
}

// Rebuilds from bytes; `image` as UnflattenImageFromArray1D takes it.
inline ZqError unflatten(const std::string& bytes, ZqImageHandle* image) {
    const refhost::String string(bytes);
    return UnflattenImageFromArray1D(image, string.get());
}

// A record of the image in mode 2.
inline std::string flattened(ZqImageHandle image, int32_t codec, int32_t kind = 0,
                             int32_t version = 0x00080000, uint8_t keep_name = 0) {
    refhost::String string;
    EXPECT_EQ(FlattenImageToArray1D2(image, string.out(), 2, codec, kind, 900, keep_name, version),
              0);
    return string.text();
}

// An image that a rebuilding made; it goes with the object.
class Rebuilt {
  public:
    explicit Rebuilt(const std::string& bytes) { code = unflatten(bytes, &handle); }
    ~Rebuilt() { ZqDisposeImage(handle); }
    Rebuilt(const Rebuilt&) = delete;
    Rebuilt& operator=(const Rebuilt&) = delete;
    std::string name() const { return handle->name == nullptr ? "" : handle->name; }

    ZqImageHandle handle = nullptr;
    ZqError code;
};

}  // namespace zqtest
