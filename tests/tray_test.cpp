// The tray routines' records, BringToFront's order, and the icon's mouse notifications.
#include "ui/main/tray.h"

#include <gtest/gtest.h>

#include "fakes/fake_guard_platform.h"
#include "guard/attempts.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;

TEST(TrayIcon, RecordsCarryIdFlagsMessageIconAndTip) {
    FakeNotifyArea tray;
    FakeWindow window;
    AddTrayIcon(tray, window, 0x99, "Vantorel -  0 attempts intercepted", 512);
    window.icon = 0x55;  // the status light changed the window's icon
    ModifyTrayIcon(tray, window, "Vantorel - 1 attempts intercepted", 512);
    RemoveTrayIcon(tray, window);
    ASSERT_EQ(tray.calls.size(), 3u);

    const auto& add = tray.calls[0];
    EXPECT_EQ(add.message, platform::kNimAdd);
    EXPECT_EQ(add.data.window, window.handle);
    EXPECT_EQ(add.data.id, 1u);
    EXPECT_EQ(add.data.flags, 7u);
    EXPECT_EQ(add.data.callbackMessage, 512u);
    EXPECT_EQ(add.data.icon, 0x99) << "add takes the picture it is given";
    EXPECT_EQ(add.data.tip, "Vantorel -  0 attempts intercepted");

    const auto& modify = tray.calls[1];
    EXPECT_EQ(modify.message, platform::kNimModify);
    EXPECT_EQ(modify.data.icon, 0x55) << "modify takes the window's current icon";
    EXPECT_EQ(modify.data.flags, 7u);
    EXPECT_EQ(modify.data.tip, "Vantorel - 1 attempts intercepted");

    const auto& remove = tray.calls[2];
    EXPECT_EQ(remove.message, platform::kNimDelete);
    EXPECT_EQ(remove.data.window, window.handle);
    EXPECT_EQ(remove.data.id, 1u);
    EXPECT_EQ(remove.data.callbackMessage, 1u);
    EXPECT_EQ(remove.data.icon, 1);
    EXPECT_EQ(remove.data.tip, "");
}

TEST(TrayIcon, TipIsCutToTheField) {
    std::string exact(63, 'x');
    EXPECT_EQ(TrayTip(exact), exact) << "63 characters are shown whole";
    EXPECT_EQ(TrayTip(exact + "yz"), exact);
    EXPECT_EQ(TrayTip(""), "");
    EXPECT_EQ(StatusText(INT32_MIN, CountForm::BlankBeforeSign), "Vantorel - -2147483648 attempts intercepted");
    EXPECT_EQ(StatusText(7, CountForm::BlankBeforeSign), "Vantorel -  7 attempts intercepted");
    EXPECT_EQ(StatusText(7, CountForm::Plain), "Vantorel - 7 attempts intercepted");
}

TEST(TrayIcon, BringToFrontGoesTopmostLetsMessagesRunThenLeavesTopmost) {
    FakeWindowManager windows;
    FakePump pump;
    std::vector<int> pumpsAtCall;
    windows.onSetWindowPos = [&](std::uint32_t) { pumpsAtCall.push_back(pump.pumps); };
    BringToFront(windows, pump, 0x42);
    ASSERT_EQ(windows.calls.size(), 2u);
    EXPECT_EQ(windows.calls[0].insertAfter, -1);
    EXPECT_EQ(windows.calls[1].insertAfter, -2);
    for (const auto& call : windows.calls) {
        EXPECT_EQ(call.window, 0x42);
        EXPECT_EQ(call.flags, 0x53u);
        EXPECT_EQ(call.x | call.y | call.cx | call.cy, 0);
    }
    EXPECT_EQ(pumpsAtCall, (std::vector<int>{0, 1}));
}

struct MouseRig {
    FakeWindow window;
    FakeWindowManager windows;
    FakePump pump;
    MouseRig() {
        // Like the real call, raising with the show flag makes the window visible.
        windows.onSetWindowPos = [this](std::uint32_t flags) {
            if (flags & platform::kSwpShowWindow) window.visible = true;
        };
    }
};

TEST(TrayIcon, ClicksBringTheWindowBackAndPlainMovesDoNothing) {
    for (std::uint32_t code : {0x201u, 0x202u, 0x203u, 0x204u, 0x205u, 0x206u, 0x207u}) {
        MouseRig hidden;
        hidden.window.visible = false;
        hidden.window.state = platform::WindowState::Minimized;  // hidden by minimising
        TrayMouseNotification(hidden.window, hidden.windows, hidden.pump, code);
        EXPECT_TRUE(hidden.window.visible) << code;
        EXPECT_EQ(hidden.window.state, platform::WindowState::Normal) << code;
        EXPECT_EQ(hidden.windows.calls.size(), 2u) << code;
    }

    MouseRig shown;
    shown.window.visible = true;
    shown.window.state = platform::WindowState::Maximized;
    TrayMouseNotification(shown.window, shown.windows, shown.pump, 0x205);
    EXPECT_EQ(shown.windows.calls.size(), 2u) << "a shown window is only raised";
    EXPECT_EQ(shown.window.state, platform::WindowState::Maximized);

    MouseRig move;
    TrayMouseNotification(move.window, move.windows, move.pump, 512);
    EXPECT_TRUE(move.windows.calls.empty());
    EXPECT_FALSE(move.window.visible);

    // A real pointer move over the window's surface arrives the same way, its x as the code.
    MouseRig surface;
    surface.window.visible = true;
    TrayMouseNotification(surface.window, surface.windows, surface.pump, 100);
    EXPECT_EQ(surface.windows.calls.size(), 2u);
}

}  // namespace
}  // namespace vantorel
