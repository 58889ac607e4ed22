// Black-box tests of vantorel.exe under Wine against an update server that stalls, trickles or
// serves a new list: a copy of the program runs in a folder of its own with its own definitions
// file, and the tests watch its windows, its standard output and its files. The user's journeys
// (first start, clicks, tray, a second instance) are tests/e2e/e2e_tests.py.
#include <winsock2.h>
#include <windows.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <iterator>
#include <utility>
#include <regex>
#include <string>

#include "platform/win32/files_win32.h"
#include "win32/vantorel_settings.h"

namespace vantorel {
namespace {

using testing::DeleteSettings;
using testing::WriteSetting;

// A copy of vantorel.exe in a folder of its own, with its own definitions file.
struct ProgramCopy {
    std::string folder, exe;
    ProgramCopy(const std::string& name, const std::string& definitions) {
        char temp[MAX_PATH];
        ::GetTempPathA(MAX_PATH, temp);
        folder = std::string(temp) + name;
        exe = folder + "\\vantorel.exe";
        ::CreateDirectoryA(folder.c_str(), nullptr);
        ::CopyFileA((win32::ProgramFolder() + "\\vantorel.exe").c_str(), exe.c_str(), FALSE);
        std::ofstream(folder + "\\sw2.def", std::ios::binary) << definitions;
    }
    ~ProgramCopy() {
        ::DeleteFileA(exe.c_str());
        ::DeleteFileA((folder + "\\sw2.def").c_str());
        ::RemoveDirectoryA(folder.c_str());
    }
};

// A started program with its standard output captured.
class Started {
public:
    explicit Started(const std::string& exe) {
        SECURITY_ATTRIBUTES inherit{sizeof inherit, nullptr, TRUE};
        HANDLE write = nullptr;
        ::CreatePipe(&read_, &write, &inherit, 0);
        ::SetHandleInformation(read_, HANDLE_FLAG_INHERIT, 0);
        STARTUPINFOA startup{};
        startup.cb = sizeof startup;
        startup.dwFlags = STARTF_USESTDHANDLES;
        startup.hStdOutput = write;
        startup.hStdError = write;
        std::string line = "\"" + exe + "\"";
        started_ = ::CreateProcessA(nullptr, line.data(), nullptr, nullptr, TRUE, 0, nullptr, nullptr, &startup,
                                    &process_) != FALSE;
        ::CloseHandle(write);
    }
    ~Started() {
        if (!started_) return;
        if (::WaitForSingleObject(process_.hProcess, 0) != WAIT_OBJECT_0) ::TerminateProcess(process_.hProcess, 1);
        ::CloseHandle(process_.hProcess);
        ::CloseHandle(process_.hThread);
        ::CloseHandle(read_);
    }
    bool Ok() const { return started_; }

    // What the program has written so far.
    const std::string& Says() {
        char buffer[512];
        DWORD available = 0, got = 0;
        while (::PeekNamedPipe(read_, nullptr, 0, nullptr, &available, nullptr) && available > 0 &&
               ::ReadFile(read_, buffer, sizeof buffer, &got, nullptr) && got > 0)
            says_.append(buffer, got);
        return says_;
    }
    // Waits up to 30 s for the output to match.
    bool WaitToSay(const std::regex& pattern) {
        for (DWORD until = ::GetTickCount() + 30000; ::GetTickCount() < until; ::Sleep(50))
            if (std::regex_search(Says(), pattern)) return true;
        return false;
    }
    // The exit code once it has ended (within 30 s), or -1.
    int Wait() {
        if (::WaitForSingleObject(process_.hProcess, 30000) != WAIT_OBJECT_0) return -1;
        DWORD code = 0;
        ::GetExitCodeProcess(process_.hProcess, &code);
        Says();
        return static_cast<int>(code);
    }

private:
    bool started_ = false;
    HANDLE read_ = nullptr;
    PROCESS_INFORMATION process_{};
    std::string says_;
};

// The update server: the scriptable server on 127.0.0.1 (tests/servers/http_test_server.py), whose
// files under /vt/ can be made to misbehave.
std::string Scripted() {
    const char* file = std::getenv("VANTOREL_HTTP_PORT_FILE");
    std::ifstream in(std::string("Z:") + (file == nullptr ? "" : file));
    std::string port;
    in >> port;
    return "http://127.0.0.1:" + port;
}

// A control of `parent` (at any depth) with this caption.
HWND Control(HWND parent, const std::string& caption) {
    std::pair<std::string, HWND> search{caption, nullptr};
    ::EnumChildWindows(
        parent,
        [](HWND child, LPARAM found) -> BOOL {
            auto* s = reinterpret_cast<std::pair<std::string, HWND>*>(found);
            char text[256] = {};
            ::GetWindowTextA(child, text, sizeof text);
            if (s->first != text) return TRUE;
            s->second = child;
            return FALSE;
        },
        reinterpret_cast<LPARAM>(&search));
    return search.second;
}

// Opens the updates window of the running program with "&Updates" and starts the check.
HWND OpenUpdates(HWND main, bool check = true) {
    ::PostMessageA(Control(main, "&Updates"), BM_CLICK, 0, 0);
    HWND updates = nullptr;
    for (int i = 0; i < 200 && (updates = ::FindWindowA("VantorelOptions", "Updates")) == nullptr; ++i) ::Sleep(50);
    if (updates != nullptr && check) ::PostMessageA(Control(updates, "&Check for Updates"), BM_CLICK, 0, 0);
    return updates;
}

bool Exists(const std::string& path) { return ::GetFileAttributesA(path.c_str()) != INVALID_FILE_ATTRIBUTES; }

TEST(ProgramWin32, ClosingDuringAStalledUpdateTakesEffectWithinASecond) {
    // What the server does, and how the user leaves: the options window's close button, "&Close",
    // or the main window's close button; then "&Exit" unless the program has already ended. Under
    // Wine here every top-level window destroyed and the tray icon's removal cost about 2 s each
    // (its shell does not answer), so the first run, with no check started, gives the time the
    // same steps take with nothing to stop; a stalled check may add less than a second to it.
    struct Case {
        const char* server;
        const char* leave;
    };
    DWORD idleClose = 0, idleExit = 0;
    for (const Case& c : {Case{nullptr, "close"}, Case{"/do/noanswer/defver", "close"},
                          Case{"/do/noanswer/sw2.def", "close"}, Case{"/do/trickle/sw2.def", "&Close"},
                          Case{"/do/endless/sw2.def", "main"}}) {
        SCOPED_TRACE(std::string(c.server ? c.server : "no check") + " " + c.leave);
        const std::string installed = "-939524086\r\n67305985";
        ProgramCopy copy("vantorel-stall-test", installed);
        DeleteSettings();
        WriteSetting(HKEY_LOCAL_MACHINE, "Server", (Scripted() + (c.server ? c.server : "")).c_str());
        Started program(copy.exe);
        ASSERT_TRUE(program.WaitToSay(std::regex("Started")));
        HWND main = ::FindWindowA("VantorelFrmMain", nullptr);
        HWND updates = OpenUpdates(main, c.server != nullptr);
        ASSERT_NE(updates, nullptr);
        ::Sleep(1500);  // the request or the body is under way
        ASSERT_FALSE(::IsWindowEnabled(main)) << "the options window is modal";
        DWORD left = ::GetTickCount();
        if (std::string(c.leave) == "main") {
            ::PostMessageA(main, WM_CLOSE, 0, 0);
            EXPECT_TRUE(program.WaitToSay(std::regex("Unloaded")));
            EXPECT_LT(::GetTickCount() - left, idleClose + idleExit + 1000) << "the program unloads";
        } else {
            if (std::string(c.leave) == "close") ::PostMessageA(updates, WM_CLOSE, 0, 0);
            else ::PostMessageA(Control(updates, c.leave), BM_CLICK, 0, 0);
            while (!::IsWindowEnabled(main) && ::GetTickCount() - left < 10000) ::Sleep(10);
            DWORD closed = ::GetTickCount() - left;
            left = ::GetTickCount();
            ::PostMessageA(Control(main, "&Exit"), BM_CLICK, 0, 0);
            EXPECT_TRUE(program.WaitToSay(std::regex("Unloaded")));
            DWORD exited = ::GetTickCount() - left;
            if (c.server == nullptr) {
                idleClose = closed;
                idleExit = exited;
            }
            EXPECT_LT(closed, idleClose + 1000) << "the main window answers again";
            EXPECT_LT(exited, idleExit + 1000) << "\"&Exit\" unloads the program";
        }
        EXPECT_EQ(program.Wait(), 0);
        std::ifstream in(copy.folder + "\\sw2.def", std::ios::binary);
        EXPECT_EQ(std::string(std::istreambuf_iterator<char>(in), {}), installed);
        for (const char* name : {"\\sw2.def.part", "\\defver", "\\defver.part", "\\VTSetup.exe"})
            EXPECT_FALSE(Exists(copy.folder + name)) << name;
    }
    DeleteSettings();
}

TEST(ProgramWin32, ANewDefinitionsListIsInForceAtOnce) {
    ProgramCopy copy("vantorel-reload-test", "-939524086\r\n67305985");  // 127.0.0.2 is not listed yet
    DeleteSettings();
    WriteSetting(HKEY_CURRENT_USER, "State", "1");
    WriteSetting(HKEY_LOCAL_MACHINE, "Server", Scripted().c_str());  // its sw2.def lists 127.0.0.2

    WSADATA wsa;
    ::WSAStartup(MAKEWORD(2, 2), &wsa);
    SOCKET listener = ::socket(AF_INET, SOCK_STREAM, IPPROTO_TCP);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(0x7F000002);
    ASSERT_EQ(::bind(listener, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    ::listen(listener, 4);
    int length = sizeof address;
    ::getsockname(listener, reinterpret_cast<sockaddr*>(&address), &length);
    SOCKET client = ::socket(AF_INET, SOCK_STREAM, IPPROTO_TCP);
    ASSERT_EQ(::connect(client, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    SOCKET server = ::accept(listener, nullptr, nullptr);

    Started program(copy.exe);
    ASSERT_TRUE(program.WaitToSay(std::regex("Swept the connection table")));
    EXPECT_FALSE(std::regex_search(program.Says(), std::regex("Caption: Vantorel - [1-9]"))) << "nothing listed yet";
    HWND main = ::FindWindowA("VantorelFrmMain", nullptr);
    HWND updates = OpenUpdates(main);
    ASSERT_NE(updates, nullptr);
    EXPECT_TRUE(program.WaitToSay(std::regex("Definitions updated: 2 definitions from .* in use")));
    for (int i = 0; i < 100 && ::IsWindowEnabled(Control(updates, "&Check for Updates")) == FALSE; ++i) ::Sleep(50);
    EXPECT_NE(Control(updates, "Definitions Updates: Complete, 2 definitions in use"), nullptr);
    ::PostMessageA(updates, WM_CLOSE, 0, 0);
    EXPECT_TRUE(program.WaitToSay(std::regex("Caption: Vantorel - [1-9][0-9]* attempts intercepted")))
        << "the guard sweeps with the new list without a restart\n" << program.Says();

    ::PostMessageA(main, WM_CLOSE, 0, 0);
    EXPECT_EQ(program.Wait(), 0);
    ::closesocket(server);
    ::closesocket(client);
    ::closesocket(listener);
    ::WSACleanup();
    ::DeleteFileA((copy.folder + "\\defver").c_str());
    DeleteSettings();
}

}  // namespace
}  // namespace vantorel
