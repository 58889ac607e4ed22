// The main window's Win32 host for now: a top-level window with the ON/OFF switch (a plain
// owner-drawn stand-in until the custom push button takes its place behind the same Switch
// interface), the two timers, and the messages the guard and the tray need. The window's other
// controls come later.
#pragma once

#include <windows.h>

#include <functional>
#include <string>

#include "platform/window.h"

namespace vantorel::win32 {

class MainWindow;

// The stand-in switch: a push button that flips its Value when clicked and paints its caption on
// its BackColor (BackOver while the pointer is over it).
class StandInSwitch final : public platform::Switch {
public:
    bool Value() const override { return value_; }
    void Value(bool value) override;
    std::string Caption() const override { return caption_; }
    void Caption(const std::string& caption) override;
    std::uint32_t BackColor() const override { return backColor_; }
    void BackColor(std::uint32_t colour) override;
    std::uint32_t BackOver() const override { return backOver_; }
    void BackOver(std::uint32_t colour) override;

    HWND Handle() const { return hwnd_; }

private:
    friend class MainWindow;
    void Redraw();
    void Draw(const DRAWITEMSTRUCT& item) const;

    HWND hwnd_ = nullptr;
    WNDPROC buttonProc_ = nullptr;  // the button class's own procedure, under ours
    bool value_ = false;
    bool over_ = false;
    std::string caption_;
    std::uint32_t backColor_ = 0x8000000F;  // the system's button face
    std::uint32_t backOver_ = 0x8000000F;
};

class Win32Timer final : public platform::Timer {
public:
    explicit Win32Timer(UINT_PTR id) : id_(id) {}
    std::uint32_t Interval() const override { return interval_; }
    void Interval(std::uint32_t milliseconds) override;
    bool Enabled() const override { return enabled_; }
    void Enabled(bool enabled) override;

private:
    friend class MainWindow;
    void Apply();
    HWND hwnd_ = nullptr;
    UINT_PTR id_;
    std::uint32_t interval_ = 0;
    bool enabled_ = false;
};

struct MainWindowHandlers {
    std::function<void()> switchClick;
    std::function<void()> tmrTick;
    std::function<void()> timerTick;
    std::function<void(std::uint32_t)> mouseMove;  // the raw low word of the position
    std::function<void()> taskbarCreated;
    std::function<void()> unload;
};

class MainWindow final : public platform::Window {
public:
    MainWindow();
    ~MainWindow() override;

    // Creates the window, hidden, with its switch. False (and GetLastError set) when there is no
    // window station or display to create it on.
    bool Create(HINSTANCE instance, MainWindowHandlers handlers);

    platform::WindowHandle Handle() const override { return reinterpret_cast<platform::WindowHandle>(hwnd_); }
    platform::IconHandle Icon() const override;
    std::string Caption() const override;
    void SetCaption(const std::string& caption) override;
    bool Visible() const override;
    void SetVisible(bool visible) override;
    platform::WindowState State() const override;
    void SetState(platform::WindowState state) override;
    std::int32_t Width() const override;
    std::int32_t Height() const override;
    void Move(std::int32_t left, std::int32_t top) override;

    StandInSwitch& BtnOnOff() { return btnOnOff_; }
    Win32Timer& Tmr() { return tmr_; }
    Win32Timer& Timer() { return timer_; }
    HWND Hwnd() const { return hwnd_; }

    // The registered "TaskbarCreated" message.
    UINT TaskbarCreatedMessage() const { return taskbarCreated_; }

private:
    static LRESULT CALLBACK WindowProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam);
    static LRESULT CALLBACK SwitchProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam);
    LRESULT HandleMessage(UINT message, WPARAM wParam, LPARAM lParam);

    HWND hwnd_ = nullptr;
    HICON icon_ = nullptr;
    UINT taskbarCreated_ = 0;
    MainWindowHandlers handlers_;
    StandInSwitch btnOnOff_;
    Win32Timer tmr_{1};
    Win32Timer timer_{2};
};

}  // namespace vantorel::win32
