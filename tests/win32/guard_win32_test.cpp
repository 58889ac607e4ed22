// The guard's window side under Wine on a virtual display: the tray routines against Wine's shell,
// BringToFront and the icon's mouse notifications on a real window, the sweep's yield, and start-up
// on the real registry with real clicks on the switch.
#include <windows.h>

#include <gtest/gtest.h>


#include <fstream>
#include <string>
#include <vector>

#include "fakes/fake_guard_platform.h"
#include "guard/attempts.h"
#include "guard/guard.h"
#include "platform/win32/connection_table_win32.h"
#include "platform/win32/files_win32.h"
#include "win32/vantorel_settings.h"
#include "app/main_window.h"
#include "platform/win32/registry_win32.h"
#include "platform/win32/shell_win32.h"
#include "ui/main/tray.h"

namespace vantorel {
namespace {

using testing::DeleteSettings;
using testing::ReadSetting;
using testing::WriteSetting;

using namespace vantorel::testing;

// The shell, noting each call's answer.
class NotingNotifyArea final : public platform::NotifyArea {
public:
    bool ShellNotifyIcon(std::uint32_t message, const platform::NotifyIconData& data) override {
        bool ok = real.ShellNotifyIcon(message, data);
        calls.push_back({message, ok});
        return ok;
    }
    struct Call {
        std::uint32_t message;
        bool ok;
    };
    win32::Win32NotifyArea real;
    std::vector<Call> calls;
};

bool Topmost(HWND hwnd) { return (::GetWindowLongPtrA(hwnd, GWL_EXSTYLE) & WS_EX_TOPMOST) != 0; }

TEST(TrayWin32, RoutinesRunAgainstWinesShell) {
    win32::MainWindow window;
    NotingNotifyArea tray;
    win32::MainWindowHandlers handlers;
    handlers.taskbarCreated = [&] {
        AddTrayIcon(tray, window, window.Icon(), window.Caption(), kTrayCallbackMessage);
    };
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr), handlers)) << "no display? error " << ::GetLastError();
    AddTrayIcon(tray, window, window.Icon(), StatusText(0, CountForm::BlankBeforeSign), kTrayCallbackMessage);
    ModifyTrayIcon(tray, window, StatusText(1, CountForm::Plain), kTrayCallbackMessage);
    ModifyTrayIcon(tray, window, std::string(100, 'x'), kTrayCallbackMessage);  // cut to the field
    RemoveTrayIcon(tray, window);
    ASSERT_EQ(tray.calls.size(), 4u);
    for (const auto& call : tray.calls) EXPECT_TRUE(call.ok) << "Shell_NotifyIconA operation " << call.message;

    // A restarted taskbar announces itself with the registered message: the icon is added again.
    ASSERT_NE(window.TaskbarCreatedMessage(), 0u);
    ::SendMessageA(window.hwnd(), window.TaskbarCreatedMessage(), 0, 0);
    ASSERT_EQ(tray.calls.size(), 5u);
    EXPECT_EQ(tray.calls[4].message, platform::kNimAdd);
    EXPECT_TRUE(tray.calls[4].ok);
    RemoveTrayIcon(tray, window);
}

TEST(TrayWin32, IconClicksBringTheHiddenWindowBackRaisedNotTopmost) {
    win32::MainWindow window;
    win32::Win32WindowManager windows;
    win32::Win32MessagePump pump;
    win32::MainWindowHandlers handlers;
    handlers.mouseMove = [&](std::uint32_t code) { TrayMouseNotification(window, windows, pump, code); };
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr), handlers));
    HWND hwnd = window.hwnd();

    // As the icon reports a left click: the mouse-move message with the code in the low word.
    ASSERT_FALSE(window.Visible());
    ::SendMessageA(hwnd, WM_MOUSEMOVE, 0, MAKELPARAM(WM_LBUTTONUP, 0));
    EXPECT_TRUE(window.Visible());
    EXPECT_EQ(window.State(), platform::WindowState::Normal);
    EXPECT_FALSE(Topmost(hwnd)) << "raised without staying on top";

    // Minimised and hidden (as the tray button leaves it): a right click brings it back normal.
    ::ShowWindow(hwnd, SW_MINIMIZE);
    ::ShowWindow(hwnd, SW_HIDE);
    ::SendMessageA(hwnd, WM_MOUSEMOVE, 0, MAKELPARAM(WM_RBUTTONUP, 0));
    EXPECT_TRUE(window.Visible());
    EXPECT_EQ(window.State(), platform::WindowState::Normal);

    // A plain move over the icon does nothing.
    ::ShowWindow(hwnd, SW_HIDE);
    ::SendMessageA(hwnd, WM_MOUSEMOVE, 0, MAKELPARAM(512, 0));
    EXPECT_FALSE(window.Visible());
}

TEST(MessagePumpWin32, TheSweepsYieldStillRunsWaitingMessages) {
    int ticks = 0;
    win32::MainWindow window;
    win32::MainWindowHandlers handlers;
    handlers.timerTick = [&] { ++ticks; };
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr), handlers));
    MSG stale;
    while (::PeekMessageA(&stale, nullptr, 0, 0, PM_REMOVE)) {
    }
    window.Timer().Interval(20);
    window.Timer().Enabled(true);
    // A loop that only yields, as a long sweep does: the timer's ticks still arrive.
    win32::Win32MessagePump pump;
    DWORD until = ::GetTickCount() + 3000;
    while (ticks < 3 && ::GetTickCount() < until) ASSERT_TRUE(pump.YieldToMessages());
    EXPECT_GE(ticks, 3);
    window.Timer().Enabled(false);

    // A quit request ends the loop and is kept for the main loop.
    ::PostQuitMessage(7);
    until = ::GetTickCount() + 3000;
    bool going = true;
    while (going && ::GetTickCount() < until) going = pump.YieldToMessages();
    EXPECT_FALSE(going);
    EXPECT_FALSE(pump.PumpMessages()) << "stays quitting";
    MSG quit;
    ASSERT_TRUE(::PeekMessageA(&quit, nullptr, WM_QUIT, WM_QUIT, PM_REMOVE));
    EXPECT_EQ(quit.wParam, 7u);
}

class StartUpWin32 : public ::testing::Test {
protected:
    void SetUp() override {
        DeleteSettings();
        char temp[MAX_PATH];
        ::GetTempPathA(MAX_PATH, temp);
        folder_ = std::string(temp) + "vantorel-startup-test";
        ::CreateDirectoryA(folder_.c_str(), nullptr);
        std::ofstream(folder_ + "\\sw2.def", std::ios::binary) << "-939524086\r\n33554559";
    }
    void TearDown() override {
        ::DeleteFileA((folder_ + "\\sw2.def").c_str());
        ::RemoveDirectoryA(folder_.c_str());
        DeleteSettings();
    }

    struct Program {
        win32::Win32Registry registry;
        win32::Win32Files files;
        win32::Win32ConnectionTable table;
        NotingNotifyArea tray;
        win32::Win32WindowManager windows;
        win32::Win32MessagePump pump;
        win32::Win32Instance instance{"Vantorel.StartUpTest"};
        win32::MainWindow frmMain;
        win32::Win32Shell shell;
        struct : platform::Application {
            void ShowOptionsModal(platform::WindowHandle, int) override {}
            void EndProgram() override {}
        } application;
        FrmMain form;
        explicit Program(const std::string& folder)
            : form(FrmMainPlatform{GuardPlatform{registry, files, table, windows, pump, instance}, tray, shell,
                                   application},
                   frmMain.Controls(), folder) {}
        void Start() {
            // Windows of earlier tests on this thread posted their quit message when destroyed.
            MSG stale;
            while (::PeekMessageA(&stale, nullptr, 0, 0, PM_REMOVE)) {
            }
            ASSERT_TRUE(form.Initialize());
            win32::MainWindowHandlers handlers;
            handlers.switchClick = [this] { form.BtnOnOffClick(); };
            handlers.tmrTick = [this] { form.TmrTick(); };
            handlers.unload = [this] { form.Unload(); };
            ASSERT_TRUE(frmMain.Create(::GetModuleHandleA(nullptr), handlers));
            form.Load();
        }
    };

    std::string folder_;
};

TEST_F(StartUpWin32, FirstStartOnAnEmptyRegistryThenTwoClicks) {
    Program program(folder_);
    program.Start();
    EXPECT_EQ(Definitions.size(), 2u);
    EXPECT_TRUE(program.frmMain.Visible());
    EXPECT_EQ(program.frmMain.Caption(), "Vantorel -  0 attempts intercepted");
    EXPECT_EQ(program.frmMain.BtnOnOff().Caption(), "OFF");
    EXPECT_EQ(ReadSetting(HKEY_CURRENT_USER, "State"), "0");
    EXPECT_FALSE(program.frmMain.Tmr().Enabled());
    EXPECT_TRUE(program.frmMain.Timer().Enabled());
    ASSERT_EQ(program.tray.calls.size(), 1u);
    EXPECT_TRUE(program.tray.calls[0].ok) << "the icon was added";

    // The window is centred on the screen.
    RECT r;
    ::GetWindowRect(program.frmMain.hwnd(), &r);
    EXPECT_EQ(r.left, (::GetSystemMetrics(SM_CXSCREEN) - (r.right - r.left)) / 2);
    EXPECT_EQ(r.top, (::GetSystemMetrics(SM_CYSCREEN) - (r.bottom - r.top)) / 2);

    // Clicks on the real button: on, then off again.
    HWND button = program.frmMain.BtnOnOff().Handle();
    ::SendMessageA(button, BM_CLICK, 0, 0);
    EXPECT_EQ(program.frmMain.BtnOnOff().Caption(), "ON");
    EXPECT_EQ(program.frmMain.BtnOnOff().BackColor(), 65280u);
    EXPECT_EQ(ReadSetting(HKEY_CURRENT_USER, "State"), "1");
    EXPECT_TRUE(program.frmMain.Tmr().Enabled());

    // While on, the sweep timer really ticks and sweeps.
    DWORD until = ::GetTickCount() + 2000;
    while (program.form.guard().SweepsRun() < 3 && ::GetTickCount() < until) {
        ::MsgWaitForMultipleObjects(0, nullptr, FALSE, 50, QS_ALLINPUT);
        program.pump.PumpMessages();
    }
    EXPECT_GE(program.form.guard().SweepsRun(), 3u);

    ::SendMessageA(button, BM_CLICK, 0, 0);
    EXPECT_EQ(program.frmMain.BtnOnOff().Caption(), "OFF");
    EXPECT_EQ(program.frmMain.BtnOnOff().BackColor(), 192u);
    EXPECT_EQ(ReadSetting(HKEY_CURRENT_USER, "State"), "0");
    EXPECT_FALSE(program.frmMain.Tmr().Enabled());
}

TEST_F(StartUpWin32, StoredStateSevenComesUpOnAndIsRewritten) {
    WriteSetting(HKEY_CURRENT_USER, "State", "7");
    WriteSetting(HKEY_CURRENT_USER, "Attempts", "abc");
    WriteSetting(HKEY_LOCAL_MACHINE, "Tray", "1");
    Program program(folder_);
    program.Start();
    EXPECT_EQ(program.frmMain.BtnOnOff().Caption(), "ON");
    EXPECT_TRUE(program.frmMain.Tmr().Enabled());
    EXPECT_EQ(ReadSetting(HKEY_CURRENT_USER, "State"), "1");
    EXPECT_EQ(program.frmMain.Caption(), "Vantorel -  0 attempts intercepted") << "a count that is no number is 0";
    EXPECT_FALSE(program.frmMain.Visible()) << "started hidden in the tray";
}

}  // namespace
}  // namespace vantorel
