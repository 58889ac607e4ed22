#include "ui/options/update_check.h"

#include <algorithm>
#include <utility>

#include "download/leading_number.h"
#include "download/open_url.h"
#include "guard/definitions_check.h"
#include "ui/options/draw_progress.h"

namespace vantorel {
namespace {

const char* const kTitle = "Updates";

}  // namespace

UpdateCheck::UpdateCheck(UpdatesFrame& frame, platform::HttpTransfer& transfer, platform::MessagePump& pump,
                         platform::Files& files, FileDownloader& FD1, FileDownloader& FD2, FileDownloader& FD3,
                         std::string programFolder, ProgramVersion version, std::string server)
    : frame_(frame),
      transfer_(transfer),
      pump_(pump),
      files_(files),
      FD1_(FD1),
      FD2_(FD2),
      FD3_(FD3),
      folder_(std::move(programFolder)),
      version_(version),
      server_(std::move(server)) {
    transfer_.StopWaitingWhen([this] { return cancelled_; });
}

void UpdateCheck::ConnectEvents() {
    FD1_.DownloadErrors = [this](const std::string& message) {
        if (!cancelled_) frame_.MsgBoxExclamation("Error downloading definition updates " + message, kTitle);
    };
    FD1_.DowloadComplete = [this] { frame_.SetLCaption(0, "Definitions Updates: Complete"); };
    FD1_.CheckFile = [this](const std::string& partialPath) -> std::string {
        std::string text;
        if (!files_.ReadAll(partialPath, text)) return "The downloaded file could not be read back.";
        std::string problem = DefinitionsListProblem(text);
        if (problem.empty()) return std::string();
        return "The downloaded file is not a definitions list (" + problem + "). The installed definitions are kept.";
    };
    FD2_.DownloadErrors = [this](const std::string& message) {
        if (!cancelled_) frame_.MsgBoxExclamation("Error downloading program updates " + message, kTitle);
    };
    FD2_.DowloadComplete = [this] { frame_.SetLCaption(1, "Program Updates: Complete"); };
    FD2_.CheckFile = [this](const std::string& partialPath) -> std::string {
        std::string text;
        if (files_.ReadAll(partialPath, text) && text.empty()) return "The downloaded setup program is empty.";
        return std::string();
    };
    FD3_.DownloadErrors = nullptr;
    FD3_.DowloadComplete = nullptr;
    for (FileDownloader* fd : {&FD1_, &FD2_, &FD3_}) {
        fd->DownloadEvents = nullptr;
        fd->DownloadProgress = [this](const std::string& percent) { Progress(percent); };
    }
}

void UpdateCheck::Progress(const std::string& percentText) {
    if (cancelled_) return;
    std::int32_t percent = 0;
    if (!RoundToInt32(LeadingNumber(percentText), percent)) return;
    percent = std::clamp<std::int32_t>(percent, -32768, 32767);
    DrawProgress(frame_.pb(), static_cast<std::int16_t>(percent), kProgressForeColor, kProgressBackColor);
}

double UpdateCheck::LocalDefinitionsVersion() {
    const std::string path = folder_ + "\\defver";
    std::string content;
    if (!files_.ReadAll(path, content)) {
        if (!files_.Exists(path)) frame_.SetLCaption(0, "Definitions Updates: defver has been corrupted");
        return 0;
    }
    if (content.empty()) {
        frame_.SetLCaption(0, "Definitions Updates: defver has been corrupted");
        return 0;
    }
    return LeadingNumber(content.substr(0, content.find_first_of("\r\n")));
}

bool UpdateCheck::RemoteVersion(const std::string& path, double& version) {
    std::string text;
    platform::TransferError error;
    if (!OpenURL(transfer_, pump_, server_ + path, text, error)) {
        if (cancelled_) return false;
        frame_.MsgBoxExclamation(
            "Cannot check for updates: the update server " + server_ + " could not be reached.\r\r" + error.description,
            kTitle);
        return false;
    }
    version = LeadingNumber(text);
    return true;
}

void UpdateCheck::Cancel() {
    cancelled_ = true;
    FD1_.Cancel();
    FD2_.Cancel();
    FD3_.Cancel();
}

void UpdateCheck::BtnUpdate_Click() {
    cancelled_ = false;
    frame_.SetBtnUpdateEnabled(false);

    const double localDefinitions = LocalDefinitionsVersion();
    double remote = 0;
    if (!RemoteVersion("/vt/defver", remote)) {
        if (!cancelled_) frame_.SetBtnUpdateEnabled(true);
        return;
    }
    if (cancelled_) return;
    if (remote <= localDefinitions) {
        frame_.SetLCaption(0, "Definitions Updates: No Updates");
    } else {
        frame_.ShowPb();
        if (FD1_.DownloadFile(server_ + "/vt/sw2.def", folder_ + "\\sw2.def") && !cancelled_) {
            std::optional<std::size_t> inUse = ReloadDefinitions ? ReloadDefinitions() : std::nullopt;
            if (inUse && !cancelled_) {
                frame_.SetLCaption(0,
                                   "Definitions Updates: Complete, " + std::to_string(*inUse) + " definitions in use");
            }
            FD3_.DownloadFile(server_ + "/vt/defver", folder_ + "\\defver");
        }
        if (cancelled_) return;
    }

    const double localProgram = LeadingNumber(std::to_string(version_.major) + "." + std::to_string(version_.minor));
    if (!RemoteVersion("/vt/mainver", remote)) {
        if (!cancelled_) frame_.SetBtnUpdateEnabled(true);
        return;
    }
    if (cancelled_) return;
    if (remote <= localProgram) {
        frame_.SetLCaption(1, "Program Updates: No Updates");
    } else {
        frame_.ShowPb();
        FD2_.DownloadFile(server_ + "/vt/VTSetup.exe", folder_ + "\\VTSetup.exe");
        if (cancelled_) return;
    }

    frame_.SetBtnUpdateEnabled(true);
}

}  // namespace vantorel
