// The options window on the real registry under Wine: its load step on an empty registry, its
// boxes writing the settings Windows and Internet Explorer read, and the modal loop ending on
// "&Close"; once with queued BM_CLICKs, once with the real pointer (SendInput, hit-tested by the
// system, pressed and released on the control). Runs on the virtual display; the values it touches are removed afterwards.
#include <windows.h>

#include <gtest/gtest.h>

#include "app/options_window.h"
#include "platform/win32/registry_win32.h"
#include "settings/settings.h"
#include "win32/ui_input.h"

namespace vantorel::win32 {
namespace {

using platform::kHkeyCurrentUser;
using platform::kHkeyLocalMachine;

class OptionsWindowTest : public ::testing::Test {
protected:
    void SetUp() override { Clean(); }
    void TearDown() override { Clean(); }

    Variant Read(std::int32_t root, const std::string& key, const std::string& name) {
        RegistryRoutines reg(registry_);
        reg.hkey(root);
        reg.KeyRoot(key);
        return reg.GetRegistryValue(name);
    }
    void Remove(std::int32_t root, const std::string& key, const std::string& name) {
        RegistryRoutines reg(registry_);
        reg.hkey(root);
        reg.KeyRoot(key);
        reg.DeleteValue(name);
    }
    void Clean() {
        Remove(kHkeyLocalMachine, kSettingsKey, "Start");
        Remove(kHkeyLocalMachine, kSettingsKey, "Tray");
        Remove(kHkeyLocalMachine, std::string(kRunKey) + "\\", "Vantorel");
        Remove(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger");
    }

    Win32Registry registry_;
};

TEST_F(OptionsWindowTest, BoxesShowWhatIsInEffectAndStoreTheirState) {
    const std::string exe = AutostartPath();
    EXPECT_NE(exe.find("options_window_tests.exe"), std::string::npos) << exe;

    OptionsWindow window(nullptr, 0, registry_, exe);
    ASSERT_NE(window.hwnd(), nullptr) << "no display?";
    char caption[64];
    ::GetWindowTextA(window.hwnd(), caption, sizeof caption);
    EXPECT_STREQ(caption, "Options");
    EXPECT_TRUE(window.controls().F[0]->Visible());
    EXPECT_FALSE(window.controls().F[1]->Visible());
    EXPECT_FALSE(window.box(0).Value());
    EXPECT_FALSE(window.box(1).Value());
    EXPECT_TRUE(window.box(2).Value());
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kSettingsKey, "Start"))) << "loading writes nothing";
    EXPECT_TRUE(IsEmpty(Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger")));

    // The user checks "Boot when Windows boots", then unchecks it, then closes the window; the
    // clicks are queued and handled by the modal loop.
    ::PostMessageA(window.box(0).hwnd(), BM_CLICK, 0, 0);
    ::PostMessageA(window.box(1).hwnd(), BM_CLICK, 0, 0);
    ::PostMessageA(window.box(2).hwnd(), BM_CLICK, 0, 0);
    ::PostMessageA(window.closeButton().hwnd(), BM_CLICK, 0, 0);
    window.ShowModal();
    EXPECT_EQ(window.hwnd(), nullptr) << "closed";
    EXPECT_EQ(Read(kHkeyLocalMachine, kRunKey, "Vantorel"), Variant(exe));
    EXPECT_EQ(Read(kHkeyLocalMachine, kSettingsKey, "Start"), Variant(std::string("1")));
    EXPECT_EQ(Read(kHkeyLocalMachine, kSettingsKey, "Tray"), Variant(std::string("1")));
    EXPECT_EQ(Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger"),
              Variant(std::string("no")));

    OptionsWindow again(nullptr, 1, registry_, exe);
    ::GetWindowTextA(again.hwnd(), caption, sizeof caption);
    EXPECT_STREQ(caption, "Updates");
    EXPECT_TRUE(again.controls().F[1]->Visible());
    EXPECT_FALSE(again.controls().F[0]->Visible());
    EXPECT_TRUE(again.box(0).Value());
    EXPECT_TRUE(again.box(1).Value());
    EXPECT_FALSE(again.box(2).Value());
    ::PostMessageA(again.box(0).hwnd(), BM_CLICK, 0, 0);
    ::PostMessageA(again.hwnd(), WM_CLOSE, 0, 0);
    again.ShowModal();
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kRunKey, "Vantorel"))) << "unchecking removes the autostart entry";
    EXPECT_EQ(Read(kHkeyLocalMachine, kSettingsKey, "Start"), Variant(std::string("0")));
}

TEST_F(OptionsWindowTest, PointerClicksOnBootWhenWindowsBootsWriteAndRemoveTheAutostartEntry) {
    const std::string exe = AutostartPath();
    OptionsWindow window(nullptr, 0, registry_, exe);
    ASSERT_NE(window.hwnd(), nullptr) << "no display?";
    ASSERT_FALSE(window.box(0).Value()) << "an empty registry: the program does not start with Windows";

    Variant runAfterCheck, startAfterCheck, runAfterUncheck, startAfterUncheck;
    int step = 0;
    Ticker user(30, [&] {
        switch (step) {
            case 0:  // the window is up: check the box
                if (!::IsWindowVisible(window.hwnd())) return false;
                PointerClick(window.box(0).hwnd());
                break;
            case 1:  // checked: look at the registry, uncheck it
                if (!window.box(0).Value()) return false;
                runAfterCheck = Read(kHkeyLocalMachine, kRunKey, "Vantorel");
                startAfterCheck = Read(kHkeyLocalMachine, kSettingsKey, "Start");
                PointerClick(window.box(0).hwnd());
                break;
            case 2:  // unchecked: look again, then "&Close"
                if (window.box(0).Value()) return false;
                runAfterUncheck = Read(kHkeyLocalMachine, kRunKey, "Vantorel");
                startAfterUncheck = Read(kHkeyLocalMachine, kSettingsKey, "Start");
                PointerClick(window.closeButton().hwnd());
                return true;
        }
        ++step;
        return false;
    });
    window.ShowModal();
    EXPECT_EQ(window.hwnd(), nullptr) << "the pointer click on \"&Close\" closed the window";
    EXPECT_EQ(runAfterCheck, Variant(exe)) << "checking writes the running executable's path";
    EXPECT_EQ(startAfterCheck, Variant(std::string("1")));
    EXPECT_TRUE(IsEmpty(runAfterUncheck)) << "unchecking removes the Run value";
    EXPECT_EQ(startAfterUncheck, Variant(std::string("0")));
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kSettingsKey, "Tray"))) << "the other boxes wrote nothing";
    EXPECT_TRUE(IsEmpty(Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger")));
}

}  // namespace
}  // namespace vantorel::win32
