// The downloader with the real WinINet transfer, disk and message pump under Wine, against the
// scriptable HTTP server on 127.0.0.1 that a CTest fixture starts (its port in the file named by
// VANTOREL_HTTP_PORT_FILE): the status line and the Range header cross the wire, bodies arrive as
// exact 1024-byte chunks, slow ones with progress as they come, a connection cut mid-body is caught,
// and https checks certificates. A download that does not complete leaves the installed file and no
// partial file behind. Cancels, while the server does not answer, trickles or sends without end, and
// window messages running meanwhile, are proved on the real program (tests/e2e/e2e_tests.py, closing
// the updates window during a check, within a second). Last, a definitions file in the same folder
// that is there but cannot be used, through the Windows file calls.
#include <windows.h>
#include <wincrypt.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <sstream>

#include "download/file_downloader.h"
#include "fakes/fake_http_transfer.h"
#include "guard/read_definitions.h"
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
    return scheme + "://127.0.0.1:" + std::to_string(std::atoi(ReadFile("Z:" + file).c_str()));
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
        fd_.DownloadProgress = [this](const std::string& s) {
            events_ += "progress:" + s + " ";
            longest_ = std::max<DWORD>(longest_, ::GetTickCount() - last_);
            last_ = ::GetTickCount();
        };
    }
    void TearDown() override {
        for (const char* name : {"\\sw2.def", "\\new\\sw2.def"}) ::DeleteFileA((folder_ + name).c_str());
        ::RemoveDirectoryA((folder_ + "\\new").c_str());
        EXPECT_TRUE(::RemoveDirectoryA(folder_.c_str())) << "something was left behind in " << folder_;
    }
    // Runs one download over the installed file; true when it completed. One that did not changed
    // nothing (and TearDown finds no partial file left).
    bool Get(const std::string& path) {
        std::ofstream(dest_, std::ios::binary) << kOld;
        events_.clear();
        last_ = ::GetTickCount();
        longest_ = 0;
        bool done = fd_.DownloadFile(path.rfind("/", 0) == 0 ? server_ + path : path, dest_);
        if (!done) {
            EXPECT_EQ(ReadFile(dest_), kOld) << path;
        }
        return done;
    }

    const std::string kOld = "definitions in use\r\n";
    std::string server_, folder_, dest_, events_;
    DWORD last_ = 0, longest_ = 0;  // the longest wait for progress in the last download, in ms
    win32::Win32MessagePump pump_;
    win32::WinInetTransfer inet_{pump_};
    win32::Win32FileSystem disk_;
    FileDownloader fd_{inet_, disk_, pump_};
};

TEST_F(WinInetDownload, BodiesOfEverySizeArriveWholeWithProgressPerChunk) {
    // /slow/5000/100/300 sends pieces of 300 bytes 0.1 s apart: they still come out as whole chunks, a
    // short one only at the end, each as soon as it is there rather than all once a 64 KiB block is full.
    const std::pair<std::string, std::string> cases[] = {{"/body/5000", Progress({20, 41, 61, 82, 100, 100})},
                                                         {"/slow/5000/100/300", Progress({20, 41, 61, 82, 100, 100})},
                                                         {"/body/1024", Progress({100, 100})},
                                                         {"/body/0", Progress({})}};
    for (const auto& [path, events] : cases) {
        EXPECT_TRUE(Get(path)) << path;
        EXPECT_EQ(events_, events) << path;
        EXPECT_EQ(ReadFile(dest_), Pattern(std::stoul(path.substr(path.find('/', 1) + 1)))) << path;
        EXPECT_LT(longest_, 1000u) << path << ": the longest wait for progress";
    }
    // A missing destination folder is created.
    EXPECT_TRUE(fd_.DownloadFile(server_ + "/body/5000", folder_ + "\\new\\sw2.def"));
    EXPECT_EQ(ReadFile(folder_ + "\\new\\sw2.def"), Pattern(5000));
}

TEST_F(WinInetDownload, RefusalsCutsAndUnusableSizesLeaveTheInstalledFile) {
    const std::pair<std::string, std::string> cases[] = {
        {"/status/204", "Nothing to download!"},
        {"/status/401", "Authorization failed!"},
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
    EXPECT_EQ(ReadFile(dest_), Pattern(100));
}

TEST_F(WinInetDownload, AServerThatNeverAnswersIsGivenUpAfterTheSilenceLimit) {
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

// A definitions file that is there but cannot be used is asked for like a missing one: a file locked
// without read sharing, a file over the size limit.
TEST_F(WinInetDownload, ADefinitionsFileThatCannotBeUsedIsAskedForLikeAMissingOne) {
    win32::Win32Files files;
    auto attempt = [&](const char* what) {
        int missing = 0;
        DefinitionList list = DefinitionList::FromText("67305985");
        EXPECT_FALSE(LoadDefinitions(
            dest_, files, [&] { ++missing; }, list))
            << what;
        EXPECT_EQ(missing, 1) << what;
        EXPECT_EQ(list.size(), 0u) << what;
    };
    std::ofstream(dest_, std::ios::binary) << "67305985";  // held open by another program that shares no reading
    HANDLE locked = ::CreateFileA(dest_.c_str(), GENERIC_READ, 0, nullptr, OPEN_EXISTING, 0, nullptr);
    ASSERT_NE(locked, INVALID_HANDLE_VALUE);
    attempt("a locked file");
    ::CloseHandle(locked);

    // Past the size limit (a sparse file: nothing is written), refused for its size alone.
    HANDLE big = ::CreateFileA(dest_.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, 0, nullptr);
    LARGE_INTEGER end;
    end.QuadPart = static_cast<LONGLONG>(kMaxDefinitionsBytes) + 1;
    ASSERT_TRUE(::SetFilePointerEx(big, end, nullptr, FILE_BEGIN) && ::SetEndOfFile(big));
    ::CloseHandle(big);
    attempt("a file over 256 MB");
    EXPECT_EQ(files.ReadableSize(dest_), kMaxDefinitionsBytes + 1);
}

}  // namespace
}  // namespace vantorel
