// The real options window's updates panel under Wine, against nginx (the configuration in deploy/,
// started by a CTest fixture on a loopback port): "&Check for Updates" is clicked with the real
// pointer (input injected with SendInput, hit-tested and turned into the button's press and
// release by the system) or with BM_CLICK, the check runs with the window's own WinINet
// downloaders, and what the window shows is read back from its controls: the status labels, the
// picture box pb and its pixels, the button's enabled state and the "Updates" message box.
#include <windows.h>

#include "win32/update_server.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <functional>
#include <sstream>

#include "app/options_window.h"
#include "platform/win32/registry_win32.h"
#include "win32/ui_input.h"
#include "settings/registry_routines.h"

namespace vantorel::win32 {
namespace {

using testing::ReadFile;
using testing::WriteFile;

std::string Text(HWND hwnd) {
    char text[512] = {0};
    ::GetWindowTextA(hwnd, text, sizeof text);
    return text;
}

// A message box shown by this thread: its caption, its owner and its texts.
struct MessageBoxSeen {
    HWND hwnd = nullptr;
    std::string title, text;
    HWND owner = nullptr;
};

MessageBoxSeen FindMessageBox() {
    MessageBoxSeen seen;
    ::EnumThreadWindows(
        ::GetCurrentThreadId(),
        [](HWND hwnd, LPARAM found) -> BOOL {
            char cls[32] = {0};
            ::GetClassNameA(hwnd, cls, sizeof cls);
            if (std::string(cls) != "#32770" || !::IsWindowVisible(hwnd)) return TRUE;
            reinterpret_cast<MessageBoxSeen*>(found)->hwnd = hwnd;
            return FALSE;
        },
        reinterpret_cast<LPARAM>(&seen));
    if (seen.hwnd == nullptr) return seen;
    seen.title = Text(seen.hwnd);
    seen.owner = ::GetWindow(seen.hwnd, GW_OWNER);
    ::EnumChildWindows(
        seen.hwnd,
        [](HWND child, LPARAM found) -> BOOL {
            char cls[32] = {0};
            ::GetClassNameA(child, cls, sizeof cls);
            if (std::string(cls) == "Static") reinterpret_cast<MessageBoxSeen*>(found)->text += Text(child);
            return TRUE;
        },
        reinterpret_cast<LPARAM>(&seen));
    return seen;
}

class OptionsUpdatesTest : public testing::UpdateServerTest {
protected:
    OptionsUpdatesTest() : UpdateServerTest("vtopt-") {}

    // Opens the updates panel, lets `click` start the check once the modal loop runs, and closes
    // the window when the check has returned; `after` looks at the window before it closes.
    void RunCheck(const std::function<void(OptionsWindow&)>& click, const std::function<void(OptionsWindow&)>& after) {
        OptionsWindow window(nullptr, 1, registry_, AutostartPath(), {folder_, {1, 0}});
        ASSERT_NE(window.hwnd(), nullptr) << "no display?";
        EXPECT_FALSE(::IsWindowVisible(window.pbWindow())) << "pb is hidden until a download starts";
        std::function<void()> check = window.updateButton().Click;
        window.updateButton().Click = [&] {
            ++clicks_;
            check();
            if (window.hwnd() == nullptr) return;
            after(window);
            ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);
        };
        Ticker start(50, [&] {
            if (!::IsWindowVisible(window.hwnd())) return false;
            click(window);
            return true;
        });
        window.ShowModal();
        EXPECT_EQ(window.hwnd(), nullptr);
    }

    int clicks_ = 0;
};

TEST_F(OptionsUpdatesTest, PointerClickFetchesNewerDefinitionsAndPaintsProgress) {
    std::string definitions;
    for (int i = 0; i < 20000; ++i) definitions += std::to_string(-2000000 + i * 11) + "\r\n";
    Serve("defver", "21\n");
    Serve("sw2.def", definitions);
    Serve("mainver", "1.0\n");
    std::string L0, L1;
    bool pbVisible = false, enabledAfter = false;
    COLORREF leftPixel = 0, rightPixel = 0;
    RunCheck([](OptionsWindow& w) { PointerClick(w.updateButton().hwnd()); },
             [&](OptionsWindow& w) {
                 L0 = Text(w.label(0).hwnd());
                 L1 = Text(w.label(1).hwnd());
                 pbVisible = ::IsWindowVisible(w.pbWindow()) != FALSE;
                 enabledAfter = ::IsWindowEnabled(w.updateButton().hwnd()) != FALSE;
                 RECT inside;
                 ::GetClientRect(w.pbWindow(), &inside);
                 leftPixel = w.picture().Pixel(3, 3);
                 rightPixel = w.picture().Pixel(inside.right - 4, inside.bottom / 2);
             });
    EXPECT_EQ(clicks_, 1) << "the pointer click reached the button once";
    EXPECT_EQ(L0, "Definitions Updates: Complete");
    EXPECT_EQ(L1, "Program Updates: No Updates");
    EXPECT_EQ(Local("sw2.def"), definitions);
    EXPECT_EQ(Local("defver"), "21\n");
    EXPECT_TRUE(pbVisible);
    EXPECT_TRUE(enabledAfter);
    // The last progress painted was 100 %: the bar (highlight colour) reaches across pb.
    EXPECT_EQ(leftPixel, ::GetSysColor(COLOR_HIGHLIGHT));
    EXPECT_EQ(rightPixel, ::GetSysColor(COLOR_HIGHLIGHT));
}

TEST_F(OptionsUpdatesTest, EqualVersionsFetchNothingAndPbStaysHidden) {
    Serve("defver", "20");
    Serve("sw2.def", "should not be fetched");
    Serve("mainver", "1.0");
    std::string L0, L1;
    bool pbVisible = true;
    RunCheck([](OptionsWindow& w) { ::PostMessageA(w.updateButton().hwnd(), BM_CLICK, 0, 0); },
             [&](OptionsWindow& w) {
                 L0 = Text(w.label(0).hwnd());
                 L1 = Text(w.label(1).hwnd());
                 pbVisible = ::IsWindowVisible(w.pbWindow()) != FALSE;
             });
    EXPECT_EQ(clicks_, 1);
    EXPECT_EQ(L0, "Definitions Updates: No Updates");
    EXPECT_EQ(L1, "Program Updates: No Updates");
    EXPECT_FALSE(pbVisible);
    EXPECT_EQ(Local("sw2.def"), "installed definitions\r\n");
    EXPECT_EQ(Local("defver"), "20\r\n");
}

TEST_F(OptionsUpdatesTest, UnreachableServerShowsOneMessageBoxAndTheButtonComesBack) {
    SetServer("http://127.0.0.1:9");  // discard: nothing listens there on this loopback
    std::vector<MessageBoxSeen> boxes;
    std::vector<bool> buttonEnabledDuringBox;
    bool enabledAfter = false;
    OptionsWindow window(nullptr, 1, registry_, AutostartPath(), {folder_, {1, 0}});
    ASSERT_NE(window.hwnd(), nullptr);
    const HWND options = window.hwnd();
    // Answers every message box the check shows, noting what it says.
    Ticker answer(20, [&] {
        MessageBoxSeen seen = FindMessageBox();
        if (seen.hwnd != nullptr && (boxes.empty() || boxes.back().hwnd != seen.hwnd)) {
            boxes.push_back(seen);
            buttonEnabledDuringBox.push_back(::IsWindowEnabled(window.updateButton().hwnd()) != FALSE);
            ::PostMessageA(seen.hwnd, WM_COMMAND, IDOK, 0);
        }
        return false;
    });
    std::function<void()> check = window.updateButton().Click;
    window.updateButton().Click = [&] {
        ++clicks_;
        check();
        enabledAfter = ::IsWindowEnabled(window.updateButton().hwnd()) != FALSE;
        ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);
    };
    ::PostMessageA(window.updateButton().hwnd(), BM_CLICK, 0, 0);
    window.ShowModal();
    ASSERT_EQ(boxes.size(), 1u);
    EXPECT_EQ(boxes[0].title, "Updates");
    EXPECT_EQ(boxes[0].owner, options) << "the message box belongs to the options window";
    EXPECT_NE(boxes[0].text.find("http://127.0.0.1:9"), std::string::npos) << boxes[0].text;
    EXPECT_FALSE(buttonEnabledDuringBox[0]) << "the button stays disabled while the check runs";
    EXPECT_TRUE(enabledAfter);
    EXPECT_EQ(Local("sw2.def"), "installed definitions\r\n");
}

TEST_F(OptionsUpdatesTest, ClosingTheWindowDuringADownloadLeavesTheInstalledFiles) {
    Serve("defver", "21");
    Serve("sw2.def", std::string(64 * 1024 * 1024, '7'));
    Serve("mainver", "9");
    Serve("VTSetup.exe", "should not be fetched");
    bool returned = false;
    {
        OptionsWindow window(nullptr, 1, registry_, AutostartPath(), {folder_, {1, 0}});
        ASSERT_NE(window.hwnd(), nullptr);
        std::function<void()> check = window.updateButton().Click;
        window.updateButton().Click = [&] {
            check();
            returned = true;
        };
        // The user closes the window as soon as the download shows progress.
        Ticker close(1, [&] {
            if (window.hwnd() == nullptr || !::IsWindowVisible(window.pbWindow())) return false;
            ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);
            return true;
        });
        ::PostMessageA(window.updateButton().hwnd(), BM_CLICK, 0, 0);
        window.ShowModal();
        EXPECT_EQ(window.hwnd(), nullptr);
    }
    EXPECT_TRUE(returned) << "the check returned after the window closed";
    const std::string installed = Local("sw2.def");
    EXPECT_TRUE(installed == "installed definitions\r\n") << "sw2.def holds " << installed.size() << " bytes";
    EXPECT_EQ(Local("defver"), "20\r\n");
    EXPECT_EQ(::GetFileAttributesA((folder_ + "\\sw2.def.part").c_str()), INVALID_FILE_ATTRIBUTES);
    EXPECT_EQ(::GetFileAttributesA((folder_ + "\\VTSetup.exe").c_str()), INVALID_FILE_ATTRIBUTES);
}

}  // namespace
}  // namespace vantorel::win32
