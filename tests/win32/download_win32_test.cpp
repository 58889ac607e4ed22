// The downloader with the real WinINet transfer, the real disk and the real message pump, against
// the scriptable HTTP server on 127.0.0.1 that the CTest fixture starts (its port is read from the
// file named by VANTOREL_HTTP_PORT_FILE). What a fake cannot show: that the status line, the Range
// header and the credentials really cross the wire, that a connection cut mid-body is caught, that
// blocks read on the worker thread come out as exact 1024-byte chunks, and that window messages keep
// running while a slow download waits.
#include <winsock2.h>
#include <windows.h>
#include <wincrypt.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>

#include "download/file_downloader.h"
#include "platform/win32/file_system_win32.h"
#include "platform/win32/http_transfer_win32.h"
#include "platform/win32/shell_win32.h"

namespace vantorel {
namespace {

std::string Pattern(std::size_t size) {
    std::string data(size, '\0');
    for (std::size_t i = 0; i < size; ++i) data[i] = static_cast<char>((i * 7 + i / 251) & 0xFF);
    return data;
}

std::string Server() {
    const char* file = std::getenv("VANTOREL_HTTP_PORT_FILE");
    if (file == nullptr) return std::string();
    std::ifstream in(std::string("Z:") + file);
    std::string port;
    in >> port;
    return port.empty() ? std::string() : "http://127.0.0.1:" + port;
}

std::string ReadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::stringstream content;
    content << in.rdbuf();
    return content.str();
}

void WriteFile(const std::string& path, const std::string& content) {
    std::ofstream(path, std::ios::binary) << content;
}

bool Exists(const std::string& path) { return ::GetFileAttributesA(path.c_str()) != INVALID_FILE_ATTRIBUTES; }

class WinInetDownload : public ::testing::Test {
protected:
    void SetUp() override {
        server_ = Server();
        ASSERT_FALSE(server_.empty()) << "no test server: VANTOREL_HTTP_PORT_FILE is not set or empty";
        char temp[MAX_PATH];
        ::GetTempPathA(MAX_PATH, temp);
        folder_ = std::string(temp) + "vtdl-" + std::to_string(::GetCurrentProcessId()) + "-" +
                  ::testing::UnitTest::GetInstance()->current_test_info()->name();
        ::CreateDirectoryA(folder_.c_str(), nullptr);
        dest_ = folder_ + "\\sw2.def";
        WriteFile(dest_, kOld);
        fd_.DownloadErrors = [this](const std::string& s) { events_.push_back("error:" + s); };
        fd_.DowloadComplete = [this] { events_.push_back("complete"); };
        fd_.DownloadProgress = [this](const std::string& s) { events_.push_back("progress:" + s); };
    }
    void TearDown() override {
        for (const char* name : {"\\sw2.def", "\\sw2.def.part", "\\new\\sw2.def", "\\new\\sw2.def.part"})
            ::DeleteFileA((folder_ + name).c_str());
        ::RemoveDirectoryA((folder_ + "\\new").c_str());
        EXPECT_TRUE(::RemoveDirectoryA(folder_.c_str())) << "something was left behind in " << folder_;
    }
    bool Get(const std::string& path, const std::string& user = "", const std::string& password = "") {
        return fd_.DownloadFile(server_ + path, dest_, user, password);
    }
    std::vector<std::string> Only(const std::string& prefix) const {
        std::vector<std::string> kept;
        for (const auto& e : events_)
            if (e.rfind(prefix, 0) == 0) kept.push_back(e);
        return kept;
    }

    const std::string kOld = "definitions in use\r\n";
    std::string server_, folder_, dest_;
    win32::Win32MessagePump pump_;
    win32::WinInetTransfer inet_{pump_};
    win32::Win32FileSystem disk_;
    FileDownloader fd_{inet_, disk_, pump_};
    std::vector<std::string> events_;
};

using Events = std::vector<std::string>;

TEST_F(WinInetDownload, Answers200And206GiveTheKnownBodyWithProgressPerChunk) {
    // /range answers 206 only when "Range: bytes=0-" reached the server, 400 otherwise.
    for (const char* path : {"/body/5000", "/range/5000"}) {
        SCOPED_TRACE(path);
        events_.clear();
        EXPECT_TRUE(Get(path));
        EXPECT_EQ(events_, (Events{"progress:20", "progress:41", "progress:61", "progress:82", "progress:100",
                                   "progress:100", "complete"}));
        EXPECT_EQ(ReadFile(dest_), Pattern(5000));
        EXPECT_FALSE(Exists(dest_ + ".part"));
    }
    // Several worker blocks (64 KiB) and a last short chunk: every byte in place.
    events_.clear();
    EXPECT_TRUE(Get("/body/300001"));
    EXPECT_EQ(ReadFile(dest_), Pattern(300001));
    EXPECT_EQ(Only("progress:").size(), 294u) << "292 full chunks, one of 993 bytes, one empty";
}

TEST_F(WinInetDownload, RefusalsLeaveTheInstalledFileUntouched) {
    struct Case {
        std::string path, message;
    };
    const std::vector<Case> cases = {
        {"/status/204", "Nothing to download!"},
        {"/auth/5000", "Authorization failed!"},
        {"/status/404", "The file, \"" + server_ + "/status/404\" was not found!"},
        {"/status/500", "The server returned the following response:\r\rHTTP/1.1 500 Internal Server Error\r"},
        {"/range-missing", "The file, \"" + server_ + "/range-missing\" was not found!"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.path);
        events_.clear();
        EXPECT_FALSE(Get(c.path));
        EXPECT_EQ(events_, (Events{"error:" + c.message}));
        EXPECT_EQ(ReadFile(dest_), kOld);
        EXPECT_FALSE(Exists(dest_ + ".part"));
    }
    // The same protected file with the right credentials.
    events_.clear();
    EXPECT_TRUE(Get("/auth/3000", "vt", "secret"));
    EXPECT_EQ(ReadFile(dest_), Pattern(3000));
}

TEST_F(WinInetDownload, ConnectionClosedAfterThreeChunksIsAResetAndLeavesNothingBehind) {
    EXPECT_FALSE(Get("/cut/5000/3072"));
    EXPECT_EQ(events_, (Events{"progress:20", "progress:41", "progress:61", "progress:61",
                               "error:The connection with the server was reset."}));
    EXPECT_EQ(ReadFile(dest_), kOld);
    EXPECT_FALSE(Exists(dest_ + ".part"));
}

TEST_F(WinInetDownload, MissingOrUnusableSizes) {
    // No Content-Length (the body ends when the server closes): refused, the old file kept.
    EXPECT_FALSE(Get("/nolength/3000"));
    EXPECT_EQ(events_, (Events{"error:Error: Missing size (the server did not say how long the file is) occurred."}));
    EXPECT_EQ(ReadFile(dest_), kOld);
    EXPECT_FALSE(Exists(dest_ + ".part"));

    // A size beyond 32 bits, a negative one, and two different sizes: refused with a clear error
    // before any data.
    for (const std::string path : {"/length/99999999999/3000", "/length/-5/3000", "/twolengths/3000/5000"}) {
        SCOPED_TRACE(path);
        std::size_t from = path.find('/', 1) + 1;
        std::string length = path.substr(from, path.find('/', from) - from);
        events_.clear();
        EXPECT_FALSE(Get(path));
        ASSERT_EQ(events_.size(), 1u);
        EXPECT_EQ(events_[0].rfind("error:Error: ", 0), 0u) << events_[0];
        EXPECT_NE(events_[0].find(length), std::string::npos) << events_[0];
        EXPECT_EQ(ReadFile(dest_), kOld);
        EXPECT_FALSE(Exists(dest_ + ".part"));
    }
}

TEST_F(WinInetDownload, CancelDuringTheChunkLoopStopsAtOnce) {
    fd_.DownloadProgress = [this](const std::string& p) {
        events_.push_back("progress:" + p);
        fd_.Cancel();
    };
    DWORD started = ::GetTickCount();
    EXPECT_FALSE(Get("/body/8000000"));
    EXPECT_LT(::GetTickCount() - started, 5000u) << "the worker stops without reading the rest";
    EXPECT_EQ(events_, (Events{"progress:0"}));
    EXPECT_EQ(ReadFile(dest_), kOld);
    EXPECT_FALSE(Exists(dest_ + ".part"));

    // The transfer is usable again after a cancel.
    events_.clear();
    fd_.DownloadProgress = nullptr;
    EXPECT_TRUE(Get("/body/2000"));
    EXPECT_EQ(ReadFile(dest_), Pattern(2000));
}

TEST_F(WinInetDownload, SlowDataShowsProgressAndCancelEndsEveryWaitWithinASecond) {
    // 2 KB/s: a chunk of progress every half second, not all of it once a 64 KiB block is full.
    DWORD last = ::GetTickCount(), longest = 0;
    fd_.DownloadProgress = [&](const std::string&) {
        longest = std::max<DWORD>(longest, ::GetTickCount() - last);
        last = ::GetTickCount();
    };
    EXPECT_TRUE(Get("/slow/4096/500/1024"));
    EXPECT_LT(longest, 1000u) << "the longest wait for progress";
    EXPECT_TRUE(ReadFile(dest_) == Pattern(4096));
    WriteFile(dest_, kOld);

    // The user cancels (a thread timer stands for the click) while the server does not answer,
    // trickles a byte a second, or sends without end.
    static FileDownloader* target = nullptr;
    static DWORD cancelledAt = 0;
    target = &fd_;
    for (const char* path : {"/noanswer", "/trickle/2000/1000", "/endless"}) {
        SCOPED_TRACE(path);
        events_.clear();
        fd_.DownloadProgress = nullptr;
        UINT_PTR timer = ::SetTimer(nullptr, 0, 1500, [](HWND, UINT, UINT_PTR id, DWORD) {
            ::KillTimer(nullptr, id);
            cancelledAt = ::GetTickCount();
            target->Cancel();
        });
        EXPECT_FALSE(Get(path));
        DWORD took = ::GetTickCount() - cancelledAt;
        ::KillTimer(nullptr, timer);
        EXPECT_LT(took, 1000u) << "the download returned " << took << " ms after the cancel";
        EXPECT_TRUE(events_.empty());
        EXPECT_EQ(ReadFile(dest_), kOld);
        EXPECT_FALSE(Exists(dest_ + ".part"));
    }
}

TEST_F(WinInetDownload, AServerThatNeverAnswersIsGivenUpAfterTheSilenceLimit) {
    win32::WinInetTransfer inet(pump_, win32::WinInetTransfer::kDefaultBlockSize, 500);
    FileDownloader fd(inet, disk_, pump_);
    fd.DownloadErrors = [this](const std::string& s) { events_.push_back("error:" + s); };
    DWORD started = ::GetTickCount();
    EXPECT_FALSE(fd.DownloadFile(server_ + "/noanswer", dest_));
    EXPECT_LT(::GetTickCount() - started, 3000u);
    ASSERT_EQ(events_.size(), 1u);
    EXPECT_NE(events_[0].find("timed out"), std::string::npos) << events_[0];
    EXPECT_EQ(ReadFile(dest_), kOld);
}

TEST_F(WinInetDownload, MissingDestinationFolderIsCreated) {
    std::string dest = folder_ + "\\new\\sw2.def";
    EXPECT_TRUE(fd_.DownloadFile(server_ + "/body/5000", dest));
    EXPECT_EQ(ReadFile(dest), Pattern(5000));
}

TEST_F(WinInetDownload, FailedConnectionsAreRequestErrors) {
    // A port nobody listens on: bind one, note it, close it.
    SOCKET probe = INVALID_SOCKET;
    WSADATA wsa;
    ::WSAStartup(MAKEWORD(2, 2), &wsa);
    probe = ::socket(AF_INET, SOCK_STREAM, IPPROTO_TCP);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    ASSERT_EQ(::bind(probe, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    int length = sizeof address;
    ::getsockname(probe, reinterpret_cast<sockaddr*>(&address), &length);
    ::closesocket(probe);
    std::string closed = "http://127.0.0.1:" + std::to_string(ntohs(address.sin_port)) + "/body/10";

    EXPECT_FALSE(fd_.DownloadFile(closed, dest_));
    ASSERT_EQ(events_.size(), 1u);
    EXPECT_EQ(events_[0].rfind("error:Error: ", 0), 0u) << events_[0];
    EXPECT_EQ(events_[0].substr(events_[0].size() - 10), " occurred.") << events_[0];
    EXPECT_EQ(ReadFile(dest_), kOld);

    events_.clear();
    EXPECT_FALSE(fd_.DownloadFile("ftp://127.0.0.1/sw2.def", dest_));
    ASSERT_EQ(events_.size(), 1u);
    EXPECT_EQ(events_[0].rfind("error:Error: ", 0), 0u) << events_[0];
    ::WSACleanup();
}

TEST_F(WinInetDownload, WindowMessagesRunWhileASlowDownloadWaits) {
    // A thread timer's WM_TIMER only runs when someone dispatches messages: the download must.
    static int ticks = 0;
    ticks = 0;
    UINT_PTR timer = ::SetTimer(nullptr, 0, 20, [](HWND, UINT, UINT_PTR, DWORD) { ++ticks; });
    ASSERT_NE(timer, 0u);
    DWORD started = ::GetTickCount();
    EXPECT_TRUE(Get("/slow/5000/120"));  // five pieces, 120 ms apart
    DWORD took = ::GetTickCount() - started;
    ::KillTimer(nullptr, timer);
    EXPECT_GE(took, 500u);
    EXPECT_GE(ticks, static_cast<int>(took / 20 / 3)) << "the timer ran " << ticks << " times in " << took << " ms";
    EXPECT_EQ(ReadFile(dest_), Pattern(5000));

    // Data trickling in pieces of 300 bytes still comes out as whole chunks: a short chunk only at
    // the end, so the loop does not stop early.
    events_.clear();
    EXPECT_TRUE(Get("/slow/5000/25/300"));
    EXPECT_EQ(events_, (Events{"progress:20", "progress:41", "progress:61", "progress:82", "progress:100",
                               "progress:100", "complete"}));
    EXPECT_EQ(ReadFile(dest_), Pattern(5000));
}

}  // namespace
}  // namespace vantorel

namespace vantorel {
namespace {

// https through the same transfer. Two loopback https servers: one with a certificate signed by a
// test authority that this test puts among the trusted roots of its own scratch Wine prefix, one
// with a self-signed certificate nobody trusts. The first must deliver; the second must be refused
// (the certificate check is never switched off) without touching the installed file.
TEST(WinInetHttps, TrustedCertificateDeliversAndUntrustedIsRefused) {
    const char* dir = std::getenv("VANTOREL_HTTPS_DIR");
    ASSERT_NE(dir, nullptr) << "VANTOREL_HTTPS_DIR is not set";
    auto port = [&](const char* which) {
        std::ifstream in(std::string("Z:") + dir + "/" + which + "/server.port");
        std::string value;
        in >> value;
        return value;
    };
    std::string trusted = "https://127.0.0.1:" + port("trusted"), untrusted = "https://127.0.0.1:" + port("untrusted");

    std::string der = ReadFile(std::string("Z:") + dir + "/certs/ca.der");
    ASSERT_FALSE(der.empty());
    HCERTSTORE root = ::CertOpenStore(CERT_STORE_PROV_SYSTEM_A, 0, 0, CERT_SYSTEM_STORE_LOCAL_MACHINE, "ROOT");
    ASSERT_NE(root, nullptr);
    ASSERT_TRUE(::CertAddEncodedCertificateToStore(root, X509_ASN_ENCODING,
                                                   reinterpret_cast<const BYTE*>(der.data()),
                                                   static_cast<DWORD>(der.size()), CERT_STORE_ADD_REPLACE_EXISTING,
                                                   nullptr));
    ::CertCloseStore(root, 0);

    char temp[MAX_PATH];
    ::GetTempPathA(MAX_PATH, temp);
    std::string dest = std::string(temp) + "vtdl-https-" + std::to_string(::GetCurrentProcessId()) + ".def";
    WriteFile(dest, "installed");

    win32::Win32MessagePump pump;
    win32::WinInetTransfer inet(pump);
    win32::Win32FileSystem disk;
    FileDownloader fd(inet, disk, pump);
    std::vector<std::string> events;
    fd.DownloadErrors = [&](const std::string& s) { events.push_back("error:" + s); };
    fd.DowloadComplete = [&] { events.push_back("complete"); };

    EXPECT_FALSE(fd.DownloadFile(untrusted + "/body/5000", dest));
    ASSERT_EQ(events.size(), 1u);
    EXPECT_EQ(events[0].rfind("error:Error: ", 0), 0u) << events[0];
    EXPECT_NE(events[0].find("certificate authority"), std::string::npos) << events[0];
    EXPECT_EQ(ReadFile(dest), "installed");

    events.clear();
    EXPECT_TRUE(fd.DownloadFile(trusted + "/range/5000", dest)) << (events.empty() ? "" : events[0]);
    EXPECT_EQ(events, (std::vector<std::string>{"complete"}));
    EXPECT_EQ(ReadFile(dest), Pattern(5000));
    ::DeleteFileA(dest.c_str());
}

}  // namespace
}  // namespace vantorel
