// The child window that shows an image: paints it, zooms about the pointer, scrolls by dragging.
#ifndef ZQVIEW_PICTURE_AREA_H
#define ZQVIEW_PICTURE_AREA_H

#include <windows.h>

#include <functional>
#include <optional>

#include "document.h"
#include "view.h"

class PictureArea {
  public:
    struct Events {
        std::function<void()> view_changed;
        // The image position under the pointer; nothing when the pointer has left.
        std::function<void(std::optional<Point>)> pointed_at;
    };

    PictureArea(HWND parent, Events events);
    PictureArea(const PictureArea&) = delete;
    PictureArea& operator=(const PictureArea&) = delete;

    // Shows a document, which is borrowed; null: none.
    void show(const Document* document);
    void place(int width, int height);
    // A turn of the wheel by so many of its units, the pointer being at a screen position.
    void turn_wheel(int delta, POINT screen);
    // A change of the view from the keyboard.
    void change_view(const std::function<void(View&)>& change);
    const View& view() const { return view_; }

    // For the window procedure.
    void adopt(HWND window) { window_ = window; }
    LRESULT handle(UINT message, WPARAM wide, LPARAM word);

  private:
    void paint();
    void move_pointer(Point at);
    // Tells what is under the pointer, which a change of the view changes too.
    void point_again();
    std::optional<Point> image_position(Point client) const;

    HWND window_ = nullptr;
    Events events_;
    const Document* document_ = nullptr;
    View view_;
    int wheel_rest_ = 0;            // less than a notch
    std::optional<Point> pointer_;  // client position while it is inside
    bool dragging_ = false;
};

#endif
