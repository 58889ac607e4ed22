// FrmMain's Win32 window under Wine on a virtual display, with the program's own resources linked
// in: the icons as compiled (padlock 48 x 48 in 24-bit colour, bulbs 32 x 32 and 16 x 16 in 16
// colours), the version resource, the layout in twips at each DPI and the tab order, what the
// window logic asks of the real window (the status light as its icon, no size command, Alt+O
// through the sweep's pump, the session's end), the sweep's yield, and the tray routines against
// Wine's shell. Start-up, the switch, clicks, hiding in the tray and back, closing and the layout
// of the real program at 150 % are proved in tests/e2e/.
#include <windows.h>

#include <gtest/gtest.h>

#include <cmath>
#include <string>
#include <vector>

#include "app/main_window.h"
#include "platform/win32/resource_ids.h"
#include "platform/win32/shell_win32.h"
#include "guard/attempts.h"
#include "ui/main/tray.h"
#include "ui/main/frm_main.h"
#include "version.h"
#include "win32/ui_input.h"

namespace vantorel {
namespace {

using win32::ChildRect;

// The entries of an icon group resource (a 6-byte header, 14 bytes an entry): (width, height, bits per pixel).
std::vector<std::vector<int>> IconGroup(int id) {
    HRSRC found = ::FindResourceA(nullptr, MAKEINTRESOURCEA(id), MAKEINTRESOURCEA(14) /* RT_GROUP_ICON */);
    if (found == nullptr) return {};
    const auto* data = static_cast<const BYTE*>(::LockResource(::LoadResource(nullptr, found)));
    std::vector<std::vector<int>> entries;
    for (int i = 0; i < data[4] + 256 * data[5]; ++i) {
        const BYTE* e = data + 6 + 14 * i;
        entries.push_back({e[0] == 0 ? 256 : e[0], e[1] == 0 ? 256 : e[1], e[6] + 256 * e[7]});
    }
    return entries;
}

TEST(ResourcesWin32, IconsAndVersionAsCompiledIn) {
    using Entries = std::vector<std::vector<int>>;
    EXPECT_EQ(IconGroup(IDI_PADLOCK), (Entries{{48, 48, 24}}));
    EXPECT_EQ(IconGroup(IDI_BULB_DARK), (Entries{{32, 32, 4}, {16, 16, 4}}));
    EXPECT_EQ(IconGroup(IDI_BULB_LIT), (Entries{{32, 32, 4}, {16, 16, 4}}));

    char path[MAX_PATH];
    ::GetModuleFileNameA(nullptr, path, sizeof path);
    DWORD ignored = 0;
    std::vector<char> info(::GetFileVersionInfoSizeA(path, &ignored));
    VS_FIXEDFILEINFO* fixed = nullptr;
    UINT length = 0;
    ASSERT_TRUE(!info.empty() && ::GetFileVersionInfoA(path, 0, static_cast<DWORD>(info.size()), info.data()) &&
                ::VerQueryValueA(info.data(), "\\", reinterpret_cast<void**>(&fixed), &length));
    EXPECT_EQ(fixed->dwFileVersionMS, static_cast<DWORD>(MAKELONG(kVersionMinor, kVersionMajor)));
}

TEST(MainWindowWin32, LightsTheSizeCommandAltOTheSweepsYieldAndTheSessionsEndOnTheRealWindow) {
    MSG stale;  // windows of earlier tests on this thread posted their quit message when destroyed
    while (::PeekMessageA(&stale, nullptr, 0, 0, PM_REMOVE)) {}
    win32::MainWindow window;
    int closes = 0, ticks = 0;
    win32::MainWindowHandlers handlers;
    handlers.timerTick = [&] { ++ticks; };
    handlers.close = [&] {
        ++closes;
        window.Destroy();
    };
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr), handlers));
    HWND hwnd = window.hwnd();
    EXPECT_EQ(window.Uf(1).Caption() + window.Uf(0).Caption(), "OptionsUpdate");
    EXPECT_EQ(window.Icon(), window.Lights(kLightPadlock)) << "the design icon is the padlock";

    // The lights the window logic sets are the window's real icon, big and small.
    auto icon = [&](WPARAM size) { return reinterpret_cast<HICON>(::SendMessageA(hwnd, WM_GETICON, size, 0)); };
    window.SetIcon(window.Lights(kLightBright));
    EXPECT_EQ(icon(ICON_BIG), window.ShownLight(kLightBright));
    EXPECT_NE(icon(ICON_SMALL), nullptr);
    window.SetIcon(window.Lights(kLightDark));
    EXPECT_EQ(icon(ICON_BIG), window.ShownLight(kLightDark));

    // The size command the window logic drops on every resize goes from the real system menu.
    ASSERT_TRUE(win32::Win32WindowManager().DeleteSystemMenuCommand(window.Handle(), platform::kScSize));
    HMENU menu = ::GetSystemMenu(hwnd, FALSE);
    EXPECT_EQ(::GetMenuState(menu, SC_SIZE, MF_BYCOMMAND), static_cast<UINT>(-1)) << "no size command";
    EXPECT_NE(::GetMenuState(menu, SC_CLOSE, MF_BYCOMMAND), static_cast<UINT>(-1));

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

TEST(MainWindowWin32, FollowsTheMonitorsDpiWithEveryTextWholeAndTabWalksTheButtons) {
    win32::MainWindow window;
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr)));
    HWND hwnd = window.hwnd(), onOff = window.BtnOnOff().Handle();
    ::ShowWindow(hwnd, SW_SHOWNA);
    for (UINT dpi : {144u, 192u, 120u, 96u}) {
        const int d = static_cast<int>(dpi);
        RECT suggested = win32::SendDpiChange(hwnd, dpi, {9120, 4335}), now;
        ::GetWindowRect(hwnd, &now);
        EXPECT_TRUE(::EqualRect(&now, &suggested)) << dpi << ": the suggested rectangle taken";
        RECT switchRect = ChildRect(onOff, hwnd);
        EXPECT_EQ(switchRect.left, ::MulDiv(120, d, 1440)) << dpi;
        EXPECT_EQ(switchRect.bottom - switchRect.top, ::MulDiv(4095, d, 1440)) << dpi;
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
        EXPECT_EQ(window.BtnOnOffWindow().button().Font().name, "Verdana");
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
