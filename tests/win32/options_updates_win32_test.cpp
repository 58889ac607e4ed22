// The update check in the real options window under Wine, against nginx (the configuration in
// deploy/, started by a CTest fixture on a loopback port, serving VANTOREL_NGINX_DIR/www/vt), with
// the window's own WinINet downloaders, for a program folder in the temp folder and the "Server"
// setting pointing at nginx. "&Check for Updates" is clicked with BM_CLICK, and what the window
// shows is read back from its controls: the status labels, the picture box pb and its pixels, the
// button and the "Updates" message boxes. Closing the window during a check, and a new list taking
// effect in the running guard, are proved end to end (tests/e2e/e2e_tests.py). Then DrawProgress on
// its own on a bitmap the size of pb.
#include <windows.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <functional>
#include <optional>
#include <sstream>

#include "app/options_window.h"
#include "platform/win32/picture_box_win32.h"
#include "platform/win32/registry_win32.h"
#include "settings/registry_routines.h"
#include "ui/options/draw_progress.h"
#include "win32/ui_input.h"

namespace vantorel::win32 {
namespace {

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

// What the window showed: labels and pb when the check returned, every message box on the way (its
// title, owner and text, and whether the button was disabled meanwhile), and the reloads asked for.
struct Shown {
    std::string L0, L1;
    bool pbVisible = false, barFull = false, enabled = false;
    std::vector<std::string> boxes;
    int reloads = 0;
};

class OptionsUpdatesTest : public ::testing::Test {
protected:
    void SetUp() override {
        const char* dir = std::getenv("VANTOREL_NGINX_DIR");
        ASSERT_NE(dir, nullptr) << "VANTOREL_NGINX_DIR is not set";
        std::string port = ReadFile(std::string("Z:") + dir + "/server.port");
        while (!port.empty() && (port.back() == '\n' || port.back() == '\r')) port.pop_back();
        ASSERT_FALSE(port.empty()) << "nginx is not running";
        www_ = std::string("Z:") + dir + "/www/vt/";
        SetServer("http://127.0.0.1:" + port + "/");
        char temp[MAX_PATH];
        ::GetTempPathA(MAX_PATH, temp);
        folder_ = std::string(temp) + "vtopt-" + std::to_string(::GetCurrentProcessId());
        ::CreateDirectoryA(folder_.c_str(), nullptr);
    }
    void TearDown() override {
        Serve(nullptr, nullptr, nullptr, nullptr);
        for (const char* name : {"\\defver", "\\sw2.def", "\\VTSetup.exe"}) ::DeleteFileA((folder_ + name).c_str());
        EXPECT_TRUE(::RemoveDirectoryA(folder_.c_str())) << "something was left behind in " << folder_;
        SetServer("");
    }

    // The "Server" setting, as the program reads it; removed when empty.
    void SetServer(const std::string& address) {
        RegistryRoutines reg(registry_);
        reg.hkey(platform::kHkeyLocalMachine);
        reg.KeyRoot("SOFTWARE\\Vantorel\\");
        reg.CreateKey();
        if (address.empty()) reg.DeleteValue("Server");
        else ASSERT_TRUE(reg.SetRegistryValue("Server", address, platform::kRegSz));
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
        EXPECT_FALSE(::IsWindowVisible(window.pbWindow())) << "pb is hidden until a download starts";
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
                shown.boxes.push_back(Text(box) + (::GetWindow(box, GW_OWNER) == window.hwnd() ? " owned: " : ": ") +
                                      text + (off ? " (button off)" : ""));
                answered = box;
                ::PostMessageA(box, WM_COMMAND, IDOK, 0);
            }
            return false;
        });
        window.ShowModal();
        return shown;
    }

    win32::Win32Registry registry_;
    std::string www_, folder_;
};

TEST_F(OptionsUpdatesTest, VersionsCompareAsNumbersAndOnlyACompleteListReplacesTheInstalledOne) {
    std::string list;  // 20,000 keys, about 200 KB: several blocks of the WinINet worker, many chunks of progress
    for (int i = 0; i < 20000; ++i) list += std::to_string(-2000000 + i * 11) + "\r\n";
    const std::string kNoDefs = "Definitions Updates: No Updates", kNoProgram = "Program Updates: No Updates";
    const char* kAsLoaded = "Definitions Updates:";  // the caption the window was loaded with
    const char* kNew = "Definitions Updates: Complete, 2 definitions in use";
    const char* kNoList = "Updates owned: Error downloading definition updates The file, \"";
    const char* kNotAList =
        "Updates owned: Error downloading definition updates The downloaded file is not a definitions";
    const char* kNoSetup = "Updates owned: Error downloading program updates The file, \"";
    const char* kEmpty = "Updates owned: Error downloading program updates The downloaded setup program is empty.";
    struct Case {
        const char *localDefver, *defver, *sw2, *mainver, *setup;
        ProgramVersion version;
        std::string L0, L1;
        const char* box;
    } cases[] = {
        // Equal versions fetch nothing; 3 against 10 is older as numbers, though "3" sorts after "10" as text.
        {"20\r\n", "20", "not fetched", "1.0", nullptr, {1, 0}, kNoDefs, kNoProgram, ""},
        {"10\r\n", "3", "not fetched", "1.0", nullptr, {1, 0}, kNoDefs, kNoProgram, ""},
        // A newer list is installed and put in force through the owner; a missing local version counts as 0.
        {"20\r\n", "21\n", list.c_str(), "1.0\n", nullptr, {1, 0}, kNew, kNoProgram, ""},
        {nullptr, "1", "67305985\r\n", "1.0", nullptr, {1, 0}, kNew, kNoProgram, ""},
        // Program 1.10 reads as 1.1, below the server's 1.9: the setup program is fetched.
        {"20\r\n", "20", nullptr, "1.9\r\n", "setup", {1, 10}, kNoDefs, "Program Updates: Complete", ""},
        // No sw2.def on the server, an empty body, an error page served as a success: "defver" stays,
        // so the next check tries again.
        {"20\r\n", "21", nullptr, "1.0", nullptr, {1, 0}, kAsLoaded, kNoProgram, kNoList},
        {"20\r\n", "21", "", "1.0", nullptr, {1, 0}, kAsLoaded, kNoProgram, kNotAList},
        {"20\r\n", "21", "<html>Not here</html>", "1.0", nullptr, {1, 0}, kAsLoaded, kNoProgram, kNotAList},
        // No setup program, an empty one: the caption keeps its text.
        {"20\r\n", "20", nullptr, "2", nullptr, {1, 0}, kNoDefs, "Program Updates:", kNoSetup},
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

TEST_F(OptionsUpdatesTest, UnreachableServerShowsOneMessageBoxWhileTheButtonIsOff) {
    SetServer("http://127.0.0.1:9");  // discard: nothing listens there on this loopback
    Shown shown = Check("20\r\n");
    ASSERT_EQ(shown.boxes.size(), 1u);
    EXPECT_EQ(shown.boxes[0].rfind("Updates owned: Cannot check for updates", 0), 0u) << shown.boxes[0];
    EXPECT_NE(shown.boxes[0].find("http://127.0.0.1:9"), std::string::npos) << shown.boxes[0];
    EXPECT_NE(shown.boxes[0].find("(button off)"), std::string::npos) << "the button stays off while the check runs";
    EXPECT_TRUE(shown.enabled);
    EXPECT_EQ(Local("sw2.def"), kInstalled);
}

// The XOR passes leave the bar in the highlight colour and turn the label's strokes under it into the
// window colour; 0 percent draws no bar.
TEST(DrawProgressGdi, BarAndInvertedLabelOnARealBitmap) {
    GdiPictureBox pb(393, 17);
    ASSERT_EQ(pb.TwipsPerPixelX(), 15) << "the sizes below assume 96 dots per inch";
    const COLORREF fore = ::GetSysColor(COLOR_HIGHLIGHT), back = ::GetSysColor(COLOR_WINDOW);
    ASSERT_NE(fore, back);
    // The columns of the label, centred in the inner width (5865 twips).
    auto label = [&](const char* text) {
        const int left = static_cast<int>((5865 - pb.TextWidth(text)) / 2 / 15);
        return std::make_pair(left, left + static_cast<int>(pb.TextWidth(text) / 15));
    };

    DrawProgress(pb, 50, kProgressForeColor, kProgressBackColor);
    const auto [labelLeft, labelRight] = label("50%");
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

    // 0 percent: nothing in the highlight colour outside the label.
    DrawProgress(pb, 0, kProgressForeColor, kProgressBackColor);
    const auto [zeroLeft, zeroRight] = label("0%");
    int outside = 0;
    for (int y = 0; y < 17; ++y)
        for (int x = 0; x < 393; ++x)
            if ((x < zeroLeft - 1 || x > zeroRight + 1) && pb.Pixel(x, y) != back) ++outside;
    EXPECT_EQ(outside, 0);
}

}  // namespace
}  // namespace vantorel::win32
