// What tests of PNG files with vision information share: chunks taken apart and put together with
// zlib alone, a class of objects, and images read and written through the exported functions.
#pragma once

#include <gtest/gtest.h>
#include <zqvissvc/custom_data.h>
#include <zqvissvc/files.h>
#include <zqvissvc/image.h>

#include <algorithm>
#include <map>
#include <string>
#include <utility>

#include "support/bare_png.h"
#include "support/host_blocks.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace zqtest {

using Entries = std::map<std::string, std::string>;

inline std::string deflated(const std::string& payload, int level = 5) {
    auto size = compressBound(static_cast<uLong>(payload.size()));
    std::string stream(size, '\0');
    compress2(reinterpret_cast<Bytef*>(stream.data()), &size,
              reinterpret_cast<const Bytef*>(payload.data()), static_cast<uLong>(payload.size()),
              level);
    stream.resize(size);
    return stream;
}

inline std::string big_endian(size_t number) {
    std::string text;
    for (int shift = 24; shift >= 0; shift -= 8) text += static_cast<char>(number >> shift);
    return text;
}

inline std::string little_endian(uint32_t number) {
    const std::string text = big_endian(number);
    return {text.rbegin(), text.rend()};
}

inline std::string payload_chunk(const std::string& name, const std::string& payload) {
    return png_chunk(name, big_endian(payload.size()) + "ZQKEMO" + deflated(payload));
}

// What a private chunk of the file inflates to; the level shows in the stream's second byte.
inline std::string inflated(const std::string& file, const std::string& name,
                            char level_byte = '^') {
    const std::string chunk = chunk_bytes(file, name);
    if (chunk.empty()) return {};
    EXPECT_EQ(chunk.substr(4, 6), "ZQKEMO");
    EXPECT_EQ(chunk[11], level_byte);
    std::string payload(1 << 16, '\0');
    auto size = static_cast<uLongf>(payload.size());
    EXPECT_EQ(uncompress(reinterpret_cast<Bytef*>(payload.data()), &size,
                         reinterpret_cast<const Bytef*>(chunk.data() + 10),
                         static_cast<uLong>(chunk.size() - 10)),
              Z_OK);
    EXPECT_EQ(big_endian(size), chunk.substr(0, 4));
    return payload.substr(0, size);
}

inline constexpr ZqClassId kCommon = {0x03020100, 0x0504, 0x0706, {8, 9, 10, 11, 12, 13, 14, 15}};
inline constexpr ZqClassId kPrivate = {
    0x13121110, 0x1514, 0x1716, {24, 25, 26, 27, 28, 29, 30, 31}};
inline const std::string kCommonBytes("\0\1\2\3\4\5\6\7\x8\x9\xA\xB\xC\xD\xE\xF", 16);
inline const std::string kPrivateBytes(
    "\x10\x11\x12\x13\x14\x15\x16\x17\x18\x19\x1A\x1B\x1C\x1D\x1E\x1F");
inline const std::string kWord = little_endian(0x00061010);

inline std::string object(uint32_t word, const std::string& id, const std::string& form) {
    return little_endian(word) + little_endian(4) +
           little_endian(static_cast<uint32_t>(form.size())) + id + form;
}

// An object of a sibling library: a text, whose class refuses the one that is "bad".
struct Note {
    static inline int alive = 0;
    explicit Note(std::string content) : text(std::move(content)) { ++alive; }
    ~Note() { --alive; }
    std::string text;

    static void ZQ_CALL destroy(void* note) { delete static_cast<Note*>(note); }
    static ZqError ZQ_CALL create(const void* block, uint32_t size, void** object) {
        std::string text(static_cast<const char*>(block), size);
        if (text == "bad") return -5;
        *object = new Note(std::move(text));
        return 0;
    }
    static ZqAttachmentClass description(const ZqClassId& id, uint16_t number) {
        return {id,
                [](void* note) -> uint32_t {
                    return static_cast<uint32_t>(static_cast<Note*>(note)->text.size());
                },
                [](void* note, void* block) -> ZqError {
                    const std::string& text = static_cast<Note*>(note)->text;
                    std::copy(text.begin(), text.end(), static_cast<char*>(block));
                    return text == "mute" ? -6 : 0;
                },
                create,
                destroy,
                [](void* note) -> uint32_t {
                    return 0xA0 + static_cast<uint32_t>(static_cast<Note*>(note)->text.size());
                },
                number};
    }
};

class VisionFilesTest : public testing::Test {
  protected:
    VisionFilesTest() { know_classes(); }
    ~VisionFilesTest() override {
        forget_classes();
        EXPECT_EQ(Note::alive, 0);
    }
    static void know_classes() {
        for (const auto& [id, number] : {std::pair(kCommon, uint16_t{7}), {kPrivate, 65535}}) {
            const ZqAttachmentClass description = Note::description(id, number);
            EXPECT_EQ(ZqRegisterAttachmentClass(&description), 0);
        }
    }
    static void forget_classes() {
        for (const ZqClassId& id : {kCommon, kPrivate}) ZqUnregisterAttachmentClass(&id);
    }
    static void attach(const Picture& picture, const ZqClassId& id, const std::string& text) {
        ASSERT_EQ(ZqSetAttachment(picture.handle(), &id, new Note(text), Note::destroy), 0);
    }
    static std::string note(const Picture& picture, const ZqClassId& id) {
        void* found = nullptr;
        EXPECT_EQ(ZqFindAttachment(picture.handle(), &id, &found), 0);
        return found == nullptr ? "" : static_cast<Note*>(found)->text;
    }
    static void keep(const Picture& picture, const std::string& key, const std::string& value) {
        const ZqImageValue image = picture.value();
        ASSERT_EQ(DF_WriteCustomData(&image, key.c_str(), value.data(),
                                     static_cast<uint32_t>(value.size()), nullptr),
                  0);
    }
    static Entries entries(const Picture& picture) {
        const ZqImageValue image = picture.value();
        Keys keys;
        EXPECT_EQ(DF_EnumerateCustomKeys(&image, keys.out(), nullptr), 0);
        Entries all;
        for (const std::string& key : keys.texts()) {
            Block value;
            EXPECT_EQ(DF_ReadCustomData(&image, key.c_str(), value.out(), nullptr, nullptr), 0);
            all[key] = value.bytes();
        }
        return all;
    }
    std::string written(const Picture& picture) {
        const ZqImageValue image = picture.value();
        EXPECT_EQ(DF_WriteImageAndVisionInfo(&image, path_.c_str(), nullptr, nullptr), 0);
        return load_bytes(path_);
    }
    ZqError read(const Picture& picture, const std::string& bytes) {
        store_bytes(path_, bytes);
        const ZqImageValue image = picture.value();
        return DF_ReadImageAndVisionInfo(&image, path_.c_str(), 0, nullptr, nullptr);
    }

    ScratchFolder folder_;
    std::string path_ = folder_.path("picture.png");
};

}  // namespace zqtest
