#include "app/options_window.h"

#include <algorithm>

#include "platform/win32/files_win32.h"
#include "platform/win32/gdi_objects.h"
#include "platform/win32/registry_win32.h"
#include "settings/settings.h"
#include "version.h"

namespace vantorel::win32 {

namespace {

constexpr const char* kOptionsClass = "VantorelOptions";
constexpr const char* kPictureClass = "VantorelPictureBox";

// Layout in twips.
constexpr TwipsRect kFrameRect{120, 120, 6375, 2295};
constexpr TwipsRect kBoxRects[3] = {{240, 420, 5900, 300}, {240, 900, 5900, 300}, {240, 1380, 5900, 300}};
constexpr TwipsRect kHintRect{240, 420, 3000, 255};
constexpr TwipsRect kUpdateRect{3360, 330, 2775, 435};
constexpr TwipsRect kLabelRects[2] = {{240, 960, 5895, 255}, {240, 1320, 5895, 255}};
constexpr TwipsRect kProgressRect{240, 1800, 5895, 255};
constexpr TwipsRect kCloseRect{4440, 2520, 2055, 495};
constexpr int kClientWidth = 6615, kClientHeight = 3135;
constexpr DWORD kStyle = WS_CAPTION | WS_SYSMENU | WS_POPUP | WS_CLIPCHILDREN;
constexpr DWORD kExStyle = WS_EX_DLGMODALFRAME | WS_EX_CONTROLPARENT;

// The window's outer size for the design's client area at `dpi`.
SIZE OuterSize(UINT dpi) {
    RECT frame{0, 0, TwipsToPixels(kClientWidth, dpi), TwipsToPixels(kClientHeight, dpi)};
    ::AdjustWindowRectEx(&frame, kStyle, FALSE, kExStyle);
    return {frame.right - frame.left, frame.bottom - frame.top};
}

}  // namespace

UpdateTarget InstalledProgram() { return {ProgramFolder(), {kVersionMajor, kVersionMinor}}; }

std::string AutostartPath() {
    char module[MAX_PATH * 4] = {0};
    ::GetModuleFileNameA(nullptr, module, sizeof module);
    std::string path = module;
    std::size_t slash = path.find_last_of("\\/");
    std::string base = slash == std::string::npos ? path : path.substr(slash + 1);
    std::size_t dot = base.find_last_of('.');
    if (dot != std::string::npos) base.erase(dot);
    return ProgramFolder() + "\\" + base + ".exe";
}

void ShowOptionsModal(HWND owner, int frameIndex, std::function<std::optional<std::size_t>()> reloadDefinitions) {
    Win32Registry registry;
    OptionsWindow window(owner, frameIndex, registry, AutostartPath());
    if (window.hwnd() != nullptr) window.SetReloadDefinitions(std::move(reloadDefinitions));
    window.ShowModal();
}

OptionsWindow::OptionsWindow(HWND owner, int frameIndex, platform::Registry& registry,
                             const std::string& executablePath, const UpdateTarget& target)
    : owner_(owner) {
    HINSTANCE instance = ::GetModuleHandleA(nullptr);
    RegisterWindowClass(instance, kOptionsClass, WindowProc);
    RegisterWindowClass(instance, kPictureClass, PictureProc);
    hwnd_ = ::CreateWindowExA(kExStyle, kOptionsClass, "Options", kStyle, CW_USEDEFAULT, CW_USEDEFAULT, 100, 100, owner,
                              nullptr, instance, this);
    if (hwnd_ == nullptr) return;

    const UINT dpi = dpi_ = DpiOfWindow(hwnd_);
    RECT ownerRect{0, 0, ::GetSystemMetrics(SM_CXSCREEN), ::GetSystemMetrics(SM_CYSCREEN)};
    if (owner != nullptr && ::IsWindowVisible(owner)) ::GetWindowRect(owner, &ownerRect);
    const int width = OuterSize(dpi).cx, height = OuterSize(dpi).cy;
    ::SetWindowPos(hwnd_, nullptr, (ownerRect.left + ownerRect.right - width) / 2,
                   (ownerRect.top + ownerRect.bottom - height) / 2, width, height, SWP_NOZORDER | SWP_NOACTIVATE);

    font_.reset(CreateDesignFont(dpi));
    frames_[0] = std::make_unique<Win32Frame>(hwnd_, "Options", kFrameRect, dpi, font_.get(), frameIndex == 0);
    frames_[1] = std::make_unique<Win32Frame>(hwnd_, "Updates", kFrameRect, dpi, font_.get(), frameIndex == 1);
    const char* boxCaptions[3] = {"Boot when Windows boots", "Start minimized to system tray",
                                  "Disable script debugging in Interent Explorer"};
    for (int i = 0; i < 3; ++i)
        boxes_[i] = std::make_unique<Win32CheckBox>(frames_[0]->hwnd(), boxCaptions[i], kBoxRects[i], dpi, font_.get());
    hint_ =
        std::make_unique<Win32Label>(frames_[1]->hwnd(), "Click to check for updates ->", kHintRect, dpi, font_.get());
    update_ = std::make_unique<Win32Button>(frames_[1]->hwnd(), "&Check for Updates", kUpdateRect, dpi, font_.get());
    labels_[0] =
        std::make_unique<Win32Label>(frames_[1]->hwnd(), "Definitions Updates:", kLabelRects[0], dpi, font_.get());
    labels_[1] = std::make_unique<Win32Label>(frames_[1]->hwnd(), "Program Updates:", kLabelRects[1], dpi, font_.get());
    // pb: a sunken white box whose inside shows the picture box's image.
    RECT pb = ToPixels(kProgressRect, dpi);
    pbWindow_ = ::CreateWindowExA(WS_EX_CLIENTEDGE, kPictureClass, "", WS_CHILD, pb.left, pb.top, pb.right - pb.left,
                                  pb.bottom - pb.top, frames_[1]->hwnd(), nullptr, instance, nullptr);
    RECT inside{};
    ::GetClientRect(pbWindow_, &inside);
    pb_ = std::make_unique<GdiPictureBox>(inside.right, inside.bottom, pbWindow_);
    ::SetWindowLongPtrA(pbWindow_, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(pb_.get()));
    close_ = std::make_unique<Win32Button>(hwnd_, "&Close", kCloseRect, dpi, font_.get());
    if (frameIndex == 1) ::SetWindowTextA(hwnd_, "Updates");
    // Focus rectangles and access-key underlines shown from the start, not only after a key press.
    ::SendMessageA(hwnd_, WM_CHANGEUISTATE, MAKEWPARAM(UIS_CLEAR, UISF_HIDEFOCUS | UISF_HIDEACCEL), 0);

    controls_.F = {frames_[0].get(), frames_[1].get()};
    controls_.Box = {boxes_[0].get(), boxes_[1].get(), boxes_[2].get()};
    controls_.BtnCancel = close_.get();
    controls_.BtnUpdate = update_.get();
    controls_.L = {labels_[0].get(), labels_[1].get()};
    form_ = std::make_unique<FrmOptions>(
        OptionsPlatform{registry, scheduler_, pump_, files_, disk_, inet_, transfer1_, transfer2_, transfer3_},
        controls_, *this, target, executablePath,
        [this] {
            if (live() != nullptr) ::DestroyWindow(hwnd_);
        },
        [this](const std::string& text) {
            if (live() != nullptr) ::MessageBoxA(hwnd_, text.c_str(), "Options", MB_OK | MB_ICONEXCLAMATION);
        });
    form_->Form_Load();
}

void OptionsWindow::ApplyDpi(UINT dpi) {
    dpi_ = dpi;
    UniqueHfont old = std::move(font_);  // deleted once every control has the new one
    font_.reset(CreateDesignFont(dpi));
    for (auto& frame : frames_) frame->Relayout(dpi, font_.get());
    for (auto& box : boxes_) box->Relayout(dpi, font_.get());
    for (auto& label : labels_) label->Relayout(dpi, font_.get());
    hint_->Relayout(dpi, font_.get());
    update_->Relayout(dpi, font_.get());
    close_->Relayout(dpi, font_.get());
    // pb: the box at its new size, with an image of the new size (the next progress step paints it).
    RECT pb = ToPixels(kProgressRect, dpi), inside{};
    ::SetWindowPos(pbWindow_, nullptr, pb.left, pb.top, pb.right - pb.left, pb.bottom - pb.top,
                   SWP_NOZORDER | SWP_NOACTIVATE);
    ::GetClientRect(pbWindow_, &inside);
    pb_ = std::make_unique<GdiPictureBox>(inside.right, inside.bottom, pbWindow_);
    ::SetWindowLongPtrA(pbWindow_, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(pb_.get()));
    ::InvalidateRect(pbWindow_, nullptr, TRUE);
}

void OptionsWindow::SetBtnUpdateEnabled(bool enabled) {
    if (live() != nullptr) update_->SetEnabled(enabled);
}

void OptionsWindow::SetLCaption(int index, const std::string& caption) {
    if (live() != nullptr && (index == 0 || index == 1)) labels_[index]->SetCaption(caption);
}

void OptionsWindow::ShowPb() {
    if (live() != nullptr) ::ShowWindow(pbWindow_, SW_SHOW);
}

void OptionsWindow::MsgBoxExclamation(const std::string& prompt, const std::string& title) {
    if (live() != nullptr) ::MessageBoxA(hwnd_, prompt.c_str(), title.c_str(), MB_OK | MB_ICONEXCLAMATION);
}

LRESULT CALLBACK OptionsWindow::PictureProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_PAINT) {
        PaintGuard paint(hwnd);
        auto* picture = reinterpret_cast<GdiPictureBox*>(::GetWindowLongPtrA(hwnd, GWLP_USERDATA));
        if (picture != nullptr) picture->Show(paint.dc(), 0, 0);
        return 0;
    }
    if (message == WM_ERASEBKGND) return 1;  // the image covers the whole inside
    return ::DefWindowProcA(hwnd, message, wParam, lParam);
}

OptionsWindow::~OptionsWindow() {
    if (hwnd_ != nullptr) ::DestroyWindow(hwnd_);
    pbWindow_ = nullptr;
}

void OptionsWindow::ShowModal() {
    if (hwnd_ == nullptr) return;
    bool ownerWasEnabled = owner_ != nullptr && ::IsWindowEnabled(owner_);
    if (ownerWasEnabled) ::EnableWindow(owner_, FALSE);
    ::ShowWindow(hwnd_, SW_SHOW);
    MSG msg;
    while (!closed_) {
        BOOL got = ::GetMessageA(&msg, nullptr, 0, 0);
        if (got == 0) {
            ::PostQuitMessage(static_cast<int>(msg.wParam));  // leave the quit for the outer loop
            break;
        }
        if (got == -1) break;
        DispatchQueuedMessage(msg);
    }
    if (ownerWasEnabled) {
        ::EnableWindow(owner_, TRUE);
        ::SetActiveWindow(owner_);
    }
    if (live() != nullptr) ::DestroyWindow(hwnd_);
}

LRESULT OptionsWindow::HandleMessage(UINT message, WPARAM wParam, LPARAM lParam) {
    HWND hwnd = hwnd_;
    switch (message) {
        case WM_COMMAND:
            if (RouteCommand(wParam, lParam)) return 0;
            if (LOWORD(wParam) == IDCANCEL && form_) {  // Escape
                form_->BtnCancel_Click();
                return 0;
            }
            if (LOWORD(wParam) == IDOK && lParam == 0) {  // Enter: the push button with the focus
                HWND focus = ::GetFocus();
                if (focus != nullptr && ::IsChild(hwnd, focus) &&
                    (::SendMessageA(focus, WM_GETDLGCODE, 0, 0) & (DLGC_DEFPUSHBUTTON | DLGC_UNDEFPUSHBUTTON)))
                    ::SendMessageA(focus, BM_CLICK, 0, 0);
                return 0;
            }
            break;
        case WM_DPICHANGED:
            if (form_) {
                // Moved to a monitor of another DPI: lay out again and take the size the system suggests.
                ApplyDpi(HIWORD(wParam));
                const RECT* suggested = reinterpret_cast<const RECT*>(lParam);
                ::SetWindowPos(hwnd, nullptr, suggested->left, suggested->top, suggested->right - suggested->left,
                               suggested->bottom - suggested->top, SWP_NOZORDER | SWP_NOACTIVATE);
                return 0;
            }
            break;
        case WM_GETMINMAXINFO: {
            // The design's size at the window's DPI is never cut to the screen's.
            auto* info = reinterpret_cast<MINMAXINFO*>(lParam);
            SIZE outer = OuterSize(dpi_);
            info->ptMaxTrackSize.x = std::max<LONG>(info->ptMaxTrackSize.x, outer.cx);
            info->ptMaxTrackSize.y = std::max<LONG>(info->ptMaxTrackSize.y, outer.cy);
            return 0;
        }
        case WM_SETFOCUS:
            // The keyboard starts on the first control of the visible frame.
            if (close_) {
                HWND first = frames_[0]->Visible() ? boxes_[0]->hwnd()
                             : update_->Enabled()  ? update_->hwnd()
                                                   : close_->hwnd();
                ::SetFocus(first);
            }
            return 0;
        case WM_CLOSE: ::DestroyWindow(hwnd); return 0;
        case WM_DESTROY:
            closed_ = true;
            // A check running below this message (it pumps messages) stops at its next step.
            if (form_) form_->Updates().Cancel();
            return 0;
        default: break;
    }
    return ::DefWindowProcA(hwnd, message, wParam, lParam);
}

}  // namespace vantorel::win32
