// Drawing on canvases through the exported functions.
#include <gtest/gtest.h>
#include <zqvissvc/display.h>
#include <zqvissvc/errors.h>
#include <zqvissvc/image.h>

#include <algorithm>
#include <climits>
#include <vector>

namespace {

class TestCanvas {
  public:
    TestCanvas(int32_t width, int32_t height) : width_(width) {
        EXPECT_EQ(ZqNewCanvas(width, height, &handle), 0);
    }
    ~TestCanvas() { EXPECT_EQ(ZqDisposeCanvas(handle), 0); }
    TestCanvas(const TestCanvas&) = delete;
    TestCanvas& operator=(const TestCanvas&) = delete;
    // The blue of a row.
    std::vector<int> row(int32_t y) const {
        const uint32_t* first = ZqGetCanvasPixels(handle) + y * width_;
        std::vector<int> blues;
        blues.reserve(static_cast<size_t>(width_));
        for (int32_t x = 0; x < width_; ++x) blues.push_back(static_cast<int>(first[x] & 0xFF));
        return blues;
    }

    ZqDeviceContext handle = nullptr;

  private:
    int32_t width_;
};

using Row = std::vector<int>;
constexpr uint8_t kGrey[6] = {1, 2, 3, 4, 5, 6};  // 3 x 2, or 2 x 3

TEST(Display, PlotsARectangleUprightAndUpsideDown) {
    TestCanvas canvas(4, 3);
    EXPECT_EQ(Gen_PlotImageToDC(canvas.handle, kGrey, 1, 0, 2, 2, 1, 1, ZQ_DRAW_GREY_8), 0U);
    EXPECT_EQ(canvas.row(0), (Row{0, 0, 0, 0}));
    EXPECT_EQ(canvas.row(1), (Row{0, 2, 3, 0}));
    EXPECT_EQ(canvas.row(2), (Row{0, 5, 6, 0}));
    EXPECT_EQ(Gen_PlotImage(canvas.handle, kGrey, 0, 0, 3, 2, 0, 0, ZQ_DRAW_BOTTOM_UP), 0U);
    EXPECT_EQ(canvas.row(0), (Row{4, 5, 6, 0}));
    EXPECT_EQ(canvas.row(1), (Row{1, 2, 3, 0}));
    const ZqCoordinates clip = {1, 0, 2, 3};
    EXPECT_EQ(ZqSetCanvasClip(canvas.handle, &clip), 0);
    EXPECT_EQ(Gen_PlotImageToDC(canvas.handle, kGrey, 0, 0, 1, 2, 1, 0, 3), 0U);
    EXPECT_EQ(canvas.row(0), (Row{4, 4, 6, 0})) << "three bytes a pixel, clipped";
}

TEST(Display, RefusesInOrderAndDrawsNothingForImpossibleRectangles) {
    TestCanvas canvas(2, 2);
    struct Case {
        ZqDeviceContext dc;
        const void* pixels;
        int32_t left, top, width, height;
        uint32_t flags;
        ZqError expected;
    };
    const Case cases[] = {
        {nullptr, nullptr, 0, 0, 1, 1, 12, ZQ_ERR_BUFFER_NULL_PATH},
        {canvas.handle, nullptr, 0, 0, 1, 1, 12, ZQ_ERR_BUFFER_NULL_BUFFER},
        {canvas.handle, kGrey, 0, 0, 1, 1, 12, ZQ_ERR_BUFFER_MODE},
        {canvas.handle, kGrey, 0, 0, 1, 1, 128, ZQ_ERR_BUFFER_MODE},
        {canvas.handle, kGrey, -1, 0, 2, 2, 0, 0},
        {canvas.handle, kGrey, 0, 0, -1, 2, 0, 0},
        {canvas.handle, kGrey, 0, INT_MIN, 1, INT_MIN, 0, 0},
        {canvas.handle, kGrey, INT_MAX, 0, INT_MAX, 1, 4, 0},
        {canvas.handle, kGrey, 0, 0, 1, 0, 0, 0},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(static_cast<ZqError>(Gen_PlotImageToDC(c.dc, c.pixels, c.left, c.top, c.width,
                                                         c.height, 0, 0, c.flags)),
                  c.expected)
            << c.left << ' ' << c.top << ' ' << c.width << ' ' << c.height << ' ' << c.flags;
    }
    constexpr int32_t kFar = 1 << 30;
    EXPECT_EQ(Gen_PlotImageToDC(canvas.handle, kGrey, 0, kFar, 1, kFar - 1, 0, kFar, 1), 0U);
    EXPECT_EQ(canvas.row(0), (Row{0, 0}));
    EXPECT_EQ(ZqDisposeCanvas(&canvas), ZQ_ERR_NOT_AN_OBJECT);
    ZqDeviceContext none = nullptr;
    EXPECT_EQ(ZqNewCanvas(0, 1, &none), ZQ_ERR_INVALID_PARAMETER);
    EXPECT_EQ(ZqNewCanvas(1, 40000, &none), ZQ_ERR_INVALID_PARAMETER);
    EXPECT_EQ(none, nullptr);
}

TEST(Display, ZoomsOverThePattern) {
    TestCanvas canvas(8, 6);
    EXPECT_EQ(Gen_PlotZoomedImage(canvas.handle, kGrey, 2, 3, 2, 0, 0, 0, nullptr), 0U);
    // Text colour is the button face, the pattern's set bits are white. It starts at the first
    // logical pixel that shows in part: outside, as the image starts at (1, 1).
    EXPECT_EQ(canvas.row(0), (Row{240, 240, 240, 240, 240, 240, 240, 240}));
    EXPECT_EQ(canvas.row(1), (Row{255, 1, 1, 2, 2, 3, 3, 255}));
    EXPECT_EQ(canvas.row(2), (Row{255, 1, 1, 2, 2, 3, 3, 255}));
    EXPECT_EQ(canvas.row(4), (Row{240, 4, 4, 5, 5, 6, 6, 240}));
    ZqCoordinates place = {};
    EXPECT_EQ(Gen_GetImageClientPos(canvas.handle, 6, 4, 1, 1, &place), 0U);
    EXPECT_EQ(place.left, 2);
    EXPECT_EQ(place.top, 1);
    EXPECT_EQ(place.right, 5);
    EXPECT_EQ(place.bottom, 3);
    EXPECT_EQ(Gen_PlotZoomedImage(canvas.handle, nullptr, 2, 3, 2, 0, 0, 12, nullptr), 0U);
    EXPECT_EQ(canvas.row(2), (Row{255, 255, 240, 240, 255, 255, 240, 240}));
}

TEST(Display, AnImageWithoutPixelsIsZoomedLikeOthers) {
    ZqImageHandle image = nullptr;
    ASSERT_EQ(NewImage(ZQ_TYPE_U8, 0, 0, 0, &image), 0);
    for (const bool buffer : {false, true}) {
        TestCanvas canvas(8, 3);
        const ZqCoordinates clip = {2, 1, 8, 3};
        ZqSetCanvasClip(canvas.handle, &clip);
        EXPECT_EQ(buffer ? static_cast<ZqError>(
                               Gen_PlotZoomedImage(nullptr, kGrey, 2, 0, 2, 0, 0, 0, canvas.handle))
                         : ZqDrawImage(nullptr, image, 2, 0, 0, 0, canvas.handle),
                  0);
        EXPECT_EQ(canvas.row(0), Row(8));
        EXPECT_EQ(canvas.row(1), (Row{0, 0, 240, 240, 240, 240, 240, 240}));
        ZqCoordinates place = {};
        EXPECT_EQ(Gen_GetImageClientPos(canvas.handle, 6, 4, 0, 0, &place), 0U);
        EXPECT_EQ(place.left, 3);
    }
    EXPECT_EQ(ZqDisposeImage(image), 0);
}

TEST(Display, ClippedDrawsShowWhatWholeOnesShowThere) {
    // In place as bytes, mapped as samples.
    std::vector<uint16_t> pixels(20 * 20);
    for (size_t i = 0; i < pixels.size(); ++i) pixels[i] = static_cast<uint16_t>(4 + i % 200 * 5);
    const ZqCoordinates clips[] = {{3, 5, 11, 9}, {0, 19, 20, 20}, {7, 0, 8, 20}, {9, 9, 9, 9}};
    for (const int32_t zoom : {1, 2, 7, 16, -2, -3}) {
        for (const int32_t offset : {0, 1, 7, 9}) {
            for (const uint32_t flags : {0U, 1U, 8U, 9U}) {
                const auto draw = [&](const TestCanvas& canvas) {
                    Gen_PlotZoomedImage(canvas.handle, pixels.data(), zoom, 20, 20, offset, offset,
                                        flags, nullptr);
                };
                const TestCanvas whole(20, 20);
                draw(whole);
                for (const ZqCoordinates& clip : clips) {
                    const TestCanvas part(20, 20);
                    ZqSetCanvasClip(part.handle, &clip);
                    draw(part);
                    if (clip.top == clip.bottom) {
                        EXPECT_EQ(part.row(9), Row(20)) << "nothing";
                    }
                    for (int32_t y = clip.top; y < clip.bottom; ++y) {
                        const Row expected = whole.row(y), actual = part.row(y);
                        const auto inside = [&](const Row& row) {
                            Row some(row.begin() + clip.left, row.begin() + clip.right);
                            // The pattern starts at the corner of what is painted.
                            for (int& blue : some) blue = std::min(blue, 240);
                            return some;
                        };
                        EXPECT_EQ(inside(actual), inside(expected))
                            << zoom << ' ' << offset << ' ' << flags << ' ' << y;
                    }
                }
            }
        }
    }
}

TEST(Display, ShrinksToTheFirstRowAndTheLastColumnOfEachGroup) {
    TestCanvas canvas(2, 2);
    const uint8_t pixels[] = {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16};
    uint16_t samples[16];  // mapped, and no other rows than are shown
    std::transform(pixels, pixels + 16, samples, [](int pixel) { return pixel * 4; });
    for (const bool mapped : {false, true}) {
        const void* source = mapped ? static_cast<const void*>(samples) : pixels;
        const uint32_t format = mapped ? ZQ_DRAW_GREY_16_BY_2 : ZQ_DRAW_GREY_8;
        EXPECT_EQ(Gen_PlotZoomedImage(canvas.handle, source, -2, 4, 4, 0, 0, format, nullptr), 0U);
        EXPECT_EQ(canvas.row(0), (Row{2, 4}));
        EXPECT_EQ(canvas.row(1), (Row{10, 12}));
        EXPECT_EQ(Gen_PlotZoomedImage(canvas.handle, source, -2, 4, 4, 0, 0, format + 1, nullptr),
                  0U);
        EXPECT_EQ(canvas.row(0), (Row{14, 16})) << "the first row as it is seen";
    }
}

TEST(Display, PaintsEveryBrushButTheExcludedRectangle) {
    for (const int32_t style : {0, 1, 2, 3, 4, 5, 6, 7, 8, 9}) {
        TestCanvas canvas(4, 4);
        const ZqCoordinates whole = {0, 0, 4, 4};
        const ZqCoordinates hole =
            style % 2 == 0 ? ZqCoordinates{1, 0, 3, 4} : ZqCoordinates{3, 4, 1, 0};  // backwards
        const auto paint = [&](const ZqCoordinates* area, const ZqCoordinates* excluded) {
            return DrawImageBackground2(canvas.handle, area, excluded, 0x0A0B0C, 0x0D0E0F, style,
                                        1);
        };
        const ZqCoordinates nothing = {0, 0, 0, 0};
        EXPECT_EQ(paint(&nothing, nullptr), style != 4 && style != 9 ? 1 : 0) << style;
        EXPECT_EQ(paint(&whole, &hole), 1) << "the region is given back last, " << style;
        const bool pattern = style == 3 || (style >= 5 && style <= 8);
        const int edge = pattern ? 240 : style == 0 ? 0x0A : style == 2 ? 0x0D : 0;
        EXPECT_EQ(canvas.row(0), (Row{edge, 0, 0, edge})) << style;
        EXPECT_EQ(Gen_PlotImage(canvas.handle, kGrey, 0, 0, 3, 2, 1, 0, 0), 0U);
        EXPECT_EQ(canvas.row(0), (Row{edge, 1, 2, 3})) << "the clip region is whole again";
    }
}

}  // namespace
