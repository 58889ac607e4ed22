#include "platform/win32/options_window_win32.h"

#include "platform/win32/files_win32.h"
#include "platform/win32/registry_win32.h"
#include "settings/server_address.h"
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

UINT WindowDpi(HWND hwnd) {
    HDC dc = ::GetDC(hwnd);
    UINT dpi = static_cast<UINT>(::GetDeviceCaps(dc, LOGPIXELSY));
    ::ReleaseDC(hwnd, dc);
    return dpi == 0 ? 96 : dpi;
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
    RegisterWindowClass(instance, kOptionsClass, Proc);
    RegisterWindowClass(instance, kPictureClass, PictureProc);
    const DWORD style = WS_CAPTION | WS_SYSMENU | WS_POPUP | WS_CLIPCHILDREN;
    hwnd_ = ::CreateWindowExA(WS_EX_DLGMODALFRAME | WS_EX_CONTROLPARENT, kOptionsClass, "Options", style,
                              CW_USEDEFAULT, CW_USEDEFAULT, 100, 100, owner, nullptr, instance, this);
    if (hwnd_ == nullptr) return;

    UINT dpi = WindowDpi(hwnd_);
    RECT frame{0, 0, TwipsToPixels(kClientWidth, dpi), TwipsToPixels(kClientHeight, dpi)};
    ::AdjustWindowRectEx(&frame, style, FALSE, WS_EX_DLGMODALFRAME);
    RECT ownerRect{0, 0, ::GetSystemMetrics(SM_CXSCREEN), ::GetSystemMetrics(SM_CYSCREEN)};
    if (owner != nullptr && ::IsWindowVisible(owner)) ::GetWindowRect(owner, &ownerRect);
    int width = frame.right - frame.left, height = frame.bottom - frame.top;
    ::SetWindowPos(hwnd_, nullptr, (ownerRect.left + ownerRect.right - width) / 2,
                   (ownerRect.top + ownerRect.bottom - height) / 2, width, height, SWP_NOZORDER | SWP_NOACTIVATE);

    font_ = CreateDesignFont(dpi);
    frames_[0] = std::make_unique<Win32Frame>(hwnd_, "Options", kFrameRect, dpi, font_, frameIndex == 0);
    frames_[1] = std::make_unique<Win32Frame>(hwnd_, "Updates", kFrameRect, dpi, font_, frameIndex == 1);
    const char* boxCaptions[3] = {"Boot when Windows boots", "Start minimized to system tray",
                                  "Disable script debugging in Interent Explorer"};
    for (int i = 0; i < 3; ++i)
        boxes_[i] = std::make_unique<Win32CheckBox>(frames_[0]->hwnd(), boxCaptions[i], kBoxRects[i], dpi, font_);
    hint_ = std::make_unique<Win32Label>(frames_[1]->hwnd(), "Click to check for updates ->", kHintRect, dpi, font_);
    update_ = std::make_unique<Win32Button>(frames_[1]->hwnd(), "&Check for Updates", kUpdateRect, dpi, font_);
    labels_[0] = std::make_unique<Win32Label>(frames_[1]->hwnd(), "Definitions Updates:", kLabelRects[0], dpi, font_);
    labels_[1] = std::make_unique<Win32Label>(frames_[1]->hwnd(), "Program Updates:", kLabelRects[1], dpi, font_);
    // pb: a sunken white box whose inside shows the picture box's image.
    RECT pb = ToPixels(kProgressRect, dpi);
    pbWindow_ = ::CreateWindowExA(WS_EX_CLIENTEDGE, kPictureClass, "", WS_CHILD, pb.left, pb.top,
                                  pb.right - pb.left, pb.bottom - pb.top, frames_[1]->hwnd(), nullptr, instance,
                                  nullptr);
    RECT inside{};
    ::GetClientRect(pbWindow_, &inside);
    pb_ = std::make_unique<GdiPictureBox>(inside.right, inside.bottom, pbWindow_);
    ::SetWindowLongPtrA(pbWindow_, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(pb_.get()));
    close_ = std::make_unique<Win32Button>(hwnd_, "&Close", kCloseRect, dpi, font_);
    if (frameIndex == 1) ::SetWindowTextA(hwnd_, "Updates");

    controls_.F = {frames_[0].get(), frames_[1].get()};
    controls_.Box = {boxes_[0].get(), boxes_[1].get(), boxes_[2].get()};
    controls_.BtnCancel = close_.get();
    controls_.BtnUpdate = update_.get();
    controls_.L = {labels_[0].get(), labels_[1].get()};
    form_ = std::make_unique<FrmOptions>(controls_, registry, executablePath, [this] {
        if (hwnd_ != nullptr) ::DestroyWindow(hwnd_);
    });
    form_->Form_Load();

    check_ = std::make_unique<UpdateCheck>(*this, inet_, pump_, files_, FD1_, FD2_, FD3_, target.programFolder,
                                           target.version, ServerAddress(registry));
    check_->ConnectEvents();
    update_->Click = [this] { check_->BtnUpdate_Click(); };
}

void OptionsWindow::SetBtnUpdateEnabled(bool enabled) {
    if (hwnd_ != nullptr) update_->SetEnabled(enabled);
}

void OptionsWindow::SetLCaption(int index, const std::string& caption) {
    if (hwnd_ != nullptr && (index == 0 || index == 1)) labels_[index]->SetCaption(caption);
}

void OptionsWindow::ShowPb() {
    if (hwnd_ != nullptr) ::ShowWindow(pbWindow_, SW_SHOW);
}

void OptionsWindow::MsgBoxExclamation(const std::string& prompt, const std::string& title) {
    if (hwnd_ != nullptr) ::MessageBoxA(hwnd_, prompt.c_str(), title.c_str(), MB_OK | MB_ICONEXCLAMATION);
}

LRESULT CALLBACK OptionsWindow::PictureProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_PAINT) {
        PAINTSTRUCT paint;
        HDC dc = ::BeginPaint(hwnd, &paint);
        auto* picture = reinterpret_cast<GdiPictureBox*>(::GetWindowLongPtrA(hwnd, GWLP_USERDATA));
        if (picture != nullptr) picture->Show(dc, 0, 0);
        ::EndPaint(hwnd, &paint);
        return 0;
    }
    if (message == WM_ERASEBKGND) return 1;  // the image covers the whole inside
    return ::DefWindowProcA(hwnd, message, wParam, lParam);
}

OptionsWindow::~OptionsWindow() {
    if (hwnd_ != nullptr) ::DestroyWindow(hwnd_);
    pbWindow_ = nullptr;
    if (font_ != nullptr) ::DeleteObject(font_);
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
        if (hwnd_ != nullptr && ::IsDialogMessageA(hwnd_, &msg)) continue;
        ::TranslateMessage(&msg);
        ::DispatchMessageA(&msg);
    }
    if (ownerWasEnabled) {
        ::EnableWindow(owner_, TRUE);
        ::SetActiveWindow(owner_);
    }
    if (hwnd_ != nullptr) ::DestroyWindow(hwnd_);
}

LRESULT CALLBACK OptionsWindow::Proc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_NCCREATE) {
        auto* create = reinterpret_cast<CREATESTRUCTA*>(lParam);
        ::SetWindowLongPtrA(hwnd, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(create->lpCreateParams));
    }
    auto* self = reinterpret_cast<OptionsWindow*>(::GetWindowLongPtrA(hwnd, GWLP_USERDATA));
    switch (message) {
        case WM_COMMAND:
            if (RouteCommand(wParam, lParam)) return 0;
            if (LOWORD(wParam) == IDCANCEL && self != nullptr) {  // Escape
                self->form_->BtnCancel_Click();
                return 0;
            }
            break;
        case WM_CLOSE:
            ::DestroyWindow(hwnd);
            return 0;
        case WM_DESTROY:
            if (self != nullptr) {
                self->closed_ = true;
                self->hwnd_ = nullptr;
                // A check running below this message (it pumps messages) stops at its next step.
                if (self->check_) self->check_->Cancel();
            }
            return 0;
        default:
            break;
    }
    return ::DefWindowProcA(hwnd, message, wParam, lParam);
}

}  // namespace vantorel::win32
