// zqvis draw: windows rendered into files.
#include "tool/tool_run.h"

namespace {

using zqtest::ToolFolder;

TEST(ToolDraw, OneToOneShowsThePictureAndScrollingMovesIt) {
    const ToolFolder folder;
    ASSERT_EQ(folder.run("convert @grey.png -o @rgb.png --type rgb").status, 0);
    ASSERT_EQ(folder.run("draw @grey.png -o @same.png").status, 0);
    const std::string whole = folder.run("dump @rgb.png -o -").out;
    EXPECT_EQ(folder.run("dump @same.png -o -").out, whole);
    ASSERT_EQ(folder.run("draw @grey.png -o @corner.png --client 1x1 --offset 1,0").status, 0);
    EXPECT_EQ(folder.run("dump @corner.png -o -").out, whole.substr(4, 4));
    ASSERT_EQ(folder.run("draw @grey.png -o @large.png --zoom 2 --client 1x1 --offset 3,0").status,
              0);
    EXPECT_EQ(folder.run("dump @large.png -o -").out, whole.substr(4, 4));
    EXPECT_EQ(folder.run("draw @grey.png -o @no.png --zoom 17").status, 2);
    EXPECT_EQ(folder.run("draw @grey.png -o @no.png --client 0x4").status, 2);
    EXPECT_EQ(folder.run("draw @grey.png -o @no.png --client 40000x4").status, 1);
}

}  // namespace
