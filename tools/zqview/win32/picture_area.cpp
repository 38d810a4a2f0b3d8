// Painting and the mouse.
#include "picture_area.h"

#include <windowsx.h>
#include <zqvissvc/display.h>

#include <algorithm>

#include "failure.h"
#include "window_procedure.h"

namespace {

constexpr char kClass[] = "ZqViewPicture";

Point client_point(LPARAM word) {
    return {GET_X_LPARAM(word), GET_Y_LPARAM(word)};
}

int32_t rounded_down(int32_t value, int32_t multiple) {
    const int32_t rest = value % multiple;
    return value - (rest < 0 ? rest + multiple : rest);
}

}  // namespace

PictureArea::PictureArea(HWND parent, Events events) : events_(std::move(events)) {
    // A context of its own keeps the mapping of the last drawing, by which positions are told.
    register_window_class<PictureArea>(kClass, CS_OWNDC, IDC_CROSS);
    window_ = CreateWindowExA(0, kClass, "", WS_CHILD | WS_VISIBLE, 0, 0, 0, 0, parent, nullptr,
                              GetModuleHandleA(nullptr), this);
}

LRESULT PictureArea::handle(UINT message, WPARAM wide, LPARAM word) {
    switch (message) {
        case WM_PAINT:
            paint();
            return 0;
        case WM_ERASEBKGND:
            return 1;  // the drawing covers everything
        case WM_SIZE:
            view_.resize({LOWORD(word), HIWORD(word)});
            InvalidateRect(window_, nullptr, FALSE);
            return 0;
        case WM_LBUTTONDOWN:
            move_pointer(client_point(word));
            dragging_ = true;
            SetCapture(window_);
            return 0;
        case WM_LBUTTONUP:
            move_pointer(client_point(word));
            ReleaseCapture();
            return 0;
        case WM_CAPTURECHANGED:
            dragging_ = false;
            return 0;
        case WM_MOUSEMOVE:
            move_pointer(client_point(word));
            return 0;
        case WM_MOUSELEAVE:
            pointer_.reset();
            point_again();
            return 0;
        default:
            return DefWindowProcA(window_, message, wide, word);
    }
}

void PictureArea::show(const Document* document) {
    document_ = document;
    if (document != nullptr) view_.show(document->extent());
    change_view([](View&) {});
}

void PictureArea::place(int width, int height) {
    MoveWindow(window_, 0, 0, width, height, TRUE);
}

void PictureArea::paint() {
    PAINTSTRUCT paint_info;
    const HDC dc = BeginPaint(window_, &paint_info);
    try {
        if (document_ != nullptr) {
            document_->draw(window_, view_, dc);
        } else {
            ZqDrawImage(window_, nullptr, 1, 0, 0, 0, dc);
        }
    } catch (const Failure&) {
        // What cannot be drawn now is drawn at the next chance.
    }
    // The background painter leaves a clip region of today's size in the context.
    SelectClipRgn(dc, nullptr);
    EndPaint(window_, &paint_info);
}

void PictureArea::turn_wheel(int delta, POINT screen) {
    wheel_rest_ += delta;
    const int notches = wheel_rest_ / WHEEL_DELTA;
    if (notches == 0) return;
    wheel_rest_ -= notches * WHEEL_DELTA;
    ScreenToClient(window_, &screen);
    const Point about{static_cast<int32_t>(screen.x), static_cast<int32_t>(screen.y)};
    change_view([&](View& view) { view.zoom_by(notches, about); });
}

void PictureArea::change_view(const std::function<void(View&)>& change) {
    change(view_);
    InvalidateRect(window_, nullptr, FALSE);
    UpdateWindow(window_);  // positions are told by what is drawn
    events_.view_changed();
    point_again();
}

void PictureArea::move_pointer(Point at) {
    TRACKMOUSEEVENT leave{sizeof(TRACKMOUSEEVENT), TME_LEAVE, window_, 0};
    if (!pointer_) TrackMouseEvent(&leave);
    const Point from = pointer_.value_or(at);
    pointer_ = at;
    if (dragging_ && from != at) {
        change_view([&](View& view) { view.drag(at.x - from.x, at.y - from.y); });
    } else {
        point_again();
    }
}

void PictureArea::point_again() {
    events_.pointed_at(pointer_ && document_ != nullptr ? image_position(*pointer_) : std::nullopt);
}

// Of the pixels that share a shrunk one, the first.
std::optional<Point> PictureArea::image_position(Point client) const {
    const HDC dc = GetDC(window_);
    POINT origin{};
    GetViewportOrgEx(dc, &origin);
    ReleaseDC(window_, dc);
    // The call rounds to the nearest; whole pixels leave it nothing to round.
    const int32_t step = std::max(view_.zoom(), 1);
    const int32_t x = rounded_down(client.x - static_cast<int32_t>(origin.x), step);
    const int32_t y = rounded_down(client.y - static_cast<int32_t>(origin.y), step);
    ZqCoordinates found{};
    if (Gen_GetImageClientPos(window_, x, y, 0, 0, &found) != 0) return std::nullopt;
    return Point{found.left, found.top};
}
