#include "app/main_window.h"

#include <algorithm>
#include <utility>

#include "platform/win32/resource_ids.h"

namespace vantorel::win32 {

namespace {

constexpr const char* kClassName = "VantorelFrmMain";
constexpr int kSwitchId = 100;
constexpr DWORD kStyle = WS_OVERLAPPED | WS_CAPTION | WS_SYSMENU | WS_MINIMIZEBOX;

// The design, in twips; panel contents relative to their panel.
constexpr TwipsRect kBtnOnOffRect{120, 120, 2415, 4095};
constexpr TwipsRect kUfRects[2] = {{2640, 1920, 6375, 1695}, {2640, 120, 6375, 1695}};  // "Update", "Options"
constexpr const char* kUfCaptions[2] = {"Update", "Options"};
// The panels' texts use the room their panel has (two lines down to the button), so that they are
// shown whole at every DPI and font.
constexpr TwipsRect kLRects[2] = {{480, 360, 5775, 540}, {480, 360, 5775, 540}};
constexpr const char* kLCaptions[2] = {"Selectable options such as starting when windows boots...",
                                       "Check for Vantorel updates..."};
constexpr TwipsRect kPanelButtonRect{2400, 960, 3855, 495};
constexpr TwipsRect kRowRects[3] = {{2640, 3720, 2055, 495}, {4800, 3720, 2055, 495}, {6960, 3720, 2055, 495}};
constexpr const char* kBtnOCaptions[5] = {"&Tray", "&Exit", "&Help", "&Updates", "&Options"};

HICON LoadIconSized(HINSTANCE instance, int id, int size) {
    return static_cast<HICON>(::LoadImageA(instance, MAKEINTRESOURCEA(id), IMAGE_ICON, size, size, LR_DEFAULTCOLOR));
}

// A system metric at `dpi`: GetSystemMetricsForDpi where the system has it, else scaled.
int MetricForDpi(int index, UINT dpi) {
    using ForDpiFunction = int(WINAPI*)(int, UINT);
    if (HMODULE user32 = ::GetModuleHandleA("user32.dll")) {
        auto get = reinterpret_cast<ForDpiFunction>(
            reinterpret_cast<void*>(::GetProcAddress(user32, "GetSystemMetricsForDpi")));
        if (get != nullptr) return get(index, dpi);
    }
    return ::MulDiv(::GetSystemMetrics(index), static_cast<int>(dpi), 96);
}

}  // namespace

xpbutton::PropertyBag BtnOnOffDesign() {
    xpbutton::PropertyBag design;
    design.Write("BTYPE", std::int32_t{3});  // the rounded XP look with a gradient face
    design.Write("TX", std::string("OFF"));
    design.Write("FONT", platform::FontDesc{"Verdana", 14.25, true, false, false, false});
    design.Write("COLTYPE", std::int32_t{2});  // colours from BackColor
    design.Write("FOCUSR", true);
    design.Write("BCOL", std::int32_t{0x0000C0});
    design.Write("BCOLO", std::int32_t{0x0000C0});
    design.Write("FCOL", std::int32_t{0xFFFFFF});
    design.Write("FCOLO", std::int32_t{0xFFFFFF});
    design.Write("CHECK", true);
    design.Write("VALUE", false);
    return design;
}

void Win32Timer::Apply() {
    if (hwnd_ == nullptr) return;
    if (enabled_ && interval_ > 0) ::SetTimer(hwnd_, id_, interval_, nullptr);
    else ::KillTimer(hwnd_, id_);
}

void Win32Timer::SetInterval(std::uint32_t milliseconds) {
    interval_ = milliseconds;
    Apply();
}

void Win32Timer::SetEnabled(bool enabled) {
    enabled_ = enabled;
    Apply();
}

MainWindow::MainWindow() = default;

MainWindow::~MainWindow() { Destroy(); }

void MainWindow::Destroy() {
    if (hwnd_ != nullptr && !destroying_) ::DestroyWindow(hwnd_);
}

bool MainWindow::Create(HINSTANCE instance) {
    const int largeSize = ::GetSystemMetrics(SM_CXICON), smallSize = ::GetSystemMetrics(SM_CXSMICON);
    const int ids[3] = {IDI_BULB_DARK, IDI_BULB_LIT, IDI_PADLOCK};
    for (int i = 0; i < 3; ++i) {
        lights_[static_cast<std::size_t>(i)] = {UniqueHicon(LoadIconSized(instance, ids[i], largeSize)),
                                                UniqueHicon(LoadIconSized(instance, ids[i], smallSize))};
    }
    icon_ = lights_[2].large.get();  // the design icon: the padlock

    WNDCLASSEXA windowClass{};
    windowClass.cbSize = sizeof windowClass;
    windowClass.lpfnWndProc = &MainWindow::WindowProc;
    windowClass.hInstance = instance;
    windowClass.hIcon = lights_[2].large.get();
    windowClass.hIconSm = lights_[2].small.get();
    windowClass.hCursor = ::LoadCursorA(nullptr, reinterpret_cast<LPCSTR>(IDC_ARROW));
    windowClass.hbrBackground = reinterpret_cast<HBRUSH>(COLOR_BTNFACE + 1);
    windowClass.lpszClassName = kClassName;
    if (::RegisterClassExA(&windowClass) == 0 && ::GetLastError() != ERROR_CLASS_ALREADY_EXISTS) return false;
    if (!XPButtonWindow::RegisterWindowClass(instance)) return false;

    HWND hwnd = ::CreateWindowExA(WS_EX_CONTROLPARENT, kClassName, "Vantorel", kStyle, CW_USEDEFAULT, CW_USEDEFAULT,
                                  100, 100, nullptr, nullptr, instance, this);
    if (hwnd == nullptr) return false;
    dpi_ = DpiOfWindow(hwnd);
    RECT outer{0, 0, TwipsToPixels(kClientWidth, dpi_), TwipsToPixels(kClientHeight, dpi_)};
    ::AdjustWindowRectEx(&outer, kStyle, FALSE, WS_EX_CONTROLPARENT);
    ::SetWindowPos(hwnd, nullptr, 0, 0, outer.right - outer.left, outer.bottom - outer.top,
                   SWP_NOMOVE | SWP_NOZORDER | SWP_NOACTIVATE);
    font_.reset(CreateDesignFont(dpi_));
    ::SendMessageA(hwnd, WM_SETFONT, reinterpret_cast<WPARAM>(font_.get()), FALSE);

    RECT r = ToPixels(kBtnOnOffRect, dpi_);
    xpbutton::PropertyBag design = BtnOnOffDesign();
    if (!onOff_.Create(hwnd, kSwitchId, r.left, r.top, r.right - r.left, r.bottom - r.top, "BtnOnOff", &design))
        return false;
    onOff_.events().Click = [this] {
        if (handlers_.switchClick) handlers_.switchClick();
    };
    onOff_.Show();

    for (int i = 1; i >= 0; --i) {  // "Options" above "Update"
        auto index = static_cast<std::size_t>(i);
        uf_[index] = std::make_unique<Win32Frame>(hwnd, kUfCaptions[i], kUfRects[i], dpi_, font_.get());
        HWND panel = uf_[index]->hwnd();
        l_[static_cast<std::size_t>(1 - i)] =
            std::make_unique<Win32Label>(panel, kLCaptions[1 - i], kLRects[1 - i], dpi_, font_.get());
        const int buttonIndex = i == 1 ? 4 : 3;
        btnO_[static_cast<std::size_t>(buttonIndex)] =
            std::make_unique<Win32Button>(panel, kBtnOCaptions[buttonIndex], kPanelButtonRect, dpi_, font_.get());
    }
    for (int i = 0; i < 3; ++i) {
        btnO_[static_cast<std::size_t>(i)] =
            std::make_unique<Win32Button>(hwnd, kBtnOCaptions[i], kRowRects[i], dpi_, font_.get());
    }

    // Explorer announces a restart with this message; the program runs elevated, so it has to be let
    // through the window's message filter to arrive at all.
    taskbarCreated_ = ::RegisterWindowMessageA("TaskbarCreated");
    using FilterFunction = BOOL(WINAPI*)(HWND, UINT, DWORD, void*);
    if (HMODULE user32 = ::GetModuleHandleA("user32.dll")) {
        auto allow = reinterpret_cast<FilterFunction>(
            reinterpret_cast<void*>(::GetProcAddress(user32, "ChangeWindowMessageFilterEx")));
        if (allow != nullptr && taskbarCreated_ != 0) allow(hwnd, taskbarCreated_, 1 /* MSGFLT_ALLOW */, nullptr);
    }

    ApplyDpi(dpi_);
    // Focus rectangles and access-key underlines shown from the start, not only after a key press.
    ::SendMessageA(hwnd, WM_CHANGEUISTATE, MAKEWPARAM(UIS_CLEAR, UISF_HIDEFOCUS | UISF_HIDEACCEL), 0);

    tmr_.hwnd_ = hwnd;
    timer_.hwnd_ = hwnd;
    tmr_.Apply();
    timer_.Apply();
    return true;
}

void MainWindow::ApplyDpi(UINT dpi) {
    dpi_ = dpi;
    UniqueHfont old = std::move(font_);  // deleted once every control has the new one
    font_.reset(CreateDesignFont(dpi));
    ::SendMessageA(hwnd_, WM_SETFONT, reinterpret_cast<WPARAM>(font_.get()), FALSE);
    RECT r = ToPixels(kBtnOnOffRect, dpi);
    ::SetWindowPos(onOff_.hwnd(), nullptr, r.left, r.top, r.right - r.left, r.bottom - r.top,
                   SWP_NOZORDER | SWP_NOACTIVATE);
    onOff_.SetDpi(dpi);
    for (auto& frame : uf_) frame->Relayout(dpi, font_.get());
    for (auto& label : l_) label->Relayout(dpi, font_.get());
    for (auto& button : btnO_) button->Relayout(dpi, font_.get());

    HINSTANCE instance = reinterpret_cast<HINSTANCE>(::GetWindowLongPtrA(hwnd_, GWLP_HINSTANCE));
    const int ids[3] = {IDI_BULB_DARK, IDI_BULB_LIT, IDI_PADLOCK};
    std::array<IconPair, 3> previous = std::move(sized_);  // destroyed once the window shows the new ones
    for (std::size_t i = 0; i < 3; ++i)
        sized_[i] = {UniqueHicon(LoadIconSized(instance, ids[i], MetricForDpi(SM_CXICON, dpi))),
                     UniqueHicon(LoadIconSized(instance, ids[i], MetricForDpi(SM_CXSMICON, dpi)))};
    ShowIcon();
}

void MainWindow::ShowIcon() {
    if (hwnd_ == nullptr) return;
    HICON large = icon_, small = icon_;
    for (std::size_t i = 0; i < 3; ++i) {
        if (lights_[i].large.get() == icon_) {
            large = sized_[i].large.get();
            small = sized_[i].small.get();
        }
    }
    ::SendMessageA(hwnd_, WM_SETICON, ICON_BIG, reinterpret_cast<LPARAM>(large));
    ::SendMessageA(hwnd_, WM_SETICON, ICON_SMALL, reinterpret_cast<LPARAM>(small));
}

void MainWindow::SetIcon(platform::IconHandle icon) {
    HICON large = reinterpret_cast<HICON>(icon);
    if (large == icon_) return;
    icon_ = large;
    ShowIcon();  // the light's picture at the window's DPI
}

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
            if (RouteCommand(wParam, lParam)) return 0;
            break;
        case WM_SIZE:
            if (handlers_.resize) handlers_.resize();
            return 0;
        case WM_DPICHANGED: {
            // Moved to a monitor of another DPI: lay out again and take the size the system suggests.
            ApplyDpi(HIWORD(wParam));
            const RECT* suggested = reinterpret_cast<const RECT*>(lParam);
            ::SetWindowPos(hwnd, nullptr, suggested->left, suggested->top, suggested->right - suggested->left,
                           suggested->bottom - suggested->top, SWP_NOZORDER | SWP_NOACTIVATE);
            return 0;
        }
        case WM_GETMINMAXINFO: {
            // The design's size at the window's DPI is never cut to the screen's (a monitor of
            // 200 % may be wider in pixels than the one the window came from).
            RECT outer{0, 0, TwipsToPixels(kClientWidth, dpi_), TwipsToPixels(kClientHeight, dpi_)};
            ::AdjustWindowRectEx(&outer, kStyle, FALSE, WS_EX_CONTROLPARENT);
            auto* info = reinterpret_cast<MINMAXINFO*>(lParam);
            info->ptMaxTrackSize.x = std::max<LONG>(info->ptMaxTrackSize.x, outer.right - outer.left);
            info->ptMaxTrackSize.y = std::max<LONG>(info->ptMaxTrackSize.y, outer.bottom - outer.top);
            return 0;
        }
        case WM_ACTIVATE:
            // Keyboard focus comes back to the control that had it (the switch at first).
            if (LOWORD(wParam) == WA_INACTIVE) {
                HWND focus = ::GetFocus();
                if (focus != nullptr && ::IsChild(hwnd, focus)) focus_ = focus;
            }
            break;
        case WM_SETFOCUS: ::SetFocus(focus_ != nullptr && ::IsWindow(focus_) ? focus_ : onOff_.hwnd()); return 0;
        case WM_MOUSEMOVE:
            // The tray icon's notifications arrive as this message with the event code in the low
            // word: taken raw, not as a signed coordinate.
            if (handlers_.mouseMove) handlers_.mouseMove(LOWORD(lParam));
            return 0;
        case WM_CLOSE:
            if (handlers_.close) handlers_.close();
            else Destroy();
            return 0;
        case WM_QUERYENDSESSION: return TRUE;  // the user is logging off or the system shuts down: nothing holds it up
        case WM_ENDSESSION:
            // The session ends once this returns: the same unload as "&Exit", now.
            if (wParam != FALSE) {
                if (handlers_.close) handlers_.close();
                else Destroy();
            }
            return 0;
        case WM_DESTROY:
            destroying_ = true;
            if (handlers_.unload) handlers_.unload();
            ::PostQuitMessage(0);
            return 0;
        case WM_NCDESTROY:
            tmr_.hwnd_ = nullptr;
            timer_.hwnd_ = nullptr;
            break;
        default: break;
    }
    return ::DefWindowProcA(hwnd, message, wParam, lParam);
}

FrmMainControls MainWindow::Controls() {
    return FrmMainControls{*this,
                           BtnOnOff(),
                           Tmr(),
                           Timer(),
                           {&BtnO(0), &BtnO(1), &BtnO(2), &BtnO(3), &BtnO(4)},
                           {&Uf(0), &Uf(1)},
                           {&L(0), &L(1)},
                           {Lights(0), Lights(1), Lights(2)}};
}

}  // namespace vantorel::win32
