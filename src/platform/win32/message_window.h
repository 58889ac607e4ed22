// One window-procedure shape for every window class of the program. A class `T` derives from
// `MessageWindow<T>` and registers `MessageWindow<T>::WindowProc`, creating its window with `this`
// as the creation parameter: the procedure keeps the object in GWLP_USERDATA from WM_NCCREATE on and
// hands every message to `T::HandleMessage`, which only decodes and returns DefWindowProc for what it
// leaves alone. After WM_NCDESTROY the window no longer reaches the object, and `hwnd()` is null.
#pragma once

#include <windows.h>

namespace vantorel::win32 {

template <class T>
class MessageWindow {
public:
    HWND hwnd() const { return hwnd_; }

protected:
    MessageWindow() = default;
    ~MessageWindow() = default;
    MessageWindow(const MessageWindow&) = delete;
    MessageWindow& operator=(const MessageWindow&) = delete;

    static LRESULT CALLBACK WindowProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
        T* self = nullptr;
        if (message == WM_NCCREATE) {
            self = static_cast<T*>(reinterpret_cast<CREATESTRUCTA*>(lParam)->lpCreateParams);
            static_cast<MessageWindow*>(self)->hwnd_ = hwnd;
            ::SetWindowLongPtrA(hwnd, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(self));
        } else {
            self = reinterpret_cast<T*>(::GetWindowLongPtrA(hwnd, GWLP_USERDATA));
        }
        if (self == nullptr) return ::DefWindowProcA(hwnd, message, wParam, lParam);
        LRESULT result = self->HandleMessage(message, wParam, lParam);
        if (message == WM_NCDESTROY) {
            ::SetWindowLongPtrA(hwnd, GWLP_USERDATA, 0);
            static_cast<MessageWindow*>(self)->hwnd_ = nullptr;
        }
        return result;
    }

    HWND hwnd_ = nullptr;
};

}  // namespace vantorel::win32
