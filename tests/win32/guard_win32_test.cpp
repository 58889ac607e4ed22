// The guard's window side under Wine on a virtual display: the tray routines against Wine's shell and
// the sweep's yield. Start-up, the switch, hiding in the tray and the icon's clicks bringing the window
// back are proved on the real program end to end (tests/e2e/).
#include <windows.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "guard/attempts.h"
#include "app/main_window.h"
#include "platform/win32/shell_win32.h"
#include "ui/main/tray.h"

namespace vantorel {
namespace {

// The shell, noting each call's answer and the tip it was given.
class NotingNotifyArea final : public platform::NotifyArea {
public:
    bool ShellNotifyIcon(std::uint32_t message, const platform::NotifyIconData& data) override {
        bool ok = real.ShellNotifyIcon(message, data);
        calls.push_back({message, ok, data.tip});
        return ok;
    }
    struct Call {
        std::uint32_t message;
        bool ok;
        std::string tip;
    };
    win32::Win32NotifyArea real;
    std::vector<Call> calls;
};

TEST(TrayWin32, RoutinesRunAgainstWinesShell) {
    win32::MainWindow window;
    NotingNotifyArea tray;
    win32::MainWindowHandlers handlers;
    handlers.taskbarCreated = [&] { AddTrayIcon(tray, window, window.Icon(), window.Caption(), kTrayCallbackMessage); };
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr), handlers)) << "no display? error " << ::GetLastError();
    AddTrayIcon(tray, window, window.Icon(), StatusText(0, CountForm::BlankBeforeSign), kTrayCallbackMessage);
    ModifyTrayIcon(tray, window, std::string(100, 'x'), kTrayCallbackMessage);  // cut to the field
    RemoveTrayIcon(tray, window);
    // A restarted taskbar announces itself with the registered message: the icon is added again.
    ::SendMessageA(window.hwnd(), window.TaskbarCreatedMessage(), 0, 0);
    RemoveTrayIcon(tray, window);
    ASSERT_EQ(tray.calls.size(), 5u);
    for (const auto& call : tray.calls) EXPECT_TRUE(call.ok) << "Shell_NotifyIconA operation " << call.message;
    EXPECT_EQ(tray.calls[1].tip, std::string(63, 'x')) << "the tip handed to the shell fits its 64-byte field";
    EXPECT_EQ(tray.calls[3].message, platform::kNimAdd);
}

TEST(MessagePumpWin32, TheSweepsYieldStillRunsWaitingMessages) {
    int ticks = 0;
    win32::MainWindow window;
    win32::MainWindowHandlers handlers;
    handlers.timerTick = [&] { ++ticks; };
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr), handlers));
    MSG stale;
    while (::PeekMessageA(&stale, nullptr, 0, 0, PM_REMOVE)) {}
    window.Timer().SetInterval(20);
    window.Timer().SetEnabled(true);
    // A loop that only yields, as a long sweep does: the timer's ticks still arrive.
    win32::Win32MessagePump pump;
    DWORD until = ::GetTickCount() + 3000;
    while (ticks < 3 && ::GetTickCount() < until) ASSERT_TRUE(pump.YieldToMessages());
    EXPECT_GE(ticks, 3);
    window.Timer().SetEnabled(false);

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

}  // namespace
}  // namespace vantorel
