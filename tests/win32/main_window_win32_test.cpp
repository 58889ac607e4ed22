// FrmMain's Win32 window under Wine on a virtual display, with the program's own resources linked
// in: what the window logic asks of the real window (the status light as its icon, Alt+O through
// the sweep's pump, the session's end), the sweep's yield, the tray routines against Wine's shell,
// the layout in twips at each DPI and the tab order. Start-up, the switch, clicks, hiding in the
// tray and back, closing and the layout of the real program at 150 % are proved in tests/e2e/.
#include <windows.h>

#include <gtest/gtest.h>

#include <cmath>
#include <string>
#include <vector>

#include "app/main_window.h"
#include "guard/attempts.h"
#include "platform/win32/shell_win32.h"
#include "ui/main/frm_main.h"
#include "ui/main/tray.h"
#include "win32/ui_input.h"

namespace vantorel {
namespace {

// The shell, noting each call as "message answer tip".
class NotingNotifyArea final : public platform::NotifyArea {
public:
    bool ShellNotifyIcon(std::uint32_t message, const platform::NotifyIconData& data) override {
        bool ok = real.ShellNotifyIcon(message, data);
        calls.push_back(std::to_string(message) + (ok ? " ok " : " refused ") + data.tip);
        return ok;
    }
    win32::Win32NotifyArea real;
    std::vector<std::string> calls;
};

TEST(MainWindowWin32, TheLightTheTrayAltOTheSweepsYieldAndTheSessionsEndOnTheRealWindow) {
    MSG stale;  // windows of earlier tests on this thread posted their quit message when destroyed
    while (::PeekMessageA(&stale, nullptr, 0, 0, PM_REMOVE)) {}
    win32::MainWindow window;
    NotingNotifyArea tray;
    int closes = 0, ticks = 0;
    win32::MainWindowHandlers handlers;
    handlers.timerTick = [&] { ++ticks; };
    handlers.close = [&] {
        ++closes;
        window.Destroy();
    };
    handlers.taskbarCreated = [&] { AddTrayIcon(tray, window, window.Icon(), window.Caption(), kTrayCallbackMessage); };
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr), handlers)) << "no display? error " << ::GetLastError();
    HWND hwnd = window.hwnd();

    // The light the window logic sets is the window's real icon, big and small.
    window.SetIcon(window.Lights(kLightBright));
    EXPECT_EQ(reinterpret_cast<HICON>(::SendMessageA(hwnd, WM_GETICON, ICON_BIG, 0)), window.ShownLight(kLightBright));
    EXPECT_NE(::SendMessageA(hwnd, WM_GETICON, ICON_SMALL, 0), 0);

    // The tray routines against Wine's shell; a restarted taskbar announces itself with the
    // registered message, and the icon is added again.
    AddTrayIcon(tray, window, window.Icon(), StatusText(0, CountForm::BlankBeforeSign), kTrayCallbackMessage);
    ModifyTrayIcon(tray, window, std::string(100, 'x'), kTrayCallbackMessage);
    RemoveTrayIcon(tray, window);
    ::SendMessageA(hwnd, window.TaskbarCreatedMessage(), 0, 0);
    RemoveTrayIcon(tray, window);
    EXPECT_EQ(tray.calls,
              (std::vector<std::string>{"0 ok Vantorel -  0 attempts intercepted", "1 ok " + std::string(63, 'x'),
                                        "2 ok ", "0 ok " + window.Caption(), "2 ok "}))
        << "the tip handed to the shell fits its 64-byte field";

    // Alt+O that the yield of a sweep lets through is handled as the main loop handles it.
    int options = 0;
    window.BtnO(kBtnOptions).Click = [&] { ++options; };
    ::PostMessageA(window.BtnO(kBtnTray).hwnd(), WM_SYSCHAR, 'o', 1 << 29);
    win32::Win32MessagePump pump;
    EXPECT_TRUE(pump.PumpMessages());
    EXPECT_EQ(options, 1) << "Alt+O presses \"&Options\"";

    // A loop that only yields, as a long sweep does: the timer's ticks still arrive.
    window.Timer().SetInterval(20);
    window.Timer().SetEnabled(true);
    DWORD until = ::GetTickCount() + 3000;
    while (ticks < 3 && ::GetTickCount() < until) ASSERT_TRUE(pump.YieldToMessages());
    EXPECT_GE(ticks, 3);
    window.Timer().SetEnabled(false);

    // Logging off or shutting down closes the window as "&Exit" does, once the session really ends.
    EXPECT_EQ(::SendMessageA(hwnd, WM_QUERYENDSESSION, 0, 0), TRUE) << "the session may end";
    ::SendMessageA(hwnd, WM_ENDSESSION, FALSE, 0);  // it did not end after all
    EXPECT_EQ(closes, 0);
    ::SendMessageA(hwnd, WM_ENDSESSION, TRUE, 0);
    EXPECT_EQ(closes, 1);
    EXPECT_EQ(window.hwnd(), nullptr);
    // The quit request the window's end posts ends a sweep's yield and is kept for the main loop.
    bool going = true;
    for (until = ::GetTickCount() + 3000; going && ::GetTickCount() < until;) going = pump.YieldToMessages();
    EXPECT_FALSE(going);
    EXPECT_FALSE(pump.PumpMessages()) << "stays quitting";
    MSG quit;
    EXPECT_TRUE(::PeekMessageA(&quit, nullptr, WM_QUIT, WM_QUIT, PM_REMOVE)) << "the message loop is told to end";
}

TEST(MainWindowWin32, FollowsTheMonitorsDpiWithEveryTextWholeAndTabWalksTheButtons) {
    win32::MainWindow window;
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr)));
    HWND hwnd = window.hwnd(), onOff = window.BtnOnOff().Handle();
    ::ShowWindow(hwnd, SW_SHOWNA);
    for (UINT dpi : {144u, 192u, 96u}) {
        const int d = static_cast<int>(dpi);
        RECT suggested = win32::SendDpiChange(hwnd, dpi, {9120, 4335}), now;
        ::GetWindowRect(hwnd, &now);
        EXPECT_TRUE(::EqualRect(&now, &suggested)) << dpi << ": the suggested rectangle taken";
        RECT switchRect = win32::ChildRect(onOff, hwnd);
        EXPECT_EQ(switchRect.bottom - switchRect.top, ::MulDiv(4095, d, 1440)) << dpi << ": laid out in twips";
        EXPECT_EQ(win32::FontHeight(window.BtnO(kBtnExit).hwnd()), -::MulDiv(825, d, 7200)) << dpi;
        EXPECT_EQ(win32::FontHeight(onOff), -std::lround(14.25 * d / 72)) << dpi << ": the switch";
        HDC dc = ::GetDC(onOff);
        HGDIOBJ old = ::SelectObject(dc, reinterpret_cast<HFONT>(::SendMessageA(onOff, WM_GETFONT, 0, 0)));
        SIZE off{};
        ::GetTextExtentPoint32A(dc, "OFF", 3, &off);
        ::SelectObject(dc, old);
        ::ReleaseDC(onOff, dc);
        const auto& caption = window.BtnOnOffWindow().button().captionRect();
        EXPECT_EQ(caption.right - caption.left, off.cx) << dpi << ": the switch's caption laid out in that font";
        EXPECT_EQ(win32::IconWidth(reinterpret_cast<HICON>(::SendMessageA(hwnd, WM_GETICON, ICON_BIG, 0))),
                  ::MulDiv(32, d, 96))
            << dpi;
        EXPECT_EQ(win32::TextsCut(hwnd, dpi), "") << dpi;
    }

    // Tab, through the program's own handling of queued messages: the switch has the focus first;
    // Tab walks the panels' buttons, then the row, and round.
    ::ShowWindow(hwnd, SW_SHOW);
    ::SetForegroundWindow(hwnd);
    std::vector<HWND> focus;
    win32::Ticker user(60, [&] {
        focus.push_back(::GetFocus());
        if (focus.size() < 7) win32::Key(VK_TAB);
        return focus.size() == 7;
    });
    for (DWORD start = ::GetTickCount(); focus.size() < 7 && ::GetTickCount() - start < 5000;) {
        MSG msg;
        if (::PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) win32::DispatchQueuedMessage(msg);
        else ::MsgWaitForMultipleObjects(0, nullptr, FALSE, 50, QS_ALLINPUT);
    }
    EXPECT_EQ(focus, (std::vector<HWND>{onOff, window.BtnO(kBtnOptions).hwnd(), window.BtnO(kBtnUpdates).hwnd(),
                                        window.BtnO(kBtnTray).hwnd(), window.BtnO(kBtnExit).hwnd(),
                                        window.BtnO(kBtnHelp).hwnd(), onOff}));
}

}  // namespace
}  // namespace vantorel
