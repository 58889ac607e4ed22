// vantorel.exe: the main window FrmMain, start-up of the guard on it, then the message loop.
//
// The program refuses to run twice, brings the guard up in its stored state, sweeps the connection
// table every 55 ms while the guard is on, shows its state as the window's icon (a steady padlock
// while on, a blinking bulb while off) and keeps its icon in the notification area. It also writes
// what it shows to standard output (the definitions it read, the messages it shows, the caption
// whenever it has changed, the light and each switch of the guard), so a run without a screen can be
// followed.
#include <windows.h>

#include <chrono>
#include <optional>
#include <cstdio>
#include <string>

#include "guard/attempts.h"
#include "guard/read_definitions.h"
#include "platform/win32/connection_table_win32.h"
#include "platform/win32/files_win32.h"
#include "app/main_window.h"
#include "app/options_window.h"
#include "platform/win32/registry_win32.h"
#include "platform/win32/shell_win32.h"
#include "ui/main/frm_main.h"

namespace {

void WriteStdout(const std::string& text) {
    HANDLE out = ::GetStdHandle(STD_OUTPUT_HANDLE);
    if (out == nullptr || out == INVALID_HANDLE_VALUE) return;
    DWORD written = 0;
    ::WriteFile(out, text.data(), static_cast<DWORD>(text.size()), &written, nullptr);
}

// The shell, saying on standard output what it opens and shows.
class ReportingShell final : public vantorel::win32::Win32Shell {
public:
    std::intptr_t Execute(vantorel::platform::WindowHandle owner, const std::string& operation, const std::string& file,
                          const std::string& parameters, const std::string& directory, std::int32_t show) override {
        WriteStdout("Open: " + file + "\n");
        return Win32Shell::Execute(owner, operation, file, parameters, directory, show);
    }
    void ShowMessage(vantorel::platform::WindowHandle owner, const std::string& text, const std::string& title,
                     std::uint32_t style) override {
        WriteStdout(title + ": " + text + "\n");
        Win32Shell::ShowMessage(owner, text, title, style);
    }
};

class Program final : public vantorel::platform::Application {
public:
    Program(vantorel::win32::MainWindow& window, vantorel::platform::Files& files) : window_(window), files_(files) {}
    void ShowOptionsModal(vantorel::platform::WindowHandle owner, int frameIndex) override {
        WriteStdout(frameIndex == 1 ? "Options window: Updates\n" : "Options window: Options\n");
        vantorel::win32::ShowOptionsModal(reinterpret_cast<HWND>(owner), frameIndex, [this] { return Reload(); });
    }
    // A definitions list the update check installed is in force from the guard's next sweep.
    std::optional<std::size_t> Reload() {
        using namespace vantorel;
        const std::string path = DefinitionsPath(win32::ProgramFolder());
        DefinitionList fresh;
        if (!LoadDefinitions(path, files_, nullptr, fresh)) return std::nullopt;
        Definitions = std::move(fresh);
        WriteStdout("Definitions updated: " + std::to_string(Definitions.size()) + " definitions from " + path +
                    " in use.\n");
        return Definitions.size();
    }
    void EndProgram() override {
        window_.Destroy();
        ::PostQuitMessage(0);
    }

private:
    vantorel::win32::MainWindow& window_;
    vantorel::platform::Files& files_;
};

const char* LightName(const vantorel::win32::MainWindow& window) {
    if (window.Icon() == window.Lights(vantorel::kLightPadlock)) return "padlock";
    if (window.Icon() == window.Lights(vantorel::kLightBright)) return "bright bulb";
    return "dark bulb";
}

}  // namespace

int WINAPI WinMain(HINSTANCE instance, HINSTANCE, LPSTR, int) {
    using namespace vantorel;
    win32::Win32Instance previous;
    // Initialisation: another instance running ends this one at once, before any window exists.
    if (previous.PreviousInstance()) return 0;

    win32::Win32Registry registry;
    win32::Win32Files files;
    win32::Win32ConnectionTable table;
    win32::Win32NotifyArea tray;
    win32::Win32WindowManager windows;
    win32::Win32MessagePump pump;
    ReportingShell shell;
    win32::MainWindow window;
    Program program(window, files);

    if (!window.Create(instance)) {
        char line[128];
        std::snprintf(line, sizeof line,
                      "Vantorel: the main window could not be created (CreateWindowExA, error %lu).\n",
                      ::GetLastError());
        WriteStdout(line);
        return 1;
    }

    FrmMain frmMain(
        FrmMainPlatform{GuardPlatform{registry, files, table, windows, pump, previous}, tray, shell, program},
        window.Controls(), win32::ProgramFolder());

    std::string reportedCaption, reportedLight;
    std::uint64_t sweepsReported = 0;
    auto report = [&] {
        std::string caption = window.Caption();
        std::string light = LightName(window);
        std::uint64_t sweeps = frmMain.guard().SweepsRun();
        if (caption != reportedCaption) WriteStdout("Caption: " + caption + "\n");
        if (light != reportedLight) WriteStdout("Light: " + light + "\n");
        if (sweeps != sweepsReported) {
            char line[160];
            std::snprintf(line, sizeof line,
                          "Swept the connection table %llu times; the last sweep examined %u rows.\n",
                          static_cast<unsigned long long>(sweeps), frmMain.guard().Sweep().LastSweep().examined);
            WriteStdout(line);
        }
        reportedCaption = caption;
        reportedLight = light;
        sweepsReported = sweeps;
    };

    win32::MainWindowHandlers handlers;
    handlers.switchClick = [&] {
        frmMain.BtnOnOffClick();
        WriteStdout(std::string("Guard ") + (window.BtnOnOff().Value() ? "on" : "off") + "\n");
    };
    handlers.tmrTick = [&] { frmMain.TmrTick(); };
    handlers.timerTick = [&] {
        frmMain.TimerTick();
        report();
    };
    handlers.resize = [&] {
        frmMain.Resize();
        if (!window.Visible()) WriteStdout("Hidden in the tray\n");
    };
    handlers.mouseMove = [&](std::uint32_t code) { frmMain.MouseMove(code); };
    handlers.taskbarCreated = [&] { frmMain.TaskbarCreated(); };
    handlers.close = [&] { frmMain.QueryUnload(); };
    handlers.unload = [&] {
        frmMain.Unload();
        WriteStdout("Unloaded\n");
    };
    window.SetHandlers(handlers);

    auto started = std::chrono::steady_clock::now();
    frmMain.Load();
    double ms = std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - started).count();
    char line[512];
    std::snprintf(line, sizeof line, "Started in %.1f ms with %zu definitions from %s; guard %s.\n", ms,
                  Definitions.size(), DefinitionsPath(win32::ProgramFolder()).c_str(),
                  window.BtnOnOff().Value() ? "on" : "off");
    WriteStdout(line);
    report();

    MSG message;
    while (::GetMessageA(&message, nullptr, 0, 0) > 0) win32::DispatchQueuedMessage(message);
    return static_cast<int>(message.wParam);
}
