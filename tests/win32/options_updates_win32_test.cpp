// The real options window under Wine, on the real registry and Wine's Task Scheduler. Its boxes are
// clicked with the real pointer (SendInput, hit-tested by the system), writing the settings Windows
// and Internet Explorer read, and the modal loop ends on "&Close"; checking "Boot when Windows boots"
// registers the logon task "Vantorel" with Wine's scheduler (read back from the file the scheduler
// keeps it in), unchecking removes it. Then the window at other DPIs and on the keyboard. Then the
// update check against nginx (the configuration in deploy/, started by a CTest fixture on a loopback
// port, serving VANTOREL_NGINX_DIR/www/vt), with the window's own WinINet downloaders, for a program
// folder in the temp folder and the "Server" setting pointing at nginx: "&Check for Updates" is
// clicked with BM_CLICK, and what the window shows is read back from its controls (the status labels,
// the picture box pb and its pixels, the button and the "Updates" message boxes). Closing the window
// during a check, and a new list taking effect in the running guard, are proved end to end
// (tests/e2e/e2e_tests.py). Last, DrawProgress on its own on a bitmap the size of pb. The values, the
// task and the files the tests touch are removed afterwards.
#include <windows.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <functional>
#include <optional>
#include <sstream>
#include <vector>

#include "app/options_window.h"
#include "platform/win32/picture_box_win32.h"
#include "platform/win32/registry_win32.h"
#include "settings/settings.h"
#include "ui/options/draw_progress.h"
#include "win32/ui_input.h"

namespace vantorel::win32 {
namespace {

using platform::kHkeyCurrentUser;
using platform::kHkeyLocalMachine;

const std::string kInstalled = "installed definitions\r\n";

std::string Text(HWND hwnd) {
    char text[512] = {0};
    ::GetWindowTextA(hwnd, text, sizeof text);
    return text;
}

std::string ReadFile(const std::string& path) {
    std::stringstream content;
    content << std::ifstream(path, std::ios::binary).rdbuf();
    return content.str();
}

// The task "Vantorel" as the Task Scheduler stores it, the XML file in its tasks folder ("" when there
// is none); removed first when asked.
std::string StoredTask(bool remove = false) {
    char system[MAX_PATH];
    ::GetSystemDirectoryA(system, MAX_PATH);
    const std::string file = std::string(system) + "\\Tasks\\Vantorel";
    if (remove) ::DeleteFileA(file.c_str());
    return ReadFile(file);
}

// Answers the message box showing, if any, with OK: its title, whether `owner` owns it, and its text
// (in the static 0xFFFF); "" when none shows.
std::string AnswerMessageBox(HWND owner) {
    HWND box = nullptr;  // the first visible one: other dialogs of the process may linger hidden
    while ((box = ::FindWindowExA(nullptr, box, "#32770", nullptr)) != nullptr && !::IsWindowVisible(box)) {}
    if (box == nullptr) return "";
    char text[512] = {};
    ::GetDlgItemTextA(box, 0xFFFF, text, sizeof text);
    ::PostMessageA(box, WM_COMMAND, IDOK, 0);
    return Text(box) + (::GetWindow(box, GW_OWNER) == owner ? " owned: " : ": ") + text;
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

// What the window showed: labels and pb when the check returned, every message box on the way (its
// title, owner and text, and whether the button was disabled meanwhile), and the reloads asked for.
struct Shown {
    std::string L0, L1;
    bool pbVisible = false, barFull = false, enabled = false;
    std::vector<std::string> boxes;
    int reloads = 0;
};

class OptionsWindowTest : public ::testing::Test {
protected:
    void SetUp() override {
        Clean();
        const char* dir = std::getenv("VANTOREL_NGINX_DIR");
        ASSERT_NE(dir, nullptr) << "VANTOREL_NGINX_DIR is not set";
        const int port = std::atoi(ReadFile(std::string("Z:") + dir + "/server.port").c_str());
        ASSERT_GT(port, 0) << "nginx is not running";
        www_ = std::string("Z:") + dir + "/www/vt/";
        SetServer("http://127.0.0.1:" + std::to_string(port) + "/");
        char temp[MAX_PATH];
        ::GetTempPathA(MAX_PATH, temp);
        folder_ = std::string(temp) + "vtopt-" + std::to_string(::GetCurrentProcessId());
        ::CreateDirectoryA(folder_.c_str(), nullptr);
    }
    void TearDown() override {
        Serve(nullptr, nullptr, nullptr, nullptr);
        for (const char* name : {"\\defver", "\\sw2.def", "\\VTSetup.exe"}) ::DeleteFileA((folder_ + name).c_str());
        EXPECT_TRUE(::RemoveDirectoryA(folder_.c_str())) << "something was left behind in " << folder_;
        Clean();
    }

    // A value as the program reads it; removed first when `remove`.
    Variant Read(std::int32_t root, const std::string& key, const std::string& name, bool remove = false) {
        RegistryRoutines reg = OpenOrCreate(registry_, root, key);
        if (remove) reg.DeleteValue(name);
        return reg.GetRegistryValue(name);
    }
    void Clean() {
        for (const char* name : {"Start", "Tray", "Server"}) Read(kHkeyLocalMachine, kSettingsKey, name, true);
        Read(kHkeyLocalMachine, std::string(kRunKey) + "\\", "Vantorel", true);
        Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger", true);
        StoredTask(true);
    }
    // The "Server" setting, as the program reads it.
    void SetServer(const std::string& address) {
        ASSERT_TRUE(OpenOrCreate(registry_, kHkeyLocalMachine, kSettingsKey)
                        .SetRegistryValue("Server", address, platform::kRegSz));
    }
    // What nginx serves; a file given as null is not there.
    void Serve(const char* defver, const char* sw2, const char* mainver, const char* setup) {
        const std::pair<const char*, const char*> files[] = {
            {"defver", defver}, {"sw2.def", sw2}, {"mainver", mainver}, {"VTSetup.exe", setup}};
        for (const auto& [name, content] : files) {
            if (content != nullptr) std::ofstream(www_ + name, std::ios::binary) << content;
            else ::DeleteFileA((www_ + name).c_str());
        }
    }
    std::string Local(const std::string& name) { return ReadFile(folder_ + "\\" + name); }

    // Installs the definitions and `localDefver` (none when null), opens the updates panel, clicks
    // the button once the modal loop runs, answers each message box and closes the window when the
    // check has returned.
    Shown Check(const char* localDefver, ProgramVersion version = {1, 0}) {
        if (localDefver != nullptr) std::ofstream(folder_ + "\\defver", std::ios::binary) << localDefver;
        else ::DeleteFileA((folder_ + "\\defver").c_str());
        std::ofstream(folder_ + "\\sw2.def", std::ios::binary) << kInstalled;
        ::DeleteFileA((folder_ + "\\VTSetup.exe").c_str());
        Shown shown;
        OptionsWindow window(nullptr, 1, registry_, AutostartPath(), {folder_, version});
        window.SetReloadDefinitions([&] {
            ++shown.reloads;
            return std::optional<std::size_t>(2);
        });
        EXPECT_NE(window.hwnd(), nullptr) << "no display?";
        std::function<void()> check = window.updateButton().Click;
        window.updateButton().Click = [&] {
            check();
            shown.L0 = Text(window.label(0).hwnd());
            shown.L1 = Text(window.label(1).hwnd());
            shown.pbVisible = ::IsWindowVisible(window.pbWindow()) != FALSE;
            shown.enabled = ::IsWindowEnabled(window.updateButton().hwnd()) != FALSE;
            // The bar (highlight colour) reaches across pb.
            RECT inside;
            ::GetClientRect(window.pbWindow(), &inside);
            shown.barFull =
                window.picture().Pixel(3, 3) == ::GetSysColor(COLOR_HIGHLIGHT) &&
                window.picture().Pixel(inside.right - 4, inside.bottom / 2) == ::GetSysColor(COLOR_HIGHLIGHT);
            ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);
        };
        bool clicked = false;
        int ticks = 0;
        Ticker user(30, [&] {
            if (++ticks == 1000 && window.hwnd() != nullptr) ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);  // 30 s
            if (!clicked && ::IsWindowVisible(window.hwnd())) {
                ::PostMessageA(window.updateButton().hwnd(), BM_CLICK, 0, 0);
                clicked = true;
            }
            const bool off = !::IsWindowEnabled(window.updateButton().hwnd());
            std::string box = AnswerMessageBox(window.hwnd());
            if (!box.empty()) shown.boxes.push_back(box + (off ? " (button off)" : ""));
            return false;
        });
        window.ShowModal();
        return shown;
    }

    Win32Registry registry_;
    std::string www_, folder_;
};

TEST_F(OptionsWindowTest, PointerClicksStoreTheBoxesAndBootWhenWindowsBootsRegistersTheLogonTask) {
    const std::string exe = AutostartPath();
    OptionsWindow window(nullptr, 0, registry_, exe);
    ASSERT_NE(window.hwnd(), nullptr) << "no display?";
    EXPECT_EQ(std::vector<bool>({window.box(0).Value(), window.box(1).Value(), window.box(2).Value()}),
              std::vector<bool>({false, false, true}));
    EXPECT_TRUE(IsEmpty(Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger")))
        << "loading writes nothing";

    // The user checks "Boot when Windows boots" (what it stored is read while it shows checked), unchecks
    // it, toggles the other two boxes and closes the window: each click waits for the last one's change.
    const int order[] = {0, 0, 1, 2};
    std::string refusal, task;
    Variant run, start;
    std::size_t step = 0;
    bool before = false, clicked = false;
    Ticker user(30, [&] {
        if (!::IsWindowVisible(window.hwnd())) return false;
        refusal = AnswerMessageBox(window.hwnd());
        if (!refusal.empty()) {  // refused: say why and stop
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
        RECT suggested = SendDpiChange(hwnd, dpi, {6615, 3135}), now, client, pb;
        ::GetWindowRect(hwnd, &now);
        EXPECT_TRUE(::EqualRect(&now, &suggested)) << dpi << ": the suggested rectangle taken";
        ::GetClientRect(hwnd, &client);
        EXPECT_EQ(client.right, ::MulDiv(6615, d, 1440)) << dpi;
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

TEST_F(OptionsWindowTest, VersionsCompareAsNumbersAndOnlyACompleteListReplacesTheInstalledOne) {
    std::string list;  // 20,000 keys, about 200 KB: several blocks of the WinINet worker, many chunks of progress
    for (int i = 0; i < 20000; ++i) list += std::to_string(-2000000 + i * 11) + "\r\n";
    const std::string kNoDefs = "Definitions Updates: No Updates", kNoProgram = "Program Updates: No Updates";
    const char* kAsLoaded = "Definitions Updates:";  // the caption the window was loaded with
    const char* kNew = "Definitions Updates: Complete, 2 definitions in use";
    const char* kNoList = "Updates owned: Error downloading definition updates The file, \"";
    const char* kNotAList =
        "Updates owned: Error downloading definition updates The downloaded file is not a definitions";
    const char* kEmpty = "Updates owned: Error downloading program updates The downloaded setup program is empty.";
    struct Case {
        const char *localDefver, *defver, *sw2, *mainver, *setup;
        ProgramVersion version;
        std::string L0, L1;
        const char* box;
    } cases[] = {
        // 3 against 10 is older as numbers, though "3" sorts after "10" as text: nothing is fetched.
        {"10\r\n", "3", "not fetched", "1.0", nullptr, {1, 0}, kNoDefs, kNoProgram, ""},
        // A newer list is installed and put in force through the owner; a missing local version counts as 0.
        {"20\r\n", "21\n", list.c_str(), "1.0\n", nullptr, {1, 0}, kNew, kNoProgram, ""},
        {nullptr, "1", "67305985\r\n", "1.0", nullptr, {1, 0}, kNew, kNoProgram, ""},
        // Equal definitions versions fetch nothing; program 1.10 reads as 1.1, below the server's 1.9: the
        // setup program is fetched.
        {"20\r\n", "20", nullptr, "1.9\r\n", "setup", {1, 10}, kNoDefs, "Program Updates: Complete", ""},
        // No sw2.def on the server, an error page served as a success: "defver" stays, so the next check
        // tries again.
        {"20\r\n", "21", nullptr, "1.0", nullptr, {1, 0}, kAsLoaded, kNoProgram, kNoList},
        {"20\r\n", "21", "<html>Not here</html>", "1.0", nullptr, {1, 0}, kAsLoaded, kNoProgram, kNotAList},
        // An empty setup program: the caption keeps its text.
        {"20\r\n", "20", nullptr, "2", "", {1, 0}, kNoDefs, "Program Updates:", kEmpty},
    };
    for (std::size_t i = 0; i < std::size(cases); ++i) {
        const Case& c = cases[i];
        SCOPED_TRACE("case " + std::to_string(i));
        Serve(c.defver, c.sw2, c.mainver, c.setup);
        Shown shown = Check(c.localDefver, c.version);
        EXPECT_EQ(std::make_tuple(shown.L0, shown.L1, shown.enabled), std::make_tuple(c.L0, c.L1, true));
        ASSERT_EQ(shown.boxes.size(), *c.box ? 1u : 0u);
        EXPECT_EQ(shown.boxes.empty() ? "" : shown.boxes[0].substr(0, std::strlen(c.box)), c.box);
        const bool definitions = c.L0 == kNew, program = c.L1 == "Program Updates: Complete";
        EXPECT_EQ(shown.reloads, definitions ? 1 : 0);
        EXPECT_EQ(Local("sw2.def"), definitions ? c.sw2 : kInstalled);
        EXPECT_EQ(Local("defver"), definitions ? c.defver : c.localDefver != nullptr ? c.localDefver : "");
        EXPECT_EQ(Local("VTSetup.exe"), program ? c.setup : "");
        EXPECT_EQ(shown.pbVisible, c.L0 != kNoDefs || c.L1 != kNoProgram);
        if (definitions || program) {
            EXPECT_TRUE(shown.barFull) << "the last progress painted was 100 %";
        }
    }
}

TEST_F(OptionsWindowTest, UnreachableServerShowsOneMessageBoxWhileTheButtonIsOff) {
    SetServer("http://127.0.0.1:9");  // discard: nothing listens there on this loopback
    Shown shown = Check("20\r\n");
    ASSERT_EQ(shown.boxes.size(), 1u);
    EXPECT_EQ(shown.boxes[0].rfind("Updates owned: Cannot check for updates", 0), 0u) << shown.boxes[0];
    EXPECT_NE(shown.boxes[0].find("(button off)"), std::string::npos) << "the button stays off while the check runs";
    EXPECT_TRUE(shown.enabled);
}

// The XOR passes leave the bar in the highlight colour and turn the label's strokes under it into the
// window colour.
TEST(DrawProgressGdi, BarAndInvertedLabelOnARealBitmap) {
    GdiPictureBox pb(393, 17);
    ASSERT_EQ(pb.TwipsPerPixelX(), 15) << "the sizes below assume 96 dots per inch";
    const COLORREF fore = ::GetSysColor(COLOR_HIGHLIGHT), back = ::GetSysColor(COLOR_WINDOW);
    DrawProgress(pb, 50, kProgressForeColor, kProgressBackColor);
    // The columns of the label, centred in the inner width (5865 twips).
    const int labelLeft = static_cast<int>((5865 - pb.TextWidth("50%")) / 2 / 15);
    const int labelRight = labelLeft + static_cast<int>(pb.TextWidth("50%") / 15);
    EXPECT_EQ(pb.Pixel(100, 0), back) << "the border row stays clear";
    // The bar covers the columns whose left edge lies before half of the inner width; not the border.
    for (int x = 0; x < 393; ++x) {
        if (x >= labelLeft - 1 && x <= labelRight + 1) continue;
        EXPECT_EQ(pb.Pixel(x, 2) == fore, x >= 1 && x * 15 < 5865 / 2.0) << "column " << x;
    }
    // Inside the label the text shows on both sides of the bar's end (column 195): under the bar
    // as pixels that are not the bar's colour, beyond it as pixels that are not the background.
    // (Wine smooths the glyphs, so their edges are blends of the two colours.)
    int strokesUnderBar = 0, strokesBeyond = 0;
    for (int y = 1; y < 15; ++y) {
        for (int x = labelLeft; x <= labelRight; ++x) {
            if (x <= 195 && pb.Pixel(x, y) != fore) ++strokesUnderBar;
            if (x > 195 && pb.Pixel(x, y) != back) ++strokesBeyond;
        }
    }
    EXPECT_GT(strokesUnderBar, 5);
    EXPECT_GT(strokesBeyond, 5);
}

}  // namespace
}  // namespace vantorel::win32
