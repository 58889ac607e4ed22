#include "platform/win32/message_pump_win32.h"

#include <windows.h>

namespace vantorel::win32 {

void Win32MessagePump::PumpMessages() {
    auto now = std::chrono::steady_clock::now();
    if (now - lastLook_ < minimumInterval_) return;
    MSG msg;
    while (::PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) {
        if (msg.message == WM_QUIT) {
            ::PostQuitMessage(static_cast<int>(msg.wParam));
            break;
        }
        ::TranslateMessage(&msg);
        ::DispatchMessageA(&msg);
    }
    // Measured after dispatching, so a long handler does not eat the interval.
    lastLook_ = std::chrono::steady_clock::now();
}

}  // namespace vantorel::win32
