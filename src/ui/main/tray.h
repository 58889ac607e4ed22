// The main window's icon in the notification area (the routines of mFunctions), the decoding of the
// icon's mouse notifications, and BringToFront.
//
// The icon reports its mouse events to the main window as the mouse-move message (512) with the
// event code in the low word of the message's position; the window hands that low word to
// TrayMouseNotification.
#pragma once

#include <cstdint>
#include <string>

#include "platform/notify_area.h"
#include "platform/window.h"

namespace vantorel {

inline constexpr std::uint32_t kTrayIconId = 1;
inline constexpr std::uint32_t kTrayFlags = platform::kNifMessage | platform::kNifIcon | platform::kNifTip;  // 7
inline constexpr std::uint32_t kTrayCallbackMessage = 512;  // the window's mouse-move message
inline constexpr std::uint32_t kBringToFrontFlags =
    platform::kSwpNoSize | platform::kSwpNoMove | platform::kSwpNoActivate | platform::kSwpShowWindow;  // 0x53

// The tip as the record holds it: cut to the field, so at most 63 characters before the NUL.
std::string TrayTip(const std::string& tip);

// Adds the icon (id 1, flags 7) with `icon` as its picture.
void AddTrayIcon(platform::NotifyArea& tray, const platform::Window& window, platform::IconHandle icon,
                 const std::string& tip, std::uint32_t callbackMessage);

// Changes the icon's tip; its picture becomes the window's current icon.
void ModifyTrayIcon(platform::NotifyArea& tray, const platform::Window& window, const std::string& tip,
                    std::uint32_t callbackMessage);

// Removes the icon (only the window and the id matter to the shell).
void RemoveTrayIcon(platform::NotifyArea& tray, const platform::Window& window);

// Raises `window` to the top of the ordinary windows without activating it and without leaving it
// on top: topmost, let pending messages run, not topmost.
void BringToFront(platform::WindowManager& windows, platform::MessagePump& pump, platform::WindowHandle window);

// The mouse-move handler's part for the icon. `code` is the raw low word of the message's position.
// Any press, release or double click raises the window; a window that was hidden then comes back in
// its normal state. A plain move (512) does nothing.
void TrayMouseNotification(platform::Window& window, platform::WindowManager& windows, platform::MessagePump& pump,
                           std::uint32_t code);

}  // namespace vantorel
