// The taskbar's notification area: Shell_NotifyIconA with the 8-bit record.
#pragma once

#include <cstdint>
#include <string>

#include "platform/window.h"

namespace vantorel::platform {

inline constexpr std::uint32_t kNimAdd = 0;
inline constexpr std::uint32_t kNimModify = 1;
inline constexpr std::uint32_t kNimDelete = 2;

inline constexpr std::uint32_t kNifMessage = 1;
inline constexpr std::uint32_t kNifIcon = 2;
inline constexpr std::uint32_t kNifTip = 4;

// The tip field holds 64 characters, its terminating NUL included.
inline constexpr std::size_t kTipField = 64;

// The record's fields. The record size is the platform's own (the first version of the record).
struct NotifyIconData {
    WindowHandle window = 0;
    std::uint32_t id = 0;
    std::uint32_t flags = 0;
    std::uint32_t callbackMessage = 0;
    IconHandle icon = 0;
    std::string tip;  // at most kTipField - 1 characters
};

class NotifyArea {
public:
    NotifyArea() = default;
    NotifyArea(const NotifyArea&) = delete;
    NotifyArea& operator=(const NotifyArea&) = delete;
    virtual ~NotifyArea() = default;

    // Shell_NotifyIconA(message, record): true when the shell accepted it.
    virtual bool ShellNotifyIcon(std::uint32_t message, const NotifyIconData& data) = 0;
};

}  // namespace vantorel::platform
