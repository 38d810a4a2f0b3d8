// zqvis: vision information through info, convert and data.
#include "tool/tool_run.h"

namespace {

using testing::HasSubstr;
using zqtest::Outcome;
using zqtest::ToolFolder;

// Text as the system ends its lines, with plain line feeds.
std::string lines(std::string text) {
    std::erase(text, '\r');
    return text;
}

TEST(ToolData, ValuesComeBackByteForByte) {
    const ToolFolder folder;
    const std::string bytes("a\0\r\n\x1A\xFF", 6);
    zqtest::store_bytes(folder.path("value.bin"), bytes);
    ASSERT_EQ(folder.run("data set @grey.png Serial 17").status, 0);
    ASSERT_EQ(folder.run("data set @grey.png blob --from @value.bin").status, 0);
    EXPECT_EQ(lines(folder.run("data list @grey.png").out), "Serial\nblob\n");
    EXPECT_EQ(folder.run("data get @grey.png blob").out, bytes);
    EXPECT_EQ(folder.run("dump @grey.png -o -").out, ToolFolder::kGreyPixels);

    // A conversion of the pixels and of the colour table takes the data along; a plain one does
    // not.
    ASSERT_EQ(folder.run("convert @grey.png -o @same.png --vision --type hsl").status, 0);
    EXPECT_EQ(folder.run("data get @same.png Serial").out, "17");
    ASSERT_EQ(folder.run("convert @grey.png -o @plain.png").status, 0);
    EXPECT_EQ(folder.run("data list @plain.png").out, "");
    EXPECT_THAT(folder.run("info --json @same.png").out, HasSubstr("\"Serial\""));

    ASSERT_EQ(folder.run("data remove @grey.png Serial").status, 0);
    EXPECT_EQ(lines(folder.run("data list @grey.png").out), "blob\n");
}

TEST(ToolData, RefusalsLeaveTheFile) {
    const ToolFolder folder;
    struct Case {
        const char* arguments;
        const char* file;
        int status;
        const char* message;
    };
    for (const Case& c : {
             Case{"data remove @grey.png absent", "grey.png", 1, "cannot be found in the image"},
             Case{"data get @grey.png absent", "grey.png", 1, "cannot be found in the image"},
             Case{"data set @float.aipd k v", "float.aipd", 1, "does not support the file type"},
             Case{"data set @cut.png k v", "cut.png", 1, "Unable to read data."},
             Case{"data set @grey.png k --from @absent", "grey.png", 1, "File not found."},
             Case{"data set @grey.png k v --from @notes.txt", "grey.png", 2, "--from"},
             Case{"data @grey.png", "grey.png", 2, "subcommand"},
             Case{"convert @grey.png -o @grey.aipd --vision", "grey.png", 2, "--vision"},
         }) {
        SCOPED_TRACE(c.arguments);
        const std::string before = folder.bytes(c.file);
        const Outcome outcome = folder.run(c.arguments);
        EXPECT_EQ(outcome.status, c.status);
        EXPECT_EQ(outcome.out, "");
        EXPECT_THAT(outcome.err, HasSubstr(c.message));
        EXPECT_EQ(folder.bytes(c.file), before);
    }
}

}  // namespace
