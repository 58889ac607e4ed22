#include "ui/main/tray.h"

namespace vantorel {

std::string TrayTip(const std::string& tip) { return tip.substr(0, platform::kTipField - 1); }

void AddTrayIcon(platform::NotifyArea& tray, const platform::Window& window, platform::IconHandle icon,
                 const std::string& tip, std::uint32_t callbackMessage) {
    platform::NotifyIconData data;
    data.window = window.Handle();
    data.id = kTrayIconId;
    data.flags = kTrayFlags;
    data.callbackMessage = callbackMessage;
    data.icon = icon;
    data.tip = TrayTip(tip);
    tray.ShellNotifyIcon(platform::kNimAdd, data);
}

void ModifyTrayIcon(platform::NotifyArea& tray, const platform::Window& window, const std::string& tip,
                    std::uint32_t callbackMessage) {
    platform::NotifyIconData data;
    data.window = window.Handle();
    data.id = kTrayIconId;
    data.flags = kTrayFlags;
    data.callbackMessage = callbackMessage;
    data.icon = window.Icon();
    data.tip = TrayTip(tip);
    tray.ShellNotifyIcon(platform::kNimModify, data);
}

void RemoveTrayIcon(platform::NotifyArea& tray, const platform::Window& window) {
    platform::NotifyIconData data;
    data.window = window.Handle();
    data.id = kTrayIconId;
    data.flags = kTrayFlags;
    data.callbackMessage = 1;
    data.icon = 1;
    tray.ShellNotifyIcon(platform::kNimDelete, data);
}

void BringToFront(platform::WindowManager& windows, platform::MessagePump& pump, platform::WindowHandle window) {
    windows.SetWindowPos(window, platform::kHwndTopmost, 0, 0, 0, 0, kBringToFrontFlags);
    pump.PumpMessages();
    windows.SetWindowPos(window, platform::kHwndNoTopmost, 0, 0, 0, 0, kBringToFrontFlags);
}

void TrayMouseNotification(platform::Window& window, platform::WindowManager& windows, platform::MessagePump& pump,
                           std::uint32_t code) {
    if (code == kTrayCallbackMessage) return;
    // Raising shows the window too (the flags include show), so whether it was hidden is taken
    // first: a window hidden by minimising must still come back in its normal state.
    bool wasHidden = !window.Visible();
    BringToFront(windows, pump, window.Handle());
    if (wasHidden) {
        window.SetState(platform::WindowState::Normal);
        window.SetVisible(true);
    }
}

}  // namespace vantorel
