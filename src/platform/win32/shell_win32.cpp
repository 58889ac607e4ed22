#include "platform/win32/shell_win32.h"

#include "platform/win32/controls_win32.h"

#include <shellapi.h>

#include <cstring>

namespace vantorel::win32 {

bool Win32NotifyArea::ShellNotifyIcon(std::uint32_t message, const platform::NotifyIconData& data) {
    NOTIFYICONDATAA record;
    std::memset(&record, 0, sizeof record);
    record.cbSize = NOTIFYICONDATAA_V1_SIZE;
    record.hWnd = reinterpret_cast<HWND>(data.window);
    record.uID = data.id;
    record.uFlags = data.flags;
    record.uCallbackMessage = data.callbackMessage;
    record.hIcon = reinterpret_cast<HICON>(data.icon);
    std::size_t length = data.tip.size() < sizeof record.szTip ? data.tip.size() : sizeof record.szTip - 1;
    std::memcpy(record.szTip, data.tip.data(), length);
    record.szTip[length] = '\0';
    return ::Shell_NotifyIconA(message, &record) != FALSE;
}

bool Win32WindowManager::SetWindowPos(platform::WindowHandle window, platform::WindowHandle insertAfter, std::int32_t x,
                                      std::int32_t y, std::int32_t cx, std::int32_t cy, std::uint32_t flags) {
    return ::SetWindowPos(reinterpret_cast<HWND>(window), reinterpret_cast<HWND>(insertAfter), x, y, cx, cy, flags) !=
           FALSE;
}

std::int32_t Win32WindowManager::ScreenWidth() const { return ::GetSystemMetrics(SM_CXSCREEN); }
std::int32_t Win32WindowManager::ScreenHeight() const { return ::GetSystemMetrics(SM_CYSCREEN); }

bool Win32WindowManager::DeleteSystemMenuCommand(platform::WindowHandle window, std::uint32_t command) {
    HMENU menu = ::GetSystemMenu(reinterpret_cast<HWND>(window), FALSE);
    return menu != nullptr && ::DeleteMenu(menu, command, MF_BYCOMMAND) != FALSE;
}

std::intptr_t Win32Shell::Execute(platform::WindowHandle owner, const std::string& operation, const std::string& file,
                                  const std::string& parameters, const std::string& directory, std::int32_t show) {
    HINSTANCE result = ::ShellExecuteA(reinterpret_cast<HWND>(owner), operation.c_str(), file.c_str(),
                                       parameters.empty() ? nullptr : parameters.c_str(),
                                       directory.empty() ? nullptr : directory.c_str(), show);
    return reinterpret_cast<std::intptr_t>(result);
}

void Win32Shell::ShowMessage(platform::WindowHandle owner, const std::string& text, const std::string& title,
                             std::uint32_t style) {
    ::MessageBoxA(reinterpret_cast<HWND>(owner), text.c_str(), title.c_str(), style);
}

Win32MessagePump::Win32MessagePump() {
    LARGE_INTEGER frequency;
    ::QueryPerformanceFrequency(&frequency);
    yieldTicks_ = frequency.QuadPart * kYieldMicroseconds / 1'000'000;
}

bool Win32MessagePump::YieldToMessages() {
    if (quitting_) return false;
    LARGE_INTEGER now;
    ::QueryPerformanceCounter(&now);
    if (now.QuadPart - lastLook_ < yieldTicks_) return true;
    lastLook_ = now.QuadPart;
    return PumpMessages();
}

bool Win32MessagePump::PumpMessages() {
    if (quitting_) return false;
    // The common case: nothing waiting. The high word is what the queue holds now.
    if (HIWORD(::GetQueueStatus(QS_ALLINPUT)) == 0) return true;
    MSG message;
    while (::PeekMessageA(&message, nullptr, 0, 0, PM_REMOVE)) {
        if (message.message == WM_QUIT) {
            quitting_ = true;
            ::PostQuitMessage(static_cast<int>(message.wParam));
            return false;
        }
        const MSG* outer = dispatching_;
        dispatching_ = &message;
        DispatchQueuedMessage(message);
        dispatching_ = outer;
    }
    return true;
}

void DispatchQueuedMessage(MSG& message) {
    HWND root = message.hwnd != nullptr ? ::GetAncestor(message.hwnd, GA_ROOT) : nullptr;
    // Alt+letter: the program's own rule for an access key that two buttons share ("&Close" and
    // "&Check for Updates") and for buttons on a hidden frame; the dialog handling otherwise.
    if (root != nullptr && message.message == WM_SYSCHAR && HandleAccessKey(root, static_cast<char>(message.wParam)))
        return;
    if (root != nullptr && ::IsDialogMessageA(root, &message)) return;
    ::TranslateMessage(&message);
    ::DispatchMessageA(&message);
}

bool Win32Instance::PreviousInstance() {
    HANDLE mutex = ::CreateMutexA(nullptr, FALSE, instanceName_);
    bool existed = mutex != nullptr && ::GetLastError() == ERROR_ALREADY_EXISTS;
    instanceMutex_.reset(mutex);
    return existed;
}

void Win32Instance::CreateNamedMutex(const std::string& name) {
    namedMutex_.reset(::CreateMutexA(nullptr, FALSE, name.c_str()));
}

}  // namespace vantorel::win32
