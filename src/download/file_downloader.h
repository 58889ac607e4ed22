// FileDownloader: fetches one file over HTTP into a local path and tells its host what happens
// through events.
//
// `DownloadFile` runs to its end before it returns, letting window messages run while it waits, so
// the host stays responsive and can call `Cancel`. The body arrives in chunks of at most 1024
// bytes, each written at once, with one progress event and one message pump per chunk. The data
// goes into a partial file beside the destination ("<destination>.part"), which takes the
// destination's place in one step only when the whole announced body has arrived: a download that
// fails, is refused or is cancelled leaves an existing destination exactly as it was. An answer
// that does not say how long the file is (no Content-Length, or one without a number) is refused:
// it cannot be told from a cut transfer; so is one with two different Content-Length fields. An
// announced size of 0 gives an empty file. The host may look at the complete file before it takes
// the destination's place (`CheckFile`) and refuse it. A partial file left by a program that was
// killed goes before the next download of the same file. Every problem is reported through
// `DownloadErrors`; nothing is thrown to the caller.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "platform/file_system.h"
#include "platform/http_transfer.h"
#include "platform/message_pump.h"

namespace vantorel {

class FileDownloader {
public:
    // Every wait of `transfer` ends as soon as the download is cancelled.
    FileDownloader(platform::HttpTransfer& transfer, platform::FileSystem& files, platform::MessagePump& pump)
        : transfer_(transfer), files_(files), pump_(pump) {
        transfer_.StopWaitingWhen([this] { return cancel_; });
    }
    ~FileDownloader() { transfer_.StopWaitingWhen(nullptr); }
    FileDownloader(const FileDownloader&) = delete;
    FileDownloader& operator=(const FileDownloader&) = delete;

    // Events, set by the host. Any may be left empty.
    std::function<void(const std::string& message)> DownloadErrors;
    std::function<void(const std::string& strEvent)> DownloadEvents;
    std::function<void()> DowloadComplete;
    std::function<void(const std::string& percent)> DownloadProgress;

    // Asked with the partial file's path once the whole body is in it, before it replaces the
    // destination: an empty answer lets it in; any other answer is raised through `DownloadErrors`
    // and the download ends as refused, the destination untouched. Empty: every file is let in.
    std::function<std::string(const std::string& partialPath)> CheckFile;

    // Fetches `url` into `destination` (a full local path). True when the file arrived
    // complete and the call was not cancelled.
    bool DownloadFile(const std::string& url, const std::string& destination, const std::string& userName = "",
                      const std::string& password = "");

    // Asks the running download to stop at its next check.
    void Cancel() { cancel_ = true; }

    // Where a download into `destination` keeps its data until it is complete.
    static std::string PartialPath(const std::string& destination) { return destination + ".part"; }

private:
    void Raise(const std::function<void(const std::string&)>& event, const std::string& text) {
        if (event) event(text);
    }
    // Steps from the request to the file phase; false when the download stops before the file phase.
    bool RequestPhase(const std::string& destination, std::int32_t& announced);
    void FilePhase(const std::string& destination, std::int32_t announced, std::int32_t& received);
    void RequestError(const std::string& description);
    void FileError(const platform::FileError& error);
    double DiskFreeBytes(const std::string& root);

    platform::HttpTransfer& transfer_;
    platform::FileSystem& files_;
    platform::MessagePump& pump_;
    bool cancel_ = false;
};

}  // namespace vantorel
