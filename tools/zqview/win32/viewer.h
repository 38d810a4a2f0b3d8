// The viewer's main window: a picture over a status line.
#ifndef ZQVIEW_VIEWER_H
#define ZQVIEW_VIEWER_H

#include <windows.h>
// After windows.h, on which it builds.
#include <shellapi.h>

#include <memory>
#include <optional>
#include <string>

#include "document.h"
#include "picture_area.h"

class Viewer {
  public:
    Viewer();
    Viewer(const Viewer&) = delete;
    Viewer& operator=(const Viewer&) = delete;

    // Whether the system made the window; nothing else works without.
    bool is_made() const { return window_ != nullptr; }
    // Shows a file, or says why it cannot be shown.
    void open(const std::string& path);
    // Handles messages until the window is closed; returns the exit status.
    int run();

    // For the window procedure.
    void adopt(HWND window) { window_ = window; }
    LRESULT handle(UINT message, WPARAM wide, LPARAM word);

  private:
    void create_parts();
    void arrange();
    bool press(WPARAM key);
    void ask_for_file();
    void take_dropped(HDROP drop);
    void show_title();
    void show_status(std::optional<Point> pixel);

    HWND window_ = nullptr;
    HWND status_ = nullptr;
    std::unique_ptr<PictureArea> area_;
    std::string path_;                    // of the file that was opened last; empty: none
    std::unique_ptr<Document> document_;  // null when it could not be read
    std::string failure_;                 // why
};

#endif
