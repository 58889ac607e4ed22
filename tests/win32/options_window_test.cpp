// The options window on the real registry and Wine's Task Scheduler: its load step on an empty
// registry, its boxes clicked with the real pointer (SendInput, hit-tested by the system) writing the
// settings Windows and Internet Explorer read, and the modal loop ending on "&Close"; checking "Boot
// when Windows boots" registers the logon task "Vantorel" with Wine's scheduler (read back from the
// file the scheduler keeps it in), unchecking removes it. Then the window at other DPIs and on the
// keyboard. The values and the task it touches are removed afterwards.
#include <windows.h>

#include <gtest/gtest.h>

#include <fstream>
#include <sstream>
#include <vector>

#include "app/options_window.h"
#include "platform/win32/registry_win32.h"
#include "settings/settings.h"
#include "win32/ui_input.h"

namespace vantorel::win32 {
namespace {

using platform::kHkeyCurrentUser;
using platform::kHkeyLocalMachine;

// The task "Vantorel" as the Task Scheduler stores it, the XML file in its tasks folder ("" when there
// is none); removed first when asked.
std::string StoredTask(bool remove = false) {
    char system[MAX_PATH];
    ::GetSystemDirectoryA(system, MAX_PATH);
    const std::string file = std::string(system) + "\\Tasks\\Vantorel";
    if (remove) ::DeleteFileA(file.c_str());
    std::stringstream content;
    content << std::ifstream(file, std::ios::binary).rdbuf();
    return content.str();
}

// Presses `keys` (with Alt where marked) one a tick while `window` shows modally, noting which control
// had the focus before each; true when the keys closed the window (it is closed for them otherwise).
bool PressKeys(OptionsWindow& window, const std::vector<std::pair<WORD, bool>>& keys, std::vector<HWND>& focus) {
    bool closedByKeys = true;
    Ticker ticker(60, [&] {
        if (!::IsWindowVisible(window.hwnd()) || ::GetFocus() == nullptr) return false;
        if (focus.size() == keys.size()) {  // still open after the last key
            closedByKeys = false;
            ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);
            return true;
        }
        focus.push_back(::GetFocus());
        Key(keys[focus.size() - 1].first, keys[focus.size() - 1].second);
        return false;
    });
    window.ShowModal();
    return closedByKeys;
}

class OptionsWindowTest : public ::testing::Test {
protected:
    void SetUp() override { Clean(); }
    void TearDown() override { Clean(); }

    // A value as the program reads it; removed first when `remove`.
    Variant Read(std::int32_t root, const std::string& key, const std::string& name, bool remove = false) {
        RegistryRoutines reg(registry_);
        reg.hkey(root);
        reg.KeyRoot(key);
        if (remove) reg.DeleteValue(name);
        return reg.GetRegistryValue(name);
    }
    void Clean() {
        Read(kHkeyLocalMachine, kSettingsKey, "Start", true);
        Read(kHkeyLocalMachine, kSettingsKey, "Tray", true);
        Read(kHkeyLocalMachine, std::string(kRunKey) + "\\", "Vantorel", true);
        Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger", true);
        StoredTask(true);
    }

    Win32Registry registry_;
};

TEST_F(OptionsWindowTest, PointerClicksStoreTheBoxesAndBootWhenWindowsBootsRegistersTheLogonTask) {
    const std::string exe = AutostartPath();
    EXPECT_NE(exe.find("options_window_tests.exe"), std::string::npos) << exe;
    OptionsWindow window(nullptr, 0, registry_, exe);
    ASSERT_NE(window.hwnd(), nullptr) << "no display?";
    EXPECT_EQ(std::vector<bool>({window.box(0).Value(), window.box(1).Value(), window.box(2).Value()}),
              std::vector<bool>({false, false, true}));
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kSettingsKey, "Start"))) << "loading writes nothing";
    EXPECT_TRUE(IsEmpty(Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger")));

    // The user checks "Boot when Windows boots" (what it stored is read while it shows checked), unchecks
    // it, toggles the other two boxes and closes the window: each click waits for the last one's change.
    const int order[] = {0, 0, 1, 2};
    std::string refusal, task;
    Variant run, start;
    std::size_t step = 0;
    bool before = false, clicked = false;
    Ticker user(30, [&] {
        if (!::IsWindowVisible(window.hwnd())) return false;
        if (HWND box = ::FindWindowA("#32770", "Options")) {  // refused: say why and stop
            char text[512] = {};
            ::GetDlgItemTextA(box, 0xFFFF, text, sizeof text);
            refusal = text;
            ::PostMessageA(box, WM_COMMAND, IDOK, 0);
            ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);
            return true;
        }
        if (clicked && window.box(order[step]).Value() == before) return false;
        if (clicked && step++ == 0) {
            task = StoredTask();
            run = Read(kHkeyLocalMachine, kRunKey, "Vantorel");
            start = Read(kHkeyLocalMachine, kSettingsKey, "Start");
        }
        clicked = step < 4;
        if (clicked) before = window.box(order[step]).Value();
        PointerClick(clicked ? window.box(order[step]).hwnd() : window.closeButton().hwnd());
        return !clicked;
    });
    window.ShowModal();
    ASSERT_EQ(refusal, "") << "the scheduler took the task";
    ASSERT_EQ(step, 4u);
    // Wine 8 keeps only the settings of a task registered as XML: its stored task has an empty <Triggers/>, an empty
    // <Principal> and an <Exec/> without <Command>, and its definition answers E_NOTIMPL for the trigger and action
    // collections and the principal; the logon trigger, the run level and the command line stay unproven here, and
    // IgnoreNew and Enabled are Wine's defaults too. The settings below differ from its defaults.
    for (const char* setting :
         {"<ExecutionTimeLimit>PT0S<", "<DisallowStartIfOnBatteries>false<", "<StopIfGoingOnBatteries>false<"})
        EXPECT_NE(task.find(setting), std::string::npos) << "checking registered the task with " << setting;
    EXPECT_EQ(run, Variant("\"" + exe + "\""));
    EXPECT_EQ(start, Variant(std::string("1")));

    EXPECT_EQ(window.hwnd(), nullptr) << "the pointer click on \"&Close\" closed the window";
    EXPECT_EQ(StoredTask(), "") << "unchecking removes the task";
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kRunKey, "Vantorel"))) << "unchecking removes the Run value";
    EXPECT_EQ(Read(kHkeyLocalMachine, kSettingsKey, "Start"), Variant(std::string("0")));
    EXPECT_EQ(Read(kHkeyLocalMachine, kSettingsKey, "Tray"), Variant(std::string("1")));
    EXPECT_EQ(Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger"), Variant(std::string("no")));
}

TEST_F(OptionsWindowTest, FollowsTheMonitorsDpiWithEveryTextWhole) {
    OptionsWindow window(nullptr, 0, registry_, AutostartPath());
    ASSERT_NE(window.hwnd(), nullptr) << "no display?";
    HWND hwnd = window.hwnd();
    ::ShowWindow(hwnd, SW_SHOWNA);
    window.label(0).SetCaption("Definitions Updates: defver has been corrupted");  // the longest status
    for (UINT dpi : {144u, 192u, 120u, 96u}) {
        const int d = static_cast<int>(dpi);
        RECT suggested = SendDpiChange(hwnd, dpi, {6615, 3135}), now, client;
        ::GetWindowRect(hwnd, &now);
        EXPECT_TRUE(::EqualRect(&now, &suggested)) << dpi << ": the suggested rectangle taken";
        ::GetClientRect(hwnd, &client);
        EXPECT_EQ(client.right, ::MulDiv(6615, d, 1440)) << dpi;
        EXPECT_EQ(ChildRect(window.closeButton().hwnd(), hwnd).left, ::MulDiv(4440, d, 1440)) << dpi;
        RECT box = ChildRect(window.box(2).hwnd(), hwnd), pb;
        EXPECT_EQ(box.right - box.left, ::MulDiv(5900, d, 1440)) << dpi;
        EXPECT_EQ(FontHeight(window.box(0).hwnd()), -::MulDiv(825, d, 7200)) << dpi;
        ::GetWindowRect(window.pbWindow(), &pb);
        EXPECT_EQ(pb.right - pb.left, ::MulDiv(5895, d, 1440)) << dpi << ": pb";
        EXPECT_EQ(TextsCut(hwnd, dpi), "") << dpi << ": options";
        window.controls().F[0]->SetVisible(false);
        window.controls().F[1]->SetVisible(true);
        EXPECT_EQ(TextsCut(hwnd, dpi), "") << dpi << ": updates";
        window.controls().F[1]->SetVisible(false);
        window.controls().F[0]->SetVisible(true);
    }
}

TEST_F(OptionsWindowTest, TabWalksTheControlsEscClosesAndAccessKeysReachEveryShownButton) {
    // The first box has the focus, Tab walks the boxes to "&Close" and round, Esc closes.
    OptionsWindow window(nullptr, 0, registry_, AutostartPath());
    std::vector<HWND> focus;
    EXPECT_TRUE(PressKeys(
        window, {{VK_TAB, false}, {VK_TAB, false}, {VK_TAB, false}, {VK_TAB, false}, {VK_ESCAPE, false}}, focus))
        << "Esc closed the window";
    EXPECT_EQ(focus, (std::vector<HWND>{window.box(0).hwnd(), window.box(1).hwnd(), window.box(2).hwnd(),
                                        window.closeButton().hwnd(), window.box(0).hwnd()}));

    // The options frame: Alt+C is "&Close" alone (the update button is on the hidden frame).
    int updates = 0;
    OptionsWindow options(nullptr, 0, registry_, AutostartPath());
    options.updateButton().Click = [&] { ++updates; };
    focus.clear();
    EXPECT_TRUE(PressKeys(options, {{'C', true}}, focus)) << "Alt+C pressed \"&Close\"";

    // The updates frame: "&Check for Updates" and "&Close" share C; each Alt+C moves to the next of
    // them, Enter presses the one with the focus.
    OptionsWindow updatesFrame(nullptr, 1, registry_, AutostartPath());
    updatesFrame.updateButton().Click = [&] { ++updates; };
    focus.clear();
    EXPECT_TRUE(PressKeys(updatesFrame, {{'C', true}, {'C', true}, {'C', true}, {VK_RETURN, false}}, focus))
        << "Enter pressed \"&Close\"";
    EXPECT_EQ(focus, (std::vector<HWND>{updatesFrame.updateButton().hwnd(), updatesFrame.closeButton().hwnd(),
                                        updatesFrame.updateButton().hwnd(), updatesFrame.closeButton().hwnd()}));
    EXPECT_EQ(updates, 0) << "a shared access key presses nothing";
}

}  // namespace
}  // namespace vantorel::win32
