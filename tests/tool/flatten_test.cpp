// Flattened images from the shell.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tool/tool_run.h"

namespace {

using testing::Eq;
using testing::HasSubstr;
using zqtest::Outcome;
using zqtest::run_cases;
using zqtest::ToolFolder;

unsigned word_at(const std::string& record, size_t offset) {
    unsigned word = 0;
    for (size_t i = 4; i-- > 0;)
        word = word << 8 | static_cast<unsigned char>(record.at(offset + i));
    return word;
}

std::string flatten(const ToolFolder& folder, const std::string& arguments) {
    const Outcome outcome = folder.run("flatten -o @record " + arguments);
    EXPECT_EQ(outcome.status, 0) << arguments;
    EXPECT_EQ(outcome.out + outcome.err, "");
    return folder.bytes("record");
}

TEST(ToolFlatten, PixelsComeBackAsTheCodecKeepsThem) {
    const ToolFolder folder;
    folder.write_png("mask.png", 9, 8, PNG_COLOR_TYPE_GRAY,
                     {{0, 1, 0, 0, 0, 0, 0, 128, 255}, {9, 0, 0, 0, 0, 0, 0, 0, 0}});
    folder.write_png("even.png", 64, 8, PNG_COLOR_TYPE_GRAY,
                     std::vector<std::vector<uint8_t>>(48, std::vector<uint8_t>(64, 7)));
    const struct {
        const char* flattened;
        const char* output;
        std::string pixels;
    } cases[] = {
        {"@grey.png", "again.png", ToolFolder::kGreyPixels},
        {"@rgb.png --codec plain --kind properties", "again.png",
         std::string("\3\2\1\0\6\5\4\0", 8)},
        {"@deep.png", "again.aipd", std::string("\0\x80\x40\x1C", 4)},
        {"@float.aipd --kind properties", "again.aipd", std::string("\0\0\x80\x3F\0\0\0\x40", 8)},
        // A colour table is applied, whatever the codec.
        {"@palette.png", "again.png", std::string("\0\0\xFF\0\0\xFF\0\0\0\xFF\0\0", 12)},
        {"@palette.png --codec packed", "again.png", "\xFF\xFF\xFF"},
        {"@mask.png --codec packed", "again.png",
         std::string("\0\xFF\0\0\0\0\0\xFF\xFF\xFF\0\0\0\0\0\0\0\0", 18)},
        {"@even.png --codec quality --quality 1000", "again.png", std::string(48 * 64, '\7')},
    };
    for (const auto& one : cases) {
        flatten(folder, one.flattened);
        const std::string output = one.output;
        run_cases(folder, {{("unflatten @record -o @" + output).c_str(), 0, "", ""}});
        EXPECT_EQ(folder.dump(output), one.pixels) << one.flattened;
    }
}

TEST(ToolFlatten, TheBitDepthGoesAlong) {
    const ToolFolder folder;
    run_cases(folder, {{"convert @deep.png -o @deep.aipd", 0, "", ""}});
    std::string twelve_bits = folder.bytes("deep.aipd");
    twelve_bits.at(48) = 12;
    zqtest::store_bytes(folder.path("deep.aipd"), twelve_bits);
    for (const char* kind : {"value", "properties"}) {
        flatten(folder, std::string("@deep.aipd --kind ") + kind);
        run_cases(folder, {{"unflatten @record -o @again.aipd", 0, "", ""}});
        EXPECT_EQ(folder.bytes("again.aipd"), twelve_bits) << kind;
    }
}

TEST(ToolFlatten, OptionsReachTheRecord) {
    const ToolFolder folder;
    std::vector<std::vector<uint8_t>> noise(64, std::vector<uint8_t>(64));
    unsigned random = 1;
    for (auto& row : noise)
        for (uint8_t& sample : row)
            sample = static_cast<uint8_t>((random = random * 1664525U + 1013904223U) >> 24);
    folder.write_png("noise.png", 64, 8, PNG_COLOR_TYPE_GRAY, noise);

    const std::string plain = flatten(folder, "@noise.png");
    EXPECT_EQ(plain.size(), 76U + 64U * 64U);
    EXPECT_EQ(word_at(plain, 0), 0x00080000U);
    EXPECT_EQ(word_at(plain, 4), 0U) << "kind";
    EXPECT_EQ(word_at(plain, 64), 0U) << "codec";
    const std::string packed = flatten(folder, "@noise.png --codec PACKED --kind properties");
    EXPECT_EQ(word_at(packed, 4), 1U);
    EXPECT_EQ(word_at(packed, 64), 2U);
    EXPECT_EQ(packed.size(), 76U + 64U * 8U + word_at(packed, 16));
    EXPECT_GT(word_at(packed, 16), 0U);
    const std::string best = flatten(folder, "@noise.png --codec quality --quality 1000");
    const std::string usual = flatten(folder, "@noise.png --codec quality");
    const std::string worst = flatten(folder, "@noise.png --codec quality --quality 0");
    EXPECT_EQ(word_at(usual, 64), 1U);
    EXPECT_GT(best.size(), usual.size());
    EXPECT_GT(usual.size(), worst.size());
}

TEST(ToolFlatten, WhatIsNoRecordIsRefusedAndNothingIsLeft) {
    const ToolFolder folder;
    const std::string good = flatten(folder, "@grey.png");
    const std::string picture = folder.bytes("grey.png");
    std::string unknown_version = good;
    unknown_version.at(1) = 9;
    for (const std::string& record :
         {std::string(), good.substr(0, 3), good.substr(0, 76), good.substr(0, good.size() - 1),
          good + '\0', unknown_version, std::string("\0\0\x08\0\2\0\0\0\1\0\0\0", 12)}) {
        zqtest::store_bytes(folder.path("broken"), record);
        const std::ptrdiff_t before = folder.count();
        const std::string message =
            "zqvis: " + folder.path("broken") + ": Initialization error. (-1074395960)\n";
        run_cases(folder, {{"unflatten @broken -o @new.png", 1, "", Eq(message)},
                           {"unflatten @broken -o @grey.png", 1, "", Eq(message)},
                           {"unflatten @broken -o - --format PNG", 1, "", Eq(message)}});
        EXPECT_EQ(folder.count(), before) << record.size() << " bytes";
    }
    flatten(folder, "@float.aipd");
    run_cases(
        folder,
        {{"unflatten @record -o @grey.png", 1, "",
          Eq("zqvis: " + folder.path("grey.png") + ": Incompatible image type. (-1074396077)\n")},
         {"unflatten @missing -o @grey.png", 1, "",
          Eq("zqvis: " + folder.path("missing") + ": File not found. (-1074395995)\n")},
         {"flatten @cut.png -o @record", 1, "", HasSubstr("cut.png: ")},
         {"flatten @grey.png -o @no/such/folder", 1, "", HasSubstr("-1074395995")},
         {"flatten @grey.png -o @a --codec zip", 2, "", HasSubstr("zip")},
         {"flatten @grey.png -o @a --kind reference", 2, "", HasSubstr("reference")},
         {"flatten @grey.png -o @a --quality 1001", 2, "", HasSubstr("1001")},
         {"flatten @grey.png", 2, "", HasSubstr("--output")},
         {"unflatten @record -o -", 2, "", HasSubstr("--format")},
         {"unflatten @record -o @a.gif", 2, "", HasSubstr("--format")}});
    EXPECT_EQ(folder.bytes("grey.png"), picture);
}

TEST(ToolFlatten, RecordsPassThroughStandardStreamsUnchanged) {
    const ToolFolder folder;
    std::string record = flatten(folder, "@grey.png");
    Outcome flattened = folder.run("flatten - -o -", "grey.png");
    ASSERT_EQ(flattened.status, 0) << flattened.err;
    for (std::string* one : {&record, &flattened.out}) one->replace(32, 4, 4, '\0');
    EXPECT_EQ(flattened.out, record) << "but for the reference to the source image";
    const Outcome rebuilt = folder.run("unflatten - -o - --format AIPD", "record");
    EXPECT_EQ(rebuilt.status, 0) << rebuilt.err;
    EXPECT_THAT(rebuilt.out, testing::EndsWith(ToolFolder::kGreyPixels));
}

}  // namespace
