// The downloader against a scripted transfer, an in-memory disk and a counting message pump: the
// events and their order, the refusals, the size and space checks, cancellation, and that a
// download that does not complete never touches the installed file.
#include "download/file_downloader.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "fakes/fake_file_system.h"
#include "fakes/fake_http_transfer.h"
#include "fakes/fake_message_pump.h"

namespace vantorel {
namespace {

using testing::FakeFileSystem;
using testing::FakeHttpTransfer;
using testing::FakeMessagePump;

const std::string kUrl = "http://127.0.0.1:8080/vt/sw2.def";
const std::string kDest = "C:\\Vantorel\\sw2.def";
const std::string kPartial = "C:\\Vantorel\\sw2.def.part";
const std::string kOld = "old definitions\r\n";

// One downloader with its fakes, recording every event as "kind:text" in order.
struct Rig {
    FakeHttpTransfer inet;
    FakeFileSystem disk;
    FakeMessagePump pump;
    FileDownloader fd{inet, disk, pump};
    std::vector<std::string> events;

    Rig() {
        disk.files[kDest] = kOld;
        fd.DownloadErrors = [this](const std::string& s) { events.push_back("error:" + s); };
        fd.DownloadEvents = [this](const std::string& s) { events.push_back("event:" + s); };
        fd.DowloadComplete = [this] { events.push_back("complete"); };
        fd.DownloadProgress = [this](const std::string& s) { events.push_back("progress:" + s); };
    }
    bool Run(const std::string& dest = kDest) { return fd.DownloadFile(kUrl, dest); }
    std::vector<std::string> Without(const std::string& prefix) const {
        std::vector<std::string> rest;
        for (const auto& e : events)
            if (e.rfind(prefix, 0) != 0) rest.push_back(e);
        return rest;
    }
};

using Events = std::vector<std::string>;

TEST(FileDownloader, CompleteBodyGivesOneProgressEventPerChunkAndReplacesTheFile) {
    for (const char* status : {"HTTP/1.1 206 Partial Content", "HTTP/1.1 200 OK"}) {
        SCOPED_TRACE(status);
        Rig rig;
        rig.inet.Respond(status, "Content-Length: 5000\r\n", 5000);
        rig.inet.pollsUntilDone = 3;
        // While data arrives, the installed file is still the old one and the data goes beside it.
        std::string seenAt82;
        rig.fd.DownloadProgress = [&](const std::string& p) {
            rig.events.push_back("progress:" + p);
            if (p == "82") seenAt82 = rig.disk.files[kDest] + "|" + std::to_string(rig.disk.files[kPartial].size());
        };
        EXPECT_TRUE(rig.fd.DownloadFile(kUrl, kDest, "user", "secret"));
        EXPECT_EQ(rig.events, (Events{"event:Getting file information", "progress:20", "progress:41", "progress:61",
                                      "progress:82", "progress:100", "progress:100", "complete"}));
        EXPECT_EQ(seenAt82, kOld + "|4096");
        EXPECT_EQ(rig.disk.files[kDest], FakeHttpTransfer::Body(5000));
        EXPECT_EQ(rig.disk.files.count(kPartial), 0u);
        EXPECT_EQ(rig.inet.url, kUrl);
        EXPECT_EQ(rig.inet.userName, "user");
        EXPECT_EQ(rig.inet.password, "secret");
        EXPECT_EQ(rig.inet.requestHeader, "Range: bytes=0-\r\n");
        EXPECT_EQ(rig.inet.chunkSizesAsked, (std::vector<std::size_t>(6, 1024)));
        EXPECT_EQ(rig.disk.writes, 6) << "each chunk is written at once";
        EXPECT_EQ(rig.inet.cancels, 1) << "the finish step always ends the transfer";
        EXPECT_EQ(rig.inet.polls, 4);
        // Step 2, three polls of the wait, step 10, one per chunk.
        EXPECT_EQ(rig.pump.pumps, 1 + 3 + 1 + 6);
    }
}

TEST(FileDownloader, ShortAndOddBodiesEndOnTheFirstChunkOfOneByteOrLess) {
    struct Case {
        std::size_t size;
        Events progress;
    };
    for (const Case& c : {Case{1, {"progress:100"}}, Case{1024, {"progress:100", "progress:100"}},
                          Case{1025, {"progress:100", "progress:100"}}, Case{2047, {"progress:50", "progress:100", "progress:100"}}}) {
        SCOPED_TRACE(c.size);
        Rig rig;
        rig.inet.Respond("HTTP/1.1 200 OK", "Content-Length: " + std::to_string(c.size) + "\r\n", c.size);
        EXPECT_TRUE(rig.Run());
        Events expected = c.progress;
        expected.push_back("complete");
        EXPECT_EQ(rig.Without("event:"), expected);
        EXPECT_EQ(rig.disk.files[kDest], FakeHttpTransfer::Body(c.size));
    }
}

TEST(FileDownloader, RefusedRequestsReportTheirMessageAndLeaveTheInstalledFileAlone) {
    struct Case {
        std::string header, message;
    };
    const std::vector<Case> cases = {
        {"HTTP/1.1 204 No Content\r\n\r\n", "Nothing to download!"},
        {"HTTP/1.1 401 Unauthorized\r\nContent-Length: 10\r\n\r\n", "Authorization failed!"},
        {"HTTP/1.1 404 Not Found\r\nContent-Length: 10\r\n\r\n", "The file, \"" + kUrl + "\" was not found!"},
        {"HTTP/1.1 \r\n", "Cannot establish connection."},
        {"HTTP/1.1 500 Internal Server Error\r\nContent-Length: 10\r\n\r\n",
         "The server returned the following response:\r\rHTTP/1.1 500 Internal Server Error\r"},
        {"", "The server returned the following response:\r\r<nothing>"},
        {"garbage without a line end", "The server returned the following response:\r\r<nothing>"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.message);
        Rig rig;
        rig.inet.header = c.header;
        rig.inet.body = FakeHttpTransfer::Body(10);
        EXPECT_FALSE(rig.Run());
        EXPECT_EQ(rig.events, (Events{"event:Getting file information", "error:" + c.message}));
        EXPECT_EQ(rig.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
        EXPECT_EQ(rig.inet.chunkCalls, 0);
        EXPECT_EQ(rig.inet.cancels, 1);
    }
}

TEST(FileDownloader, AnswerWithoutAUsableSizeIsRefusedNotCountedAsComplete) {
    // Without a size a cut transfer cannot be told from a whole one: "Complete" with nothing
    // written would report a failure as a success.
    const std::pair<const char*, const char*> cases[] = {
        {"", "error:Error: Missing size (the server did not say how long the file is) occurred."},
        {"Content-Length: abc\r\n", "error:Error: Invalid size (the server announced \"abc\" bytes) occurred."},
        {"Content-Length: \r\n", "error:Error: Missing size (the server did not say how long the file is) occurred."},
    };
    for (const auto& [fields, message] : cases) {
        SCOPED_TRACE(fields);
        Rig rig;
        rig.inet.Respond("HTTP/1.1 200 OK", fields, 3000);
        EXPECT_FALSE(rig.Run());
        EXPECT_EQ(rig.Without("event:"), (Events{message}));
        EXPECT_EQ(rig.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
        EXPECT_EQ(rig.inet.chunkCalls, 0);
        EXPECT_EQ(rig.inet.cancels, 1);
    }

    // An announced size of 0 is an empty file, not a "Complete" that leaves the old file in place.
    Rig empty;
    empty.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 0\r\n", 0);
    EXPECT_TRUE(empty.Run());
    EXPECT_EQ(empty.Without("event:"), (Events{"complete"}));
    EXPECT_EQ(empty.disk.files, (std::map<std::string, std::string>{{kDest, ""}}));
}

TEST(FileDownloader, ConnectionResetAfterThreeChunksKeepsTheOldFileAndLeavesNothingBehind) {
    Rig rig;
    rig.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 5000\r\n", 5000);
    rig.inet.deliverOnly = 3072;
    EXPECT_FALSE(rig.Run());
    EXPECT_EQ(rig.Without("event:"), (Events{"progress:20", "progress:41", "progress:61", "progress:61",
                                              "error:The connection with the server was reset."}));
    EXPECT_EQ(rig.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
    EXPECT_EQ(rig.inet.cancels, 1);
}

TEST(FileDownloader, CancelStopsAfterTheCurrentChunkWithoutFurtherEvents) {
    // Cancel from a progress handler, as a click handled while the chunk loop pumps would.
    Rig rig;
    rig.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 5000\r\n", 5000);
    rig.fd.DownloadProgress = [&](const std::string& p) {
        rig.events.push_back("progress:" + p);
        if (p == "41") rig.fd.Cancel();
    };
    rig.disk.closeFails = platform::FileError{112, "Flush failed."};  // not worth a word after a cancel
    EXPECT_FALSE(rig.Run());
    EXPECT_EQ(rig.Without("event:"), (Events{"progress:20", "progress:41"}));
    EXPECT_EQ(rig.inet.chunkCalls, 3) << "the chunk after the cancel is still taken and written";
    EXPECT_EQ(rig.disk.writes, 3);
    EXPECT_EQ(rig.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));

    // Cancelled while the request still runs: nothing is read.
    Rig waiting;
    waiting.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 5000\r\n", 5000);
    waiting.inet.pollsUntilDone = 100;
    waiting.pump.onPump = [&](int pump) {
        if (pump == 3) waiting.fd.Cancel();
    };
    EXPECT_FALSE(waiting.Run());
    EXPECT_EQ(waiting.events, (Events{"event:Getting file information"}));
    EXPECT_EQ(waiting.inet.polls, 2);
    EXPECT_EQ(waiting.inet.chunkCalls, 0);
    EXPECT_EQ(waiting.inet.cancels, 1);

    // Cancelled after every byte arrived (during the pump after the last chunk): still no
    // completion, and the installed file stays as it was.
    Rig late;
    late.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 2048\r\n", 2048);
    late.fd.DownloadProgress = [&](const std::string& p) {
        late.events.push_back("progress:" + p);
        if (late.events.size() == 4) late.fd.Cancel();  // the second "100": the empty closing chunk
    };
    EXPECT_FALSE(late.Run());
    EXPECT_EQ(late.Without("event:"), (Events{"progress:50", "progress:100", "progress:100"}));
    EXPECT_EQ(late.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));

    // The cancel flag of a finished call does not stop the next one.
    late.events.clear();
    late.fd.DownloadProgress = [&](const std::string& p) { late.events.push_back("progress:" + p); };
    EXPECT_TRUE(late.Run());
    EXPECT_EQ(late.disk.files[kDest], FakeHttpTransfer::Body(2048));
}

TEST(FileDownloader, FreeSpaceIsCheckedOnDriveLetterPathsOnly) {
    Rig rig;
    rig.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 5000\r\n", 5000);
    rig.disk.bytesPerSector = 1000;
    rig.disk.sectorsPerCluster = 1;
    rig.disk.freeClusters = 4;
    EXPECT_FALSE(rig.Run());
    EXPECT_EQ(rig.Without("event:"), (Events{"error:There is not enough free space on disk for this file."}));
    EXPECT_EQ(rig.disk.lastFreeSpaceRoot, "C:\\");
    EXPECT_EQ(rig.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
    EXPECT_EQ(rig.inet.chunkCalls, 0);

    rig.events.clear();
    rig.disk.freeClusters = 5;  // exactly the announced size: enough
    EXPECT_TRUE(rig.Run());
    EXPECT_EQ(rig.events.back(), "complete");

    // A share path has no drive to ask about.
    Rig share;
    share.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 5000\r\n", 5000);
    share.disk.freeClusters = 0;
    share.disk.folders.insert("\\\\server\\share");
    EXPECT_TRUE(share.Run("\\\\server\\share\\sw2.def"));
    EXPECT_EQ(share.disk.lastFreeSpaceRoot, "");
}

TEST(FileDownloader, MissingDestinationFolderIsCreatedOneLevel) {
    Rig rig;
    rig.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 3000\r\n", 3000);
    EXPECT_TRUE(rig.Run("C:\\Vantorel\\New\\sw2.def"));
    EXPECT_EQ(rig.disk.folders.count("C:\\Vantorel\\New"), 1u);
    EXPECT_EQ(rig.disk.files["C:\\Vantorel\\New\\sw2.def"], FakeHttpTransfer::Body(3000));

    // Two missing levels: only one is created, so the file cannot be opened.
    Rig deep;
    deep.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 3000\r\n", 3000);
    EXPECT_FALSE(deep.Run("C:\\Vantorel\\A\\B\\sw2.def"));
    EXPECT_EQ(deep.Without("event:"),
              (Events{"error:Cannot write file to disk.\r\rError 3: The system cannot find the path specified."}));
    EXPECT_EQ(deep.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
}

TEST(FileDownloader, FileErrorsAreReportedAndRemoveOnlyThePartialFile) {
    struct Case {
        const char* what;
        std::function<void(FakeFileSystem&)> script;
        std::string message;
    };
    const std::vector<Case> cases = {
        {"open", [](FakeFileSystem& d) { d.createFails = platform::FileError{5, "Access is denied."}; },
         "Cannot write file to disk.\r\rError 5: Access is denied."},
        {"write", [](FakeFileSystem& d) {
             d.writeFails = platform::FileError{112, "There is not enough space on the disk."};
             d.writeFailsAt = 2048;
         },
         "Cannot write file to disk.\r\rError 112: There is not enough space on the disk."},
        {"close", [](FakeFileSystem& d) { d.closeFails = platform::FileError{112, "Flush failed."}; },
         "Cannot write file to disk.\r\rError 112: Flush failed."},
        {"replace", [](FakeFileSystem& d) { d.replaceFails = platform::FileError{32, "In use."}; },
         "Cannot write file to disk.\r\rError 32: In use."},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        Rig rig;
        rig.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 5000\r\n", 5000);
        c.script(rig.disk);
        EXPECT_FALSE(rig.Run());
        ASSERT_FALSE(rig.events.empty());
        EXPECT_EQ(rig.events.back(), "error:" + c.message);
        EXPECT_EQ(std::count(rig.events.begin(), rig.events.end(), "complete"), 0);
        EXPECT_EQ(rig.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
    }

    // A read that fails in the middle of the body counts as a file error too.
    Rig read;
    read.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 5000\r\n", 5000);
    read.inet.chunkFails = platform::TransferError{12030, "The connection was aborted."};
    read.inet.chunkFailsAt = 2048;
    EXPECT_FALSE(read.Run());
    EXPECT_EQ(read.Without("event:"), (Events{"progress:20", "progress:41",
                                              "error:Cannot write file to disk.\r\rError 12030: The connection was "
                                              "aborted."}));
    EXPECT_EQ(read.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
}

TEST(FileDownloader, RequestErrorsAreReportedWithTheirDescription) {
    Rig noServer;
    noServer.inet.headerFails = platform::TransferError{12029, "The attempt to connect to the server failed."};
    EXPECT_FALSE(noServer.Run());
    EXPECT_EQ(noServer.Without("event:"),
              (Events{"error:Error: The attempt to connect to the server failed. occurred."}));

    Rig badAddress;
    badAddress.inet.executeFails = platform::TransferError{12006, "The URL does not use a recognized protocol."};
    EXPECT_FALSE(badAddress.Run());
    EXPECT_EQ(badAddress.Without("event:"),
              (Events{"error:Error: The URL does not use a recognized protocol. occurred."}));
    EXPECT_EQ(badAddress.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
}

TEST(FileDownloader, SizesThatDoNotFitOrLieAreRefusedWithoutOverrunningAnything) {
    // Larger than a signed 32-bit integer, and negative: refused before anything is read.
    for (std::string length : {"99999999999", "2147483648", "-5", "1e999"}) {
        SCOPED_TRACE(length);
        Rig rig;
        rig.inet.Respond("HTTP/1.1 200 OK", "Content-Length: " + length + "\r\n", 5000);
        EXPECT_FALSE(rig.Run());
        ASSERT_EQ(rig.Without("event:").size(), 1u);
        const std::string error = rig.Without("event:")[0];
        EXPECT_EQ(error.rfind("error:Error: ", 0), 0u) << error;
        EXPECT_NE(error.find(length), std::string::npos) << "the message names the size: " << error;
        EXPECT_EQ(rig.inet.chunkCalls, 0);
        EXPECT_EQ(rig.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
    }
    // The largest size that fits passes on to the space check.
    Rig largest;
    largest.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 2147483647\r\n", 0);
    largest.disk.freeClusters = 1;
    EXPECT_FALSE(largest.Run());
    EXPECT_EQ(largest.Without("event:"), (Events{"error:There is not enough free space on disk for this file."}));

    // A body longer than announced: the chunk that would pass the size is not written.
    Rig longer;
    longer.inet.Respond("HTTP/1.1 200 OK", "Content-Length: 2000\r\n", 5000);
    EXPECT_FALSE(longer.Run());
    EXPECT_EQ(longer.Without("event:"),
              (Events{"progress:51", "error:The server sent more than the 2000 bytes it announced."}));
    EXPECT_EQ(longer.disk.writes, 1);
    EXPECT_EQ(longer.disk.files, (std::map<std::string, std::string>{{kDest, kOld}}));
}

}  // namespace
}  // namespace vantorel
