// Custom data on images as hosts write, read, list and remove it.
#include <gtest/gtest.h>
#include <zqvissvc/custom_data.h>

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "refhost/refhost.h"
#include "tests/support/host_blocks.h"
#include "tests/support/host_image.h"

namespace {

using zqtest::Block;
using zqtest::Cluster;
using zqtest::HostImage;
using zqtest::Keys;
using namespace std::string_literals;
using Texts = std::vector<std::string>;

constexpr ZqError kNoMemory = -1074396159;
constexpr ZqError kNotAnImage = -1074396120;
constexpr ZqError kNullPointer = -1074395269;
constexpr ZqError kSize = -1074395724;
constexpr ZqError kKey = -1074395723;

ZqError write(const HostImage& image, const char* key, const std::string& value) {
    return DF_WriteCustomData(&image.value, key, value.data(), static_cast<uint32_t>(value.size()),
                              nullptr);
}

Block block_of(const std::string& text) {
    return Block(reinterpret_cast<ZqHandle>(refhost::new_string(text)));
}

// Every key with its value, read with a size and without one, into blocks smaller and larger than
// the value and into none.
Texts contents(const HostImage& image) {
    Keys keys;
    EXPECT_EQ(DF_EnumerateCustomKeys(&image.value, keys.out(), nullptr), 0);
    Texts all;
    Block small = block_of("");
    Block large = block_of(std::string(999, 'x'));
    for (const std::string& key : keys.texts()) {
        uint32_t size = 77;
        Block none;
        EXPECT_EQ(DF_ReadCustomData(&image.value, key.c_str(), none.out(), nullptr, nullptr), 0);
        EXPECT_EQ(DF_ReadCustomData(&image.value, key.c_str(), small.out(), &size, nullptr), 0);
        EXPECT_EQ(DF_ReadCustomData(&image.value, key.c_str(), large.out(), &size, nullptr), 0);
        EXPECT_EQ(size, none.bytes().size());
        EXPECT_EQ(small.bytes(), none.bytes());
        EXPECT_EQ(large.bytes(), none.bytes());
        all.push_back(key + "=" + none.bytes());
    }
    return all;
}

TEST(CustomDataTest, StoresValuesByKeyInOrderOfBytes) {
    HostImage image("part");
    HostImage other("other");
    EXPECT_EQ(contents(image), Texts());
    const std::pair<const char*, std::string> writes[] = {{"serial", "old and longer"},
                                                          {"\xC3\xA9", "e"},
                                                          {"Serial", "with\0zeros\0"s},
                                                          {"serial", "new"},
                                                          {"", "\0"s},
                                                          {"serials", std::string(70000, 's')},
                                                          {"\x7F", "below the accent"},
                                                          {"Serial ", "blank"}};
    for (const auto& [key, value] : writes) EXPECT_EQ(write(image, key, value), 0) << key;
    const Texts expected = {"=\0"s,
                            "Serial=with\0zeros\0"s,
                            "Serial =blank",
                            "serial=new",
                            "serials=" + std::string(70000, 's'),
                            "\x7F=below the accent",
                            "\xC3\xA9=e"};
    EXPECT_EQ(contents(image), expected);
    // It stays with the image through new sizes and types, and with no other image.
    EXPECT_EQ(DF_SetImageSize(&image.value, 50, 40, nullptr), 0);
    EXPECT_EQ(image.create("part", ZQ_TYPE_RGB, 2, 3, 3), 0);
    EXPECT_EQ(contents(image), expected);
    EXPECT_EQ(contents(other), Texts());
}

TEST(CustomDataTest, RemovesEntriesAndInTheEndTheStore) {
    static constexpr ZqClassId kStore = {
        0xE5457396, 0x3480, 0x4DD0, {0x9C, 0xEA, 0x77, 0xB1, 0x79, 0x14, 0xEC, 0x41}};
    HostImage image("part");
    const auto attachments = [&] { return static_cast<uintptr_t*>(image.record().customData)[2]; };
    const auto remove = [&](const char* key) {
        return DF_RemoveCustomData(&image.value, key, nullptr);
    };
    EXPECT_EQ(remove("a"), kKey);
    EXPECT_EQ(write(image, "a", "1"), 0);
    EXPECT_EQ(write(image, "A", "2"), 0);
    EXPECT_EQ(attachments(), 1U);
    Keys keys;
    EXPECT_EQ(DF_EnumerateCustomKeys(&image.value, keys.out(), nullptr), 0);
    EXPECT_EQ(keys.texts(), (Texts{"A", "a"}));
    EXPECT_EQ(remove("a"), 0);
    EXPECT_EQ(remove("a"), kKey);
    EXPECT_EQ(contents(image), (Texts{"A=2"}));
    EXPECT_EQ(remove("A"), 0);
    EXPECT_EQ(attachments(), 0U);
    EXPECT_EQ(remove("A"), kKey);
    // The array had two strings.
    EXPECT_EQ(DF_EnumerateCustomKeys(&image.value, keys.out(), nullptr), 0);
    EXPECT_EQ(keys.texts(), Texts());
    // A client's object in the store's place is nobody's custom data; a write replaces it.
    static int destroyed = 0;
    ZqSetAttachment(image.handle(), &kStore, &destroyed, [](void*) { ++destroyed; });
    EXPECT_EQ(contents(image), Texts());
    EXPECT_EQ(remove("a"), kKey);
    EXPECT_EQ(write(image, "a", "3"), 0);
    EXPECT_EQ(destroyed, 1);
    EXPECT_EQ(contents(image), (Texts{"a=3"}));
}

TEST(CustomDataTest, RefusesAndLeavesEverything) {
    struct Case {
        const char* name;
        std::function<ZqError(const ZqImageValue*)> call;
        ZqError code;
        const char* refused = nullptr;  // a service of the host
    };
    Block block = block_of("kept");
    const std::string block_before = block.bytes();
    uint32_t size = 77;
    Block no_block;
    Keys no_keys;
    Keys keys;
    HostImage image("part");
    EXPECT_EQ(write(image, "key", "value"), 0);
    EXPECT_EQ(write(image, "other", "value"), 0);
    EXPECT_EQ(DF_EnumerateCustomKeys(&image.value, keys.out(), nullptr), 0);
    using V = const ZqImageValue*;
    const auto put = [](const char* key, const void* bytes, uint32_t count) {
        return [=](V v) { return DF_WriteCustomData(v, key, bytes, count, nullptr); };
    };
    const auto get = [&](const char* key, ZqHandle* target) {
        return [=, &size](V v) { return DF_ReadCustomData(v, key, target, &size, nullptr); };
    };
    const auto list = [](ZqStringArrayHandle* target) {
        return [=](V v) { return DF_EnumerateCustomKeys(v, target, nullptr); };
    };
    const Case cases[] = {
        {"no bytes", put("key", "x", 0), kSize},
        {"no bytes, new key", put("new", "x", 0), kSize},
        {"no bytes, no pointer", put("key", nullptr, 0), kSize},
        {"more than a block holds", put("key", "x", 0x80000000U), kSize},
        {"a negative size", put("key", "x", 0xFFFFFFFFU), kSize},
        {"write without key", put(nullptr, "x", 0), kNullPointer},
        {"write without value", put("key", nullptr, 1), kNullPointer},
        {"read of a missing key", get("Key", block.out()), kKey},
        {"read of part of a key", get("ke", block.out()), kKey},
        {"read without key", get(nullptr, block.out()), kNullPointer},
        {"read of a missing key to nowhere", get("new", nullptr), kNullPointer},
        {"remove without key", [](V v) { return DF_RemoveCustomData(v, nullptr, nullptr); },
         kNullPointer},
        {"list to nowhere", list(nullptr), kNullPointer},
        {"block not resized", get("key", block.out()), kNoMemory, "DSSetHandleSize"},
        {"block not made", get("key", no_block.out()), kNoMemory, "DSNewHandle"},
        {"array not resized", list(keys.out()), kNoMemory, "NumericArrayResize"},
        {"array not made", list(no_keys.out()), kNoMemory, "NumericArrayResize"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        if (c.refused != nullptr) refhost::refuse(c.refused);
        EXPECT_EQ(c.call(&image.value), c.code);
        EXPECT_EQ(block.bytes(), block_before);
        EXPECT_EQ(size, 77U);
        EXPECT_EQ(no_block.get(), nullptr);
        EXPECT_EQ(no_keys.get(), nullptr);
        EXPECT_EQ(keys.texts(), (Texts{"key", "other"}));
        EXPECT_EQ(contents(image), (Texts{"key=value", "other=value"}));
    }
}

// What each does without an image, where no argument counts, and with an error pending.
TEST(CustomDataTest, ReportsUnderItsName) {
    struct Case {
        const char* name;
        ZqError (*call)(const ZqImageValue*, ZqErrorCluster*);
        ZqError code;
        const char* text;
    };
    using V = const ZqImageValue*;
    using E = ZqErrorCluster*;
    const char* no_key = "The key you specified cannot be found in the image.";
    const Case cases[] = {{"KEMO Write Custom Data",
                           [](V v, E e) { return DF_WriteCustomData(v, "new", nullptr, 0, e); },
                           kSize, "The size you specified is out of the valid range."},
                          {"KEMO Read Custom Data",
                           [](V v, E e) {
                               Block block;
                               return DF_ReadCustomData(v, "new", block.out(), nullptr, e);
                           },
                           kKey, no_key},
                          {"KEMO Remove Custom Data",
                           [](V v, E e) { return DF_RemoveCustomData(v, "new", e); }, kKey, no_key},
                          {"Kemo Enumerate Custom Keys",
                           [](V v, E e) { return DF_EnumerateCustomKeys(v, nullptr, e); },
                           kNullPointer, "Null pointer."}};
    HostImage live("live");
    HostImage stale("stale");
    DF_Dispose(&stale.value, 0, nullptr);
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        for (const ZqImageValue* value : {static_cast<V>(&stale.value), V{}}) {
            Cluster error;
            EXPECT_EQ(c.call(value, error), kNotAnImage);
            EXPECT_EQ(error.source(), std::string(c.name) + "\nNot an image.");
        }
        Cluster error;
        EXPECT_EQ(c.call(&live.value, error), c.code);
        EXPECT_EQ(error.source(), std::string(c.name) + "\n" + c.text);
        Cluster pending(-5);
        EXPECT_EQ(c.call(&live.value, pending), -5);
        EXPECT_EQ(c.call(&stale.value, pending), -5);
    }
}

// Threads write, read, list and remove the same two keys: a value is always one that was written
// as a whole.
TEST(CustomDataStressTest, CallsOnOneImageComeOneAfterTheOther) {
    HostImage image("shared");
    std::atomic<int> torn = 0;
    const auto work = [&](char mark) {
        for (int round = 0; round < 300; ++round) {
            const char* key = round % 3 == 0 ? "a" : "b";
            const std::string value(static_cast<size_t>(mark - 'A' + 1) * 100, mark);
            if (write(image, key, value) != 0) ++torn;
            Block block;
            if (DF_ReadCustomData(&image.value, key, block.out(), nullptr, nullptr) == 0) {
                const std::string read = block.bytes();
                const std::string whole(static_cast<size_t>(read[0] - 'A' + 1) * 100, read[0]);
                if (read != whole) ++torn;
            }
            Keys keys;
            DF_EnumerateCustomKeys(&image.value, keys.out(), nullptr);
            if (keys.texts().size() > 2) ++torn;
            DF_RemoveCustomData(&image.value, key, nullptr);
        }
    };
    std::vector<std::thread> threads;
    for (const char mark : {'A', 'B', 'C', 'D'}) threads.emplace_back(work, mark);
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(torn, 0);
    EXPECT_EQ(contents(image), Texts());
}

}  // namespace
