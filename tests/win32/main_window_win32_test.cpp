// FrmMain's Win32 window under Wine on a virtual display, with the program's own resources linked
// in: the icons as compiled (padlock 48 x 48 in 24-bit colour, bulbs 32 x 32 and 16 x 16 in 16
// colours), the version resource, the layout in twips at the window's DPI, the switch's design, and
// the window logic on the real window (the size command leaves the system menu, the status light
// changes the window's real icon, clicks reach their index, the close request ends the message
// loop). Hiding in the tray and the end of the real program are proved in tests/e2e/.
#include <windows.h>

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <tuple>
#include <string>
#include <vector>

#include "fakes/fake_file_system.h"
#include "fakes/fake_guard_platform.h"
#include "guard/attempts.h"
#include "platform/win32/connection_table_win32.h"
#include "app/main_window.h"
#include "platform/win32/registry_win32.h"
#include "platform/win32/resource_ids.h"
#include "platform/win32/shell_win32.h"
#include "ui/main/frm_main.h"
#include "version.h"
#include "win32/ui_input.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;

#pragma pack(push, 2)
struct GroupIconEntry {
    BYTE width, height, colourCount, reserved;
    WORD planes, bitCount;
    DWORD bytes;
    WORD id;
};
#pragma pack(pop)

// The entries of an icon group resource: (width, height, bits per pixel).
std::vector<std::vector<int>> IconGroup(int id) {
    HRSRC found = ::FindResourceA(nullptr, MAKEINTRESOURCEA(id), MAKEINTRESOURCEA(14) /* RT_GROUP_ICON */);
    if (found == nullptr) return {};
    const auto* data = static_cast<const BYTE*>(::LockResource(::LoadResource(nullptr, found)));
    WORD count = 0;
    std::memcpy(&count, data + 4, 2);
    std::vector<std::vector<int>> entries;
    for (WORD i = 0; i < count; ++i) {
        GroupIconEntry entry;
        std::memcpy(&entry, data + 6 + i * sizeof entry, sizeof entry);
        entries.push_back(
            {entry.width == 0 ? 256 : entry.width, entry.height == 0 ? 256 : entry.height, entry.bitCount});
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
    DWORD size = ::GetFileVersionInfoSizeA(path, &ignored);
    ASSERT_GT(size, 0u);
    std::vector<char> info(size);
    ASSERT_TRUE(::GetFileVersionInfoA(path, 0, size, info.data()));
    VS_FIXEDFILEINFO* fixed = nullptr;
    UINT length = 0;
    ASSERT_TRUE(::VerQueryValueA(info.data(), "\\", reinterpret_cast<void**>(&fixed), &length));
    EXPECT_EQ(HIWORD(fixed->dwFileVersionMS), static_cast<WORD>(kVersionMajor));
    EXPECT_EQ(LOWORD(fixed->dwFileVersionMS), static_cast<WORD>(kVersionMinor));
}

class RecordingApplication final : public platform::Application {
public:
    void ShowOptionsModal(platform::WindowHandle, int frameIndex) override { frames.push_back(frameIndex); }
    void EndProgram() override {
        ++ends;
        if (window != nullptr) window->Destroy();
    }
    std::vector<int> frames;
    int ends = 0;
    win32::MainWindow* window = nullptr;
};

RECT ChildRect(HWND child, HWND relativeTo) {
    RECT r;
    ::GetWindowRect(child, &r);
    ::MapWindowPoints(nullptr, relativeTo, reinterpret_cast<POINT*>(&r), 2);
    return r;
}

// Ended by a close request or by the end of the session (logging off, shutting down).
class MainWindowWin32 : public ::testing::TestWithParam<UINT> {};
INSTANTIATE_TEST_SUITE_P(EndedBy, MainWindowWin32, ::testing::Values(WM_CLOSE, WM_ENDSESSION));

TEST_P(MainWindowWin32, LayoutSwitchLightsAndTheWindowLogicOnTheRealWindow) {
    MSG stale;  // windows of earlier tests on this thread posted their quit message when destroyed
    while (::PeekMessageA(&stale, nullptr, 0, 0, PM_REMOVE)) {
    }
    win32::MainWindow window;
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr)));
    const UINT dpi = window.Dpi();
    HWND hwnd = window.hwnd();

    // The client area and the controls where the design puts them, at this DPI.
    RECT client;
    ::GetClientRect(hwnd, &client);
    EXPECT_EQ(client.right, ::MulDiv(9120, static_cast<int>(dpi), 1440));
    EXPECT_EQ(client.bottom, ::MulDiv(4335, static_cast<int>(dpi), 1440));
    RECT onOff = ChildRect(window.BtnOnOff().Handle(), hwnd);
    EXPECT_EQ(onOff.left, ::MulDiv(120, static_cast<int>(dpi), 1440));
    EXPECT_EQ(onOff.bottom - onOff.top, ::MulDiv(4095, static_cast<int>(dpi), 1440));
    RECT options = ChildRect(window.BtnO(kBtnOptions).hwnd(), hwnd);
    RECT panel = ChildRect(window.Uf(1).hwnd(), hwnd);
    EXPECT_EQ(options.left - panel.left, ::MulDiv(2400, static_cast<int>(dpi), 1440)) << "placed on its panel";
    EXPECT_EQ(window.Uf(1).Caption() + window.Uf(0).Caption(), "OptionsUpdate");

    // The switch: a KirelXPButton in check-box behaviour, read from the window's design.
    char className[64] = {};
    ::GetClassNameA(window.BtnOnOff().Handle(), className, sizeof className);
    EXPECT_STREQ(className, "KirelXPButton");
    const auto& onOffButton = window.BtnOnOffWindow().button();
    EXPECT_EQ(std::make_tuple(onOffButton.CheckBoxBehaviour(), onOffButton.Font().name),
              std::make_tuple(true, std::string("Verdana")));

    EXPECT_EQ(window.Icon(), window.Lights(kLightPadlock)) << "the design icon is the padlock";

    // The window logic on it, with the real registry, tray and window manager.
    ::RegDeleteKeyA(HKEY_CURRENT_USER, "SOFTWARE\\Vantorel");
    ::RegDeleteKeyA(HKEY_LOCAL_MACHINE, "SOFTWARE\\Vantorel");
    win32::Win32Registry registry;
    FakeFileSystem files;
    files.files["C:\\vt\\sw2.def"] = "67305985";
    win32::Win32ConnectionTable table;
    win32::Win32NotifyArea tray;
    win32::Win32WindowManager windows;
    win32::Win32MessagePump pump;
    FakeInstance instance;
    win32::Win32Shell shell;
    RecordingApplication application;
    application.window = &window;
    FrmMain form(FrmMainPlatform{GuardPlatform{registry, files, table, windows, pump, instance}, tray, shell,
                                 application},
                 window.Controls(),
                 "C:\\vt");
    win32::MainWindowHandlers handlers;
    handlers.resize = [&] { form.Resize(); };
    handlers.close = [&] { form.QueryUnload(); };
    handlers.unload = [&] { form.Unload(); };
    window.SetHandlers(handlers);
    ASSERT_TRUE(form.Initialize());
    form.Load();
    ASSERT_TRUE(window.Visible());

    HMENU menu = ::GetSystemMenu(hwnd, FALSE);
    ::SendMessageA(hwnd, WM_SIZE, SIZE_RESTORED, MAKELPARAM(client.right, client.bottom));
    EXPECT_EQ(::GetMenuState(menu, SC_SIZE, MF_BYCOMMAND), static_cast<UINT>(-1)) << "no size command";
    EXPECT_NE(::GetMenuState(menu, SC_CLOSE, MF_BYCOMMAND), static_cast<UINT>(-1));

    // The status light is the window's real icon, big and small.
    form.TimerTick();
    EXPECT_EQ(::SendMessageA(hwnd, WM_GETICON, ICON_BIG, 0), reinterpret_cast<LRESULT>(window.ShownLight(kLightBright)));
    EXPECT_NE(::SendMessageA(hwnd, WM_GETICON, ICON_SMALL, 0), 0);
    form.TimerTick();
    EXPECT_EQ(::SendMessageA(hwnd, WM_GETICON, ICON_BIG, 0), reinterpret_cast<LRESULT>(window.ShownLight(kLightDark)));

    // Real clicks on the Win32 buttons reach the handler by index.
    ::SendMessageA(window.BtnO(kBtnUpdates).hwnd(), BM_CLICK, 0, 0);
    ::SendMessageA(window.BtnO(kBtnOptions).hwnd(), BM_CLICK, 0, 0);
    EXPECT_EQ(application.frames, (std::vector<int>{1, 0}));
    // Alt+O that the yield of a sweep lets through is handled as the main loop handles it.
    ::PostMessageA(window.BtnO(kBtnTray).hwnd(), WM_SYSCHAR, 'o', 1 << 29);
    EXPECT_TRUE(pump.PumpMessages());
    EXPECT_EQ(application.frames, (std::vector<int>{1, 0, 0})) << "Alt+O presses \"&Options\"";

    // The close request or the session's end: tray icon gone, timers stopped, the window destroyed once.
    if (GetParam() == WM_ENDSESSION) {
        EXPECT_EQ(::SendMessageA(hwnd, WM_QUERYENDSESSION, 0, 0), TRUE) << "the session may end";
        ::SendMessageA(hwnd, WM_ENDSESSION, FALSE, 0);  // it did not end after all
        EXPECT_EQ(application.ends, 0);
        EXPECT_TRUE(window.Timer().Enabled());
    }
    ::SendMessageA(hwnd, GetParam(), GetParam() == WM_ENDSESSION, 0);
    EXPECT_TRUE(form.Unloaded());
    EXPECT_EQ(application.ends, 1);
    EXPECT_FALSE(window.Timer().Enabled());
    EXPECT_EQ(window.hwnd(), nullptr);
    MSG quit;
    EXPECT_TRUE(::PeekMessageA(&quit, nullptr, WM_QUIT, WM_QUIT, PM_REMOVE)) << "the message loop is told to end";
}

TEST(MainWindowWin32, FollowsTheMonitorsDpiWithEveryTextWholeAndTheKeyboard) {
    win32::MainWindow window;
    ASSERT_TRUE(window.Create(::GetModuleHandleA(nullptr)));
    HWND hwnd = window.hwnd();
    ::ShowWindow(hwnd, SW_SHOWNA);
    for (UINT dpi : {144u, 192u, 120u, 96u}) {
        const int d = static_cast<int>(dpi);
        RECT suggested = win32::SendDpiChange(hwnd, dpi, {9120, 4335}), now, client;
        ::GetWindowRect(hwnd, &now);
        EXPECT_TRUE(::EqualRect(&now, &suggested)) << dpi << ": the suggested rectangle taken";
        ::GetClientRect(hwnd, &client);
        EXPECT_EQ(client.right, ::MulDiv(9120, d, 1440)) << dpi;
        RECT onOff = ChildRect(window.BtnOnOff().Handle(), hwnd);
        EXPECT_EQ(onOff.left, ::MulDiv(120, d, 1440)) << dpi;
        EXPECT_EQ(onOff.bottom - onOff.top, ::MulDiv(4095, d, 1440)) << dpi;
        RECT options = ChildRect(window.BtnO(kBtnOptions).hwnd(), hwnd), panel = ChildRect(window.Uf(1).hwnd(), hwnd);
        EXPECT_EQ(options.left - panel.left, ::MulDiv(2400, d, 1440)) << dpi;
        EXPECT_EQ(panel.right - panel.left, ::MulDiv(6375, d, 1440)) << dpi;
        EXPECT_EQ(win32::FontHeight(window.BtnO(kBtnExit).hwnd()), -::MulDiv(825, d, 7200)) << dpi;
        HWND onOffHwnd = window.BtnOnOff().Handle();
        EXPECT_EQ(win32::FontHeight(onOffHwnd), -std::lround(14.25 * d / 72)) << dpi << ": the switch";
        HDC dc = ::GetDC(onOffHwnd);
        HGDIOBJ old = ::SelectObject(dc, reinterpret_cast<HFONT>(::SendMessageA(onOffHwnd, WM_GETFONT, 0, 0)));
        SIZE off{};
        ::GetTextExtentPoint32A(dc, "OFF", 3, &off);
        ::SelectObject(dc, old);
        ::ReleaseDC(onOffHwnd, dc);
        const auto& caption = window.BtnOnOffWindow().button().captionRect();
        EXPECT_EQ(caption.right - caption.left, off.cx) << dpi << ": the switch's caption laid out in that font";
        EXPECT_EQ(win32::IconWidth(reinterpret_cast<HICON>(::SendMessageA(hwnd, WM_GETICON, ICON_BIG, 0))),
                  ::MulDiv(32, d, 96)) << dpi;
        EXPECT_EQ(win32::TextsCut(hwnd, dpi), "") << dpi;
    }

    // The keyboard, through a loop that hands dialog keys to the window as the program's does: the
    // switch has the focus first; Tab walks the panels' buttons, then the row, and round; each
    // button's access key presses it.
    ::ShowWindow(hwnd, SW_SHOW);
    ::SetForegroundWindow(hwnd);
    std::vector<HWND> focus;
    std::string pressed;
    const char keys[] = "TEHUO";
    for (int i = 0; i < 5; ++i) window.BtnO(i).Click = [&, i] { pressed += keys[i]; };
    std::size_t step = 0;
    win32::Ticker user(60, [&] {
        if (step < 7) focus.push_back(::GetFocus());
        if (step < 7) win32::Key(VK_TAB);
        else win32::Key(static_cast<WORD>("OUTEH"[step - 7]), true);
        return ++step == 12;
    });
    for (DWORD start = ::GetTickCount(); pressed.size() < 5 && ::GetTickCount() - start < 5000;) {
        MSG msg;
        if (!::PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) {
            ::MsgWaitForMultipleObjects(0, nullptr, FALSE, 50, QS_ALLINPUT);
            continue;
        }
        if (::IsDialogMessageA(hwnd, &msg)) continue;
        ::TranslateMessage(&msg);
        ::DispatchMessageA(&msg);
    }
    HWND onOff = window.BtnOnOff().Handle();
    EXPECT_EQ(focus, (std::vector<HWND>{onOff, window.BtnO(kBtnOptions).hwnd(), window.BtnO(kBtnUpdates).hwnd(),
                                        window.BtnO(kBtnTray).hwnd(), window.BtnO(kBtnExit).hwnd(),
                                        window.BtnO(kBtnHelp).hwnd(), onOff}));
    EXPECT_EQ(pressed, "OUTEH");
}

}  // namespace
}  // namespace vantorel
