// vantorel.exe: start-up of the guard on its main window, then the message loop.
//
// The program refuses to run twice, brings the guard up in its stored state, sweeps the connection
// table every 55 ms while the guard is on, and keeps its icon in the notification area. It also
// writes what it shows to standard output (the definitions it read, the caption whenever it has
// changed, once a second, and each switch of the guard), so a run without a screen can be followed.
#include <windows.h>

#include <chrono>
#include <cstdio>
#include <string>

#include "guard/attempts.h"
#include "guard/guard.h"
#include "guard/read_definitions.h"
#include "platform/win32/connection_table_win32.h"
#include "platform/win32/files_win32.h"
#include "platform/win32/main_window_win32.h"
#include "platform/win32/registry_win32.h"
#include "platform/win32/shell_win32.h"

namespace {

constexpr const char* kWebAddress = "http://www.vantorel.com/";

void WriteStdout(const std::string& text) {
    HANDLE out = ::GetStdHandle(STD_OUTPUT_HANDLE);
    if (out == nullptr || out == INVALID_HANDLE_VALUE) return;
    DWORD written = 0;
    ::WriteFile(out, text.data(), static_cast<DWORD>(text.size()), &written, nullptr);
}

}  // namespace

int WINAPI WinMain(HINSTANCE instance, HINSTANCE, LPSTR, int) {
    using namespace vantorel;
    win32::Win32Registry registry;
    win32::Win32Files files;
    win32::Win32ConnectionTable table;
    win32::Win32NotifyArea tray;
    win32::Win32WindowManager windows;
    win32::Win32MessagePump pump;
    win32::Win32Instance previous;
    win32::MainWindow frmMain;

    auto onMissing = [&frmMain] {
        std::string text = std::string("Reading definitions, installation corrupted re-install at ") + kWebAddress;
        WriteStdout("Definitions Error: " + text + "\n");
        // Owned by the main window, so it stands in front of it.
        ::MessageBoxA(reinterpret_cast<HWND>(frmMain.Handle()), text.c_str(), "Definitions Error",
                      MB_OK | MB_ICONSTOP);
    };
    Guard guard(GuardPlatform{registry, files, table, tray, windows, pump, previous},
                GuardWindow{frmMain, frmMain.BtnOnOff(), frmMain.Tmr(), frmMain.Timer()}, win32::ProgramFolder(),
                onMissing);

    if (!guard.Initialize()) return 0;  // another instance runs: leave without a trace

    std::string reported;
    std::uint64_t sweepsReported = 0;
    auto report = [&] {
        std::string caption = frmMain.Caption();
        std::uint64_t sweeps = guard.SweepsRun();
        if (caption != reported) WriteStdout("Caption: " + caption + "\n");
        if (sweeps != sweepsReported) {
            char line[160];
            std::snprintf(line, sizeof line, "Swept the connection table %llu times; the last sweep examined %u rows.\n",
                          static_cast<unsigned long long>(sweeps), guard.Sweep().LastSweep().examined);
            WriteStdout(line);
        }
        reported = caption;
        sweepsReported = sweeps;
    };

    win32::MainWindowHandlers handlers;
    handlers.switchClick = [&] {
        guard.BtnOnOffClick();
        WriteStdout(std::string("Guard ") + (frmMain.BtnOnOff().Value() ? "on" : "off") + "\n");
    };
    handlers.tmrTick = [&] { guard.TmrTick(); };
    handlers.timerTick = report;
    handlers.mouseMove = [&](std::uint32_t code) { guard.MouseMove(code); };
    handlers.taskbarCreated = [&] { guard.TaskbarCreated(); };
    handlers.unload = [&] { guard.Unload(); };
    if (!frmMain.Create(instance, handlers)) {
        char line[128];
        std::snprintf(line, sizeof line, "Vantorel: the main window could not be created (CreateWindowExA, error %lu).\n",
                      ::GetLastError());
        WriteStdout(line);
        return 1;
    }

    auto started = std::chrono::steady_clock::now();
    guard.Load();
    double ms = std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - started).count();
    char line[512];
    std::snprintf(line, sizeof line, "Started in %.1f ms with %zu definitions from %s; guard %s.\n", ms,
                  Definitions.size(), DefinitionsPath(win32::ProgramFolder()).c_str(),
                  frmMain.BtnOnOff().Value() ? "on" : "off");
    WriteStdout(line);
    report();

    MSG message;
    while (::GetMessageA(&message, nullptr, 0, 0) > 0) {
        ::TranslateMessage(&message);
        ::DispatchMessageA(&message);
    }
    return static_cast<int>(message.wParam);
}
