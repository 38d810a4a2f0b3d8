// Custom data as bytes, and what the image is told about it.
#include <gtest/gtest.h>

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "image/lifecycle.h"
#include "image/registry.h"
#include "serialize/custom_data.h"
#include "tests/support/image_probes.h"

namespace zq {
namespace {

using namespace std::string_literals;
using zqtest::code_of;

std::span<const std::uint8_t> bytes_of(const std::string& text) {
    return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

std::string again(const std::string& bytes) {
    const auto out = serialise(*parse_custom_data(bytes_of(bytes)));
    return {out.begin(), out.end()};
}

GRLIBError_enum parse(const std::string& bytes) {
    return code_of([&] { parse_custom_data(bytes_of(bytes)); });
}

const std::string kThree =
    "\3\0\0\0"
    "\0\0\0\0\1\0\0\0\0"
    "\1\0\0\0\2\0\0\0Bxy"
    "\2\0\0\0\3\0\0\0\xC3\xA9\0\0\1"s;

TEST(CustomDataBytesTest, HaveOneFormOnly) {
    CustomData store;
    store.put("\xC3\xA9", bytes_of("\0\0\1"s));
    store.put("B", bytes_of("xy"));
    store.put("", bytes_of("\0"s));
    const auto bytes = serialise(store);
    EXPECT_EQ(std::string(bytes.begin(), bytes.end()), kThree);
    EXPECT_EQ(again(kThree), kThree);
    for (std::size_t length = 0; length < kThree.size(); ++length) {
        EXPECT_EQ(parse(kThree.substr(0, length)), kInitializationError) << length;
    }
    // Whatever is accepted is what the store would write: nothing is ignored or mended.
    for (std::size_t at = 0; at < kThree.size(); ++at) {
        for (int bits = 1; bits < 256; ++bits) {
            std::string damaged = kThree;
            damaged[at] = static_cast<char>(damaged[at] ^ bits);
            const GRLIBError_enum code = parse(damaged);
            if (code == kSuccess) {
                EXPECT_EQ(again(damaged), damaged) << at << ' ' << bits;
            } else {
                EXPECT_EQ(code, kInitializationError) << at << ' ' << bits;
            }
        }
    }
}

TEST(CustomDataBytesTest, RefusesWhatTheStoreCannotHold) {
    const std::string a = "\1\0\0\0\1\0\0\0av"s;
    const std::string b = "\1\0\0\0\1\0\0\0bv"s;
    struct Case {
        const char* name;
        std::string bytes;
        GRLIBError_enum code;
    };
    const Case cases[] = {
        {"two", "\2\0\0\0"s + a + b, kSuccess},
        {"none", "\0\0\0\0"s, kInitializationError},
        {"more than counted", "\1\0\0\0"s + a + b, kInitializationError},
        {"fewer than counted", "\3\0\0\0"s + a + b, kInitializationError},
        {"the highest count", "\xFF\xFF\xFF\xFF"s + a + b, kInitializationError},
        {"descending", "\2\0\0\0"s + b + a, kInitializationError},
        {"twice", "\2\0\0\0"s + a + a, kInitializationError},
        {"zero in a key", "\1\0\0\0\2\0\0\0\1\0\0\0a\0v"s, kInitializationError},
        {"empty value", "\1\0\0\0\1\0\0\0\0\0\0\0a"s, kInitializationError},
        {"lengths that wrap", "\1\0\0\0\xFF\xFF\xFF\xFF\2\0\0\0a"s, kInitializationError},
    };
    for (const Case& c : cases) EXPECT_EQ(parse(c.bytes), c.code) << c.name;
}

TEST(CustomDataNoticeTest, EveryWriteIsToldAndEverySuccessfulRemoval) {
    const ImageHandle handle = new_image({ZQ_TYPE_U8, 1, 1, 0});
    Image& image = *Image::from_handle(handle);
    const auto told = [&](auto action, GRLIBError_enum code) {
        const std::uint64_t before = image.attachments().change_count();
        EXPECT_EQ(code_of(action), code);
        return image.attachments().change_count() - before;
    };
    EXPECT_EQ(told([&] { CustomData::write(image, "k", bytes_of("v")); }, kSuccess), 1U);
    EXPECT_EQ(told([&] { CustomData::write(image, "k", bytes_of("v")); }, kSuccess), 1U);
    EXPECT_EQ(told([&] { CustomData::write(image, "k", {}); }, kCustomDataSize), 1U);
    EXPECT_EQ(told([&] { CustomData::read(image, "k"); }, kSuccess), 0U);
    EXPECT_EQ(told([&] { CustomData::remove(image, "x"); }, kCustomDataKey), 0U);
    EXPECT_EQ(told([&] { CustomData::remove(image, "k"); }, kSuccess), 1U);
    dispose_image(handle);
}

}  // namespace
}  // namespace zq
