#include "platform/win32/main_window_win32.h"

#include <utility>

namespace vantorel::win32 {

namespace {

constexpr const char* kClassName = "VantorelFrmMain";
constexpr int kSwitchId = 100;
// The design layout in twips at 15 twips per pixel: client area 9120 x 4335, the switch at
// (120, 120) sized 2415 x 4095.
constexpr int kClientWidth = 9120 / 15, kClientHeight = 4335 / 15;
constexpr int kSwitchLeft = 120 / 15, kSwitchTop = 120 / 15, kSwitchWidth = 2415 / 15, kSwitchHeight = 4095 / 15;

COLORREF ToColorRef(std::uint32_t colour) {
    // A colour with the high bit set refers to a system colour by its low byte.
    if (colour & 0x80000000u) return ::GetSysColor(static_cast<int>(colour & 0xFF));
    return static_cast<COLORREF>(colour & 0x00FFFFFF);
}

}  // namespace

void StandInSwitch::Redraw() {
    if (hwnd_ != nullptr) ::InvalidateRect(hwnd_, nullptr, TRUE);
}

void StandInSwitch::Value(bool value) {
    value_ = value;
    Redraw();
}

void StandInSwitch::Caption(const std::string& caption) {
    caption_ = caption;
    if (hwnd_ != nullptr) ::SetWindowTextA(hwnd_, caption_.c_str());
    Redraw();
}

void StandInSwitch::BackColor(std::uint32_t colour) {
    backColor_ = colour;
    Redraw();
}

void StandInSwitch::BackOver(std::uint32_t colour) {
    backOver_ = colour;
    Redraw();
}

void StandInSwitch::Draw(const DRAWITEMSTRUCT& item) const {
    RECT box = item.rcItem;
    HBRUSH brush = ::CreateSolidBrush(ToColorRef(over_ ? backOver_ : backColor_));
    ::FillRect(item.hDC, &box, brush);
    ::DeleteObject(brush);
    ::DrawEdge(item.hDC, &box, (item.itemState & ODS_SELECTED) ? EDGE_SUNKEN : EDGE_RAISED, BF_RECT);
    int oldMode = ::SetBkMode(item.hDC, TRANSPARENT);
    COLORREF oldColour = ::SetTextColor(item.hDC, RGB(0, 0, 0));
    RECT text = box;
    ::DrawTextA(item.hDC, caption_.c_str(), static_cast<int>(caption_.size()), &text,
                DT_CENTER | DT_VCENTER | DT_SINGLELINE);
    ::SetTextColor(item.hDC, oldColour);
    ::SetBkMode(item.hDC, oldMode);
    if (item.itemState & ODS_FOCUS) {
        RECT focus = box;
        ::InflateRect(&focus, -4, -4);
        ::DrawFocusRect(item.hDC, &focus);
    }
}

void Win32Timer::Apply() {
    if (hwnd_ == nullptr) return;
    if (enabled_ && interval_ > 0) ::SetTimer(hwnd_, id_, interval_, nullptr);
    else ::KillTimer(hwnd_, id_);
}

void Win32Timer::Interval(std::uint32_t milliseconds) {
    interval_ = milliseconds;
    Apply();
}

void Win32Timer::Enabled(bool enabled) {
    enabled_ = enabled;
    Apply();
}

MainWindow::MainWindow() = default;

MainWindow::~MainWindow() {
    if (hwnd_ != nullptr) ::DestroyWindow(hwnd_);
}

bool MainWindow::Create(HINSTANCE instance, MainWindowHandlers handlers) {
    handlers_ = std::move(handlers);
    icon_ = ::LoadIconA(nullptr, reinterpret_cast<LPCSTR>(IDI_APPLICATION));
    WNDCLASSEXA windowClass{};
    windowClass.cbSize = sizeof windowClass;
    windowClass.lpfnWndProc = &MainWindow::WindowProc;
    windowClass.hInstance = instance;
    windowClass.hIcon = icon_;
    windowClass.hCursor = ::LoadCursorA(nullptr, reinterpret_cast<LPCSTR>(IDC_ARROW));
    windowClass.hbrBackground = reinterpret_cast<HBRUSH>(COLOR_BTNFACE + 1);
    windowClass.lpszClassName = kClassName;
    if (::RegisterClassExA(&windowClass) == 0 && ::GetLastError() != ERROR_CLASS_ALREADY_EXISTS) return false;

    constexpr DWORD kStyle = WS_OVERLAPPED | WS_CAPTION | WS_SYSMENU | WS_MINIMIZEBOX;
    RECT outer{0, 0, kClientWidth, kClientHeight};
    ::AdjustWindowRectEx(&outer, kStyle, FALSE, 0);
    HWND hwnd = ::CreateWindowExA(0, kClassName, "Vantorel", kStyle, CW_USEDEFAULT, CW_USEDEFAULT,
                                  outer.right - outer.left, outer.bottom - outer.top, nullptr, nullptr, instance, this);
    if (hwnd == nullptr) return false;

    HWND button = ::CreateWindowExA(0, "BUTTON", btnOnOff_.caption_.c_str(), WS_CHILD | WS_VISIBLE | WS_TABSTOP | BS_OWNERDRAW,
                                    kSwitchLeft, kSwitchTop, kSwitchWidth, kSwitchHeight, hwnd,
                                    reinterpret_cast<HMENU>(static_cast<INT_PTR>(kSwitchId)), instance, nullptr);
    if (button == nullptr) return false;
    btnOnOff_.hwnd_ = button;
    ::SetWindowLongPtrA(button, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(&btnOnOff_));
    btnOnOff_.buttonProc_ = reinterpret_cast<WNDPROC>(
        ::SetWindowLongPtrA(button, GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(&MainWindow::SwitchProc)));

    // Explorer announces a restart with this message; the program runs elevated, so it has to be let
    // through the window's message filter to arrive at all.
    taskbarCreated_ = ::RegisterWindowMessageA("TaskbarCreated");
    using FilterFunction = BOOL(WINAPI*)(HWND, UINT, DWORD, void*);
    if (HMODULE user32 = ::GetModuleHandleA("user32.dll")) {
        auto allow = reinterpret_cast<FilterFunction>(
            reinterpret_cast<void*>(::GetProcAddress(user32, "ChangeWindowMessageFilterEx")));
        if (allow != nullptr && taskbarCreated_ != 0) allow(hwnd, taskbarCreated_, 1 /* MSGFLT_ALLOW */, nullptr);
    }

    tmr_.hwnd_ = hwnd;
    timer_.hwnd_ = hwnd;
    tmr_.Apply();
    timer_.Apply();
    return true;
}

platform::IconHandle MainWindow::Icon() const { return reinterpret_cast<platform::IconHandle>(icon_); }

std::string MainWindow::Caption() const {
    if (hwnd_ == nullptr) return std::string();
    int length = ::GetWindowTextLengthA(hwnd_);
    std::string text(static_cast<std::size_t>(length) + 1, '\0');
    int got = ::GetWindowTextA(hwnd_, text.data(), length + 1);
    text.resize(static_cast<std::size_t>(got > 0 ? got : 0));
    return text;
}

void MainWindow::SetCaption(const std::string& caption) {
    if (hwnd_ != nullptr) ::SetWindowTextA(hwnd_, caption.c_str());
}

bool MainWindow::Visible() const { return hwnd_ != nullptr && ::IsWindowVisible(hwnd_) != FALSE; }

void MainWindow::SetVisible(bool visible) {
    if (hwnd_ != nullptr) ::ShowWindow(hwnd_, visible ? SW_SHOW : SW_HIDE);
}

platform::WindowState MainWindow::State() const {
    if (hwnd_ != nullptr && ::IsIconic(hwnd_)) return platform::WindowState::Minimized;
    if (hwnd_ != nullptr && ::IsZoomed(hwnd_)) return platform::WindowState::Maximized;
    return platform::WindowState::Normal;
}

void MainWindow::SetState(platform::WindowState state) {
    if (hwnd_ == nullptr || state == State()) return;
    switch (state) {
        case platform::WindowState::Normal: ::ShowWindow(hwnd_, SW_RESTORE); break;
        case platform::WindowState::Minimized: ::ShowWindow(hwnd_, SW_MINIMIZE); break;
        case platform::WindowState::Maximized: ::ShowWindow(hwnd_, SW_MAXIMIZE); break;
    }
}

std::int32_t MainWindow::Width() const {
    RECT r{};
    if (hwnd_ != nullptr) ::GetWindowRect(hwnd_, &r);
    return r.right - r.left;
}

std::int32_t MainWindow::Height() const {
    RECT r{};
    if (hwnd_ != nullptr) ::GetWindowRect(hwnd_, &r);
    return r.bottom - r.top;
}

void MainWindow::Move(std::int32_t left, std::int32_t top) {
    if (hwnd_ != nullptr) ::SetWindowPos(hwnd_, nullptr, left, top, 0, 0, SWP_NOSIZE | SWP_NOZORDER | SWP_NOACTIVATE);
}

LRESULT CALLBACK MainWindow::WindowProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
    MainWindow* self = nullptr;
    if (message == WM_NCCREATE) {
        self = static_cast<MainWindow*>(reinterpret_cast<CREATESTRUCTA*>(lParam)->lpCreateParams);
        self->hwnd_ = hwnd;
        ::SetWindowLongPtrA(hwnd, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(self));
    } else {
        self = reinterpret_cast<MainWindow*>(::GetWindowLongPtrA(hwnd, GWLP_USERDATA));
    }
    if (self == nullptr) return ::DefWindowProcA(hwnd, message, wParam, lParam);
    return self->HandleMessage(message, wParam, lParam);
}

LRESULT CALLBACK MainWindow::SwitchProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
    auto* button = reinterpret_cast<StandInSwitch*>(::GetWindowLongPtrA(hwnd, GWLP_USERDATA));
    if (message == WM_MOUSEMOVE && !button->over_) {
        button->over_ = true;
        TRACKMOUSEEVENT track{sizeof track, TME_LEAVE, hwnd, 0};
        ::TrackMouseEvent(&track);
        button->Redraw();
    } else if (message == WM_MOUSELEAVE) {
        button->over_ = false;
        button->Redraw();
    }
    return ::CallWindowProcA(button->buttonProc_, hwnd, message, wParam, lParam);
}

LRESULT MainWindow::HandleMessage(UINT message, WPARAM wParam, LPARAM lParam) {
    HWND hwnd = hwnd_;
    if (message == taskbarCreated_ && taskbarCreated_ != 0) {
        if (handlers_.taskbarCreated) handlers_.taskbarCreated();
        return 0;
    }
    switch (message) {
        case WM_TIMER:
            if (wParam == tmr_.id_ && handlers_.tmrTick) handlers_.tmrTick();
            else if (wParam == timer_.id_ && handlers_.timerTick) handlers_.timerTick();
            return 0;
        case WM_COMMAND:
            if (LOWORD(wParam) == kSwitchId && HIWORD(wParam) == BN_CLICKED) {
                btnOnOff_.Value(!btnOnOff_.Value());  // a two-state button flips itself
                if (handlers_.switchClick) handlers_.switchClick();
            }
            return 0;
        case WM_DRAWITEM: {
            const auto* item = reinterpret_cast<const DRAWITEMSTRUCT*>(lParam);
            if (item->CtlID == static_cast<UINT>(kSwitchId)) {
                btnOnOff_.Draw(*item);
                return TRUE;
            }
            break;
        }
        case WM_MOUSEMOVE:
            // The tray icon's notifications arrive as this message with the event code in the low
            // word: taken raw, not as a signed coordinate.
            if (handlers_.mouseMove) handlers_.mouseMove(LOWORD(lParam));
            return 0;
        case WM_CLOSE:
            ::DestroyWindow(hwnd_);
            return 0;
        case WM_DESTROY:
            if (handlers_.unload) handlers_.unload();
            ::PostQuitMessage(0);
            return 0;
        case WM_NCDESTROY:
            hwnd_ = nullptr;
            btnOnOff_.hwnd_ = nullptr;
            tmr_.hwnd_ = nullptr;
            timer_.hwnd_ = nullptr;
            break;
        default:
            break;
    }
    return ::DefWindowProcA(hwnd, message, wParam, lParam);
}

}  // namespace vantorel::win32
