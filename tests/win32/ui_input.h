// Input for tests of real windows under Wine: a pointer click through the system's input queue,
// a step run from a thread timer inside whatever message loop is running, a change of DPI as the
// system announces it, and what a window's texts need against the room their controls have.
#pragma once

#include <windows.h>

#include <functional>
#include <string>
#include <utility>

namespace vantorel::win32 {

// Presses and releases the left button over the middle of `control` through the system's input.
inline void PointerClick(HWND control) {
    RECT r;
    ::GetWindowRect(control, &r);
    const int x = (r.left + r.right) / 2, y = (r.top + r.bottom) / 2;
    const int w = ::GetSystemMetrics(SM_CXSCREEN), h = ::GetSystemMetrics(SM_CYSCREEN);
    INPUT input[3] = {};
    for (INPUT& in : input) {
        in.type = INPUT_MOUSE;
        in.mi.dx = (x * 65535 + w / 2) / (w - 1);
        in.mi.dy = (y * 65535 + h / 2) / (h - 1);
    }
    input[0].mi.dwFlags = MOUSEEVENTF_MOVE | MOUSEEVENTF_ABSOLUTE;
    input[1].mi.dwFlags = MOUSEEVENTF_LEFTDOWN | MOUSEEVENTF_ABSOLUTE;
    input[2].mi.dwFlags = MOUSEEVENTF_LEFTUP | MOUSEEVENTF_ABSOLUTE;
    ::SendInput(3, input, sizeof(INPUT));
}

// Presses and releases `vk` through the system's input, with Alt held when `alt`.
inline void Key(WORD vk, bool alt = false) {
    INPUT input[4] = {};
    WORD keys[4] = {VK_MENU, vk, vk, VK_MENU};
    int n = 0;
    for (int i = alt ? 0 : 1; i < (alt ? 4 : 3); ++i, ++n) {
        input[n].type = INPUT_KEYBOARD;
        input[n].ki.wVk = keys[i];
        input[n].ki.dwFlags = i >= 2 ? KEYEVENTF_KEYUP : 0;
    }
    ::SendInput(static_cast<UINT>(n), input, sizeof(INPUT));
}

// Runs `step` on the window thread every `ms` milliseconds while any message loop runs (the modal
// loop, a download's pumping, a message box's own loop) until it returns true.
class Ticker {
public:
    Ticker(UINT ms, std::function<bool()> step) {
        current_ = this;
        step_ = std::move(step);
        id_ = ::SetTimer(nullptr, 0, ms, &Ticker::Tick);
    }
    ~Ticker() {
        if (id_ != 0) ::KillTimer(nullptr, id_);
        current_ = nullptr;
    }

private:
    static void CALLBACK Tick(HWND, UINT, UINT_PTR, DWORD) {
        if (current_ == nullptr || current_->id_ == 0) return;
        if (current_->step_()) {
            ::KillTimer(nullptr, current_->id_);
            current_->id_ = 0;
        }
    }
    static Ticker* current_;  // one at a time
    std::function<bool()> step_;
    UINT_PTR id_ = 0;
};
inline Ticker* Ticker::current_ = nullptr;

}  // namespace vantorel::win32

namespace vantorel::win32 {

// Sends `top` what the system sends when it moves to a monitor of `dpi`: WM_DPICHANGED with the
// rectangle that gives it a client area of `clientTwips` at that DPI. Returns that rectangle.
inline RECT SendDpiChange(HWND top, UINT dpi, SIZE clientTwips) {
    RECT now;
    ::GetWindowRect(top, &now);
    const int d = static_cast<int>(dpi);
    RECT r{0, 0, ::MulDiv(clientTwips.cx, d, 1440), ::MulDiv(clientTwips.cy, d, 1440)};
    ::AdjustWindowRectEx(&r, static_cast<DWORD>(::GetWindowLongPtrA(top, GWL_STYLE)), FALSE,
                         static_cast<DWORD>(::GetWindowLongPtrA(top, GWL_EXSTYLE)));
    ::OffsetRect(&r, now.left - r.left, now.top - r.top);
    ::SendMessageA(top, WM_DPICHANGED, MAKEWPARAM(dpi, dpi), reinterpret_cast<LPARAM>(&r));
    return r;
}

// The texts of the visible standard controls under `top` that do not fit their control at `dpi`
// (measured in each control's own font): "class: text" each.
inline std::string TextsCut(HWND top, UINT dpi) {
    struct Walk {
        UINT dpi;
        std::string cut;
    } walk{dpi, {}};
    ::EnumChildWindows(
        top,
        [](HWND control, LPARAM data) -> BOOL {
            auto& w = *reinterpret_cast<Walk*>(data);
            char cls[32] = {}, text[256] = {};
            ::GetClassNameA(control, cls, sizeof cls);
            ::GetWindowTextA(control, text, sizeof text);
            if (!::IsWindowVisible(control) || text[0] == '\0') return TRUE;
            const std::string kind = cls;
            const LONG_PTR style = ::GetWindowLongPtrA(control, GWL_STYLE);
            RECT client;
            ::GetClientRect(control, &client);
            HDC dc = ::GetDC(control);
            HGDIOBJ old = ::SelectObject(dc, reinterpret_cast<HFONT>(::SendMessageA(control, WM_GETFONT, 0, 0)));
            TEXTMETRICA metrics{};
            ::GetTextMetricsA(dc, &metrics);
            const int px = static_cast<int>(w.dpi) / 96;  // one design pixel, at least
            int room = client.right, height = client.bottom;
            UINT flags = DT_CALCRECT | DT_SINGLELINE;
            if (kind == "Static" || kind == "STATIC") {
                flags = DT_CALCRECT | DT_WORDBREAK;
            } else if (kind == "Button" || kind == "BUTTON") {
                if ((style & BS_TYPEMASK) == BS_AUTOCHECKBOX) room -= ::MulDiv(13 + 6, static_cast<int>(w.dpi), 96);
                else room -= 6 * px;  // the push button's edges
            } else if (kind == "VantorelFrame") {
                room -= 2 * metrics.tmAveCharWidth + 6;
                height = metrics.tmHeight;
            } else {
                room = 0;  // not a control of known layout
            }
            RECT need{0, 0, room, 0};
            if (room > 0) ::DrawTextA(dc, text, -1, &need, flags);
            ::SelectObject(dc, old);
            ::ReleaseDC(control, dc);
            if (room > 0 && (need.right > room || need.bottom > height))
                w.cut += kind + ": " + text + " (" + std::to_string(need.right) + "x" + std::to_string(need.bottom) +
                         " in " + std::to_string(room) + "x" + std::to_string(height) + "); ";
            return TRUE;
        },
        reinterpret_cast<LPARAM>(&walk));
    return walk.cut;
}

// Where `child` lies in `relativeTo`'s client coordinates.
inline RECT ChildRect(HWND child, HWND relativeTo) {
    RECT r;
    ::GetWindowRect(child, &r);
    ::MapWindowPoints(nullptr, relativeTo, reinterpret_cast<POINT*>(&r), 2);
    return r;
}

// The height of the font `control` draws with (negative: character height).
inline LONG FontHeight(HWND control) {
    LOGFONTA font{};
    ::GetObjectA(reinterpret_cast<HFONT>(::SendMessageA(control, WM_GETFONT, 0, 0)), sizeof font, &font);
    return font.lfHeight;
}

// The width of an icon.
inline int IconWidth(HICON icon) {
    ICONINFO info{};
    if (!::GetIconInfo(icon, &info)) return 0;
    BITMAP bitmap{};
    ::GetObjectA(info.hbmColor != nullptr ? info.hbmColor : info.hbmMask, sizeof bitmap, &bitmap);
    if (info.hbmColor != nullptr) ::DeleteObject(info.hbmColor);
    ::DeleteObject(info.hbmMask);
    return bitmap.bmWidth;
}

}  // namespace vantorel::win32
