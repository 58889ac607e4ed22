// FrmOptions: the options window's logic. Two frames: the options (three check boxes stored in the
// registry as soon as they are toggled) and the updates (the update check runs there: FrmOptions
// owns it and its downloaders FD1 to FD3, as FrmMain owns the guard; the window is a view of it). The window
// keeps no state of its own beyond its controls; every value lives in the registry, and each step
// makes its own registry routines object. Starting with Windows is a logon task of the Task
// Scheduler (the program runs elevated, which the Run key cannot start); the Run value and "Start"
// are kept beside it as the stored state other tools read.
#pragma once

#include <array>
#include <functional>
#include <string>

#include "download/file_downloader.h"
#include "platform/file_system.h"
#include "platform/files.h"
#include "platform/http_transfer.h"
#include "platform/message_pump.h"
#include "platform/registry.h"
#include "platform/task_scheduler.h"
#include "platform/widgets.h"
#include "ui/options/update_check.h"

namespace vantorel {

inline constexpr const char* kStartTaskName = "Vantorel";

// Where the update check puts what it downloads and which program version it compares.
struct UpdateTarget {
    std::string programFolder;  // without a trailing backslash
    ProgramVersion version;
};

// What the options window's logic asks of the system.
struct OptionsPlatform {
    platform::Registry& registry;
    platform::TaskScheduler& scheduler;
    platform::MessagePump& pump;
    platform::Files& files;
    platform::FileSystem& disk;
    platform::HttpTransfer& inet;  // the version texts
    platform::HttpTransfer& fd1;   // the transfers of FD1 (definitions), FD2 (setup), FD3 (defver)
    platform::HttpTransfer& fd2;
    platform::HttpTransfer& fd3;
};

// The options window's controls, as the window declares them.
struct OptionsControls {
    std::array<platform::Frame*, 2> F{};       // 0 "Options", 1 "Updates"
    std::array<platform::CheckBox*, 3> Box{};  // start with Windows, start in the tray, script debugger
    platform::Button* BtnCancel = nullptr;     // "&Close"
    platform::Button* BtnUpdate = nullptr;     // "&Check for Updates"
    std::array<platform::Label*, 2> L{};       // definitions and program status lines
};

class FrmOptions {
public:
    // `frame` is what the update check does to the window; `target` where it installs what it
    // downloads. `executablePath`: the program's folder + "\" + its base name + ".exe", started
    // (quoted) by the logon task and written (quoted) as the autostart entry. `unload` closes the
    // window; `showMessage` tells the user why starting with Windows could not be changed.
    FrmOptions(OptionsPlatform platform, const OptionsControls& controls, UpdatesFrame& frame,
               const UpdateTarget& target, std::string executablePath, std::function<void()> unload,
               std::function<void(const std::string&)> showMessage);
    FrmOptions(const FrmOptions&) = delete;
    FrmOptions& operator=(const FrmOptions&) = delete;

    // Shows the boxes as the stored settings are in effect. Writes no value; a box click that the
    // check box raises while the load sets it is ignored.
    void Form_Load();

    // A box was toggled by the user: store its new state. When the logon task of "Boot when
    // Windows boots" cannot be registered (or removed), the box shows its old state again, nothing
    // is stored and a message names the failing call and its HRESULT.
    void Box_Click(int index);

    void BtnCancel_Click();

    // The update check of the updates frame ("&Check for Updates" runs it).
    UpdateCheck& Updates() { return check_; }

private:
    void StartWithWindows(bool checked);

    OptionsControls controls_;
    platform::Registry& registry_;
    platform::TaskScheduler& scheduler_;
    std::string executablePath_;
    std::function<void()> unload_;
    std::function<void(const std::string&)> showMessage_;
    bool loading_ = false;
    FileDownloader FD1_, FD2_, FD3_;
    UpdateCheck check_;
};

}  // namespace vantorel
