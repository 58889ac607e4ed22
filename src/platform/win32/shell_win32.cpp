#include "platform/win32/shell_win32.h"

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
        ::TranslateMessage(&message);
        ::DispatchMessageA(&message);
    }
    return true;
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
