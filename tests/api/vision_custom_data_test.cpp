// Custom data in PNG files: entries as texts, and texts of other programs as entries.
#include "support/vision_files.h"

namespace zqtest {
namespace {

using namespace std::string_literals;
using VisionCustomDataTest = VisionFilesTest;

TEST_F(VisionCustomDataTest, CustomDataBecomesTexts) {
    const std::string escape("Vision custom data\0", 19);
    struct Case {
        std::string key, value, text;
    };
    std::string all_bytes;
    for (int i = 255; i >= 0; --i) all_bytes += static_cast<char>(i);
    const Case cases[] = {
        {"Author", "me\n\x80\x01", {"Author\0me\n\x80\x01", 12}},
        {"caf\xE9 1", "~", {"caf\xE9 1\0~", 8}},
        {"zero", {"a\0", 2}, escape + "emVybw== YQA="},
        {"", "x", escape + " eA=="},
        {" k", "x", escape + "IGs= eA=="},
        {"k ", "x", escape + "ayA= eA=="},
        {"a  b", "x", escape + "YSAgYg== eA=="},
        {"new\nline", "x", escape + "bmV3CmxpbmU= eA=="},
        {"\xC2\xA0", "x", escape + "wqA= eA=="},
        {"Version", "mine", escape + "VmVyc2lvbg== bWluZQ=="},
        {"Vision custom data", "xyz", escape + "VmlzaW9uIGN1c3RvbSBkYXRh eHl6"},
        {std::string(79, 'k'), "x", std::string(79, 'k') + std::string("\0x", 2)},
        {"all", all_bytes, ""},
        {std::string(80, 'k'), "x", ""},
    };
    Picture source(ZQ_TYPE_U8, 2, 2), target(ZQ_TYPE_U8);
    Entries expected;
    for (const Case& c : cases) {
        keep(source, c.key, c.value);
        expected[c.key] = c.value;
    }
    keep(target, "old", "gone");
    const std::string file = written(source);
    std::vector<std::string> texts;
    for (const Chunk& chunk : chunks_of(file)) {
        if (chunk.name == "tEXt") texts.push_back(chunk.bytes);
    }
    EXPECT_EQ(texts.size(), std::size(cases));
    for (const Case& c : cases) {
        EXPECT_TRUE(c.text.empty() || std::ranges::count(texts, c.text) == 1) << c.key;
    }
    ASSERT_EQ(read(target, file), 0);
    EXPECT_EQ(entries(target), expected);
}

TEST_F(VisionCustomDataTest, TextsOfOtherProgramsBecomeCustomData) {
    const std::string escaped("Vision custom data\0YQ== Yg==", 28);
    const auto version = [](const std::string& text) {
        return png_chunk("tEXt", std::string("Version\0", 8) + text);
    };
    const auto text = [](const std::string& bytes) { return png_chunk("tEXt", bytes); };
    struct Case {
        const char* name;
        std::string chunks;
        Entries entries;
        const char* before = "IDAT";
    };
    const Entries as_it_is = {{"Vision custom data", "YQ== Yg=="}};
    const Case cases[] = {
        {"escape, newest",
         version("Zorvane Kemo Vision 7.1.0") + png_chunk("tEXt", escaped),
         {{"a", "b"}}},
        {"escape, version behind",
         png_chunk("tEXt", escaped) + version("Zorvane Kemo Vision 8.0"),
         {{"a", "b"}}},
        {"escape, older", version("Zorvane Kemo Vision 6.5") + png_chunk("tEXt", escaped),
         as_it_is},
        {"escape, no version", png_chunk("tEXt", escaped), as_it_is},
        {"unsigned order", version("\xFF") + png_chunk("tEXt", escaped), {{"a", "b"}}},
        {"no base64",
         version("Zorvane Kemo Vision 7.1.0") + text("Vision custom data\0YQ== Y==="s),
         {{"Vision custom data", "YQ== Y==="}}},
        {"deflated",
         png_chunk("zTXt", std::string("k\0\0", 3) + deflated("value")),
         {{"k", "value"}}},
        {"deflated, damaged", png_chunk("zTXt", std::string("k\0\0xx", 5)), {}},
        {"deflated, bytes behind",
         png_chunk("zTXt", std::string("k\0\0", 3) + deflated("v") + "x"),
         {}},
        {"other method", png_chunk("zTXt", std::string("k\0\1", 3) + deflated("value")), {}},
        {"the first of two, the last empty",
         text("k\0one"s) + text("k\0two"s) + text("e\0"s),
         {{"k", "one"}}},
        {"no keyword", text("\0x"s) + text("no end"s), {}},
        {"other encodings", png_chunk("iTXt", std::string("k\0\0\0\0\0x", 7)), {}},
        {"behind the picture", text("k\0v"s), {{"k", "v"}}, "IEND"},
        {"too much",
         png_chunk("zTXt", std::string("k\0\0", 3) + deflated(std::string(65 << 20, '0'))),
         {}},
    };
    BarePng bare;
    bare.width = bare.height = 1;
    bare.rows = {{7}};
    write_bare_png(path_, bare);
    const std::string file = load_bytes(path_);
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture target(ZQ_TYPE_U8);
        ASSERT_EQ(read(target, with_chunks(file, c.before, c.chunks)), 0);
        EXPECT_EQ(entries(target), c.entries);
    }
}

}  // namespace
}  // namespace zqtest
