// The downloader with the real WinINet transfer, disk and message pump under Wine, against the
// scriptable HTTP server on 127.0.0.1 that a CTest fixture starts (its port in the file named by
// VANTOREL_HTTP_PORT_FILE): the status line, the Range header and the credentials cross the wire,
// bodies arrive as exact 1024-byte chunks, a connection cut mid-body is caught, window messages keep
// running while a slow download waits, and https checks certificates. A download that does not
// complete leaves the installed file and no partial file behind. Cancels, while the server does not
// answer, trickles or sends without end, are proved on the real program (tests/e2e/e2e_tests.py,
// closing the updates window during a check, within a second). Last, the file system the
// downloader writes through is held to the same answers as the in-memory fake of its native tests.
#include <windows.h>
#include <wincrypt.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <fstream>
#include <sstream>

#include "download/file_downloader.h"
#include "fakes/fake_file_system.h"
#include "fakes/fake_http_transfer.h"
#include "platform/win32/file_system_win32.h"
#include "platform/win32/files_win32.h"
#include "platform/win32/http_transfer_win32.h"
#include "platform/win32/shell_win32.h"

namespace vantorel {
namespace {

const auto Pattern = testing::FakeHttpTransfer::Body;

std::string ReadFile(const std::string& path) {
    std::stringstream content;
    content << std::ifstream(path, std::ios::binary).rdbuf();
    return content.str();
}

// The loopback server whose port the fixture wrote to `file`.
std::string Server(const std::string& scheme, const std::string& file) {
    std::string port = ReadFile("Z:" + file);
    while (!port.empty() && std::isspace(static_cast<unsigned char>(port.back()))) port.pop_back();
    return scheme + "://127.0.0.1:" + port;
}

std::string Progress(std::initializer_list<int> steps) {
    std::string out;
    for (int p : steps) out += "progress:" + std::to_string(p) + " ";
    return out + "complete ";
}

class WinInetDownload : public ::testing::Test {
protected:
    void SetUp() override {
        const char* file = std::getenv("VANTOREL_HTTP_PORT_FILE");
        ASSERT_NE(file, nullptr) << "no test server: VANTOREL_HTTP_PORT_FILE is not set";
        server_ = Server("http", file);
        char temp[MAX_PATH];
        ::GetTempPathA(MAX_PATH, temp);
        folder_ = std::string(temp) + "vtdl-" + std::to_string(::GetCurrentProcessId()) + "-" +
                  ::testing::UnitTest::GetInstance()->current_test_info()->name();
        ::CreateDirectoryA(folder_.c_str(), nullptr);
        dest_ = folder_ + "\\sw2.def";
        fd_.DownloadErrors = [this](const std::string& s) { events_ += "error:" + s + " "; };
        fd_.DowloadComplete = [this] { events_ += "complete "; };
        fd_.DownloadProgress = [this](const std::string& s) { events_ += "progress:" + s + " "; };
    }
    void TearDown() override {
        for (const char* name : {"\\sw2.def", "\\new\\sw2.def"}) ::DeleteFileA((folder_ + name).c_str());
        ::RemoveDirectoryA((folder_ + "\\new").c_str());
        EXPECT_TRUE(::RemoveDirectoryA(folder_.c_str())) << "something was left behind in " << folder_;
    }
    // Runs one download over the installed file; true when it completed. One that did not changed
    // nothing (and TearDown finds no partial file left).
    bool Get(const std::string& path, const std::string& user = "", const std::string& password = "") {
        std::ofstream(dest_, std::ios::binary) << kOld;
        events_.clear();
        bool done = fd_.DownloadFile(path.rfind("/", 0) == 0 ? server_ + path : path, dest_, user, password);
        if (!done) {
            EXPECT_EQ(ReadFile(dest_), kOld) << path;
        }
        return done;
    }

    const std::string kOld = "definitions in use\r\n";
    std::string server_, folder_, dest_, events_;
    win32::Win32MessagePump pump_;
    win32::WinInetTransfer inet_{pump_};
    win32::Win32FileSystem disk_;
    FileDownloader fd_{inet_, disk_, pump_};
};

TEST_F(WinInetDownload, BodiesOfEverySizeArriveWholeWithProgressPerChunk) {
    // /slow/5000/25/300 trickles in pieces of 300 bytes that still come out as whole chunks, a short one
    // only at the end.
    const std::pair<std::string, std::string> cases[] = {{"/body/5000", Progress({20, 41, 61, 82, 100, 100})},
                                                         {"/slow/5000/25/300", Progress({20, 41, 61, 82, 100, 100})},
                                                         {"/body/1", Progress({100})},
                                                         {"/body/1024", Progress({100, 100})},
                                                         {"/body/1025", Progress({100, 100})},
                                                         {"/body/2047", Progress({50, 100, 100})},
                                                         {"/body/0", Progress({})}};
    for (const auto& [path, events] : cases) {
        EXPECT_TRUE(Get(path)) << path;
        EXPECT_EQ(events_, events) << path;
        EXPECT_EQ(ReadFile(dest_), Pattern(std::stoul(path.substr(path.find('/', 1) + 1)))) << path;
    }
    // A missing destination folder is created.
    EXPECT_TRUE(fd_.DownloadFile(server_ + "/body/5000", folder_ + "\\new\\sw2.def"));
    EXPECT_EQ(ReadFile(folder_ + "\\new\\sw2.def"), Pattern(5000));
}

TEST_F(WinInetDownload, RefusalsCutsAndUnusableSizesLeaveTheInstalledFile) {
    const std::pair<std::string, std::string> cases[] = {
        {"/status/204", "Nothing to download!"},
        {"/auth/5000", "Authorization failed!"},
        {"/status/404", "The file, \"" + server_ + "/status/404\" was not found!"},
        {"/status/500", "The server returned the following response:\r\rHTTP/1.1 500 Internal Server Error\r"},
        {"/nolength/3000", "Error: Missing size (the server did not say how long the file is) occurred."},
        {"/length/abc/3000", "Error: Invalid size (the server announced \"abc\" bytes) occurred."},
        {"/length/-5/3000", "Error: Invalid size (the server announced -5 bytes) occurred."},
        {"/length/2147483648/3000",
         "Error: Overflow (the server announced 2147483648 bytes, more than a download can take) occurred."},
        {"/length/1e999/3000",
         "Error: Overflow (the server announced 1e999 bytes, more than a download can take) occurred."},
        {"/twolengths/3000/5000", "Error: Invalid size (the server announced both 3000 and 5000 bytes) occurred."},
    };
    for (const auto& [path, message] : cases) {
        EXPECT_FALSE(Get(path));
        EXPECT_EQ(events_, "error:" + message + " ") << path;
    }
    EXPECT_FALSE(Get("/cut/5000/3072"));
    EXPECT_EQ(events_,
              "progress:20 progress:41 progress:61 progress:61 error:The connection with the server was reset. ");
    // A size WinINet reads as 0 leaves the rest of a long body unread on the kept-alive connection:
    // the next download still gets an answer of its own.
    EXPECT_TRUE(Get("/length/0.4/20000"));
    EXPECT_EQ(ReadFile(dest_), "");
    EXPECT_TRUE(Get("/body/100")) << events_;
    EXPECT_TRUE(Get("/auth/3000", "vt", "secret")) << "the protected file with the right credentials";
    EXPECT_EQ(ReadFile(dest_), Pattern(3000));
}

TEST_F(WinInetDownload, SlowDataShowsProgressWithWindowMessagesRunning) {
    // 2 KB/s: a chunk of progress every half second, not all of it once a 64 KiB block is full; a
    // thread timer's WM_TIMER only runs when someone dispatches messages: the download must.
    static int ticks = 0;
    UINT_PTR timer = ::SetTimer(nullptr, 0, 20, [](HWND, UINT, UINT_PTR, DWORD) { ++ticks; });
    DWORD started = ::GetTickCount(), last = started, longest = 0;
    fd_.DownloadProgress = [&](const std::string&) {
        longest = std::max<DWORD>(longest, ::GetTickCount() - last);
        last = ::GetTickCount();
    };
    EXPECT_TRUE(Get("/slow/4096/500/1024"));
    DWORD took = ::GetTickCount() - started;
    ::KillTimer(nullptr, timer);
    EXPECT_LT(longest, 1000u) << "the longest wait for progress";
    EXPECT_TRUE(ReadFile(dest_) == Pattern(4096));
    EXPECT_GE(ticks, static_cast<int>(took / 20 / 3)) << "the timer ran " << ticks << " times in " << took << " ms";
}

TEST_F(WinInetDownload, FailedConnectionsAndSilenceAreRequestErrors) {
    // Nothing listens on the discard port of this loopback; ftp is no transfer of this program.
    for (const char* url : {"http://127.0.0.1:9/body/10", "ftp://127.0.0.1/sw2.def"}) {
        EXPECT_FALSE(Get(url));
        EXPECT_EQ(events_.rfind("error:Error: ", 0), 0u) << events_;
        EXPECT_EQ(events_.substr(events_.size() - 11), " occurred. ") << events_;
    }
    // A server that never answers is given up after the silence limit.
    win32::WinInetTransfer inet(pump_, win32::WinInetTransfer::kDefaultBlockSize, 500);
    FileDownloader fd(inet, disk_, pump_);
    fd.DownloadErrors = [this](const std::string& s) { events_ += "error:" + s; };
    DWORD started = ::GetTickCount();
    EXPECT_FALSE(fd.DownloadFile(server_ + "/noanswer", dest_));
    EXPECT_LT(::GetTickCount() - started, 3000u);
    EXPECT_NE(events_.find("timed out"), std::string::npos) << events_;
}

// https through the same transfer: one loopback server with a certificate signed by a test
// authority that this test puts among the trusted roots of its scratch prefix, one self-signed that
// nobody trusts. The first delivers (/range answers 206 only when "Range: bytes=0-" reached it, 400
// otherwise); the second is refused (the check is never switched off).
TEST_F(WinInetDownload, TrustedCertificateDeliversAndUntrustedIsRefused) {
    const char* dir = std::getenv("VANTOREL_HTTPS_DIR");
    ASSERT_NE(dir, nullptr) << "VANTOREL_HTTPS_DIR is not set";
    auto server = [&](const char* which) { return Server("https", std::string(dir) + "/" + which + "/server.port"); };
    std::string der = ReadFile(std::string("Z:") + dir + "/certs/ca.der");
    HCERTSTORE root = ::CertOpenStore(CERT_STORE_PROV_SYSTEM_A, 0, 0, CERT_SYSTEM_STORE_LOCAL_MACHINE, "ROOT");
    ASSERT_NE(root, nullptr);
    ASSERT_TRUE(::CertAddEncodedCertificateToStore(root, X509_ASN_ENCODING, reinterpret_cast<const BYTE*>(der.data()),
                                                   static_cast<DWORD>(der.size()), CERT_STORE_ADD_REPLACE_EXISTING,
                                                   nullptr));
    ::CertCloseStore(root, 0);
    EXPECT_FALSE(Get(server("untrusted") + "/body/5000"));
    EXPECT_NE(events_.find("certificate authority"), std::string::npos) << events_;
    EXPECT_TRUE(Get(server("trusted") + "/range/5000")) << events_;
    EXPECT_EQ(ReadFile(dest_), Pattern(5000));
}

TEST_F(WinInetDownload, TheFileSystemAnswersLikeTheFake) {
    win32::Win32Files realFiles;
    testing::FakeFileSystem fake;
    for (bool real : {true, false}) {
        SCOPED_TRACE(real ? "Win32" : "fake");
        platform::FileSystem& disk = real ? static_cast<platform::FileSystem&>(disk_) : fake;
        platform::Files& files = real ? static_cast<platform::Files&>(realFiles) : fake;   // reads `disk`
        const std::string one = (real ? folder_ : std::string("C:\\Vantorel")) + "\\new";  // in an existing folder
        const std::string part = one + "\\sw2.def.part", to = one + "\\sw2.def";
        platform::FileError error;
        std::string content;
        auto write = [&](const std::string& text) {
            auto file = disk.CreateNew(part, error);
            return file && file->Write(text, error) && file->Close(error);
        };
        EXPECT_FALSE(disk.CreateFolder(one + "\\two\\", error));
        EXPECT_EQ(error.number, 3) << "folders are created one level at a time";
        EXPECT_FALSE(write("no folder"));
        EXPECT_EQ(error.number, 3);
        ASSERT_TRUE(disk.CreateFolder(one + "\\", error));
        EXPECT_TRUE(disk.FolderExists(one + "\\")) << "a trailing backslash names the same folder";
        ASSERT_TRUE(write("first") && disk.Replace(part, to, error)) << "onto a missing destination";
        ASSERT_TRUE(write(std::string(100000, 'a')) && write("second")) << "a new file over a longer one";
        ASSERT_TRUE(disk.Replace(part, to, error)) << "over an existing destination";
        EXPECT_TRUE(files.ReadAll(to, content) && content == "second") << content.size();
        EXPECT_FALSE(disk.FileExists(part));
        EXPECT_FALSE(disk.Replace(part, to, error));
        EXPECT_EQ(error.number, 2) << "from nothing: refused, the destination kept";
        EXPECT_TRUE(files.ReadAll(to, content) && content == "second");
        EXPECT_TRUE(disk.Delete(to));
    }
}

}  // namespace
}  // namespace vantorel
