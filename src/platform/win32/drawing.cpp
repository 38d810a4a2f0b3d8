// Device contexts and windows of GDI.
#include "platform/drawing.h"

#include <windows.h>

namespace zq::platform {
namespace {

struct GreyDib {
    BITMAPINFOHEADER header;
    RGBQUAD palette[256];
};
static_assert(sizeof(GreyDib) == 1064);

constexpr LONG kPixelsPerMetre = 3779;  // 96 an inch

GreyDib header_of(const Dib& dib) {
    GreyDib result{};
    result.header = {.biSize = sizeof(BITMAPINFOHEADER),
                     .biWidth = dib.width,
                     .biHeight = dib.bottom_up ? dib.height : -dib.height,
                     .biPlanes = 1,
                     .biBitCount = static_cast<WORD>(dib.bits_per_pixel),
                     .biCompression = BI_RGB,
                     .biSizeImage = 0,
                     .biXPelsPerMeter = kPixelsPerMetre,
                     .biYPelsPerMeter = kPixelsPerMetre,
                     .biClrUsed = 0,
                     .biClrImportant = 0};
    for (unsigned i = 0; i < 256; ++i) {
        const auto grey = static_cast<BYTE>(i);
        result.palette[i] = {grey, grey, grey, 0};
    }
    return result;
}

Point point_of(LONG x, LONG y) {
    return {static_cast<std::int32_t>(x), static_cast<std::int32_t>(y)};
}

bool is_nt() {
    OSVERSIONINFOA version{};
    version.dwOSVersionInfoSize = sizeof(version);
    return GetVersionExA(&version) != 0 && version.dwPlatformId == VER_PLATFORM_WIN32_NT;
}

// Asked once, when the library is loaded.
const bool kIsNt = is_nt();

class GdiContext final : public DeviceContext {
  public:
    GdiContext(HDC dc, HWND owner) : dc_(dc), owner_(owner) {}
    ~GdiContext() override {
        if (owner_ != nullptr) ReleaseDC(owner_, dc_);
    }
    GdiContext(const GdiContext&) = delete;
    GdiContext& operator=(const GdiContext&) = delete;

    Mapping mapping() override {
        SIZE window{}, viewport{};
        POINT window_origin{}, viewport_origin{};
        GetWindowExtEx(dc_, &window);
        GetViewportExtEx(dc_, &viewport);
        GetWindowOrgEx(dc_, &window_origin);
        GetViewportOrgEx(dc_, &viewport_origin);
        return {static_cast<MapMode>(GetMapMode(dc_)), point_of(window_origin.x, window_origin.y),
                point_of(viewport_origin.x, viewport_origin.y), point_of(window.cx, window.cy),
                point_of(viewport.cx, viewport.cy)};
    }
    void set_mapping(const Mapping& m) override {
        SetMapMode(dc_, static_cast<int>(m.mode));
        SetWindowOrgEx(dc_, m.window_origin.x, m.window_origin.y, nullptr);
        SetViewportOrgEx(dc_, m.viewport_origin.x, m.viewport_origin.y, nullptr);
        if (m.mode != MapMode::kAnisotropic) return;
        SetWindowExtEx(dc_, m.window_extent.x, m.window_extent.y, nullptr);
        SetViewportExtEx(dc_, m.viewport_extent.x, m.viewport_extent.y, nullptr);
    }
    Box clip_box() override {
        // In device pixels first: what the system gives in logical units may miss pixels.
        const int saved = SaveDC(dc_);
        set_mapping({});
        RECT box{};
        const bool known = GetClipBox(dc_, &box) != ERROR;
        RestoreDC(dc_, saved);
        return known ? covering(*this, box_of(box)) : Box{0, 0, 0, 0};
    }
    Box to_logical(const Box& device) override {
        RECT box = rect_of(device);
        DPtoLP(dc_, reinterpret_cast<POINT*>(&box), 2);
        return box_of(box);
    }
    Box to_device(const Box& logical) override {
        RECT box = rect_of(logical);
        LPtoDP(dc_, reinterpret_cast<POINT*>(&box), 2);
        return box_of(box);
    }
    void exclude_clip(const Box& device) override { combine_clip(device, RGN_DIFF); }
    void include_clip(const Box& device) override { combine_clip(device, RGN_OR); }
    void set_stretching() override {
        SetStretchBltMode(dc_, COLORONCOLOR);
        SetBrushOrgEx(dc_, 0, 0, nullptr);
    }
    void stretch(const Dib& dib, const Box& source, const Box& destination) override {
        // The source is told as a bitmap of its own: from which end the system counts rows inside
        // of one depends on too much.
        Dib rows = dib;
        rows.bits += static_cast<std::size_t>(source.top) * dib.stride();
        rows.height = static_cast<std::int32_t>(source.height());
        const GreyDib header = header_of(rows);
        StretchDIBits(dc_, destination.left, destination.top, static_cast<int>(destination.width()),
                      static_cast<int>(destination.height()), source.left, 0,
                      static_cast<int>(source.width()), rows.height, rows.bits,
                      reinterpret_cast<const BITMAPINFO*>(&header), DIB_RGB_COLORS, SRCCOPY);
    }
    bool fill(const Box& device, const Brush& brush) override;
    std::uint32_t button_face() override { return GetSysColor(COLOR_BTNFACE); }

  private:
    static RECT rect_of(const Box& box) { return {box.left, box.top, box.right, box.bottom}; }
    static Box box_of(const RECT& rect) {
        return {static_cast<std::int32_t>(rect.left), static_cast<std::int32_t>(rect.top),
                static_cast<std::int32_t>(rect.right), static_cast<std::int32_t>(rect.bottom)};
    }
    void combine_clip(const Box& device, int mode) {
        HRGN region = CreateRectRgn(device.left, device.top, device.right, device.bottom);
        // Without a clip region of its own the context is clipped by what is visible: make it one.
        HRGN present = CreateRectRgn(0, 0, 0, 0);
        if (mode == RGN_DIFF || GetClipRgn(dc_, present) == 1) ExtSelectClipRgn(dc_, region, mode);
        DeleteObject(present);
        DeleteObject(region);
    }

    HDC dc_;
    HWND owner_;  // null: the context is the caller's
};

bool GdiContext::fill(const Box& device, const Brush& brush) {
    LOGBRUSH description{BS_SOLID, brush.colour, 0};
    HBITMAP bitmap = nullptr;
    if (brush.kind == Brush::Kind::kNone) {
        description.lbStyle = BS_NULL;
    } else if (brush.kind == Brush::Kind::kUnknown) {
        description.lbStyle = BS_INDEXED;  // which no system makes
    } else if (brush.kind == Brush::Kind::kHatch) {
        description = {BS_HATCHED, brush.colour, static_cast<ULONG_PTR>(brush.hatch)};
    } else if (brush.kind == Brush::Kind::kPattern) {
        WORD rows[8];  // two bytes a row
        for (std::size_t i = 0; i < 8; ++i) rows[i] = brush.pattern[i];
        bitmap = CreateBitmap(8, 8, 1, 1, rows);
        description = {BS_PATTERN, 0, reinterpret_cast<ULONG_PTR>(bitmap)};
    }
    SetTextColor(dc_, brush.text_colour);
    SetBkColor(dc_, brush.background_colour);
    HBRUSH made = CreateBrushIndirect(&description);
    SetBrushOrgEx(dc_, device.left, device.top, nullptr);
    if (made != nullptr) {
        const RECT rect = rect_of(device);
        FillRect(dc_, &rect, made);
        DeleteObject(made);
    }
    if (bitmap != nullptr) DeleteObject(bitmap);
    return made != nullptr;
}

}  // namespace

std::unique_ptr<DeviceContext> wrap_device_context(void* dc) {
    return dc == nullptr ? nullptr : std::make_unique<GdiContext>(static_cast<HDC>(dc), nullptr);
}

std::unique_ptr<DeviceContext> window_device_context(void* window) {
    if (window == nullptr) return nullptr;  // null would be the whole screen
    HDC dc = GetDC(static_cast<HWND>(window));
    if (dc == nullptr) return nullptr;
    return std::make_unique<GdiContext>(dc, static_cast<HWND>(window));
}

Box client_box(void* window) {
    RECT rect{};
    if (window == nullptr || GetClientRect(static_cast<HWND>(window), &rect) == 0) {
        return {0, 0, 0, 0};
    }
    return {0, 0, static_cast<std::int32_t>(rect.right), static_cast<std::int32_t>(rect.bottom)};
}

bool can_display_large_bitmaps() {
    return kIsNt;
}

}  // namespace zq::platform
