// Input for tests of real windows under Wine: a pointer click through the system's input queue
// and a step run from a thread timer inside whatever message loop is running.
#pragma once

#include <windows.h>

#include <functional>
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
