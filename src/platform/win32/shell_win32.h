// The notification area, window placement, the message pump and the instance test on Windows.
#pragma once

#include <windows.h>

#include "platform/shell.h"
#include "platform/notify_area.h"
#include "platform/window.h"
#include "platform/win32/unique_handle.h"

namespace vantorel::win32 {

// Shell_NotifyIconA with the first version of the record (its size is the platform's own).
class Win32NotifyArea final : public platform::NotifyArea {
public:
    bool ShellNotifyIcon(std::uint32_t message, const platform::NotifyIconData& data) override;
};

class Win32WindowManager final : public platform::WindowManager {
public:
    bool SetWindowPos(platform::WindowHandle window, platform::WindowHandle insertAfter, std::int32_t x, std::int32_t y,
                      std::int32_t cx, std::int32_t cy, std::uint32_t flags) override;
    std::int32_t ScreenWidth() const override;
    std::int32_t ScreenHeight() const override;
    bool DeleteSystemMenuCommand(platform::WindowHandle window, std::uint32_t command) override;
};

// ShellExecuteA and MessageBoxA.
class Win32Shell : public platform::Shell {
public:
    std::intptr_t Execute(platform::WindowHandle owner, const std::string& operation, const std::string& file,
                          const std::string& parameters, const std::string& directory, std::int32_t show) override;
    void ShowMessage(platform::WindowHandle owner, const std::string& text, const std::string& title,
                     std::uint32_t style) override;
};

// Handles one message taken from the queue, the same way in every loop of the program (the main
// loop, the options window's loop and the yield of long work): the keyboard interface of the
// top-level window the message is for (Tab, the arrow keys, Enter, Escape and the access keys of
// its controls), otherwise translated and dispatched.
void DispatchQueuedMessage(MSG& message);

// Runs the messages waiting on this thread. WM_QUIT is put back for the main loop and ends all
// further pumping.
//
// The yield of a sweep runs once per row. Asking the queue costs one GetQueueStatus call (well under
// a microsecond on Windows, but a wineserver round trip of tens of microseconds under Wine), so the
// yield asks at most once per kYieldMicroseconds and otherwise only reads the performance counter.
class Win32MessagePump final : public platform::MessagePump {
public:
    static constexpr long long kYieldMicroseconds = 1000;

    Win32MessagePump();
    bool PumpMessages() override;
    bool YieldToMessages() override;
    bool InOwnTimerTick() const override { return dispatching_ != nullptr && dispatching_->message == WM_TIMER; }
    bool Quitting() const { return quitting_; }

private:
    bool quitting_ = false;
    const MSG* dispatching_ = nullptr;  // the message this pump is handling now (innermost call)
    long long yieldTicks_ = 0;          // performance-counter ticks between two looks at the queue
    long long lastLook_ = 0;
};

// The previous-instance test claims a mutex of its own, atomically, so of two programs started
// together exactly one carries on; the named mutex "Vantorel" is created apart from it and kept.
class Win32Instance final : public platform::Instance {
public:
    explicit Win32Instance(const char* instanceName = "Vantorel.Instance") : instanceName_(instanceName) {}
    bool PreviousInstance() override;
    void CreateNamedMutex(const std::string& name) override;

private:
    const char* instanceName_;
    UniqueKernelHandle instanceMutex_;
    UniqueKernelHandle namedMutex_;
};

}  // namespace vantorel::win32
