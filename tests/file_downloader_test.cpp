// The downloader against a scripted transfer and an in-memory disk, for what the loopback server
// under Wine (tests/win32/download_win32_test.cpp) cannot stage: answers without a status line, a
// body longer than announced, a full or failing disk, a share path, and a cancel after the last
// byte. Whatever happens, a download that does not complete leaves the installed file.
#include "download/file_downloader.h"

#include <gtest/gtest.h>


#include "fakes/fake_file_system.h"
#include "fakes/fake_http_transfer.h"
#include "fakes/fake_message_pump.h"

namespace vantorel {
namespace {

using testing::FakeFileSystem;
using testing::FakeHttpTransfer;
using testing::FakePump;
using Events = std::vector<std::string>;
using Files = std::map<std::string, std::string>;

const std::string kUrl = "http://127.0.0.1:8080/vt/sw2.def";
const std::string kDest = "C:\\Vantorel\\sw2.def";
const std::string kOld = "old definitions\r\n";

// One downloader with its fakes, recording every event as "kind:text" in order.
struct Rig {
    FakeHttpTransfer inet;
    FakeFileSystem disk;
    FakePump pump;
    FileDownloader fd{inet, disk, pump};
    Events events;

    explicit Rig(std::size_t size = 5000, const std::string& length = "") {
        disk.files[kDest] = kOld;
        inet.Respond("HTTP/1.1 200 OK", "Content-Length: " + (length.empty() ? std::to_string(size) : length) + "\r\n",
                     size);
        fd.DownloadErrors = [this](const std::string& s) { events.push_back("error:" + s); };
        fd.DownloadEvents = [this](const std::string& s) { events.push_back("event:" + s); };
        fd.DowloadComplete = [this] { events.push_back("complete"); };
        fd.DownloadProgress = [this](const std::string& s) { events.push_back("progress:" + s); };
    }
    Events Run(const std::string& dest = kDest) {
        bool done = fd.DownloadFile(kUrl, dest, "user", "secret");
        EXPECT_EQ(done, !events.empty() && events.back() == "complete");
        return events;
    }
    bool Untouched() const { return disk.files == Files{{kDest, kOld}}; }
};

TEST(FileDownloader, AnswersThatCannotBeTrustedAreRefusedBeforeAnythingIsWritten) {
    const std::pair<std::string, std::string> cases[] = {
        {"HTTP/1.1 \r\n", "error:Cannot establish connection."},
        {"", "error:The server returned the following response:\r\r<nothing>"},
        {"garbage without a line end", "error:The server returned the following response:\r\r<nothing>"},
    };
    for (const auto& [header, error] : cases) {
        Rig rig;
        rig.inet.header = header;
        EXPECT_EQ(rig.Run(), (Events{"event:Getting file information", error})) << header;
        EXPECT_TRUE(rig.Untouched()) << header;
    }
    // The largest that fits passes on to the space check.
    Rig largest(0, "2147483647");
    largest.disk.freeClusters = 1;
    EXPECT_EQ(largest.Run().back(), "error:There is not enough free space on disk for this file.");
    // A body longer than announced: the chunk that would pass the size is not written.
    Rig longer(5000, "2000");
    EXPECT_EQ(longer.Run().back(), "error:The server sent more than the 2000 bytes it announced.");
    EXPECT_TRUE(longer.Untouched());
}

TEST(FileDownloader, FreeSpaceIsCheckedOnDriveLetterPathsOnly) {
    Rig rig;
    rig.disk.bytesPerSector = 1000;
    rig.disk.sectorsPerCluster = 1;
    rig.disk.freeClusters = 4;
    EXPECT_EQ(rig.Run().back(), "error:There is not enough free space on disk for this file.");
    EXPECT_EQ(rig.disk.lastFreeSpaceRoot, "C:\\");
    EXPECT_TRUE(rig.Untouched());
    rig.disk.freeClusters = 5;  // exactly the announced size: enough
    EXPECT_EQ(rig.Run().back(), "complete");

    Rig share;  // a share has no drive to ask about
    share.disk.freeClusters = 0;
    share.disk.folders.insert("\\\\server\\share");
    EXPECT_EQ(share.Run("\\\\server\\share\\sw2.def").back(), "complete");
}

TEST(FileDownloader, FileErrorsAreReportedAndLeaveOnlyTheInstalledFile) {
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
        EXPECT_EQ(rig.Run().back(), "error:Cannot write file to disk.\r\rError " + std::to_string(error.number) + ": " +
                                        error.description);
        EXPECT_TRUE(rig.Untouched()) << error.description;
    }
    // A missing folder is created one level deep (proved under Wine); two missing levels cannot be opened.
    Rig deep;
    EXPECT_EQ(deep.Run("C:\\Vantorel\\A\\B\\sw2.def").back(),
              "error:Cannot write file to disk.\r\rError 3: The system cannot find the path specified.");
    EXPECT_TRUE(deep.Untouched());
}

TEST(FileDownloader, ACancelAfterTheLastByteStillCompletesNothingAndTheNextCallRuns) {
    Rig late(2048);
    late.fd.DownloadProgress = [&](const std::string& p) {
        late.events.push_back("progress:" + p);
        if (late.events.size() == 4) late.fd.Cancel();  // the second "100": the empty closing chunk
    };
    EXPECT_EQ(late.Run(), (Events{"event:Getting file information", "progress:50", "progress:100", "progress:100"}));
    EXPECT_TRUE(late.Untouched());
    late.fd.DownloadProgress = nullptr;
    EXPECT_EQ(late.Run().back(), "complete");
    EXPECT_EQ(late.disk.files[kDest], FakeHttpTransfer::Body(2048));
}

}  // namespace
}  // namespace vantorel
