// vtprobe.exe: reads windows for the end-to-end tests, from inside the same Wine desktop as the
// program under test (inside a Wine desktop the program's windows are not X windows, so X tools
// cannot read them). The desktop is the one named by VTPROBE_DESKTOP, "vt" by default.
//
//   vtprobe windows                 every top-level window of other processes:
//                                   hwnd \t class \t caption \t visible \t enabled \t topmost \t left top right bottom
//   vtprobe controls HWND           the child windows of HWND, same columns, screen coordinates
//   vtprobe post HWND MSG WPARAM LPARAM
//                                   posts a message (numbers in decimal or 0x hex)
//   vtprobe run "COMMAND LINE"      runs a program in the desktop, waits for it and exits with its code
//   vtprobe hold NAME MS            holds the named mutex NAME for MS milliseconds ("held" once it does)
#include <windows.h>

#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

void Print(HWND hwnd) {
    char caption[512] = {0};
    char className[256] = {0};
    ::GetWindowTextA(hwnd, caption, sizeof caption);
    ::GetClassNameA(hwnd, className, sizeof className);
    RECT r{};
    ::GetWindowRect(hwnd, &r);
    const bool topmost = (::GetWindowLongPtrA(hwnd, GWL_EXSTYLE) & WS_EX_TOPMOST) != 0;
    std::printf("%lld\t%s\t%s\t%d\t%d\t%d\t%ld %ld %ld %ld\n", static_cast<long long>(reinterpret_cast<INT_PTR>(hwnd)),
                className, caption, ::IsWindowVisible(hwnd) ? 1 : 0, ::IsWindowEnabled(hwnd) ? 1 : 0, topmost ? 1 : 0,
                r.left, r.top, r.right, r.bottom);
}

BOOL CALLBACK EachTopLevel(HWND hwnd, LPARAM) {
    DWORD pid = 0;
    ::GetWindowThreadProcessId(hwnd, &pid);
    if (pid != ::GetCurrentProcessId()) Print(hwnd);
    return TRUE;
}

BOOL CALLBACK EachChild(HWND hwnd, LPARAM) {
    Print(hwnd);
    return TRUE;
}

HWND ToHwnd(const char* text) { return reinterpret_cast<HWND>(static_cast<INT_PTR>(std::strtoll(text, nullptr, 0))); }

}  // namespace

int main(int argc, char** argv) {
    // Work in the program's Wine desktop (named by VTPROBE_DESKTOP, "vt" by default).
    const char* desktopName = std::getenv("VTPROBE_DESKTOP");
    HDESK desktop = ::OpenDesktopA(desktopName != nullptr ? desktopName : "vt", 0, FALSE, GENERIC_ALL);
    if (desktop != nullptr) ::SetThreadDesktop(desktop);

    std::string command = argc > 1 ? argv[1] : "";
    if (command == "windows") {
        ::EnumWindows(EachTopLevel, 0);
    } else if (command == "controls" && argc > 2) {
        ::EnumChildWindows(ToHwnd(argv[2]), EachChild, 0);
    } else if (command == "post" && argc > 5) {
        UINT message = static_cast<UINT>(std::strtoul(argv[3], nullptr, 0));
        WPARAM wParam = static_cast<WPARAM>(std::strtoull(argv[4], nullptr, 0));
        LPARAM lParam = static_cast<LPARAM>(std::strtoll(argv[5], nullptr, 0));
        return ::PostMessageA(ToHwnd(argv[2]), message, wParam, lParam) ? 0 : 1;
    } else if (command == "run" && argc > 2) {
        std::string line = argv[2];
        STARTUPINFOA startup{};
        startup.cb = sizeof startup;
        std::string name = desktopName != nullptr ? desktopName : "vt";
        startup.lpDesktop = name.data();
        PROCESS_INFORMATION process{};
        if (!::CreateProcessA(nullptr, line.data(), nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup, &process)) {
            std::fprintf(stderr, "vtprobe: cannot run %s (error %lu)\n", line.c_str(), ::GetLastError());
            return 127;
        }
        ::WaitForSingleObject(process.hProcess, INFINITE);
        DWORD code = 0;
        ::GetExitCodeProcess(process.hProcess, &code);
        ::CloseHandle(process.hThread);
        ::CloseHandle(process.hProcess);
        return static_cast<int>(code);
    } else if (command == "hold" && argc > 3) {
        HANDLE mutex = ::CreateMutexA(nullptr, FALSE, argv[2]);
        std::printf("held\n");
        std::fflush(stdout);
        ::Sleep(static_cast<DWORD>(std::strtoul(argv[3], nullptr, 10)));
        ::CloseHandle(mutex);
    } else {
        std::fprintf(stderr,
                     "usage: vtprobe windows | controls HWND | post HWND MSG WPARAM LPARAM | "
                     "run \"COMMAND LINE\" | hold NAME MS\n");
        return 2;
    }
    std::fflush(stdout);
    return 0;
}
