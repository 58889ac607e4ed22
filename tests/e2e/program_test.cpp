// Black-box tests of vantorel.exe under Wine on a virtual display: a copy of the program runs in a
// folder of its own with its own definitions file, and the tests watch its windows, its standard
// output and the registry.
#include <winsock2.h>
#include <windows.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <regex>
#include <string>

#include "platform/win32/files_win32.h"
#include "win32/vantorel_settings.h"

namespace vantorel {
namespace {

using testing::DeleteSettings;
using testing::ReadSetting;
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

int CountMainWindows() {
    int count = 0;
    HWND found = nullptr;
    while ((found = ::FindWindowExA(nullptr, found, "VantorelFrmMain", nullptr)) != nullptr) ++count;
    return count;
}

TEST(SingleInstanceWin32, SecondStartOfTheProgramEndsSilently) {
    ProgramCopy copy("vantorel-instance-test", "-939524086\r\n67305985");
    DeleteSettings();
    Started first(copy.exe);
    ASSERT_TRUE(first.Ok());
    ASSERT_TRUE(first.WaitToSay(std::regex("Started"))) << "start-up is over when the program reports it";
    ASSERT_EQ(CountMainWindows(), 1) << "the first start shows its window";
    WriteSetting(HKEY_CURRENT_USER, "State", "1");  // a second start that read it would write it back

    Started second(copy.exe);
    ASSERT_TRUE(second.Ok());
    EXPECT_EQ(second.Wait(), 0);
    EXPECT_EQ(second.Says(), "") << "nothing shown or said";
    EXPECT_EQ(CountMainWindows(), 1);
    EXPECT_EQ(ReadSetting(HKEY_CURRENT_USER, "State"), "1");

    ::PostMessageA(::FindWindowA("VantorelFrmMain", nullptr), WM_CLOSE, 0, 0);
    EXPECT_EQ(first.Wait(), 0) << "closing the window ends the program";
    DeleteSettings();
}

TEST(ProgramWin32, SweepsAListedConnectionAndShowsTheCount) {
    ProgramCopy copy("vantorel-program-test", "-939524086\r\n33554559");  // 127.0.0.2 is listed
    DeleteSettings();
    WriteSetting(HKEY_CURRENT_USER, "State", "1");

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

    // Under Wine SetTcpEntry answers success without closing anything, so the connection is
    // counted again on every sweep: the count climbs while the program runs.
    Started program(copy.exe);
    ASSERT_TRUE(program.Ok());
    EXPECT_TRUE(program.WaitToSay(std::regex("Caption: Vantorel - [1-9][0-9]* attempts intercepted")))
        << "the sweep writes the count without a blank\n" << program.Says();
    EXPECT_NE(program.Says().find("guard on"), std::string::npos) << program.Says();
    HWND window = ::FindWindowA("VantorelFrmMain", nullptr);
    ASSERT_NE(window, nullptr);
    char caption[128] = {};
    ::GetWindowTextA(window, caption, sizeof caption);
    EXPECT_EQ(std::string(caption).rfind("Vantorel - ", 0), 0u) << caption;
    EXPECT_GE(std::atoi(ReadSetting(HKEY_CURRENT_USER, "Attempts").c_str()), 1) << "the count is stored";

    ::PostMessageA(window, WM_CLOSE, 0, 0);
    EXPECT_EQ(program.Wait(), 0);
    ::closesocket(server);
    ::closesocket(client);
    ::closesocket(listener);
    ::WSACleanup();
    DeleteSettings();
}

}  // namespace
}  // namespace vantorel
