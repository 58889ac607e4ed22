// The downloader against a scripted transfer and an in-memory disk, for what the loopback server
// under Wine (tests/win32/download_win32_test.cpp) cannot stage: answers without a status code, a
// body longer than announced, the free space of a drive, and disk calls that fail. The fuzz target
// (tests/fuzz/downloader.cpp) holds every other script to the same rule: a download that does not
// complete leaves the installed file and nothing else.
#include "download/file_downloader.h"

#include <gtest/gtest.h>

#include "fakes/fake_file_system.h"
#include "fakes/fake_http_transfer.h"
#include "fakes/fake_message_pump.h"

namespace vantorel {
namespace {

using testing::FakeFileSystem;

const std::string kDest = "C:\\Vantorel\\sw2.def";
const std::string kOld = "old definitions\r\n";

// One downloader with its fakes: an answer of `size` bytes announced as `length`, over an installed file.
struct Rig {
    testing::FakeHttpTransfer inet;
    FakeFileSystem disk;
    testing::FakePump pump;
    FileDownloader fd{inet, disk, pump};
    std::string said;

    explicit Rig(std::size_t size = 5000, const std::string& length = "") {
        disk.files[kDest] = kOld;
        inet.header =
            "HTTP/1.1 200 OK\r\nContent-Length: " + (length.empty() ? std::to_string(size) : length) + "\r\n\r\n";
        inet.body = testing::FakeHttpTransfer::Body(size);
        fd.DownloadErrors = [this](const std::string& s) { said += s; };
        fd.DowloadComplete = [this] { said += "complete"; };
    }
    // What the download said; one that failed must have left the installed file alone.
    std::string Run(const std::string& dest = kDest) {
        said.clear();
        if (!fd.DownloadFile("http://127.0.0.1/vt/sw2.def", dest)) {
            EXPECT_EQ(disk.files, (std::map<std::string, std::string>{{kDest, kOld}})) << said;
        }
        return said;
    }
};

TEST(FileDownloader, AnswersThatCannotBeTrustedAreRefused) {
    Rig noCode;
    noCode.inet.header = "HTTP/1.1 \r\n";
    EXPECT_EQ(noCode.Run(), "Cannot establish connection.");
    Rig noStatusLine;
    noStatusLine.inet.header = "garbage without a line end";
    EXPECT_EQ(noStatusLine.Run(), "The server returned the following response:\r\r<nothing>");
    Rig longer(5000, "2000");  // the chunk that would pass the size is not written
    EXPECT_EQ(longer.Run(), "The server sent more than the 2000 bytes it announced.");
}

TEST(FileDownloader, FreeSpaceIsCheckedOnDriveLetterPathsOnly) {
    Rig rig(4096);  // 4096 bytes a cluster
    rig.disk.freeClusters = 0;
    EXPECT_EQ(rig.Run(), "There is not enough free space on disk for this file.");
    rig.disk.freeClusters = 1;  // exactly the announced size: enough
    EXPECT_EQ(rig.Run(), "complete");

    Rig share;  // a share has no drive to ask about
    share.disk.freeClusters = 0;
    share.disk.folders.insert("\\\\server\\share");
    EXPECT_EQ(share.Run("\\\\server\\share\\sw2.def"), "complete");
}

TEST(FileDownloader, FailingDiskCallsAreReported) {
    // Each disk call failing in turn, then the connection failing mid-body (both at 2 KiB).
    const std::pair<std::optional<platform::FileError> FakeFileSystem::*, platform::FileError> cases[] = {
        {&FakeFileSystem::createFails, {5, "Access is denied."}},
        {&FakeFileSystem::writeFails, {112, "There is not enough space on the disk."}},
        {&FakeFileSystem::closeFails, {112, "Flush failed."}},
        {&FakeFileSystem::replaceFails, {32, "In use."}},
        {nullptr, {12030, "The connection was aborted."}},
    };
    for (const auto& [diskCall, error] : cases) {
        Rig rig;
        rig.disk.writeFailsAt = rig.inet.chunkFailsAt = 2048;
        if (diskCall != nullptr) rig.disk.*diskCall = error;
        else rig.inet.chunkFails = platform::TransferError{error.number, error.description};
        EXPECT_EQ(rig.Run(),
                  "Cannot write file to disk.\r\rError " + std::to_string(error.number) + ": " + error.description);
    }
}

}  // namespace
}  // namespace vantorel
