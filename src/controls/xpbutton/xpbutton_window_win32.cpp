#include "controls/xpbutton/xpbutton_window_win32.h"

#include <windowsx.h>

#include <vector>

#include "platform/win32/gdi_picture.h"

namespace vantorel::win32 {

namespace {
constexpr UINT_PTR kOverTimerId = 1;

// The platform's pointer-shape numbers, 1 to 15.
LPCSTR CursorOf(std::int32_t shape) {
    switch (shape) {
        case 1: return IDC_ARROW;
        case 2: return IDC_CROSS;
        case 3: return IDC_IBEAM;
        case 4: return IDC_ARROW;
        case 5: return IDC_SIZEALL;
        case 6: return IDC_SIZENESW;
        case 7: return IDC_SIZENS;
        case 8: return IDC_SIZENWSE;
        case 9: return IDC_SIZEWE;
        case 10: return IDC_UPARROW;
        case 11: return IDC_WAIT;
        case 12: return IDC_NO;
        case 13: return IDC_APPSTARTING;
        case 14: return IDC_HELP;
        case 15: return IDC_SIZEALL;
        default: return nullptr;
    }
}
}  // namespace

XPButtonWindow::XPButtonWindow() : button_(std::make_unique<xpbutton::KirelXPButton>(*this, canvas_)) {}

XPButtonWindow::~XPButtonWindow() { Destroy(); }

bool XPButtonWindow::RegisterWindowClass(HINSTANCE instance) {
    WNDCLASSEXA wc{};
    if (::GetClassInfoExA(instance, kClassName, &wc)) return true;
    wc = {};
    wc.cbSize = sizeof wc;
    wc.style = CS_DBLCLKS;
    wc.lpfnWndProc = WindowProc;
    wc.hInstance = instance;
    wc.hCursor = ::LoadCursorA(nullptr, IDC_ARROW);
    wc.lpszClassName = kClassName;
    return ::RegisterClassExA(&wc) != 0;
}

bool XPButtonWindow::Create(HWND parent, int id, int x, int y, int w, int h, const std::string& name,
                            const xpbutton::PropertyBag* store) {
    HINSTANCE instance = ::GetModuleHandleA(nullptr);
    if (!RegisterWindowClass(instance)) return false;
    parent_ = parent;
    name_ = name;
    hwnd_ = ::CreateWindowExA(0, kClassName, name.c_str(), WS_CHILD | WS_TABSTOP | WS_CLIPSIBLINGS, x, y, w, h, parent,
                              reinterpret_cast<HMENU>(static_cast<INT_PTR>(id)), instance, this);
    if (!hwnd_) return false;
    canvas_.SetWindow(hwnd_);
    if (store) {
        button_->ReadProperties(*store);
    } else {
        button_->InitNewControl();
    }
    button_->OnResize();
    return true;
}

void XPButtonWindow::Show() {
    if (hwnd_) ::ShowWindow(hwnd_, SW_SHOWNA);
}

void XPButtonWindow::Hide() {
    if (hwnd_) ::ShowWindow(hwnd_, SW_HIDE);
}

void XPButtonWindow::Destroy() {
    if (hwnd_) ::DestroyWindow(hwnd_);
    hwnd_ = nullptr;
}

void XPButtonWindow::SetDefault(bool isDefault) {
    default_ = isDefault;
    button_->Paint(button_->lastState(), true);
}

std::int16_t XPButtonWindow::ShiftState() {
    std::int16_t shift = 0;
    if (::GetKeyState(VK_SHIFT) < 0) shift |= 1;
    if (::GetKeyState(VK_CONTROL) < 0) shift |= 2;
    if (::GetKeyState(VK_MENU) < 0) shift |= 4;
    return shift;
}

LRESULT XPButtonWindow::HandleMessage(UINT message, WPARAM wParam, LPARAM lParam) {
    const auto x = static_cast<float>(GET_X_LPARAM(lParam));
    const auto y = static_cast<float>(GET_Y_LPARAM(lParam));
    auto held = [wParam]() {
        std::int16_t b = 0;
        if (wParam & MK_LBUTTON) b |= 1;
        if (wParam & MK_RBUTTON) b |= 2;
        if (wParam & MK_MBUTTON) b |= 4;
        return b;
    };
    switch (message) {
        case WM_PAINT: {
            PaintGuard paint(hwnd_);
            if (paint.dc()) canvas_.PaintTo(paint.dc());
            return 0;
        }
        case WM_ERASEBKGND: return 1;
        case WM_SIZE: button_->OnResize(); return 0;
        case WM_SHOWWINDOW:
            if (wParam) {
                button_->OnShow();
            } else {
                button_->OnHide();
            }
            return 0;
        case WM_LBUTTONDOWN:
        case WM_RBUTTONDOWN:
        case WM_MBUTTONDOWN:
        case WM_RBUTTONDBLCLK:  // a quick second right or middle press is a press like any other
        case WM_MBUTTONDBLCLK: {
            const std::int16_t b = message == WM_LBUTTONDOWN                                  ? 1
                                   : message == WM_RBUTTONDOWN || message == WM_RBUTTONDBLCLK ? 2
                                                                                              : 4;
            if (b == 1 && ::GetFocus() != hwnd_) ::SetFocus(hwnd_);
            ::SetCapture(hwnd_);
            if (b == 1) leftPressed_ = true;
            button_->OnMouseDown(b, ShiftState(), x, y);
            return 0;
        }
        case WM_LBUTTONDBLCLK:
            doubleClicked_ = true;
            button_->OnDoubleClick();
            return 0;
        case WM_CAPTURECHANGED:
            // Another window took the mouse in the middle of a press: its release is no click.
            if (reinterpret_cast<HWND>(lParam) != hwnd_) leftPressed_ = false;
            return 0;
        case WM_MOUSEMOVE: button_->OnMouseMove(held(), ShiftState(), x, y); return 0;
        case WM_LBUTTONUP:
        case WM_RBUTTONUP:
        case WM_MBUTTONUP: {
            const std::int16_t b = message == WM_LBUTTONUP ? 1 : message == WM_RBUTTONUP ? 2 : 4;
            const bool captured = ::GetCapture() == hwnd_;
            // A click needs the left press on this control, the mouse held by it since then.
            const bool pressedHere = b == 1 && leftPressed_ && captured;
            if (b == 1) leftPressed_ = false;
            if (captured) ::ReleaseCapture();
            RECT client;
            ::GetClientRect(hwnd_, &client);
            POINT at{GET_X_LPARAM(lParam), GET_Y_LPARAM(lParam)};
            const bool inside = ::PtInRect(&client, at) != FALSE;
            button_->OnMouseUp(b, ShiftState(), x, y);
            // The click after a press and release on the control; the release that ends a double
            // click raises none.
            if (pressedHere && inside && !doubleClicked_ && hwnd_) button_->OnClick();
            if (b == 1) doubleClicked_ = false;
            return 0;
        }
        case WM_GETDLGCODE:
            // DLGC_BUTTON lets IsDialogMessage send BM_CLICK for the access key in the window text.
            return DLGC_WANTARROWS | DLGC_BUTTON | (default_ ? DLGC_DEFPUSHBUTTON : DLGC_UNDEFPUSHBUTTON);
        case WM_KEYDOWN: button_->OnKeyDown(static_cast<std::int16_t>(wParam), ShiftState()); return 0;
        case WM_KEYUP: button_->OnKeyUp(static_cast<std::int16_t>(wParam), ShiftState()); return 0;
        case WM_SYSKEYDOWN:
        case WM_SYSKEYUP: {
            // Keys pressed with Alt: the Alt bit from the message itself (posted keys leave the
            // keyboard state alone); then the system's own handling (Alt+F4, Alt+Space, F10).
            std::int16_t shift = ShiftState();
            if (lParam & (1 << 29)) shift |= 4;
            if (message == WM_SYSKEYDOWN) button_->OnKeyDown(static_cast<std::int16_t>(wParam), shift);
            else button_->OnKeyUp(static_cast<std::int16_t>(wParam), shift);
            break;
        }
        case WM_CHAR: button_->OnKeyPress(static_cast<std::int16_t>(wParam)); return 0;
        case BM_CLICK: button_->OnAccessKey(); return 0;  // the caption's access key (IsDialogMessage)
        case WM_SETFOCUS: button_->OnGotFocus(); return 0;
        case WM_KILLFOCUS: button_->OnLostFocus(); return 0;
        case WM_TIMER:
            if (wParam == kOverTimerId) button_->OnOverTimer();
            return 0;
        case WM_SYSCOLORCHANGE:
        case WM_SETTINGCHANGE: button_->OnAmbientChanged(); return 0;
        case WM_SETCURSOR:
            if (pointer_ == 99 && mouseIcon_) {
                if (auto* picture = dynamic_cast<const GdiPicture*>(mouseIcon_.get()); picture && picture->icon()) {
                    ::SetCursor(picture->icon());
                    return TRUE;
                }
            } else if (LPCSTR cursor = CursorOf(pointer_)) {
                ::SetCursor(::LoadCursorA(nullptr, cursor));
                return TRUE;
            }
            break;
        case WM_GETFONT: return reinterpret_cast<LRESULT>(font_.get());
        case WM_DESTROY: button_->OnTerminate(); return 0;
        default: break;
    }
    return ::DefWindowProcA(hwnd_, message, wParam, lParam);
}

platform::Box XPButtonWindow::ClientRect() const {
    RECT r{};
    if (hwnd_) ::GetClientRect(hwnd_, &r);
    return {r.left, r.top, r.right, r.bottom};
}

void XPButtonWindow::SetEnabled(bool enabled) {
    if (hwnd_) ::EnableWindow(hwnd_, enabled);
}

void XPButtonWindow::SetFont(const platform::FontDesc& font) { font_ = MakeFont(font, static_cast<int>(dpi_)); }

void XPButtonWindow::SetDpi(UINT dpi) {
    dpi_ = dpi;
    canvas_.SetDpi(static_cast<int>(dpi));
    font_ = MakeFont(button_->Font(), static_cast<int>(dpi));
    if (hwnd_) button_->Refresh();
}

bool XPButtonWindow::SetMouseIcon(const platform::PicturePtr& picture) {
    if (picture && !dynamic_cast<const GdiPicture*>(picture.get())) return false;
    mouseIcon_ = picture;
    return true;
}

void XPButtonWindow::SetShape(const platform::WindowShape& shape) {
    if (!hwnd_) return;
    UniqueHrgn region(shape.ellipse ? ::CreateEllipticRgn(0, 0, shape.width + 1, shape.height + 1)
                                    : ::CreateRectRgn(0, 0, shape.width, shape.height));
    if (!region) return;
    for (const auto& [px, py] : shape.removed) {
        UniqueHrgn pixel(::CreateRectRgn(px, py, px + 1, py + 1));
        if (pixel) ::CombineRgn(region.get(), region.get(), pixel.get(), RGN_DIFF);
    }
    // The window owns the region from here and releases the one it replaces.
    if (::SetWindowRgn(hwnd_, region.get(), TRUE)) region.release();
}

void XPButtonWindow::ReleaseShape() {
    // The old region belongs to the window and is released by SetWindowRgn or window destruction.
}

bool XPButtonWindow::PointerOverSelf() const {
    POINT p;
    if (!hwnd_ || !::GetCursorPos(&p)) return false;
    return ::WindowFromPoint(p) == hwnd_;
}

void XPButtonWindow::StartOverTimer(std::int32_t milliseconds) {
    if (hwnd_) ::SetTimer(hwnd_, kOverTimerId, static_cast<UINT>(milliseconds), nullptr);
}

void XPButtonWindow::StopOverTimer() {
    if (hwnd_) ::KillTimer(hwnd_, kOverTimerId);
}

void XPButtonWindow::SendKeys(const std::string& keys) {
    const bool withShift = !keys.empty() && keys[0] == '+';
    std::vector<INPUT> inputs;
    auto key = [&inputs](WORD vk, bool up) {
        INPUT in{};
        in.type = INPUT_KEYBOARD;
        in.ki.wVk = vk;
        in.ki.dwFlags = up ? KEYEVENTF_KEYUP : 0;
        inputs.push_back(in);
    };
    if (withShift) key(VK_SHIFT, false);
    key(VK_TAB, false);
    key(VK_TAB, true);
    if (withShift) key(VK_SHIFT, true);
    ::SendInput(static_cast<UINT>(inputs.size()), inputs.data(), sizeof(INPUT));
}

void XPButtonWindow::CaptureMouse() {
    if (hwnd_) ::SetCapture(hwnd_);
}

void XPButtonWindow::Present() {
    if (hwnd_) ::UpdateWindow(hwnd_);
}

void XPButtonWindow::SetAccessKey(char key) {
    // IsDialogMessage finds the access key in the window text by the system's rule, which skips
    // every doubled "&&"; the control skips only the first, so where the two differ the control
    // has no key ("A&&B &&C &D"). The window text is then the caption with every "&" doubled: it
    // still reads as the caption, and the dialog finds no key in it either.
    if (!hwnd_) return;
    std::string text;
    for (char c : button_->Caption()) {
        text += c;
        if (key == 0 && c == '&') text += '&';
    }
    ::SetWindowTextA(hwnd_, text.c_str());
}

std::int32_t XPButtonWindow::ScreenDpi() const { return win32::ScreenDpi(LOGPIXELSX); }

void XPButtonWindow::PropertyChanged(const std::string& key) {
    if (onPropertyChanged) onPropertyChanged(key);
}

platform::Rgb XPButtonWindow::ParentBackColour() const {
    WindowDc dc(parent_);
    return dc.get() ? static_cast<platform::Rgb>(::GetBkColor(dc.get())) : 0xFFFFFF;
}

platform::Rgb XPButtonWindow::ParentTextColour() const {
    WindowDc dc(parent_);
    return dc.get() ? static_cast<platform::Rgb>(::GetTextColor(dc.get())) : 0;
}

bool XPButtonWindow::CaptureParentPixels(std::int32_t w, std::int32_t h, std::vector<std::uint8_t>& pixels) {
    if (!hwnd_ || !parent_ || w <= 0 || h <= 0) return false;
    RECT r;
    ::GetWindowRect(hwnd_, &r);
    POINT at{r.left, r.top};
    ::ScreenToClient(parent_, &at);
    // Step out of the parent's way and let it repaint there.
    ::SetWindowPos(hwnd_, nullptr, 0, 0, r.right - r.left, 0, SWP_NOMOVE | SWP_NOZORDER | SWP_NOACTIVATE);
    ::RedrawWindow(parent_, nullptr, nullptr, RDW_INVALIDATE | RDW_UPDATENOW | RDW_ALLCHILDREN);
    MSG msg;
    while (::PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) {
        if (msg.message == WM_QUIT) {
            // Leave the quit request for the application's own loop.
            ::PostQuitMessage(static_cast<int>(msg.wParam));
            break;
        }
        ::TranslateMessage(&msg);
        ::DispatchMessageA(&msg);
    }
    if (!hwnd_) return false;  // destroyed while the messages ran
    bool copied = false;
    {
        WindowDc parentDc(parent_);
        UniqueHdc memory(::CreateCompatibleDC(parentDc.get()));
        void* bits = nullptr;
        UniqueHbitmap copy(memory ? CreateDib(memory.get(), w, h, 24, &bits) : nullptr);
        if (parentDc.get() && copy) {
            SelectGuard select(memory.get(), copy.get());
            if (::BitBlt(memory.get(), 0, 0, w, h, parentDc.get(), at.x, at.y, SRCCOPY)) {
                ::GdiFlush();
                const auto* begin = static_cast<const std::uint8_t*>(bits);
                pixels.assign(begin, begin + static_cast<std::size_t>(platform::DibStride(w)) * h);
                copied = true;
            }
        }
    }
    if (hwnd_) {
        ::SetWindowPos(hwnd_, nullptr, 0, 0, r.right - r.left, h, SWP_NOMOVE | SWP_NOZORDER | SWP_NOACTIVATE);
    }
    return copied;
}

platform::Rgb XPButtonWindow::SystemColour(int index) const { return static_cast<platform::Rgb>(::GetSysColor(index)); }

}  // namespace vantorel::win32
