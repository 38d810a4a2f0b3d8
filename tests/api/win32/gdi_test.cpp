// Canvases against the device contexts of Windows: the same calls draw the same pixels.
#include <gtest/gtest.h>
#include <windows.h>
#include <zqvissvc/display.h>
#include <zqvissvc/image.h>

#include <random>
#include <string>
#include <vector>

#include "support/picture.h"

namespace {

constexpr int32_t kWidth = 61, kHeight = 47;
constexpr uint32_t kCanvasFace = 0xF0F0F0;

uint32_t face_of_system() {
    const COLORREF face = GetSysColor(COLOR_BTNFACE);
    return static_cast<uint32_t>(GetRValue(face) << 16 | GetGValue(face) << 8 | GetBValue(face));
}

// A memory context over a bitmap, and a window of the same client size.
class GdiScreen {
  public:
    GdiScreen() : dc_(CreateCompatibleDC(nullptr)) {
        BITMAPINFO description{};
        description.bmiHeader = {
            sizeof(BITMAPINFOHEADER), kWidth, -kHeight, 1, 32, BI_RGB, 0, 0, 0, 0, 0};
        void* bits = nullptr;
        bitmap_ = CreateDIBSection(dc_, &description, DIB_RGB_COLORS, &bits, nullptr, 0);
        pixels_ = static_cast<uint32_t*>(bits);
        previous_ = SelectObject(dc_, bitmap_);
        window_ = CreateWindowA("STATIC", "", WS_POPUP, 0, 0, kWidth, kHeight, nullptr, nullptr,
                                nullptr, nullptr);
    }
    ~GdiScreen() {
        DestroyWindow(window_);
        SelectObject(dc_, previous_);
        DeleteObject(bitmap_);
        DeleteDC(dc_);
    }
    GdiScreen(const GdiScreen&) = delete;
    GdiScreen& operator=(const GdiScreen&) = delete;

    void* dc() const { return dc_; }
    void* window() const { return window_; }
    void set_clip(const ZqCoordinates& clip) const {
        const HRGN region = CreateRectRgn(clip.left, clip.top, clip.right, clip.bottom);
        SelectClipRgn(dc_, region);
        DeleteObject(region);
    }
    uint32_t pixel(size_t i) const {
        GdiFlush();
        return pixels_[i] & 0xFFFFFF;
    }

  private:
    HDC dc_;
    HBITMAP bitmap_ = nullptr;
    HGDIOBJ previous_ = nullptr;
    uint32_t* pixels_ = nullptr;
    HWND window_ = nullptr;
};

class CanvasScreen {
  public:
    CanvasScreen() { EXPECT_EQ(ZqNewCanvas(kWidth, kHeight, &handle_), 0); }
    ~CanvasScreen() { ZqDisposeCanvas(handle_); }
    CanvasScreen(const CanvasScreen&) = delete;
    CanvasScreen& operator=(const CanvasScreen&) = delete;

    void* dc() const { return handle_; }
    void* window() const { return handle_; }
    void set_clip(const ZqCoordinates& clip) const { ZqSetCanvasClip(handle_, &clip); }
    uint32_t pixel(size_t i) const { return ZqGetCanvasPixels(handle_)[i] & 0xFFFFFF; }

  private:
    ZqDeviceContext handle_ = nullptr;
};

const ZqCoordinates kClips[] = {{0, 0, kWidth, kHeight}, {7, 5, 40, 33}, {20, 11, 21, 47}};

// Calls draw(screen) for both kinds of screen and compares them.
template <class Draw>
void compare(const ZqCoordinates& clip, const std::string& name, Draw draw) {
    const GdiScreen gdi;
    const CanvasScreen canvas;
    gdi.set_clip(clip);
    canvas.set_clip(clip);
    ASSERT_EQ(draw(canvas), draw(gdi)) << name;
    size_t different = 0, first = 0;
    for (size_t i = 0; i < size_t{kWidth} * kHeight; ++i) {
        const uint32_t ours = canvas.pixel(i), theirs = gdi.pixel(i);
        if (ours == theirs || (ours == kCanvasFace && theirs == face_of_system())) continue;
        if (different++ == 0) first = i;
    }
    EXPECT_EQ(different, 0U) << name << ", clip from " << clip.left << ", first at "
                             << first % kWidth << ',' << first / kWidth << ": " << std::hex
                             << canvas.pixel(first) << " for " << gdi.pixel(first);
}

std::vector<uint32_t> noise() {
    std::mt19937 random(5);
    std::vector<uint32_t> words(300 * 300);
    for (uint32_t& word : words) word = static_cast<uint32_t>(random());
    return words;
}

constexpr uint32_t kFormats[] = {0, 2, 4, 8, 16, 32, 64};

TEST(Gdi, PlotsAsACanvasDoes) {
    struct Place {
        int32_t left, top, width, height, x, y;
    };
    const Place places[] = {{0, 0, 61, 47, 0, 0},   {0, 0, 30, 20, 5, 7}, {9, 4, 20, 21, 9, 4},
                            {3, 2, 40, 40, -6, -9}, {0, 0, 90, 80, 0, 0}, {1, 0, 7, 1, 30, 46},
                            {5, 30, 33, 12, 5, 30}};
    const std::vector<uint32_t> pixels = noise();
    for (const ZqCoordinates& clip : kClips) {
        for (const uint32_t format : kFormats) {
            for (const uint32_t flip : {0U, 1U}) {
                for (const Place& p : places) {
                    compare(clip,
                            std::to_string(format + flip) + " at " + std::to_string(p.left) + ' ' +
                                std::to_string(p.x),
                            [&](const auto& screen) {
                                return Gen_PlotImageToDC(screen.dc(), pixels.data(), p.left, p.top,
                                                         p.width, p.height, p.x, p.y,
                                                         format + flip);
                            });
                }
            }
        }
    }
}

TEST(Gdi, ZoomsAsACanvasDoes) {
    const std::vector<uint32_t> pixels = noise();
    const int32_t offsets[][2] = {{0, 0}, {3, 5}, {17, 9}, {-4, -7}};
    for (const ZqCoordinates& clip : kClips) {
        for (int32_t zoom = -16; zoom <= 16; ++zoom) {
            for (const auto& [x, y] : offsets) {
                for (const int32_t side : {5, 40, 299}) {
                    const uint32_t flags = kFormats[static_cast<uint32_t>(zoom + 16 + side) % 7] +
                                           static_cast<uint32_t>(zoom & 1);
                    compare(clip,
                            "zoom " + std::to_string(zoom) + " side " + std::to_string(side) +
                                " flags " + std::to_string(flags) + " offset " + std::to_string(x),
                            [&](const auto& screen) {
                                return Gen_PlotZoomedImage(screen.window(), pixels.data(), zoom,
                                                           side, side - 1, x, y, flags,
                                                           screen.dc());
                            });
                }
            }
        }
    }
}

TEST(Gdi, ShowsImagesOfEveryTypeAsACanvasDoes) {
    for (int32_t type = 0; type < 7; ++type) {
        for (const int32_t zoom : {1, 2, -3, 16}) {
            zqtest::Picture picture(type, 33, 21);
            compare(kClips[0], "type " + std::to_string(type) + " zoom " + std::to_string(zoom),
                    [&](const auto& screen) {
                        return ZqDrawImage(screen.window(), picture.handle(), zoom, 2, 1, type & 1,
                                           screen.dc());
                    });
        }
    }
}

TEST(Gdi, PaintsBackgroundsAsACanvasDoes) {
    const ZqCoordinates boxes[] = {
        {0, 0, kWidth, kHeight}, {3, 2, 30, 41}, {-5, -3, 20, 19}, {30, 41, 3, 2}};
    const ZqCoordinates upright = {9, 8, 25, 16}, backwards = {25, 16, 9, 8};
    const ZqCoordinates* const holes[] = {nullptr, &upright, &backwards};
    for (const ZqCoordinates& clip : kClips) {
        for (const ZqCoordinates& box : boxes) {
            for (int32_t style = 0; style <= 9; ++style) {
                for (int32_t hatch = 0; hatch < (style == 2 ? 14 : 1); ++hatch) {
                    for (const ZqCoordinates* hole : holes) {
                        compare(clip,
                                "style " + std::to_string(style) + " hatch " +
                                    std::to_string(hatch) + " box " + std::to_string(box.left),
                                [&](const auto& screen) {
                                    return DrawImageBackground2(screen.dc(), &box, hole, 0x123456,
                                                                0x789ABC, style, hatch) != 0;
                                });
                    }
                }
            }
        }
    }
}

}  // namespace
