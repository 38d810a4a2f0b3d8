// What the library leaves to Windows itself: message boxes on the screen, and the string table as
// a resource that any program can read.
#include <gtest/gtest.h>
#include <windows.h>
#include <zqvissvc/errors.h>
#include <zqvissvc/slots.h>

#include <array>
#include <atomic>
#include <string>
#include <thread>

#include "refhost/refhost.h"

namespace {

struct String {
    UINT id;
    const char* text;
};
constexpr String kStrings[] = {
#define ZQ_STRING(id, text) {id, text},
#include "base/string_table.def"
#undef ZQ_STRING
};

TEST(SystemTest, EveryStringIsAResourceOfTheLibrary) {
    const HMODULE library = GetModuleHandleA("ZqVisSvc.dll");
    ASSERT_NE(library, nullptr);
    for (const String& string : kStrings) {
        std::array<char, 512> text{};
        LoadStringA(library, string.id, text.data(), text.size());
        EXPECT_STREQ(text.data(), string.text) << string.id;
    }
    std::array<char, 8> none{};
    EXPECT_EQ(LoadStringA(library, 1, none.data(), none.size()), 0);
}

// Waits for a box with this caption, takes its text and closes it.
class BoxCloser {
  public:
    explicit BoxCloser(const char* caption)
        : thread_([this, caption] {
              HWND box = nullptr;
              while (box == nullptr && !stop_) {
                  box = FindWindowA(nullptr, caption);
                  Sleep(10);
              }
              if (box == nullptr) return;
              std::array<char, 512> text{};
              GetDlgItemTextA(box, kTextItem, text.data(), text.size());
              text_ = text.data();
              PostMessageA(box, WM_CLOSE, 0, 0);
          }) {}
    // Call after the box is gone.
    std::string text() {
        stop_ = true;
        if (thread_.joinable()) thread_.join();
        return text_;
    }
    ~BoxCloser() { text(); }
    BoxCloser(const BoxCloser&) = delete;
    BoxCloser& operator=(const BoxCloser&) = delete;

  private:
    static constexpr int kTextItem = 0xFFFF;
    std::atomic<bool> stop_{false};
    std::string text_;
    std::thread thread_;
};

TEST(SystemTest, AMissingServiceIsShownOnTheScreen) {
    const int dialogs = refhost::dialogs_shown();
    SetDFRTModule(GetModuleHandleA("kernel32.dll"));  // a module without any service
    BoxCloser closer("Fatal Error");
    const int32_t length = Dataflux::StrLen_EX("abc");
    SetDFRTModule(nullptr);
    EXPECT_EQ(length, 0);
    EXPECT_EQ(closer.text(), "DATAFLUX.LIB could not locate \"StrLen\".");
    EXPECT_EQ(refhost::dialogs_shown(), dialogs)
        << "that module has no brackets for dialogs either";
}

TEST(SystemTest, AResultIsShownOnTheScreenWhenTheModeSaysSo) {
    const int dialogs = refhost::dialogs_shown();
    DF_SetErrorMode(ZQ_ERROR_MODE_SHOW, 1, nullptr, nullptr);
    BoxCloser closer("KEMO Vision");
    const int32_t code = ZqProcessResult(ZQ_ERR_NOT_AN_IMAGE, nullptr, 219);
    DF_SetErrorMode(ZQ_ERROR_MODE_DEFAULT, 1, nullptr, nullptr);
    EXPECT_EQ(code, ZQ_ERR_NOT_AN_IMAGE);
    EXPECT_EQ(closer.text(), "KEMO Dispose\nNot an image.");
    EXPECT_EQ(refhost::dialogs_shown(), dialogs + 1);
}

}  // namespace
