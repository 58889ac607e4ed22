// The update check of the options window's updates panel: one click on `BtnUpdate` compares the
// server's definitions version and program version with the installed ones and downloads what is
// newer into the program's folder, painting progress into `pb` and reporting in `L(0)`, `L(1)` and
// message boxes.
//
// The definitions version file "defver" is fetched only after "sw2.def" arrived complete and read
// as a definitions list: a version file that ran ahead of the definitions it describes would stop
// the next check from ever fetching them again. A new list replaces the installed one only when it
// reads as a list, and then takes effect at once through the owner's `ReloadDefinitions`.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>

#include "download/file_downloader.h"
#include "platform/files.h"
#include "platform/http_transfer.h"
#include "platform/message_pump.h"
#include "platform/picture_box.h"

namespace vantorel {

// What the check needs of the options window's controls.
class UpdatesFrame {
public:
    UpdatesFrame() = default;
    UpdatesFrame(const UpdatesFrame&) = delete;
    UpdatesFrame& operator=(const UpdatesFrame&) = delete;
    virtual ~UpdatesFrame() = default;

    virtual void SetBtnUpdateEnabled(bool enabled) = 0;
    // The caption of status label `L(index)`: 0 definitions, 1 program.
    virtual void SetLCaption(int index, const std::string& caption) = 0;
    virtual void ShowPb() = 0;
    virtual platform::PictureBox& pb() = 0;
    // A message box with an exclamation icon and an OK button.
    virtual void MsgBoxExclamation(const std::string& prompt, const std::string& title) = 0;
};

struct ProgramVersion {
    std::int32_t major = 0;
    std::int32_t minor = 0;
};

class UpdateCheck {
public:
    // `transfer` fetches the version texts; `FD1` the definitions, `FD2` the setup program, `FD3` the
    // definitions version file. `programFolder` has no trailing backslash; `server` is the web
    // server's address without a trailing slash.
    UpdateCheck(UpdatesFrame& frame, platform::HttpTransfer& transfer, platform::MessagePump& pump,
                platform::Files& files, FileDownloader& FD1, FileDownloader& FD2, FileDownloader& FD3,
                std::string programFolder, ProgramVersion version, std::string server);
    ~UpdateCheck() { transfer_.StopWaitingWhen(nullptr); }

    // Sets the downloaders' event handlers: messages and captions for FD1 and FD2, progress for all.
    void ConnectEvents();

    void BtnUpdate_Click();

    // Set by the owner: puts the newly installed "sw2.def" in force and answers how many
    // definitions are now in use, or nothing when it could not be read.
    std::function<std::optional<std::size_t>()> ReloadDefinitions;

    // The window is going away: the running check stops at its next step without touching the
    // window again (the running download stops at its next check of its cancel flag).
    void Cancel();

private:
    double LocalDefinitionsVersion();
    // The version in the server's text file at `path`; false after reporting a request that failed
    // outright.
    bool RemoteVersion(const std::string& path, double& version);
    void Progress(const std::string& percentText);

    UpdatesFrame& frame_;
    platform::HttpTransfer& transfer_;
    platform::MessagePump& pump_;
    platform::Files& files_;
    FileDownloader& FD1_;
    FileDownloader& FD2_;
    FileDownloader& FD3_;
    std::string folder_;
    ProgramVersion version_;
    std::string server_;
    bool cancelled_ = false;
};

}  // namespace vantorel
