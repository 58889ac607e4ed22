// The update check in the real options window under Wine, against nginx (the configuration in
// deploy/, started by a CTest fixture on a loopback port), with the window's own WinINet
// downloaders: "&Check for Updates" is clicked with BM_CLICK, and what the window shows is read back
// from its controls: the status labels, the picture box pb and its pixels, the button and the
// "Updates" message boxes.
#include <windows.h>

#include "win32/update_server.h"

#include <gtest/gtest.h>

#include <functional>
#include <optional>

#include "app/options_window.h"
#include "platform/win32/registry_win32.h"
#include "win32/ui_input.h"

namespace vantorel::win32 {
namespace {

using testing::WriteFile;

std::string Text(HWND hwnd) {
    char text[512] = {0};
    ::GetWindowTextA(hwnd, text, sizeof text);
    return text;
}

// What the window showed: labels and pb when the check returned, and every message box on the way
// (its title, owner and text, and whether the button was disabled meanwhile).
struct Shown {
    std::string L0, L1;
    bool pbVisible = false, enabled = false;
    COLORREF pbLeft = 0, pbRight = 0;
    std::vector<std::string> boxes;
};

class OptionsUpdatesTest : public testing::UpdateServerTest {
protected:
    OptionsUpdatesTest() : UpdateServerTest("vtopt-") {}

    // Opens the updates panel, clicks the button once the modal loop runs, answers each message box
    // and closes the window when the check has returned.
    Shown Check(ProgramVersion version = {1, 0}, std::function<std::optional<std::size_t>()> reload = nullptr) {
        Shown shown;
        OptionsWindow window(nullptr, 1, registry_, AutostartPath(), {folder_, version});
        window.SetReloadDefinitions(std::move(reload));
        EXPECT_NE(window.hwnd(), nullptr) << "no display?";
        EXPECT_FALSE(::IsWindowVisible(window.pbWindow())) << "pb is hidden until a download starts";
        std::function<void()> check = window.updateButton().Click;
        int clicks = 0;
        window.updateButton().Click = [&] {
            ++clicks;
            check();
            shown.L0 = Text(window.label(0).hwnd());
            shown.L1 = Text(window.label(1).hwnd());
            shown.pbVisible = ::IsWindowVisible(window.pbWindow()) != FALSE;
            shown.enabled = ::IsWindowEnabled(window.updateButton().hwnd()) != FALSE;
            RECT inside;
            ::GetClientRect(window.pbWindow(), &inside);
            shown.pbLeft = window.picture().Pixel(3, 3);
            shown.pbRight = window.picture().Pixel(inside.right - 4, inside.bottom / 2);
            ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);
        };
        bool clicked = false;
        HWND answered = nullptr;
        int ticks = 0;
        Ticker user(30, [&] {
            if (++ticks == 1000 && window.hwnd() != nullptr) ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);  // 30 s
            if (!clicked && ::IsWindowVisible(window.hwnd())) {
                ::PostMessageA(window.updateButton().hwnd(), BM_CLICK, 0, 0);
                clicked = true;
            }
            HWND box = ::FindWindowA("#32770", nullptr);  // a message box (its text in the static 0xFFFF)
            if (box != nullptr && ::IsWindowVisible(box) && box != answered) {
                char text[512] = {};
                ::GetDlgItemTextA(box, 0xFFFF, text, sizeof text);
                const bool off = !::IsWindowEnabled(window.updateButton().hwnd());
                if (off) ::SendMessageA(window.updateButton().hwnd(), BM_CLICK, 0, 0);  // raises nothing while off
                shown.boxes.push_back(Text(box) + (::GetWindow(box, GW_OWNER) == window.hwnd() ? " owned: " : ": ") +
                                      text + (off ? " (button off)" : ""));
                answered = box;
                ::PostMessageA(box, WM_COMMAND, IDOK, 0);
            }
            return false;
        });
        window.ShowModal();
        EXPECT_EQ(window.hwnd(), nullptr);
        EXPECT_EQ(clicks, 1) << "the click reached the button once, and none while it was off";
        return shown;
    }
};

TEST_F(OptionsUpdatesTest, FetchesNewerDefinitionsAndPaintsProgress) {
    std::string definitions;
    for (int i = 0; i < 20000; ++i) definitions += std::to_string(-2000000 + i * 11) + "\r\n";
    Serve("defver", "21\n");
    Serve("sw2.def", definitions);
    Serve("mainver", "1.0\n");
    Shown shown = Check();
    EXPECT_EQ(std::make_tuple(shown.L0, shown.L1, shown.pbVisible, shown.enabled),
              std::make_tuple(std::string("Definitions Updates: Complete"), std::string("Program Updates: No Updates"),
                              true, true));
    EXPECT_TRUE(shown.boxes.empty());
    EXPECT_EQ(Local("sw2.def"), definitions);
    EXPECT_EQ(Local("defver"), "21\n");
    // The last progress painted was 100 %: the bar (highlight colour) reaches across pb.
    EXPECT_EQ(std::make_pair(shown.pbLeft, shown.pbRight),
              std::make_pair(::GetSysColor(COLOR_HIGHLIGHT), ::GetSysColor(COLOR_HIGHLIGHT)));
}

TEST_F(OptionsUpdatesTest, VersionsCompareAsNumbersAndFailuresKeepTheInstalledVersion) {
    const std::string installed = "installed definitions\r\n";
    const char *kNoDefs = "Definitions Updates: No Updates", *kNoProgram = "Program Updates: No Updates";
    struct Case {
        const char *localDefver, *defver, *sw2, *mainver, *setup;
        ProgramVersion version;
        const char *L0, *L1, *box, *defverAfter;
    } cases[] = {
        // Equal versions fetch nothing and pb stays hidden.
        {"20\r\n", "20", "not fetched", "1.0", nullptr, {1, 0}, kNoDefs, kNoProgram, "", "20\r\n"},
        // 3 against 10: older as numbers, though "3" sorts after "10" as text.
        {"10\r\n", "3", "not fetched", "1.0", nullptr, {1, 0}, kNoDefs, kNoProgram, "", "10\r\n"},
        // Program 1.10 reads as 1.1, below the server's 1.9: the setup program is fetched.
        {"20\r\n", "20", nullptr, "1.9\r\n", "setup", {1, 10}, kNoDefs, "Program Updates: Complete", "", "20\r\n"},
        // A newer version without sw2.def on the server: defver stays, so the next check retries.
        {"20\r\n",
         "21",
         nullptr,
         "1.0",
         nullptr,
         {1, 0},
         "Definitions Updates:",
         kNoProgram,
         "Updates owned: Error downloading definition updates The file, \"",
         "20\r\n"},
        // A missing local version counts as 0.
        {nullptr, "1", "67305985\r\n", "1.0", nullptr, {1, 0}, "Definitions Updates: Complete", kNoProgram, "", "1"},
        // The setup program's own failure has its own message; the caption keeps its text.
        {"20\r\n",
         "20",
         nullptr,
         "2",
         nullptr,
         {1, 0},
         kNoDefs,
         "Program Updates:",
         "Updates owned: Error downloading program updates The file, \"",
         "20\r\n"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.defver) + " " + c.mainver);
        if (c.localDefver) WriteFile(folder_ + "\\defver", c.localDefver);
        else ::DeleteFileA((folder_ + "\\defver").c_str());
        WriteFile(folder_ + "\\sw2.def", installed);
        ::DeleteFileA((folder_ + "\\VTSetup.exe").c_str());
        for (const char* name : {"sw2.def", "VTSetup.exe"}) ::DeleteFileA((www_ + name).c_str());
        Serve("defver", c.defver);
        Serve("mainver", c.mainver);
        if (c.sw2) Serve("sw2.def", c.sw2);
        if (c.setup) Serve("VTSetup.exe", c.setup);
        Shown shown = Check(c.version);
        EXPECT_EQ(std::make_tuple(shown.L0, shown.L1, shown.enabled),
                  std::make_tuple(std::string(c.L0), std::string(c.L1), true));
        ASSERT_EQ(shown.boxes.size(), *c.box ? 1u : 0u);
        if (*c.box) {
            EXPECT_EQ(shown.boxes[0].rfind(c.box, 0), 0u) << shown.boxes[0];
        }
        EXPECT_EQ(Local("defver"), c.defverAfter);
        const bool definitions = std::string(c.L0).find("Complete") != std::string::npos;
        const bool program = std::string(c.L1).find("Complete") != std::string::npos;
        EXPECT_EQ(Local("sw2.def"), definitions ? std::string(c.sw2) : installed);
        EXPECT_EQ(Local("VTSetup.exe"), program ? c.setup : "");
    }
}

TEST_F(OptionsUpdatesTest, UnreachableServerShowsOneMessageBoxWhileTheButtonIsOff) {
    SetServer("http://127.0.0.1:9");  // discard: nothing listens there on this loopback
    Shown shown = Check();
    ASSERT_EQ(shown.boxes.size(), 1u);
    EXPECT_EQ(shown.boxes[0].rfind("Updates owned: Cannot check for updates", 0), 0u) << shown.boxes[0];
    EXPECT_NE(shown.boxes[0].find("http://127.0.0.1:9"), std::string::npos) << shown.boxes[0];
    EXPECT_NE(shown.boxes[0].find("(button off)"), std::string::npos) << "the button stays off while the check runs";
    EXPECT_TRUE(shown.enabled);
    EXPECT_EQ(Local("sw2.def"), "installed definitions\r\n");
}

TEST_F(OptionsUpdatesTest, OnlyADefinitionsListReplacesTheInstalledOneAndTakesEffectAtOnce) {
    Serve("defver", "21\n");
    Serve("mainver", "1.0\n");
    // An empty body, an error page served as a success, binary bytes: refused before the rename, and
    // "defver" is not fetched, so the next check tries again.
    for (const std::string& body :
         {std::string(), std::string("<html><body>Not here</body></html>"), std::string("\x01\x02\xff\x00\x10", 5)}) {
        Serve("sw2.def", body);
        Shown shown = Check();
        ASSERT_EQ(shown.boxes.size(), 1u) << body;
        EXPECT_EQ(shown.boxes[0].rfind("Updates owned: Error downloading definition updates The downloaded file is "
                                       "not a definitions list",
                                       0),
                  0u)
            << shown.boxes[0];
        EXPECT_TRUE(shown.enabled);
        EXPECT_EQ(Local("sw2.def"), "installed definitions\r\n");
        EXPECT_EQ(Local("defver"), "20\r\n");
        EXPECT_EQ(::GetFileAttributesA((folder_ + "\\sw2.def.part").c_str()), INVALID_FILE_ATTRIBUTES);
    }
    // A list is installed and put in force through the owner at once; the label says so.
    Serve("sw2.def", "-939524086\r\n33554559\r\n");
    int reloads = 0;
    Shown shown = Check({1, 0}, [&] {
        ++reloads;
        return std::optional<std::size_t>(2);
    });
    EXPECT_EQ(reloads, 1);
    EXPECT_EQ(shown.L0, "Definitions Updates: Complete, 2 definitions in use");
    EXPECT_EQ(Local("defver"), "21\n");
}

}  // namespace
}  // namespace vantorel::win32
