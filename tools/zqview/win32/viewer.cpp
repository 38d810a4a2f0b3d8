// Window, title, status line and keys.
#include "viewer.h"

#include <commctrl.h>
#include <commdlg.h>
#include <windowsx.h>
#include <zqvissvc/errors.h>

#include <array>
#include <climits>
#include <new>

#include "failure.h"
#include "folder.h"
#include "window_procedure.h"

namespace {

constexpr char kClass[] = "ZqView";
constexpr char kName[] = "zqview";
constexpr char kHint[] = "Open a file with Ctrl+O, or drop one here";
constexpr int kWidth = 1024, kHeight = 768;
constexpr int kToTheEnd = INT_MAX / 2;

}  // namespace

Viewer::Viewer() {
    register_window_class<Viewer>(kClass, 0, IDC_ARROW);
    window_ = CreateWindowExA(WS_EX_ACCEPTFILES, kClass, kName, WS_OVERLAPPEDWINDOW, CW_USEDEFAULT,
                              CW_USEDEFAULT, kWidth, kHeight, nullptr, nullptr,
                              GetModuleHandleA(nullptr), this);
    ShowWindow(window_, SW_SHOWDEFAULT);
}

LRESULT Viewer::handle(UINT message, WPARAM wide, LPARAM word) {
    switch (message) {
        case WM_CREATE:
            create_parts();
            return 0;
        case WM_SIZE:
            if (wide != SIZE_MINIMIZED) arrange();
            return 0;
        case WM_KEYDOWN:
            if (press(wide)) return 0;
            break;
        case WM_MOUSEWHEEL:
            area_->turn_wheel(GET_WHEEL_DELTA_WPARAM(wide),
                              {GET_X_LPARAM(word), GET_Y_LPARAM(word)});
            return 0;
        case WM_DROPFILES:
            take_dropped(reinterpret_cast<HDROP>(wide));
            return 0;
        case WM_DESTROY:
            PostQuitMessage(0);
            return 0;
        default:
            break;
    }
    return DefWindowProcA(window_, message, wide, word);
}

void Viewer::create_parts() {
    status_ = CreateWindowExA(0, STATUSCLASSNAMEA, kHint, WS_CHILD | WS_VISIBLE | SBARS_SIZEGRIP, 0,
                              0, 0, 0, window_, nullptr, GetModuleHandleA(nullptr), nullptr);
    area_ = std::make_unique<PictureArea>(
        window_, PictureArea::Events{[this] { show_title(); },
                                     [this](std::optional<Point> pixel) { show_status(pixel); }});
}

void Viewer::arrange() {
    SendMessageA(status_, WM_SIZE, 0, 0);  // it finds its own place
    RECT client{}, line{};
    GetClientRect(window_, &client);
    GetWindowRect(status_, &line);
    const LONG height = client.bottom - (line.bottom - line.top);
    area_->place(static_cast<int>(client.right), static_cast<int>(height > 0 ? height : 0));
}

void Viewer::open(const std::string& path) {
    std::unique_ptr<Document> opened;
    failure_.clear();
    try {
        opened = std::make_unique<Document>(path);
    } catch (const Failure& failure) {
        failure_ = message_of(failure.code());
    } catch (const std::bad_alloc&) {
        failure_ = message_of(ZQ_ERR_NOT_ENOUGH_MEMORY);
    }
    path_ = path;
    document_.swap(opened);  // the area may use the one before until it is told
    area_->show(document_.get());
}

void Viewer::show_title() {
    std::string title = kName;
    if (document_ != nullptr) {
        title = document_->description() + " - " + area_->view().zoom_text() + " - " + kName;
    } else if (!path_.empty()) {
        title = name_of(path_) + " - " + kName;
    }
    SetWindowTextA(window_, title.c_str());
}

void Viewer::show_status(std::optional<Point> pixel) {
    std::string text = path_.empty() ? kHint : failure_;
    if (pixel && document_ != nullptr) text = document_->value_at(*pixel);
    SendMessageA(status_, SB_SETTEXTA, 0, reinterpret_cast<LPARAM>(text.c_str()));
}

bool Viewer::press(WPARAM key) {
    const auto walk = [this](int steps) {
        if (!path_.empty()) open(neighbour(path_, steps));
    };
    const auto zoom = [this](auto change) {
        area_->change_view([&](View& view) { change(view); });
    };
    const bool control = GetKeyState(VK_CONTROL) < 0;
    switch (key) {
        case VK_LEFT:
        case VK_UP:
            walk(-1);
            return true;
        case VK_RIGHT:
        case VK_DOWN:
            walk(1);
            return true;
        case VK_HOME:
            walk(-kToTheEnd);
            return true;
        case VK_END:
            walk(kToTheEnd);
            return true;
        case VK_OEM_PLUS:
        case VK_ADD:
            zoom([](View& view) { view.zoom_by(1, view.centre()); });
            return true;
        case VK_OEM_MINUS:
        case VK_SUBTRACT:
            zoom([](View& view) { view.zoom_by(-1, view.centre()); });
            return true;
        case '1':
            zoom([](View& view) { view.zoom_to(1, view.centre()); });
            return true;
        case 'F':
            zoom([](View& view) { view.fit(); });
            return true;
        case VK_F5:
            walk(0);
            return true;
        case 'O':
            if (control) ask_for_file();
            return control;
        case VK_ESCAPE:
            DestroyWindow(window_);
            return true;
        default:
            return false;
    }
}

void Viewer::ask_for_file() {
    constexpr char kFilter[] =
        "Images\0*.png;*.aipd;*.apd;*.tif;*.tiff;*.bmp;*.jpg;*.jpeg;*.jp2;*.j2k;*.j2c;*.jpc\0"
        "All files\0*.*\0";
    std::array<char, 4 * MAX_PATH> path{};
    OPENFILENAMEA question{};
    question.lStructSize = sizeof(question);
    question.hwndOwner = window_;
    question.lpstrFilter = kFilter;
    question.lpstrFile = path.data();
    question.nMaxFile = static_cast<DWORD>(path.size());
    question.Flags = OFN_FILEMUSTEXIST | OFN_HIDEREADONLY;
    if (GetOpenFileNameA(&question) != 0) open(path.data());
}

void Viewer::take_dropped(HDROP drop) {
    std::string path(DragQueryFileA(drop, 0, nullptr, 0), '\0');
    DragQueryFileA(drop, 0, path.data(), static_cast<UINT>(path.size()) + 1);
    DragFinish(drop);
    if (!path.empty()) open(path);
}

int Viewer::run() {
    MSG message{};
    while (GetMessageA(&message, nullptr, 0, 0) > 0) {
        TranslateMessage(&message);
        DispatchMessageA(&message);
    }
    return static_cast<int>(message.wParam);
}
