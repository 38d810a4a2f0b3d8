// What the viewer shows of an image, and the file it goes to next.
#include "view.h"

#include <gtest/gtest.h>

#include <zqvissvc/files.h>

#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "document.h"
#include "folder.h"
#include "refhost/refhost.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

TEST(View, FitsWhatIsTooLarge) {
    struct Case {
        Extent image, client;
        const char* zoom;
    };
    const Case cases[] = {{{100, 100}, {300, 200}, "1:1"}, {{300, 200}, {300, 200}, "1:1"},
                          {{301, 20}, {300, 200}, "1:2"},  {{601, 20}, {300, 200}, "1:3"},
                          {{10, 800}, {300, 200}, "1:4"},  {{60000, 9}, {300, 200}, "1:16"},
                          {{0, 0}, {0, 0}, "1:1"}};
    for (const Case& c : cases) {
        View view;
        view.resize(c.client);
        view.show(c.image);
        EXPECT_EQ(view.zoom_text(), c.zoom) << c.image.width << " x " << c.image.height;
        EXPECT_EQ(view.offset(), (Point{0, 0}));
        View made_later;
        made_later.show(c.image);
        made_later.resize(c.client);
        EXPECT_EQ(made_later.zoom_text(), c.zoom);
    }
}

// Twice the size of the client area at 1:1, so that every step of zoom has room to scroll.
View large_view() {
    View view;
    view.resize({200, 100});
    view.show({400, 300});
    view.zoom_to(1, {0, 0});
    view.drag(-100, -150);
    return view;
}

TEST(View, ZoomsAboutThePointer) {
    struct Case {
        int32_t steps;
        Point about;
        const char* zoom;
        Point offset;  // of pixel 100 + x, 150 + y, less the pointer
    };
    const Case cases[] = {{1, {0, 0}, "2:1", {200, 300}},
                          {1, {60, 40}, "2:1", {2 * 160 - 60, 2 * 190 - 40}},
                          {2, {60, 40}, "3:1", {3 * 160 - 60, 3 * 190 - 40}},
                          {99, {60, 40}, "16:1", {16 * 160 - 60, 16 * 190 - 40}},
                          {-1, {60, 40}, "1:2", {0, 50}},  // 80 - 60 is beyond the edge
                          {-2, {60, 99}, "1:3", {0, 0}},
                          {-99, {0, 0}, "1:16", {0, 0}},
                          {0, {60, 40}, "1:1", {100, 150}}};
    for (const Case& c : cases) {
        View view = large_view();
        view.zoom_by(c.steps, c.about);
        EXPECT_EQ(view.zoom_text(), c.zoom);
        EXPECT_EQ(view.offset(), c.offset) << c.zoom;
    }
}

TEST(View, ComesBackFromAZoom) {
    View view = large_view();
    view.zoom_by(7, {31, 77});
    view.zoom_by(-7, {31, 77});
    EXPECT_EQ(view.offset(), (Point{100, 150}));
}

TEST(View, ZoomsACentredImageAboutThePointer) {
    View view;
    view.resize({300, 300});
    view.show({200, 200});  // from 50 to 250
    view.zoom_by(1, {150, 60});
    EXPECT_EQ(view.offset(), (Point{2 * 100 - 150, 0}));  // 2 * 10 - 60 is beyond the edge
}

TEST(View, ScrollsNoFurtherThanTheImage) {
    View view = large_view();
    view.drag(1000, -1000);
    EXPECT_EQ(view.offset(), (Point{0, 200}));
    view.resize({390, 290});
    EXPECT_EQ(view.offset(), (Point{0, 10}));
}

TEST(View, KeepsItsPlaceForAnImageOfTheSameSize) {
    View view = large_view();
    view.show({400, 300});
    EXPECT_EQ(view.offset(), (Point{100, 150}));
    view.show({400, 330});
    EXPECT_EQ(view.zoom_text(), "1:4");
}

TEST(Folder, IsWalkedByNames) {
    const zqtest::ScratchFolder folder;
    for (const char* name : {"b.png", "a.TIF", "c.txt", "d.jp2", "e.bmp"}) {
        zqtest::store_bytes(folder.path(name), "P");
    }
    std::filesystem::create_directory(folder.path("bb.png"));
    struct Case {
        const char* from;
        int steps;
        const char* to;
    };
    const Case cases[] = {{"a.TIF", 1, "b.png"},
                          {"b.png", 1, "d.jp2"},
                          {"e.bmp", 1, "e.bmp"},
                          {"a.TIF", -1, "a.TIF"},
                          {"d.jp2", -1, "b.png"},
                          {"d.jp2", 0, "d.jp2"},
                          {"b.png", -1000, "a.TIF"},
                          {"b.png", 1000, "e.bmp"},
                          // gone from the folder meanwhile
                          {"c.png", 1, "d.jp2"},
                          {"c.png", -1, "b.png"},
                          {"z.png", 1, "e.bmp"}};
    for (const Case& c : cases) {
        EXPECT_EQ(neighbour(folder.path(c.from), c.steps), folder.path(c.to))
            << c.from << ' ' << c.steps;
    }
    const std::string nowhere = folder.path("nowhere") + "/a.png";
    EXPECT_EQ(neighbour(nowhere, 1), nowhere);
}

TEST(Folder, HoldsNamesInEveryScript) {
    const zqtest::ScratchFolder folder;
    const std::string inside = folder.path("") + "\xC3\xA4rger/";  // UTF-8, as all that follow
    const auto path_of = [&](const std::string& name) {
        const std::string path = inside + name;
        return std::filesystem::path(std::u8string(path.begin(), path.end()));
    };
    const std::vector<std::string> names = {"a.png", "\xC3\xB6l.png", "\xE6\xBC\xA2.png"};
    std::filesystem::create_directory(path_of(""));
    for (const std::string& name : names) std::ofstream(path_of(name)) << 'P';
    const std::string second = neighbour(inside + names[0], 1);
    EXPECT_EQ(name_of(second), names[1]);
    EXPECT_EQ(name_of(neighbour(second, 1)), names[2]);
}

TEST(Document, TellsValuesByTheirComponents) {
    struct Case {
        int32_t type;
        std::vector<uint8_t> pixel;  // as stored
        const char* description;
        const char* value;
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, {200}, "a.aipd - 3 x 2, 8 bits", "(2, 1)  200"},
        {ZQ_TYPE_I16, {0xFE, 0xFF}, "a.aipd - 3 x 2, 16 bits", "(2, 1)  -2"},
        {ZQ_TYPE_SGL, {0, 0, 0xC0, 0xBF}, "a.aipd - 3 x 2, Float", "(2, 1)  -1.5"},
        {ZQ_TYPE_COMPLEX,
         {0, 0, 0x80, 0x3F, 0, 0, 0, 0xC0},
         "a.aipd - 3 x 2, Complex",
         "(2, 1)  1 -2 i"},
        {ZQ_TYPE_RGB, {3, 2, 1, 0}, "a.aipd - 3 x 2, RGB", "(2, 1)  red 1, green 2, blue 3"},
        {ZQ_TYPE_HSL,
         {3, 2, 1, 0},
         "a.aipd - 3 x 2, HSL",
         "(2, 1)  hue 1, saturation 2, luminance 3"},
        {ZQ_TYPE_RGBU64,
         {3, 1, 2, 1, 1, 1, 0, 0},
         "a.aipd - 3 x 2, RGB (U64)",
         "(2, 1)  red 257, green 258, blue 259"}};
    const zqtest::ScratchFolder folder;
    for (const Case& c : cases) {
        zqtest::Picture picture(c.type, 3, 2);
        std::memcpy(&picture.at<uint8_t>(2, 1), c.pixel.data(), c.pixel.size());
        const ZqImageValue value = picture.value();
        const std::string path = folder.path("a.aipd");
        ASSERT_EQ(DF_WriteFile2(&value, path.c_str(), "AIPD", nullptr, nullptr, nullptr), 0);
        const Document document(path);
        EXPECT_EQ(document.description(), c.description);
        EXPECT_EQ(document.value_at({2, 1}), c.value);
        EXPECT_EQ(document.value_at({3, 1}), "");
        EXPECT_EQ(document.value_at({0, -1}), "");
    }
}

TEST(Document, TellsTheColourOfAnIndex) {
    const zqtest::ScratchFolder folder;
    zqtest::Picture picture(ZQ_TYPE_U8, 1, 1);
    picture.at<uint8_t>(0, 0) = 7;
    refhost::ArrayU32 table(std::vector<uint32_t>(256, 0xFF010203));
    const ZqImageValue value = picture.value();
    const std::string path = folder.path("a.png");
    ASSERT_EQ(DF_WriteFile2(&value, path.c_str(), "PNG", table.out(), nullptr, nullptr), 0);
    EXPECT_EQ(Document(path).value_at({0, 0}), "(0, 0)  7  red 1, green 2, blue 3");
}

}  // namespace
