// The viewer as a person meets it: started on a file, driven by mouse and keys, and looked at on
// the screen. Needs a display of at least 1280 x 1024 pixels of 24 bits.
#include <gtest/gtest.h>
#include <windows.h>
#include <zqvissvc/display.h>
#include <zqvissvc/files.h>

#include <chrono>
#include <cstring>
#include <functional>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::Picture;

constexpr std::chrono::seconds kPatience(60);  // for a machine that emulates the processor

bool wait_until(const std::function<bool()>& holds) {
    const auto end = std::chrono::steady_clock::now() + kPatience;
    while (!holds()) {
        if (std::chrono::steady_clock::now() > end) return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    return true;
}

class Process {
  public:
    explicit Process(std::string command) {
        STARTUPINFOA start{};
        start.cb = sizeof(start);
        start.dwFlags = STARTF_USESHOWWINDOW;
        start.wShowWindow = SW_SHOWNORMAL;
        PROCESS_INFORMATION made{};
        if (CreateProcessA(nullptr, command.data(), nullptr, nullptr, FALSE, 0, nullptr, nullptr,
                           &start, &made) != 0) {
            CloseHandle(made.hThread);
            handle_ = made.hProcess;
            id_ = made.dwProcessId;
        }
    }
    ~Process() {
        TerminateProcess(handle_, 99);  // nothing where it has ended by itself
        CloseHandle(handle_);
    }
    Process(const Process&) = delete;
    Process& operator=(const Process&) = delete;

    DWORD id() const { return id_; }
    DWORD exit_status() const {
        DWORD status = STILL_ACTIVE;
        wait_until(
            [&] { return GetExitCodeProcess(handle_, &status) == 0 || status != STILL_ACTIVE; });
        return status;
    }

  private:
    HANDLE handle_ = nullptr;
    DWORD id_ = 0;
};

std::string text_of(HWND window) {
    char text[400] = {};
    SendMessageA(window, WM_GETTEXT, sizeof(text), reinterpret_cast<LPARAM>(text));
    return text;
}

// Pixels 0x00RRGGBB of the screen.
struct Screenshot {
    int32_t width = 0, height = 0;
    std::vector<uint32_t> pixels;
};

Screenshot screenshot_of(HWND window) {
    RECT client{};
    GetClientRect(window, &client);
    POINT corner{0, 0};
    ClientToScreen(window, &corner);
    Screenshot shot{static_cast<int32_t>(client.right), static_cast<int32_t>(client.bottom), {}};
    BITMAPINFO description{};
    description.bmiHeader = {
        sizeof(BITMAPINFOHEADER), shot.width, -shot.height, 1, 32, BI_RGB, 0, 0, 0, 0, 0};
    const HDC screen = GetDC(nullptr);
    const HDC memory = CreateCompatibleDC(screen);
    void* bits = nullptr;
    const HBITMAP bitmap =
        CreateDIBSection(memory, &description, DIB_RGB_COLORS, &bits, nullptr, 0);
    const HGDIOBJ previous = SelectObject(memory, bitmap);
    BitBlt(memory, 0, 0, shot.width, shot.height, screen, corner.x, corner.y, SRCCOPY);
    GdiFlush();
    const auto* from = static_cast<const uint32_t*>(bits);
    shot.pixels.assign(from, from + static_cast<size_t>(shot.width) * shot.height);
    for (uint32_t& pixel : shot.pixels) pixel &= 0xFFFFFF;
    SelectObject(memory, previous);
    DeleteObject(bitmap);
    DeleteDC(memory);
    ReleaseDC(nullptr, screen);
    return shot;
}

constexpr uint32_t kCanvasFace = 0xF0F0F0;

uint32_t face_of_system() {
    const COLORREF face = GetSysColor(COLOR_BTNFACE);
    return static_cast<uint32_t>(GetRValue(face) << 16 | GetGValue(face) << 8 | GetBValue(face));
}

// Where a screenshot first differs from the same view drawn in memory; empty where it does not.
std::string difference(const Screenshot& shot, const ZqDeviceContext canvas) {
    const uint32_t* drawn = ZqGetCanvasPixels(canvas);
    for (size_t i = 0; i < shot.pixels.size(); ++i) {
        const uint32_t wanted = drawn[i] & 0xFFFFFF;
        if (shot.pixels[i] == wanted) continue;
        if (wanted == kCanvasFace && shot.pixels[i] == face_of_system()) continue;
        const auto width = static_cast<size_t>(shot.width);
        std::ostringstream text;
        text << i % width << ',' << i / width << ": " << std::hex << shot.pixels[i] << ", not "
             << wanted;
        return text.str();
    }
    return {};
}

class Window : public testing::Test {
  protected:
    Window() {
        small_.fill(3);
        large_.fill(4);
        write(small_, "a.png");
        write(large_, "b.png");
        zqtest::store_bytes(folder_.path("c.png"), "no picture");
        viewer_ = std::make_unique<Process>("zqview.exe \"" + folder_.path("a.png") + "\"");
        EXPECT_TRUE(wait_until([&] { return find(); })) << "no window";
        SetForegroundWindow(window_);
        expect_title("a.png - 300 x 200, 8 bits - 1:1 - zqview");
        picture_ = FindWindowExA(window_, nullptr, "ZqViewPicture", nullptr);
        status_ = FindWindowExA(window_, nullptr, "msctls_statusbar32", nullptr);
    }

    void expect_title(const std::string& title) {
        EXPECT_TRUE(wait_until([&] { return text_of(window_) == title; }))
            << title << ", not " << text_of(window_);
    }
    void expect_status(const std::string& status) {
        EXPECT_TRUE(wait_until([&] { return text_of(status_) == status; }))
            << status << ", not " << text_of(status_);
    }
    void expect_picture(const char* name, ZqImageHandle image, int32_t zoom, int32_t x_offset,
                        int32_t y_offset) {
        const RECT size = area();
        ZqDeviceContext canvas = nullptr;
        ASSERT_EQ(ZqNewCanvas(static_cast<int32_t>(size.right), static_cast<int32_t>(size.bottom),
                              &canvas),
                  0);
        EXPECT_EQ(ZqDrawImage(canvas, image, zoom, x_offset, y_offset, 0, nullptr), 0);
        std::string found;
        wait_until([&] {
            found = difference(screenshot_of(picture_), canvas);
            return found.empty();
        });
        EXPECT_EQ(found, "") << name;
        ZqDisposeCanvas(canvas);
        keep(name);
    }
    void press(BYTE key) {
        keybd_event(key, 0, 0, 0);
        keybd_event(key, 0, KEYEVENTF_KEYUP, 0);
    }
    void point(int32_t x, int32_t y) {
        POINT at{x, y};
        ClientToScreen(picture_, &at);
        const auto place = [](LONG pixel, int of) {
            return static_cast<DWORD>((pixel * 65536 + 32768) / of);
        };
        mouse_event(MOUSEEVENTF_MOVE | MOUSEEVENTF_ABSOLUTE,
                    place(at.x, GetSystemMetrics(SM_CXSCREEN)),
                    place(at.y, GetSystemMetrics(SM_CYSCREEN)), 0, 0);
    }
    void turn_wheel(int notches) {
        mouse_event(MOUSEEVENTF_WHEEL, 0, 0, static_cast<DWORD>(notches * WHEEL_DELTA), 0);
    }
    RECT area() const {
        RECT client{};
        GetClientRect(picture_, &client);
        return client;
    }

    Picture small_{ZQ_TYPE_U8, 300, 200}, large_{ZQ_TYPE_RGB, 1500, 1400};
    zqtest::ScratchFolder folder_;
    std::unique_ptr<Process> viewer_;
    HWND window_ = nullptr, picture_ = nullptr, status_ = nullptr;

  private:
    void write(const Picture& picture, const char* name) {
        const ZqImageValue value = picture.value();
        ASSERT_EQ(
            DF_WriteFile2(&value, folder_.path(name).c_str(), "PNG", nullptr, nullptr, nullptr), 0);
    }
    bool find() {
        window_ = FindWindowA("ZqView", nullptr);
        DWORD owner = 0;
        GetWindowThreadProcessId(window_, &owner);
        return window_ != nullptr && owner == viewer_->id();
    }
    // For people: the whole window, beside the test's report.
    void keep(const std::string& name) {
        const Screenshot shot = screenshot_of(window_);
        const Picture kept(ZQ_TYPE_RGB, shot.width, shot.height);
        Picture& picture = const_cast<Picture&>(kept);
        std::string pixels(shot.pixels.size() * 4, '\0');
        std::memcpy(pixels.data(), shot.pixels.data(), pixels.size());
        picture.set_pixels(pixels);
        const ZqImageValue value = picture.value();
        DF_WriteFile2(&value, ("../reports/zqview-" + name + ".png").c_str(), "PNG", nullptr,
                      nullptr, nullptr);
    }
};

TEST_F(Window, ShowsZoomsScrollsAndWalks) {
    const RECT client = area();
    const auto width = static_cast<int32_t>(client.right);
    const auto height = static_cast<int32_t>(client.bottom);
    ASSERT_GT(width, 600);
    ASSERT_GT(height, 400);
    expect_picture("centred", small_.handle(), 1, 0, 0);

    // A pixel far enough from the picture's edges to stay under the pointer.
    constexpr int32_t kX = 160, kY = 120;
    const std::string value = "(160, 120)  " + std::to_string(small_.at<uint8_t>(kX, kY));
    const int32_t left = (width - 300) / 2, top = (height - 200) / 2;
    point(left + kX, top + kY);
    expect_status(value);
    turn_wheel(7);
    expect_title("a.png - 300 x 200, 8 bits - 8:1 - zqview");
    expect_status(value);
    const int32_t x = 8 * kX - (left + kX), y = 8 * kY - (top + kY);
    expect_picture("zoomed", small_.handle(), 8, x, y);

    mouse_event(MOUSEEVENTF_LEFTDOWN, 0, 0, 0, 0);
    point(left + kX - 100, top + kY - 90);
    mouse_event(MOUSEEVENTF_LEFTUP, 0, 0, 0, 0);
    expect_picture("scrolled", small_.handle(), 8, x + 100, y + 90);

    press(VK_RIGHT);
    expect_title("b.png - 1500 x 1400, RGB - 1:2 - zqview");
    expect_picture("shrunk", large_.handle(), -2, 0, 0);
    // Where the pointer was left, from the middle, at which both pictures are.
    const uint8_t* pixel = &large_.at<uint8_t>(570, 560);
    expect_status("(570, 560)  red " + std::to_string(pixel[2]) + ", green " +
                  std::to_string(pixel[1]) + ", blue " + std::to_string(pixel[0]));
    press(VK_RIGHT);
    expect_title("c.png - zqview");
    expect_status("File I/O error.");
    expect_picture("refused", nullptr, 1, 0, 0);
    press(VK_HOME);
    expect_title("a.png - 300 x 200, 8 bits - 1:1 - zqview");
    press(VK_ESCAPE);
    EXPECT_EQ(viewer_->exit_status(), 0U);
}

}  // namespace
