// What the guard and the tray routines need of the windowing system: the main window, the ON/OFF
// switch, timers, the message pump, window placement and the previous-instance test.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "platform/message_pump.h"

namespace vantorel::platform {

using WindowHandle = std::intptr_t;
using IconHandle = std::intptr_t;

enum class WindowState { Normal, Minimized, Maximized };

// A top-level window.
class Window {
public:
    Window() = default;
    Window(const Window&) = delete;
    Window& operator=(const Window&) = delete;
    virtual ~Window() = default;

    virtual WindowHandle Handle() const = 0;
    // The icon the window shows now (title bar and, through ModifyTrayIcon, the tray).
    virtual IconHandle Icon() const = 0;
    virtual void SetIcon(IconHandle icon) = 0;

    virtual std::string Caption() const = 0;
    virtual void SetCaption(const std::string& caption) = 0;

    virtual bool Visible() const = 0;
    virtual void SetVisible(bool visible) = 0;

    virtual WindowState State() const = 0;
    virtual void SetState(WindowState state) = 0;

    // Outer size and position in pixels.
    virtual std::int32_t Width() const = 0;
    virtual std::int32_t Height() const = 0;
    virtual void Move(std::int32_t left, std::int32_t top) = 0;
};

// The guard's ON/OFF switch: a two-state push button. Colours are 0x00BBGGRR.
class Switch {
public:
    Switch() = default;
    Switch(const Switch&) = delete;
    Switch& operator=(const Switch&) = delete;
    virtual ~Switch() = default;

    virtual bool Value() const = 0;
    virtual void SetValue(bool value) = 0;
    virtual std::string Caption() const = 0;
    virtual void SetCaption(const std::string& caption) = 0;
    virtual std::uint32_t BackColor() const = 0;
    virtual void SetBackColor(std::uint32_t colour) = 0;
    virtual std::uint32_t BackOver() const = 0;
    virtual void SetBackOver(std::uint32_t colour) = 0;
};

// A window timer: while enabled, calls its tick handler every `Interval` milliseconds on the
// window thread.
class Timer {
public:
    Timer() = default;
    Timer(const Timer&) = delete;
    Timer& operator=(const Timer&) = delete;
    virtual ~Timer() = default;

    virtual std::uint32_t Interval() const = 0;
    virtual void SetInterval(std::uint32_t milliseconds) = 0;
    virtual bool Enabled() const = 0;
    virtual void SetEnabled(bool enabled) = 0;
};

// Placement of top-level windows and the screen they are on.
class WindowManager {
public:
    WindowManager() = default;
    WindowManager(const WindowManager&) = delete;
    WindowManager& operator=(const WindowManager&) = delete;
    virtual ~WindowManager() = default;

    // SetWindowPos. `insertAfter` is a window handle or one of the special values below.
    virtual bool SetWindowPos(WindowHandle window, WindowHandle insertAfter, std::int32_t x, std::int32_t y,
                              std::int32_t cx, std::int32_t cy, std::uint32_t flags) = 0;
    virtual std::int32_t ScreenWidth() const = 0;
    virtual std::int32_t ScreenHeight() const = 0;

    // GetSystemMenu(window, revert = false), then DeleteMenu of `command` addressed by command.
    virtual bool DeleteSystemMenuCommand(WindowHandle window, std::uint32_t command) = 0;
};

inline constexpr std::uint32_t kScSize = 0xF000;  // the system menu's size command

inline constexpr WindowHandle kHwndTopmost = -1;
inline constexpr WindowHandle kHwndNoTopmost = -2;
inline constexpr std::uint32_t kSwpNoSize = 0x01;
inline constexpr std::uint32_t kSwpNoMove = 0x02;
inline constexpr std::uint32_t kSwpNoActivate = 0x10;
inline constexpr std::uint32_t kSwpShowWindow = 0x40;

// The program's instance bookkeeping.
class Instance {
public:
    Instance() = default;
    Instance(const Instance&) = delete;
    Instance& operator=(const Instance&) = delete;
    virtual ~Instance() = default;

    // True when another instance of this program is already running. The first caller claims the
    // place, so of two instances started together exactly one hears false.
    virtual bool PreviousInstance() = 0;

    // CreateMutexA(no security attributes, not owned, `name`): held for the life of the process.
    virtual void CreateNamedMutex(const std::string& name) = 0;
};

}  // namespace vantorel::platform
