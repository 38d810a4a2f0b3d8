// The command-line tool from outside: statuses, messages, JSON, files and streams.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <string>
#include <vector>

#include "tool/tool_run.h"

namespace {

using testing::AllOf;
using testing::Eq;
using testing::HasSubstr;
using testing::IsEmpty;
using zqtest::Outcome;
using zqtest::run_cases;
using zqtest::Text;
using zqtest::ToolFolder;

TEST(Tool, TellsWhatFilesHold) {
    const ToolFolder folder;
    run_cases(
        folder,
        {
            {"info @grey.png", 0,
             AllOf(HasSubstr("file type      PNG\n"), HasSubstr("pixel type     8 bits\n"),
                   HasSubstr("size           3 x 2 pixels\n"), HasSubstr("bytes          6\n"),
                   HasSubstr("calibration    unit 0, 1 x 1 a pixel\n"),
                   HasSubstr("bit depth      not set\n"), HasSubstr("colour table   none\n")),
             IsEmpty()},
            {"info @float.aipd", 0, AllOf(HasSubstr("AIPD"), HasSubstr("Float")), IsEmpty()},
            {"info --json @palette.png @deep.png", 0,
             AllOf(HasSubstr("\"file_type\": \"PNG\""), HasSubstr("\"pixel_type\": \"8 bits\""),
                   HasSubstr("\"pixel_type_code\": 0"), HasSubstr("\"width\": 3"),
                   HasSubstr("\"height\": 1"), HasSubstr("\"bytes\": 3"), HasSubstr("\"unit\": 0"),
                   HasSubstr("\"x_step\": 1.0"), HasSubstr("\"bit_depth\": 0"),
                   HasSubstr("\"colour_table_entries\": 256"),
                   HasSubstr("\"pixel_type\": \"16 bits\""),
                   HasSubstr("\"sample_offset\": -32768")),
             IsEmpty()},
        });
}

TEST(Tool, DoesTheOtherFilesWhenSomeFail) {
    const ToolFolder folder;
    const std::string failures =
        "zqvis: " + folder.path("missing.png") + ": File not found. (-1074395995)\n" +
        "zqvis: " + folder.path("cut.png") + ": Unable to read data. (-1074395989)\n" +
        "zqvis: " + folder.path("notes.txt") +
        ": ZQ Vision does not support the file type you specified. (-1074395991)\n";
    run_cases(folder, {
                          {"info @missing.png @cut.png @grey.png @notes.txt", 1,
                           HasSubstr("3 x 2 pixels"), Eq(failures)},
                          {"info --json @missing.png @cut.png @grey.png @notes.txt", 1,
                           HasSubstr("\"width\": 3"), Eq(failures)},
                          {"convert --out-dir @new/out --format AIPD @missing.png @rgb.png "
                           "@cut.png @grey.png @notes.txt",
                           1, IsEmpty(), Eq(failures)},
                      });
    EXPECT_EQ(folder.dump("new/out/grey.aipd"), ToolFolder::kGreyPixels);
    EXPECT_EQ(folder.dump("new/out/rgb.aipd"), std::string("\3\2\1\0\6\5\4\0", 8));
    EXPECT_THAT(folder.bytes("new/out/cut.aipd"), IsEmpty());
}

TEST(Tool, PrintsTheMessageOfACode) {
    const ToolFolder folder;
    const Text message = Eq("Not an image.\n");
    run_cases(folder,
              {
                  {"error -1074396120", 0, message, IsEmpty()},
                  {"error 3220571176", 0, message, IsEmpty()},
                  {"error 0xBFF60428", 0, message, IsEmpty()},
                  {"error bff60428", 0, message, IsEmpty()},
                  {"error --json -1074396120", 0,
                   AllOf(HasSubstr("\"code\": -1074396120"), HasSubstr("\"hex\": \"0xBFF60428\""),
                         HasSubstr("\"message\": \"Not an image.\"")),
                   IsEmpty()},
                  {"error 0x1BFF60428", 2, IsEmpty(), HasSubstr("0x1BFF60428")},
                  {"error 12k", 2, IsEmpty(), HasSubstr("12k")},
                  {"error 0x", 2, IsEmpty(), HasSubstr("0x")},
              });
}

TEST(Tool, RefusesWrongUsageBeforeItDoesAnything) {
    const ToolFolder folder;
    const auto says = [](const char* text) { return HasSubstr(text); };
    const std::ptrdiff_t before = folder.count() + 2;  // and the two files of a run's output
    run_cases(folder,
              {
                  {"", 2, IsEmpty(), says("subcommand")},
                  {"polish @grey.png", 2, IsEmpty(), says("subcommand")},
                  {"info", 2, IsEmpty(), says("FILE")},
                  {"dump @grey.png", 2, IsEmpty(), says("--output")},
                  {"convert @grey.png", 2, IsEmpty(), says("--out-dir")},
                  {"convert @grey.png -o @a.png --out-dir @b", 2, IsEmpty(), says("--out")},
                  {"convert @grey.png -o @a.gif", 2, IsEmpty(), says("--format")},
                  {"convert @grey.png -o -", 2, IsEmpty(), says("--format")},
                  {"convert @grey.png --out-dir @b", 2, IsEmpty(), says("--format")},
                  {"convert @grey.png @rgb.png -o @a.png", 2, IsEmpty(), says("--out-dir")},
                  {"convert @grey.png -o @a --format GIF", 2, IsEmpty(), says("GIF")},
                  {"convert @grey.png -o @a.png --type u9", 2, IsEmpty(), says("u9")},
                  {"convert @grey.png -o @a.png --quality 1001", 2, IsEmpty(), says("1001")},
                  {"convert @grey.png -o @a.png --png-compression 101", 2, IsEmpty(), says("101")},
                  {"convert @grey.png @new/grey.bmp --out-dir @b --format AIPD", 2, IsEmpty(),
                   says("would both become")},
              });
    EXPECT_EQ(folder.count(), before);
    run_cases(folder, {{"--help", 0, HasSubstr("convert"), IsEmpty()}});
}

TEST(Tool, KeepsColoursRight) {
    const ToolFolder folder;
    run_cases(folder,
              {
                  {"convert @palette.png -o @kept.png", 0, IsEmpty(), IsEmpty()},
                  {"convert @palette.png -o @applied.aipd", 0, IsEmpty(), IsEmpty()},
                  {"convert @palette.png -o @rgb64.aipd --type rgb64", 0, IsEmpty(), IsEmpty()},
                  {"convert @deep.png -o @deep_again.png", 0, IsEmpty(), IsEmpty()},
                  {"convert @palette.png -o @kept.jp2", 0, IsEmpty(), IsEmpty()},
                  {"convert @palette.png -o @applied.JPC", 0, IsEmpty(), IsEmpty()},
              });
    EXPECT_EQ(folder.dump("palette.png"), std::string("\0\1\1", 3));
    const zqtest::BarePng kept = zqtest::read_bare_png(folder.path("kept.png"));
    ASSERT_EQ(kept.colour_type, PNG_COLOR_TYPE_PALETTE);
    EXPECT_EQ(kept.rows.at(0), (std::vector<uint8_t>{0, 1, 1}));
    EXPECT_EQ(kept.palette.at(1).green, 255);
    EXPECT_EQ(kept.palette.at(1).red, 0);
    EXPECT_EQ(folder.dump("applied.aipd"), std::string("\0\0\xFF\0\0\xFF\0\0\0\xFF\0\0", 12));
    EXPECT_EQ(folder.dump("rgb64.aipd").size(), 3U * 8U);
    EXPECT_EQ(folder.dump("kept.jp2"), folder.dump("palette.png"));
    EXPECT_EQ(folder.dump("applied.JPC"), folder.dump("applied.aipd"));
    const zqtest::BarePng deep = zqtest::read_bare_png(folder.path("deep_again.png"));
    EXPECT_EQ(deep.rows.at(0), (std::vector<uint8_t>{0, 0, 0x9C, 0x40}));
}

TEST(Tool, ConvertsPixelTypesAndPassesOptionsOn) {
    const ToolFolder folder;
    folder.write_png("even.png", 256, 8, PNG_COLOR_TYPE_GRAY,
                     std::vector<std::vector<uint8_t>>(64, std::vector<uint8_t>(256, 7)));
    run_cases(folder,
              {
                  {"convert @rgb.png -o @deep.aipd --type I16", 0, IsEmpty(), IsEmpty()},
                  {"convert @even.png -o @small.png --png-compression 0", 0, IsEmpty(), IsEmpty()},
                  {"convert @even.png -o @large --format png --png-compression 100", 0, IsEmpty(),
                   IsEmpty()},
                  {"convert @rgb.png -o @fine --format jpeg2000", 0, IsEmpty(), IsEmpty()},
                  {"convert @rgb.png -o @poor.jp2 --quality 0", 0, IsEmpty(), IsEmpty()},
              });
    EXPECT_EQ(folder.dump("fine"), folder.dump("rgb.png"));
    EXPECT_NE(folder.dump("poor.jp2"), folder.dump("rgb.png"));
    EXPECT_EQ(folder.dump("deep.aipd").size(), 2U * 2U);
    EXPECT_LT(folder.bytes("small.png").size(), 1000U);
    EXPECT_GT(folder.bytes("large").size(), 256U * 64U);
    EXPECT_EQ(folder.dump("large"), folder.dump("even.png"));
}

// Two rows of four pixels that all are red 10, green 20, blue 30, as each pattern has them.
TEST(Tool, DecodesMosaics) {
    const ToolFolder folder;
    const std::array<std::string, 4> mosaics = {
        "\x14\x1E\x14\x1E\x0A\x14\x0A\x14", "\x14\x0A\x14\x0A\x1E\x14\x1E\x14",
        "\x1E\x14\x1E\x14\x14\x0A\x14\x0A", "\x0A\x14\x0A\x14\x14\x1E\x14\x1E"};
    const auto pixels = [](const std::string& pixel, size_t count) {
        std::string all;
        while (count-- > 0) all += pixel;
        return all;
    };
    for (size_t pattern = 0; pattern < mosaics.size(); ++pattern) {
        zqtest::store_bytes(folder.path("8.raw"), mosaics.at(pattern));
        std::string wide;  // 12 bits, 16 times the value and a half
        for (const char value : mosaics.at(pattern)) {
            wide += static_cast<char>(value << 4 | 8);
            wide += static_cast<char>(value >> 4);
        }
        zqtest::store_bytes(folder.path("12.raw"), wide + "more");
        const std::string options = " --pattern " + std::to_string(pattern) + " --size ";
        run_cases(
            folder,
            {
                {("bayer @8.raw -o @8.png" + options + "4x2").c_str(), 0, "", ""},
                {("bayer @12.raw -o @12.aipd --bits 12 --gains 2,1,0.5" + options + "4x2").c_str(),
                 0, "", ""},
                {("bayer @8.raw -o @1.png" + options + "1x1").c_str(), 0, "", ""},
                {("bayer @8.raw -o @cut.png" + options + "3x3").c_str(), 1, "",
                 Eq("zqvis: " + folder.path("8.raw") + ": Unable to read data. (-1074395989)\n")},
            });
        EXPECT_EQ(folder.dump("8.png"), pixels(std::string("\x1E\x14\x0A\0", 4), 8));
        EXPECT_EQ(folder.dump("12.aipd"), pixels(std::string("\x0F\x14\x15\0", 4), 8));
        // A single row is its own neighbour.
        EXPECT_EQ(folder.dump("1.png"), pixels(mosaics.at(pattern).substr(0, 1), 3) + '\0');
    }
    const std::string valid = "bayer @8.raw -o @8.png --size 4x2 --pattern 0 ";
    for (const char* wrong :
         {"--gains 1,3.999,1", "--gains 1,1", "--gains 1,nan,1", "--bits 0", "--bits 17"}) {
        EXPECT_EQ(folder.run(valid + wrong).status, 2) << wrong;
    }
    run_cases(folder,
              {
                  {"bayer @8.raw -o @a.png --size 4x2 --pattern 4", 2, "", HasSubstr("4")},
                  {"bayer @8.raw -o @a.png --size 4x --pattern 0", 2, "", HasSubstr("4x")},
                  {"bayer @8.raw -o @a.png --size 0x2 --pattern 0", 2, "", HasSubstr("0x2")},
                  {"bayer @8.raw -o - --size 4x2 --pattern 0", 2, "", HasSubstr("--format")},
              });
}

TEST(Tool, LeavesGoodFilesWhenItFails) {
    const ToolFolder folder;
    const std::string good = folder.bytes("grey.png");
    const std::string refused =
        "zqvis: " + folder.path("grey.png") + ": Incompatible image type. (-1074396077)\n";
    run_cases(folder,
              {
                  {"convert @float.aipd -o @grey.png", 1, IsEmpty(), Eq(refused)},
                  {"dump @cut.png -o @grey.png", 1, IsEmpty(), HasSubstr("cut.png: ")},
                  {"dump @rgb.png -o @no/such/folder", 1, IsEmpty(), HasSubstr("-1074395995")},
              });
    EXPECT_EQ(folder.bytes("grey.png"), good);
    const std::ptrdiff_t before = folder.count();
    run_cases(folder, {{"dump @grey.png -o @cut.png", 0, IsEmpty(), IsEmpty()}});
    EXPECT_EQ(folder.bytes("cut.png"), ToolFolder::kGreyPixels);
    EXPECT_EQ(folder.count(), before) << "something was left beside the output";
}

TEST(Tool, PassesBytesThroughStandardStreamsUnchanged) {
    const ToolFolder folder;
    const Outcome converted = folder.run("convert - -o - --format AIPD", "grey.png");
    ASSERT_EQ(converted.status, 0) << converted.err;
    ASSERT_EQ(converted.out.size(), 512U + 6U);
    EXPECT_EQ(converted.out.substr(0, 4), "AIPD");
    EXPECT_EQ(converted.out.substr(512), ToolFolder::kGreyPixels);

    const Outcome dumped = folder.run("dump - -o -", "grey.png");
    EXPECT_EQ(dumped.status, 0) << dumped.err;
    EXPECT_EQ(dumped.out, ToolFolder::kGreyPixels);

    EXPECT_THAT(folder.run("info -", "rgb.png").out, HasSubstr("2 x 1 pixels"));
    const Outcome refused = folder.run("convert - -o - --format PNG", "notes.txt");
    EXPECT_EQ(refused.status, 1);
    EXPECT_THAT(refused.out, IsEmpty());
    EXPECT_THAT(refused.err, testing::StartsWith("zqvis: -: "));
}

}  // namespace
