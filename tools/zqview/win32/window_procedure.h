// Windows whose messages an object handles: T::adopt(HWND) is called when the window is made with
// the object as its creation parameter, T::handle(message, wide, word) for all that follows. The
// object must outlive the window.
#ifndef ZQVIEW_WINDOW_PROCEDURE_H
#define ZQVIEW_WINDOW_PROCEDURE_H

#include <windows.h>

template <class T>
LRESULT CALLBACK window_procedure(HWND window, UINT message, WPARAM wide, LPARAM word) {
    if (message == WM_NCCREATE) {
        const auto* made = reinterpret_cast<const CREATESTRUCTA*>(word);
        static_cast<T*>(made->lpCreateParams)->adopt(window);
        SetWindowLongPtrA(window, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(made->lpCreateParams));
    }
    auto* object = reinterpret_cast<T*>(GetWindowLongPtrA(window, GWLP_USERDATA));
    try {
        if (object != nullptr) return object->handle(message, wide, word);
    } catch (...) {
        // The system cannot be thrown through: what failed for want of memory has no effect.
        if (message == WM_CREATE) return -1;
    }
    return DefWindowProcA(window, message, wide, word);
}

// A second time fails, harmlessly.
template <class T>
void register_window_class(const char* name, UINT style, const void* cursor) {
    WNDCLASSA description{};
    description.style = style;
    description.lpfnWndProc = &window_procedure<T>;
    description.hInstance = GetModuleHandleA(nullptr);
    description.hCursor = LoadCursorA(nullptr, static_cast<LPCSTR>(cursor));
    description.lpszClassName = name;
    RegisterClassA(&description);
}

#endif
