// Buttons, labels, frames and check boxes as thin wrappers over the standard Windows controls.
// Positions come in twips, as the window designs give them, and are scaled to the window's DPI
// (15 twips per pixel at 96 DPI). A frame is a small container window of its own: the controls
// placed on it are its children, so showing or hiding it shows or hides them.
//
// Clicks arrive at the parent as WM_COMMAND; the parent's window procedure (and every frame's)
// hands them to RouteCommand, which raises the wrapper's callback.
#pragma once

#include <windows.h>

#include "platform/widgets.h"

namespace vantorel::win32 {

struct TwipsRect {
    int left, top, width, height;
};

int TwipsToPixels(int twips, UINT dpi);
RECT ToPixels(const TwipsRect& rect, UINT dpi);

// The window's DPI: GetDpiForWindow where the system has it (per-monitor awareness), else the
// screen's.
UINT DpiOfWindow(HWND hwnd);

// The design font, Verdana 8.25 pt, for `dpi`. The caller owns it.
HFONT CreateDesignFont(UINT dpi);

// Moves `control` to `rect` at `dpi` and gives it `font` (a window that moved to another monitor).
void PlaceControl(HWND control, const TwipsRect& rect, UINT dpi, HFONT font);

// Registers a window class with the dialog colour and the arrow cursor, once per process.
void RegisterWindowClass(HINSTANCE instance, const char* name, WNDPROC proc);

// Alt+`key` under `top`: the shown, enabled buttons whose caption marks `key` (case-insensitive).
// One such button is focused and clicked; when several share the key, each press moves the focus
// to the next of them without clicking (Enter or Space clicks the focused one). False when no
// shown button has the key.
bool HandleAccessKey(HWND top, char key);

// Raises the click of the wrapper that sent this WM_COMMAND. True when one of ours handled it.
bool RouteCommand(WPARAM wParam, LPARAM lParam);

class Win32Button final : public platform::Button {
public:
    Win32Button(HWND parent, const std::string& caption, const TwipsRect& rect, UINT dpi, HFONT font);
    ~Win32Button() override;
    void SetCaption(const std::string& caption) override;
    std::string Caption() const override;
    void SetEnabled(bool enabled) override;
    bool Enabled() const override;
    HWND hwnd() const { return hwnd_; }
    // A BM_CLICK reaches a disabled button's notification too: the click is dropped here.
    void Clicked() {
        if (Enabled() && Click) Click();
    }

    // Back to the design rectangle at `dpi`, with `font`.
    void Relayout(UINT dpi, HFONT font) { PlaceControl(hwnd_, rect_, dpi, font); }

private:
    HWND hwnd_;
    TwipsRect rect_;
};

class Win32Label final : public platform::Label {
public:
    Win32Label(HWND parent, const std::string& caption, const TwipsRect& rect, UINT dpi, HFONT font);
    ~Win32Label() override;
    void SetCaption(const std::string& caption) override;
    std::string Caption() const override;
    HWND hwnd() const { return hwnd_; }

    // Back to the design rectangle at `dpi`, with `font`.
    void Relayout(UINT dpi, HFONT font) { PlaceControl(hwnd_, rect_, dpi, font); }

private:
    HWND hwnd_;
    TwipsRect rect_;
};

class Win32Frame final : public platform::Frame {
public:
    Win32Frame(HWND parent, const std::string& caption, const TwipsRect& rect, UINT dpi, HFONT font,
               bool visible = true);
    ~Win32Frame() override;
    void SetCaption(const std::string& caption) override;
    std::string Caption() const override;
    void SetVisible(bool visible) override;
    bool Visible() const override;
    // Controls placed on the frame are created with this as their parent.
    HWND hwnd() const { return hwnd_; }

    // Back to the design rectangle at `dpi`, with `font`.
    void Relayout(UINT dpi, HFONT font) { PlaceControl(hwnd_, rect_, dpi, font); }

private:
    HWND hwnd_;
    TwipsRect rect_;
};

class Win32CheckBox final : public platform::CheckBox {
public:
    Win32CheckBox(HWND parent, const std::string& caption, const TwipsRect& rect, UINT dpi, HFONT font);
    ~Win32CheckBox() override;
    void SetCaption(const std::string& caption) override;
    std::string Caption() const override;
    void SetValue(bool checked) override;
    bool Value() const override;
    HWND hwnd() const { return hwnd_; }
    void Clicked() {
        if (Click) Click();
    }

    // Back to the design rectangle at `dpi`, with `font`.
    void Relayout(UINT dpi, HFONT font) { PlaceControl(hwnd_, rect_, dpi, font); }

private:
    HWND hwnd_;
    TwipsRect rect_;
};

}  // namespace vantorel::win32
