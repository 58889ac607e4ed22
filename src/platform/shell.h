// What the main window asks of the shell and of the program around it: opening a document or web
// page, message boxes, the options window and the end of the program.
#pragma once

#include <cstdint>
#include <string>

#include "platform/window.h"

namespace vantorel::platform {

inline constexpr std::uint32_t kMbOk = 0x00;
inline constexpr std::uint32_t kMbIconStop = 0x10;  // the critical-stop icon
inline constexpr std::uint32_t kMbIconExclamation = 0x30;
inline constexpr std::int32_t kSwShowNormal = 1;

class Shell {
public:
    Shell() = default;
    Shell(const Shell&) = delete;
    Shell& operator=(const Shell&) = delete;
    virtual ~Shell() = default;

    // ShellExecuteA(owner, operation, file, parameters, directory, show command); the shell's answer.
    virtual std::intptr_t Execute(WindowHandle owner, const std::string& operation, const std::string& file,
                                  const std::string& parameters, const std::string& directory, std::int32_t show) = 0;

    // A modal message box owned by `owner`; returns when the user has dismissed it.
    virtual void ShowMessage(WindowHandle owner, const std::string& text, const std::string& title,
                             std::uint32_t style) = 0;
};

// The program around the main window.
class Application {
public:
    Application() = default;
    Application(const Application&) = delete;
    Application& operator=(const Application&) = delete;
    virtual ~Application() = default;

    // Loads the options window with frame `frameIndex` visible (0 options, 1 updates, which also
    // gets the caption "Updates") and shows it modally owned by `owner`; returns when it has closed.
    virtual void ShowOptionsModal(WindowHandle owner, int frameIndex) = 0;

    // Ends the program: every window closes and the process exits.
    virtual void EndProgram() = 0;
};

}  // namespace vantorel::platform
