// Start-up and the on/off state against fakes: what the first start and a stored state bring up,
// settings that are not numbers, a second instance, Toggle, and sweeps that never nest.
#include "guard/guard.h"

#include <gtest/gtest.h>

#include "fakes/fake_files.h"
#include "fakes/fake_guard_platform.h"
#include "fakes/fake_registry.h"
#include "guard/attempts.h"
#include "settings/settings.h"
#include "ui/main/tray.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;

const std::string kFolder = "C:\\Program Files\\Vantorel";
const std::string kDefinitionsPath = kFolder + "\\sw2.def";

// The view as the main window shows it: the caption, and the tray icon added at start-up.
struct RigView final : GuardView {
    FakeWindow& window;
    FakeNotifyArea& tray;
    RigView(FakeWindow& w, FakeNotifyArea& t) : window(w), tray(t) {}
    void CountLoaded(std::int32_t count) override {
        window.caption = StatusText(count, CountForm::BlankBeforeSign);
        AddTrayIcon(tray, window, window.Icon(), window.caption, kTrayCallbackMessage);
    }
    void CountIntercepted(std::int32_t count) override { window.caption = StatusText(count, CountForm::Plain); }
};

struct GuardRig {
    FakeRegistry registry;
    FakeFiles files;
    FakeConnectionTable table;
    FakeNotifyArea tray;
    FakeWindowManager windows;
    FakePump pump;
    FakeInstance instance;
    FakeWindow frmMain;
    FakeSwitch btnOnOff;
    FakeTimer tmr, timer;
    int missingShown = 0;
    std::size_t trayCallsWhenMissing = 0;
    RigView view{frmMain, tray};
    Guard guard{GuardPlatform{registry, files, table, windows, pump, instance},
                GuardWindow{frmMain, btnOnOff, tmr, timer}, view, kFolder, [this] {
                    ++missingShown;
                    trayCallsWhenMissing = tray.calls.size();
                }};

    GuardRig() {
        files.Put(kDefinitionsPath, "-939524086\r\n67305985");
    }

    std::string Get(std::int32_t root, const std::string& name) {
        RegistryRoutines reg(registry);
        reg.hkey(root);
        reg.KeyRoot(kSettingsKey);
        return VariantText(reg.GetRegistryValue(name, std::string("<missing>")));
    }
    void Put(std::int32_t root, const std::string& name, const std::string& value) {
        RegistryRoutines reg(registry);
        reg.hkey(root);
        reg.KeyRoot(kSettingsKey);
        reg.CreateKey();
        reg.SetRegistryValue(name, value, platform::kRegSz);
    }
    bool Start() {
        if (!guard.Initialize()) return false;
        guard.Load();
        return true;
    }
    void Click() {
        btnOnOff.Value(!btnOnOff.Value());  // the button flips itself
        guard.BtnOnOffClick();
    }
};

TEST(StartUp, FirstStartWithAnEmptyRegistry) {
    GuardRig rig;
    ASSERT_TRUE(rig.Start());
    EXPECT_EQ(rig.instance.mutexes, std::vector<std::string>{"Vantorel"});
    EXPECT_TRUE(rig.frmMain.visible);
    EXPECT_EQ(rig.frmMain.left, (1024 - 616) / 2);
    EXPECT_EQ(rig.frmMain.top, (768 - 320) / 2);
    EXPECT_FALSE(rig.btnOnOff.value);
    EXPECT_EQ(rig.btnOnOff.caption, "OFF");
    EXPECT_EQ(rig.btnOnOff.backColor, 192u);
    EXPECT_EQ(rig.btnOnOff.backOver, 192u);
    EXPECT_EQ(rig.frmMain.caption, "Vantorel -  0 attempts intercepted");
    EXPECT_EQ(rig.Get(platform::kHkeyCurrentUser, "State"), "0");
    EXPECT_FALSE(rig.tmr.enabled);
    EXPECT_EQ(rig.tmr.interval, 55u);
    EXPECT_TRUE(rig.timer.enabled);
    EXPECT_EQ(rig.timer.interval, 1000u);
    EXPECT_EQ(Definitions.size(), 2u);
    EXPECT_EQ(rig.missingShown, 0);

    ASSERT_EQ(rig.tray.calls.size(), 1u);
    const auto& add = rig.tray.calls[0];
    EXPECT_EQ(add.message, platform::kNimAdd);
    EXPECT_EQ(add.data.tip, rig.frmMain.caption);
    EXPECT_EQ(add.data.icon, rig.frmMain.icon);
    EXPECT_EQ(add.data.callbackMessage, 512u);
    EXPECT_EQ(rig.registry.OpenHandles(), 0u);

    // Both settings keys exist now, so later writes find them.
    RegistryRoutines machine(rig.registry);
    machine.hkey(platform::kHkeyLocalMachine);
    machine.KeyRoot(kSettingsKey);
    EXPECT_TRUE(machine.KeyExists());
}

TEST(StartUp, StoredSettingsComeBack) {
    GuardRig on;
    on.Put(platform::kHkeyCurrentUser, "State", "7");
    on.Put(platform::kHkeyCurrentUser, "Attempts", "3");
    ASSERT_TRUE(on.Start());
    EXPECT_TRUE(on.btnOnOff.value);
    EXPECT_EQ(on.btnOnOff.caption, "ON");
    EXPECT_EQ(on.btnOnOff.backColor, 65280u);
    EXPECT_EQ(on.btnOnOff.backOver, 65280u);
    EXPECT_TRUE(on.tmr.enabled);
    EXPECT_EQ(on.Get(platform::kHkeyCurrentUser, "State"), "1") << "any non-zero state is written back as 1";
    EXPECT_EQ(on.guard.AttemptCount(), 3);
    EXPECT_EQ(on.frmMain.caption, "Vantorel -  3 attempts intercepted");

    GuardRig negative;
    negative.Put(platform::kHkeyCurrentUser, "Attempts", "-4");
    ASSERT_TRUE(negative.Start());
    EXPECT_EQ(negative.frmMain.caption, "Vantorel - -4 attempts intercepted");

    GuardRig hidden;
    hidden.Put(platform::kHkeyLocalMachine, "Tray", "1");
    ASSERT_TRUE(hidden.Start());
    EXPECT_FALSE(hidden.frmMain.visible);
    ASSERT_EQ(hidden.tray.calls.size(), 1u);
    EXPECT_EQ(hidden.tray.calls[0].message, platform::kNimAdd);
}

TEST(StartUp, SettingsThatAreNotNumbersReadAsDefaults) {
    GuardRig rig;
    rig.Put(platform::kHkeyLocalMachine, "Tray", "yes");
    rig.Put(platform::kHkeyCurrentUser, "State", "abc");
    rig.Put(platform::kHkeyCurrentUser, "Attempts", "many");
    ASSERT_TRUE(rig.Start());
    EXPECT_TRUE(rig.frmMain.visible);
    EXPECT_FALSE(rig.btnOnOff.value);
    EXPECT_FALSE(rig.tmr.enabled);
    EXPECT_EQ(rig.guard.AttemptCount(), 0);
    EXPECT_EQ(rig.frmMain.caption, "Vantorel -  0 attempts intercepted");
    EXPECT_EQ(rig.Get(platform::kHkeyCurrentUser, "State"), "0");

    // A count beyond the 32-bit range is not a count either.
    GuardRig big;
    big.Put(platform::kHkeyCurrentUser, "Attempts", "99999999999");
    ASSERT_TRUE(big.Start());
    EXPECT_EQ(rig.guard.AttemptCount(), 0);
}

TEST(StartUp, SecondInstanceEndsBeforeShowingOrChangingAnything) {
    GuardRig rig;
    rig.instance.running = true;
    EXPECT_FALSE(rig.Start());
    EXPECT_FALSE(rig.frmMain.visible);
    EXPECT_EQ(rig.frmMain.caption, "FrmMain");
    EXPECT_TRUE(rig.tray.calls.empty());
    EXPECT_TRUE(rig.instance.mutexes.empty());
    EXPECT_EQ(rig.Get(platform::kHkeyCurrentUser, "State"), "<missing>");
    EXPECT_FALSE(rig.tmr.enabled);
    EXPECT_FALSE(rig.timer.enabled);
}

TEST(StartUp, MissingDefinitionsAreReportedBeforeTheTrayIconExists) {
    GuardRig rig;
    rig.files.Remove(kDefinitionsPath);
    rig.Put(platform::kHkeyCurrentUser, "State", "1");
    ASSERT_TRUE(rig.Start());
    EXPECT_EQ(rig.missingShown, 1);
    EXPECT_EQ(rig.trayCallsWhenMissing, 0u);
    EXPECT_TRUE(Definitions.empty());
    EXPECT_TRUE(rig.tmr.enabled) << "start-up carries on with an empty list";
    rig.table.rows = {Row(platform::kTcpStateEstablished, Ipv4(1, 2, 3, 4))};
    rig.guard.TmrTick();
    EXPECT_TRUE(rig.table.entries.empty());
}

TEST(Toggle, TwoClicksRestoreEverything) {
    GuardRig rig;
    rig.Put(platform::kHkeyCurrentUser, "State", "1");
    ASSERT_TRUE(rig.Start());

    rig.Click();
    EXPECT_FALSE(rig.btnOnOff.value);
    EXPECT_EQ(rig.btnOnOff.caption, "OFF");
    EXPECT_EQ(rig.btnOnOff.backColor, 192u);
    EXPECT_EQ(rig.btnOnOff.backOver, 192u);
    EXPECT_EQ(rig.Get(platform::kHkeyCurrentUser, "State"), "0");
    EXPECT_FALSE(rig.tmr.enabled);

    rig.Click();
    EXPECT_TRUE(rig.btnOnOff.value);
    EXPECT_EQ(rig.btnOnOff.caption, "ON");
    EXPECT_EQ(rig.btnOnOff.backColor, 65280u);
    EXPECT_EQ(rig.btnOnOff.backOver, 65280u);
    EXPECT_EQ(rig.Get(platform::kHkeyCurrentUser, "State"), "1");
    EXPECT_TRUE(rig.tmr.enabled);
    EXPECT_TRUE(rig.timer.enabled) << "the status timer is never touched";
    EXPECT_EQ(rig.registry.OpenHandles(), 0u);
}

TEST(TmrTick, SweepsNeverNestAndSwitchingOffLetsTheRunFinish) {
    GuardRig rig;
    rig.Put(platform::kHkeyCurrentUser, "State", "1");
    ASSERT_TRUE(rig.Start());
    rig.table.rows = {Row(platform::kTcpStateEstablished, Ipv4(5, 5, 5, 5)),
                      Row(platform::kTcpStateEstablished, Ipv4(1, 2, 3, 4))};
    int nestedTicks = 0;
    rig.pump.onPump = [&] {
        // A tick that fell due while the sweep lets messages run, and a click on the switch.
        ++nestedTicks;
        EXPECT_TRUE(rig.guard.Sweeping());
        EXPECT_EQ(rig.guard.Sweep().LastSweep().rows, 0u) << "a sweep under way is not reported yet";
        rig.pump.OwnTick([&] { rig.guard.TmrTick(); });
        if (rig.pump.pumps == 1) rig.Click();
    };
    rig.guard.TmrTick();
    EXPECT_EQ(nestedTicks, 2);
    EXPECT_EQ(rig.guard.SweepsRun(), 1u);
    EXPECT_EQ(rig.table.fetches, 1);
    EXPECT_FALSE(rig.tmr.enabled);
    EXPECT_EQ(rig.table.entries.size(), 1u) << "the run that was under way finishes its rows";
    EXPECT_EQ(rig.guard.AttemptCount(), 1);
    EXPECT_FALSE(rig.guard.Sweeping());

    EXPECT_EQ(rig.guard.Sweep().LastSweep().examined, 2u);
    rig.pump.onPump = nullptr;
    rig.guard.TmrTick();
    EXPECT_EQ(rig.guard.SweepsRun(), 2u);
}

TEST(Unload, StopsBothTimers) {
    GuardRig rig;
    rig.Put(platform::kHkeyCurrentUser, "State", "1");
    ASSERT_TRUE(rig.Start());
    rig.guard.Unload();
    EXPECT_FALSE(rig.tmr.enabled);
    EXPECT_FALSE(rig.timer.enabled);
    EXPECT_EQ(rig.Get(platform::kHkeyCurrentUser, "State"), "1") << "the next start comes up the same";
}

}  // namespace
}  // namespace vantorel
