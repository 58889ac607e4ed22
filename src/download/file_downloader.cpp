#include "download/file_downloader.h"

#include <cmath>
#include <memory>

#include "download/leading_number.h"
#include "platform/http_header.h"

namespace vantorel {
namespace {

constexpr std::size_t kChunkSize = 1024;

// The part after the last separator (`wantFile`) or the part up to and including it; a path
// without the separator comes back whole. The separator is "/" for addresses and "\" for paths.
std::string SplitPath(const std::string& path, bool wantFile, bool isAddress) {
    std::size_t last = path.rfind(isAddress ? '/' : '\\');
    if (last == std::string::npos) return path;
    return wantFile ? path.substr(last + 1) : path.substr(0, last + 1);
}

// True when `text` opens (after blanks) with a number: a size field that says something.
bool HoldsNumber(const std::string& text) {
    std::size_t i = text.find_first_not_of(" \t");
    if (i == std::string::npos) return false;
    if (text[i] == '+' || text[i] == '-') ++i;
    if (i < text.size() && text[i] == '.') ++i;
    return i < text.size() && text[i] >= '0' && text[i] <= '9';
}

std::string WithTrailingBackslash(const std::string& path) {
    return !path.empty() && path.back() == '\\' ? path : path + "\\";
}

}  // namespace

double FileDownloader::DiskFreeBytes(const std::string& root) {
    std::uint32_t bytesPerSector = 0, sectorsPerCluster = 0, freeClusters = 0;
    files_.QueryDiskFreeSpace(WithTrailingBackslash(root), bytesPerSector, sectorsPerCluster, freeClusters);
    return static_cast<double>(bytesPerSector) * sectorsPerCluster * freeClusters;
}

void FileDownloader::RequestError(const std::string& description) {
    Raise(DownloadErrors, "Error: " + description + " occurred.");
    cancel_ = true;
}

void FileDownloader::FileError(const platform::FileError& error) {
    Raise(DownloadErrors,
          "Cannot write file to disk.\r\rError " + std::to_string(error.number) + ": " + error.description);
    cancel_ = true;
}

bool FileDownloader::RequestPhase(const std::string& destination, std::int32_t& announced) {
    platform::TransferError error;
    // The range always starts at 0: nothing has been received when a download starts.
    if (!transfer_.ExecuteGet("Range: bytes=" + std::to_string(0) + "-\r\n", error)) {
        RequestError(error.description);
        return false;
    }
    while (transfer_.StillExecuting()) {
        if (!pump_.YieldToMessages()) cancel_ = true;  // the program is quitting
        if (cancel_) return false;
    }

    std::string header;
    if (!transfer_.GetHeader(header, error)) {
        RequestError(error.description);
        return false;
    }
    const std::string status = header.size() > 9 ? header.substr(9, 3) : std::string();
    if (status != "200" && status != "206") {
        if (status == "204") {
            Raise(DownloadErrors, "Nothing to download!");
        } else if (status == "401") {
            Raise(DownloadErrors, "Authorization failed!");
        } else if (status == "404") {
            Raise(DownloadErrors, "The file, \"" + transfer_.URL() + "\" was not found!");
        } else if (status == "\r\n") {
            Raise(DownloadErrors, "Cannot establish connection.");
        } else {
            std::size_t cr = header.find('\r');
            std::string first = cr == std::string::npos ? std::string() : header.substr(0, cr + 1);
            if (first.empty()) first = "<nothing>";
            Raise(DownloadErrors, "The server returned the following response:\r\r" + first);
        }
        cancel_ = true;
        return false;
    }

    std::string length;
    if (!transfer_.GetHeader("Content-Length", length, error)) {
        RequestError(error.description);
        return false;
    }
    // Two different sizes in one answer: either could be the lie, so neither is believed.
    for (std::size_t at = header.find('\n'); at != std::string::npos; at = header.find('\n', at + 1)) {
        std::string other = platform::HeaderField(header.substr(at), "Content-Length");
        if (!other.empty() && other != length) {
            RequestError("Invalid size (the server announced both " + length + " and " + other + " bytes)");
            return false;
        }
    }
    // Without a size there is no telling a whole file from a cut one: such an answer is refused
    // rather than counted as complete with nothing written.
    if (!HoldsNumber(length)) {
        RequestError(length.empty() ? "Missing size (the server did not say how long the file is)"
                                    : "Invalid size (the server announced \"" + length + "\" bytes)");
        return false;
    }
    std::int32_t size = 0;
    if (!RoundToInt32(LeadingNumber(length), size)) {
        RequestError("Overflow (the server announced " + length + " bytes, more than a download can take)");
        return false;
    }
    if (size < 0) {
        RequestError("Invalid size (the server announced " + length + " bytes)");
        return false;
    }
    announced = size;

    if (destination.size() >= 3 && destination.compare(1, 2, ":\\") == 0) {
        std::string root = destination.substr(0, destination.find('\\') + 1);
        if (announced > DiskFreeBytes(root)) {
            Raise(DownloadErrors, "There is not enough free space on disk for this file.");
            cancel_ = true;
            return false;
        }
    }
    pump_.YieldToMessages();
    return true;
}

void FileDownloader::FilePhase(const std::string& destination, std::int32_t announced, std::int32_t& received) {
    platform::FileError fileError;
    received = 0;

    // A destination given without a folder has no folder to create.
    if (destination.find('\\') != std::string::npos) {
        std::string folder = SplitPath(destination, false, false);
        if (!files_.FolderExists(folder) && !files_.CreateFolder(folder, fileError)) {
            FileError(fileError);
            return;
        }
    }

    const std::string partial = PartialPath(destination);
    std::unique_ptr<platform::FileWriter> file = files_.CreateNew(partial, fileError);
    if (!file) {
        FileError(fileError);
        return;
    }

    std::string buffer;
    bool failed = false;
    // An announced size of 0 is an empty file: nothing to read.
    for (bool more = announced > 0; more;) {
        platform::TransferError readError;
        if (!transfer_.GetChunk(kChunkSize, buffer, readError)) {
            if (!cancel_) FileError({readError.number, readError.description});
            failed = true;
            break;
        }
        // Nothing beyond the announced size is ever written: the server is not to be trusted with
        // the disk.
        if (static_cast<std::int64_t>(received) + static_cast<std::int64_t>(buffer.size()) > announced) {
            if (!cancel_) {
                Raise(DownloadErrors,
                      "The server sent more than the " + std::to_string(announced) + " bytes it announced.");
            }
            cancel_ = true;
            failed = true;
            break;
        }
        if (!file->Write(buffer, fileError)) {
            FileError(fileError);
            failed = true;
            break;
        }
        if (cancel_) break;
        received += static_cast<std::int32_t>(buffer.size());
        double percent = std::nearbyint(static_cast<double>(received) / announced * 100.0);
        Raise(DownloadProgress, std::to_string(static_cast<long long>(percent)));
        if (!pump_.YieldToMessages()) cancel_ = true;  // the program is quitting
        more = buffer.size() > 1;
    }

    // After a failure or a cancel the partial file goes anyway: a failing close adds nothing to say.
    if (!file->Close(fileError) && !failed && !cancel_) FileError(fileError);
    file.reset();
    if (cancel_ || received != announced) return;
    std::string refusal = CheckFile ? CheckFile(partial) : std::string();
    if (!refusal.empty()) {
        Raise(DownloadErrors, refusal);
        cancel_ = true;
    } else if (!files_.Replace(partial, destination, fileError)) {
        FileError(fileError);
    }
}

bool FileDownloader::DownloadFile(const std::string& url, const std::string& destination, const std::string& userName,
                                  const std::string& password) {
    cancel_ = false;
    std::int32_t received = 0;
    std::int32_t announced = 0;

    // What a killed program left behind is no part of this download.
    const std::string partial = PartialPath(destination);
    if (files_.FileExists(partial)) files_.Delete(partial);

    Raise(DownloadEvents, "Getting file information");
    pump_.YieldToMessages();
    transfer_.SetURL(url);
    transfer_.SetUserName(userName);
    transfer_.SetPassword(password);

    if (RequestPhase(destination, announced)) FilePhase(destination, announced, received);

    // Finish: the destination was replaced only if the download completed; whatever is left of the
    // partial file goes.
    bool result = false;
    if (received == announced) {
        if (!cancel_) {
            if (DowloadComplete) DowloadComplete();
        }
        result = !cancel_;
    } else {
        if (!files_.FileExists(partial)) {
            cancel_ = true;
        } else if (!cancel_) {
            Raise(DownloadErrors, "The connection with the server was reset.");
        }
    }
    if (files_.FileExists(partial)) files_.Delete(partial);
    transfer_.Cancel();
    return result;
}

}  // namespace vantorel
