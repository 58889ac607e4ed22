// Owners for the GDI objects the button's drawing creates, and a guard that selects an object into
// a device context and puts the previous one back. Declare the object before its selection guard,
// so it is deselected before it is deleted.
#pragma once

#include <windows.h>

#include "platform/win32/unique_handle.h"

namespace vantorel::win32 {

inline void DeleteGdiObject(HGDIOBJ object) { ::DeleteObject(object); }

using UniqueHbrush = UniqueHandle<NullInvalid<HBRUSH, DeleteGdiObject>>;
using UniqueHpen = UniqueHandle<NullInvalid<HPEN, DeleteGdiObject>>;
using UniqueHfont = UniqueHandle<NullInvalid<HFONT, DeleteGdiObject>>;
using UniqueHbitmap = UniqueHandle<NullInvalid<HBITMAP, DeleteGdiObject>>;
using UniqueHrgn = UniqueHandle<NullInvalid<HRGN, DeleteGdiObject>>;
using UniqueHdc = UniqueHandle<NullInvalid<HDC, ::DeleteDC>>;
using UniqueHicon = UniqueHandle<NullInvalid<HICON, ::DestroyIcon>>;

// A device-independent RGB bitmap of `width` x `height` pixels at 24 or 32 bits a pixel; a negative
// height makes it top-down. `bits` receives the pixels. The caller owns the bitmap.
inline HBITMAP CreateDib(HDC dc, int width, int height, WORD bitsPerPixel, void** bits) {
    BITMAPINFO info{};
    info.bmiHeader.biSize = sizeof(BITMAPINFOHEADER);
    info.bmiHeader.biWidth = width;
    info.bmiHeader.biHeight = height;
    info.bmiHeader.biPlanes = 1;
    info.bmiHeader.biBitCount = bitsPerPixel;
    info.bmiHeader.biCompression = BI_RGB;
    return ::CreateDIBSection(dc, &info, DIB_RGB_COLORS, bits, nullptr, 0);
}

class SelectGuard {
public:
    SelectGuard(HDC dc, HGDIOBJ object) : dc_(dc), previous_(object ? ::SelectObject(dc, object) : nullptr) {}
    SelectGuard(const SelectGuard&) = delete;
    SelectGuard& operator=(const SelectGuard&) = delete;
    ~SelectGuard() {
        if (previous_) ::SelectObject(dc_, previous_);
    }

private:
    HDC dc_;
    HGDIOBJ previous_;
};

// A screen DC obtained with GetDC and released on scope exit.
class WindowDc {
public:
    explicit WindowDc(HWND hwnd) : hwnd_(hwnd), dc_(::GetDC(hwnd)) {}
    WindowDc(const WindowDc&) = delete;
    WindowDc& operator=(const WindowDc&) = delete;
    ~WindowDc() {
        if (dc_) ::ReleaseDC(hwnd_, dc_);
    }
    HDC get() const { return dc_; }

private:
    HWND hwnd_;
    HDC dc_;
};

// The screen's DPI along `axis` (LOGPIXELSX or LOGPIXELSY), as pictures, fonts and twips are measured
// against it; 96 without a screen.
inline int ScreenDpi(int axis = LOGPIXELSY) {
    WindowDc screen(nullptr);
    const int dpi = screen.get() ? ::GetDeviceCaps(screen.get(), axis) : 0;
    return dpi > 0 ? dpi : 96;
}

// BeginPaint on construction, EndPaint on scope exit: a WM_PAINT handler's device context.
class PaintGuard {
public:
    explicit PaintGuard(HWND hwnd) : hwnd_(hwnd), dc_(::BeginPaint(hwnd, &paint_)) {}
    PaintGuard(const PaintGuard&) = delete;
    PaintGuard& operator=(const PaintGuard&) = delete;
    ~PaintGuard() { ::EndPaint(hwnd_, &paint_); }
    HDC dc() const { return dc_; }
    const RECT& area() const { return paint_.rcPaint; }

private:
    HWND hwnd_;
    PAINTSTRUCT paint_{};
    HDC dc_;
};

}  // namespace vantorel::win32
