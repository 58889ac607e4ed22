// The options window on the real registry under Wine: what its boxes show on an empty registry, the
// settings Windows and Internet Explorer read written by real pointer clicks (SendInput, hit-tested
// by the system), the updates frame, and the modal loop ending on "&Close" or the close request.
// The values it touches are removed afterwards.
#include <windows.h>

#include <gtest/gtest.h>

#include "platform/win32/options_window_win32.h"
#include "platform/win32/registry_win32.h"
#include "settings/registry_routines.h"
#include "win32/ui_input.h"

namespace vantorel::win32 {
namespace {

using platform::kHkeyCurrentUser;
using platform::kHkeyLocalMachine;

class OptionsWindowTest : public ::testing::Test {
protected:
    void SetUp() override { Clean(); }
    void TearDown() override { Clean(); }
    std::string Read(std::int32_t root, const std::string& key, const std::string& name) {
        RegistryRoutines reg(registry_);
        reg.hkey(root);
        reg.KeyRoot(key);
        Variant value = reg.GetRegistryValue(name);
        return IsEmpty(value) ? "<none>" : VariantText(value);
    }
    // Start, Tray, the Run entry and the script debugger setting, in that order.
    std::string Settings() {
        return Read(kHkeyLocalMachine, kVantorelKey, "Start") + " " + Read(kHkeyLocalMachine, kVantorelKey, "Tray") +
               " " + Read(kHkeyLocalMachine, kRunKey, "Vantorel") + " " +
               Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger");
    }
    void Clean() {
        using Value = std::tuple<std::int32_t, std::string, const char*>;
        for (auto [root, key, name] : {Value{kHkeyLocalMachine, kVantorelKey, "Start"},
                                       Value{kHkeyLocalMachine, kVantorelKey, "Tray"},
                                       Value{kHkeyLocalMachine, std::string(kRunKey) + "\\", "Vantorel"},
                                       Value{kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger"}}) {
            RegistryRoutines reg(registry_);
            reg.hkey(root);
            reg.KeyRoot(key);
            reg.DeleteValue(name);
        }
    }
    Win32Registry registry_;
};

TEST_F(OptionsWindowTest, PointerClicksStoreEachOptionAtOnce) {
    const std::string exe = AutostartPath();
    EXPECT_NE(exe.find("options_window_tests.exe"), std::string::npos) << exe;
    OptionsWindow window(nullptr, 0, registry_, exe);
    ASSERT_NE(window.hwnd(), nullptr) << "no display?";
    char caption[64];
    ::GetWindowTextA(window.hwnd(), caption, sizeof caption);
    EXPECT_STREQ(caption, "Options");
    EXPECT_TRUE(window.controls().F[0]->Visible() && !window.controls().F[1]->Visible());
    EXPECT_EQ(std::make_tuple(window.box(0).Value(), window.box(1).Value(), window.box(2).Value()),
              std::make_tuple(false, false, true)) << "what is in effect on an empty registry";
    EXPECT_EQ(Settings(), "<none> <none> <none> <none>") << "loading writes nothing";

    // The user clicks each box, then the first again, then "&Close"; the registry after each click.
    std::vector<std::string> seen;
    const int order[] = {0, 1, 2, 0};
    std::size_t step = 0;
    int pending = -1;
    bool want = false;
    Ticker user(30, [&] {
        if (!::IsWindowVisible(window.hwnd()) || (pending >= 0 && window.box(pending).Value() != want)) return false;
        if (pending >= 0) seen.push_back(Settings());
        if (step == std::size(order)) {
            PointerClick(window.closeButton().hwnd());
            return true;
        }
        pending = order[step++];
        want = !window.box(pending).Value();
        PointerClick(window.box(pending).hwnd());
        return false;
    });
    window.ShowModal();
    EXPECT_EQ(window.hwnd(), nullptr) << "the pointer click on \"&Close\" closed the window";
    EXPECT_EQ(seen, (std::vector<std::string>{"1 <none> " + exe + " <none>", "1 1 " + exe + " <none>",
                                              "1 1 " + exe + " no", "0 1 <none> no"}));

    OptionsWindow again(nullptr, 1, registry_, exe);
    ::GetWindowTextA(again.hwnd(), caption, sizeof caption);
    EXPECT_STREQ(caption, "Updates");
    EXPECT_TRUE(again.controls().F[1]->Visible() && !again.controls().F[0]->Visible());
    EXPECT_EQ(std::make_tuple(again.box(0).Value(), again.box(1).Value(), again.box(2).Value()),
              std::make_tuple(false, true, false));
    ::PostMessageA(again.hwnd(), WM_CLOSE, 0, 0);
    again.ShowModal();
    EXPECT_EQ(again.hwnd(), nullptr);
}

}  // namespace
}  // namespace vantorel::win32
