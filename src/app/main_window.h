// FrmMain on Windows: the main window laid out in twips and scaled to its DPI (again when it moves
// to a monitor of another DPI), with the ON/OFF
// switch (a KirelXPButton in check-box behaviour whose design properties come from the window's
// property store), the "Options" and "Update" panels, the "&Tray", "&Exit", "&Help" row, the three
// status icons, the two timers, and the messages the window logic needs.
#pragma once

#include <windows.h>

#include <array>
#include <functional>
#include <memory>
#include <string>
#include <utility>

#include "controls/xpbutton/property_bag.h"
#include "platform/window.h"
#include "platform/win32/controls_win32.h"
#include "platform/win32/gdi_objects.h"
#include "platform/win32/message_window.h"
#include "controls/xpbutton/xpbutton_window_win32.h"
#include "ui/main/frm_main.h"

namespace vantorel::win32 {

class MainWindow;

// BtnOnOff as the guard sees it: the KirelXPButton's Value, Caption, BackColor and BackOver.
class XPSwitch final : public platform::Switch {
public:
    explicit XPSwitch(XPButtonWindow& window) : window_(window) {}
    bool Value() const override { return window_.button().Value(); }
    void SetValue(bool value) override { window_.button().SetValue(value); }
    std::string Caption() const override { return window_.button().Caption(); }
    void SetCaption(const std::string& caption) override { window_.button().SetCaption(caption); }
    std::uint32_t BackColor() const override { return window_.button().BackColor(); }
    void SetBackColor(std::uint32_t colour) override { window_.button().SetBackColor(colour); }
    std::uint32_t BackOver() const override { return window_.button().BackOver(); }
    void SetBackOver(std::uint32_t colour) override { window_.button().SetBackOver(colour); }
    HWND Handle() const { return window_.hwnd(); }

private:
    XPButtonWindow& window_;
};

class Win32Timer final : public platform::Timer {
public:
    explicit Win32Timer(UINT_PTR id) : id_(id) {}
    std::uint32_t Interval() const override { return interval_; }
    void SetInterval(std::uint32_t milliseconds) override;
    bool Enabled() const override { return enabled_; }
    void SetEnabled(bool enabled) override;

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
    std::function<void()> resize;
    std::function<void(std::uint32_t)> mouseMove;  // the raw low word of the position
    std::function<void()> taskbarCreated;
    std::function<void()> close;   // a close request; without a handler the window is destroyed
    std::function<void()> unload;  // the window is being destroyed
};

// The switch's design: the look, scheme and font stored for BtnOnOff in the window's design.
xpbutton::PropertyBag BtnOnOffDesign();

class MainWindow final : public platform::Window, public MessageWindow<MainWindow> {
public:
    // Design layout in twips.
    static constexpr int kClientWidth = 9120, kClientHeight = 4335;

    MainWindow();
    ~MainWindow() override;

    // Creates the window, hidden, with all its controls. False (and GetLastError set) when there is
    // no window station or display to create it on.
    bool Create(HINSTANCE instance);
    bool Create(HINSTANCE instance, MainWindowHandlers handlers) {
        handlers_ = std::move(handlers);
        return Create(instance);
    }
    // Handlers may be set after the window exists; messages before that go unhandled.
    void SetHandlers(MainWindowHandlers handlers) { handlers_ = std::move(handlers); }

    // Destroys the window (once); safe while it is already being destroyed.
    void Destroy();

    platform::WindowHandle Handle() const override { return reinterpret_cast<platform::WindowHandle>(hwnd_); }
    platform::IconHandle Icon() const override { return reinterpret_cast<platform::IconHandle>(icon_); }
    void SetIcon(platform::IconHandle icon) override;
    std::string Caption() const override;
    void SetCaption(const std::string& caption) override;
    bool Visible() const override;
    void SetVisible(bool visible) override;
    platform::WindowState State() const override;
    void SetState(platform::WindowState state) override;
    std::int32_t Width() const override;
    std::int32_t Height() const override;
    void Move(std::int32_t left, std::int32_t top) override;

    XPSwitch& BtnOnOff() { return switch_; }
    XPButtonWindow& BtnOnOffWindow() { return onOff_; }
    Win32Timer& Tmr() { return tmr_; }
    Win32Timer& Timer() { return timer_; }
    Win32Button& BtnO(int index) { return *btnO_[static_cast<std::size_t>(index)]; }
    Win32Frame& Uf(int index) { return *uf_[static_cast<std::size_t>(index)]; }
    Win32Label& L(int index) { return *l_[static_cast<std::size_t>(index)]; }
    // Lights(0) dark bulb, (1) lit bulb, (2) padlock: each the large icon; the small one goes with it.
    platform::IconHandle Lights(int index) const {
        return reinterpret_cast<platform::IconHandle>(lights_[static_cast<std::size_t>(index)].large.get());
    }
    // The picture the window shows for Lights(index), at the window's DPI.
    HICON ShownLight(int index) const { return sized_[static_cast<std::size_t>(index)].large.get(); }
    UINT Dpi() const { return dpi_; }

    // The window and its controls as the window logic takes them.
    FrmMainControls Controls();

    // The registered "TaskbarCreated" message.
    UINT TaskbarCreatedMessage() const { return taskbarCreated_; }

private:
    struct IconPair {
        UniqueHicon large;
        UniqueHicon small;
    };
    friend class MessageWindow<MainWindow>;
    LRESULT HandleMessage(UINT message, WPARAM wParam, LPARAM lParam);
    // Lays the window out for `dpi`: controls in twips, the design font and the switch's font, and
    // the window's icons at that DPI's sizes.
    void ApplyDpi(UINT dpi);
    void ShowIcon();

    bool destroying_ = false;
    UINT dpi_ = 96;
    UniqueHfont font_;
    HICON icon_ = nullptr;
    std::array<IconPair, 3> lights_{};  // what the window logic holds; the identity of each light
    std::array<IconPair, 3> sized_{};   // the same pictures at the window's DPI, as the window shows them
    HWND focus_ = nullptr;              // the control that had the focus when the window was deactivated
    UINT taskbarCreated_ = 0;
    MainWindowHandlers handlers_;
    XPButtonWindow onOff_;
    XPSwitch switch_{onOff_};
    std::array<std::unique_ptr<Win32Frame>, 2> uf_;
    std::array<std::unique_ptr<Win32Label>, 2> l_;
    std::array<std::unique_ptr<Win32Button>, 5> btnO_;
    Win32Timer tmr_{1};
    Win32Timer timer_{2};
};

}  // namespace vantorel::win32
