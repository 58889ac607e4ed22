// The main window, the guard and the connection sweep behind them, against fakes, for what the real
// window, table and program (tests/win32/, tests/linux/, tests/e2e/) cannot stage: malformed
// settings, the missing-definitions flow before the tray icon, the unload order, the light's blink,
// sweeps that never nest, a modal window opened in the middle of a sweep, rows already being
// deleted, a listed key 0, a quit mid-sweep, and fetches that fail, overstate their count or never fit.
#include "ui/main/frm_main.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <tuple>
#include <vector>

#include "fakes/fake_file_system.h"
#include "fakes/fake_guard_platform.h"
#include "fakes/fake_registry.h"
#include "fakes/fake_widgets.h"
#include "guard/definitions.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;
using platform::kHkeyCurrentUser;
using platform::kHkeyLocalMachine;
using platform::kTcpStateEstablished;
using Icons = std::vector<platform::IconHandle>;

const std::string kFolder = "C:\\Vantorel";
const std::string kDefinitionsPath = kFolder + "\\sw2.def";
constexpr platform::IconHandle kDark = 0xD0, kBright = 0xB0, kPadlock = 0xA0;

// The shell and the application, noting what the window asks of them in one event log.
class FakeDesktop final : public platform::Shell, public platform::Application {
public:
    std::intptr_t Execute(platform::WindowHandle owner, const std::string& operation, const std::string& file,
                          const std::string&, const std::string&, std::int32_t show) override {
        events.push_back(operation + " " + file + " " + std::to_string(show) + " " + std::to_string(owner));
        return 2;  // "file not found": the window does not look at it
    }
    void ShowMessage(platform::WindowHandle owner, const std::string& text, const std::string& title,
                     std::uint32_t style) override {
        events.push_back("MessageBox " + title + " " + std::to_string(style) + " " + std::to_string(owner));
        texts.push_back(text);
    }
    void ShowOptionsModal(platform::WindowHandle, int frameIndex) override {
        events.push_back("Options " + std::to_string(frameIndex));
        if (onOptions) onOptions();
    }
    void EndProgram() override { events.push_back("End"); }
    std::function<void()> onOptions;
    std::vector<std::string> events, texts;
};

// The main window with every platform piece faked; the definitions list 10.0.0.200 and 1.2.3.4.
struct MainRig {
    FakeDesktop desktop;
    FakeRegistry registry;
    FakeFileSystem files;
    FakeConnectionTable table;
    FakeNotifyArea tray;
    FakeWindowManager windows;
    FakePump pump;
    FakeInstance instance;
    FakeWindow frm;
    FakeSwitch btnOnOff;
    FakeTimer tmr, timer;
    FakeButton btnO[5];
    FrmMain form{
        FrmMainPlatform{GuardPlatform{registry, files, table, windows, pump, instance}, tray, desktop, desktop},
        FrmMainControls{frm,
                        btnOnOff,
                        tmr,
                        timer,
                        {&btnO[0], &btnO[1], &btnO[2], &btnO[3], &btnO[4]},
                        {},
                        {},
                        {kDark, kBright, kPadlock}},
        kFolder};

    MainRig() {
        files.files[kDefinitionsPath] = "-939524086\r\n67305985";
        tray.events = &desktop.events;
    }
    void Put(std::int32_t root, const std::string& name, const std::string& value) {
        registry.PutRaw(root, kSettingsKey, name, platform::kRegSz, {value.begin(), value.end()});
    }
    void Start() {
        ASSERT_TRUE(form.Initialize());
        form.Load();
    }
    void ClickSwitch() {
        btnOnOff.SetValue(!btnOnOff.Value());  // the button flips itself first
        form.BtnOnOffClick();
    }
    // The window's icon after each of `n` status ticks, as the tray icon shows it.
    Icons Ticks(int n) {
        Icons shown;
        for (int i = 0; i < n; ++i) {
            form.TimerTick();
            shown.push_back(tray.calls.back().icon);
        }
        return shown;
    }
};

TEST(FrmMain, HelpOpensTheServersPageMinimisingDropsTheSizeCommandAndExitUnloadsOnce) {
    MainRig rig;
    rig.Put(kHkeyLocalMachine, "Server", "http://127.0.0.1:8080");
    rig.Start();
    rig.frm.state = platform::WindowState::Minimized;
    rig.form.Resize();
    EXPECT_EQ(std::make_pair(rig.frm.visible, rig.windows.deletedCommand), std::make_pair(false, platform::kScSize));

    rig.desktop.events.clear();
    rig.btnO[kBtnHelp].UserClick();
    rig.btnO[kBtnExit].UserClick();
    rig.form.QueryUnload();  // the window's destruction, which the end brings, unloads nothing again
    EXPECT_EQ(rig.desktop.events,
              (std::vector<std::string>{"open http://127.0.0.1:8080/vt/help.php 1 " + std::to_string(rig.frm.handle),
                                        "Tray 2", "End"}));
    EXPECT_FALSE(rig.tmr.enabled || rig.timer.enabled) << "both timers stopped";
}

TEST(Guard, SweepsNeverNestAndAModalWindowOpenedInTheMiddleOfASweepNeverPausesTheGuard) {
    MainRig rig;
    rig.Put(platform::kHkeyCurrentUser, "State", "1");
    rig.Start();
    rig.table.rows = {Row(5, Ipv4(9, 9, 9, 9)), Row(5, Ipv4(1, 2, 3, 4)), Row(5, Ipv4(8, 8, 8, 8))};
    // A tick that the running sweep's own yield takes is dropped. The click on "&Options" reaches
    // the window while the first sweep lets messages run; the options window's own loop then ticks
    // three times while it is open.
    rig.pump.onPump = [&] {
        if (rig.pump.pumps == 1) rig.btnO[kBtnOptions].UserClick();
        if (rig.pump.pumps == 2) rig.pump.OwnTick([&] { rig.form.TmrTick(); });
    };
    std::vector<std::int32_t> counts;
    rig.desktop.onOptions = [&] {
        for (int tick = 0; tick < 3; ++tick) {
            rig.form.TmrTick();
            counts.push_back(rig.form.guard().AttemptCount());
        }
    };
    rig.form.TmrTick();
    EXPECT_EQ(counts, (std::vector<std::int32_t>{1, 2, 3})) << "each tick tears the listed row down";
    EXPECT_EQ(rig.form.guard().SweepsRun(), 4u);
    EXPECT_EQ(rig.form.guard().AttemptCount(), 3) << "the held sweep never looks at another row";
    EXPECT_FALSE(rig.form.guard().Sweeping());
}

TEST(StartUp, StoredSettingsThatAreNotNumbersReadAsZeroAndTheStoredCountIsShown) {
    MainRig rig;
    rig.Put(kHkeyCurrentUser, "State", "99999999999");
    rig.Put(kHkeyCurrentUser, "Attempts", "-4");
    rig.Put(kHkeyLocalMachine, "Tray", "yes");
    rig.Start();
    EXPECT_EQ(std::make_tuple(rig.btnOnOff.caption, rig.btnOnOff.backColor, rig.btnOnOff.backOver, rig.tmr.enabled,
                              rig.frm.visible),
              std::make_tuple("OFF", 192u, 192u, false, true));
    EXPECT_EQ(rig.frm.caption, "Vantorel - -4 attempts intercepted");
    EXPECT_EQ(StoredSetting(rig.registry, kHkeyCurrentUser, "State"), "0");
}

TEST(StartUp, MissingDefinitionsAreReportedAndTheUpdatesWindowOpensBeforeTheTrayIcon) {
    MainRig rig;
    rig.files.files.clear();
    rig.Put(kHkeyLocalMachine, "Server", "https://updates.example.org");
    rig.Start();
    const std::string box = "MessageBox Definitions Error ", owner = " " + std::to_string(rig.frm.handle);
    EXPECT_EQ(rig.desktop.events,
              (std::vector<std::string>{box + "16" + owner, "Options 1", box + "48" + owner, "Tray 0"}));
    EXPECT_EQ(rig.desktop.texts,
              (std::vector<std::string>{
                  "Reading definitions, installation corrupted re-install at https://updates.example.org/",
                  kNoDefinitionsText}));

    // A file the updates window installed is read without the second message.
    MainRig updated;
    updated.files.files.clear();
    updated.desktop.onOptions = [&] { updated.files.files[kDefinitionsPath] = "67305985\n"; };
    updated.Start();
    EXPECT_EQ(updated.desktop.texts.size(), 1u);
    EXPECT_GE(FindDefinition(Definitions, "67305985"), 0);

    MainRig unreadable;  // a file that cannot be read is reported like a missing one
    unreadable.files.unreadable.insert(kDefinitionsPath);
    unreadable.Start();
    EXPECT_EQ(unreadable.desktop.texts,
              (std::vector<std::string>{std::string("Reading definitions, installation corrupted re-install at "
                                                    "http://www.vantorel.com/\n\n") +
                                            kUnreadableDefinitionsText,
                                        kStillUnreadableText}));
    EXPECT_EQ(Definitions.size(), 0u);
}

TEST(StatusDisplay, TheLightBlinksFromBrightHoldsThePadlockWhileOnAndTheTipFollowsTheCount) {
    MainRig rig;
    rig.Start();
    EXPECT_EQ(rig.Ticks(3), (Icons{kBright, kDark, kBright}));
    rig.ClickSwitch();
    EXPECT_EQ(std::make_tuple(rig.btnOnOff.caption, rig.btnOnOff.backColor, rig.btnOnOff.backOver),
              std::make_tuple("ON", 0xFF00u, 0xFF00u));
    EXPECT_EQ(rig.Ticks(2), (Icons{kPadlock, kPadlock}));

    // A teardown writes the count without the blank; the next tick puts it back.
    rig.table.rows = {Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4))};
    rig.form.TmrTick();
    EXPECT_EQ(rig.tray.calls.back().tip, "Vantorel - 1 attempts intercepted");
    rig.form.TimerTick();
    EXPECT_EQ(rig.tray.calls.back().tip, "Vantorel -  1 attempts intercepted");
}

TEST(SweepConnections, FetchesThatOverstateFailOrNeverFitRowsBeingDeletedAndAQuit) {
    MainRig rig;
    rig.Start();
    ConnectionSweep& sweep = rig.form.guard().Sweep();
    const SweepResult& last = sweep.LastSweep();
    const platform::TcpRow listed = Row(kTcpStateEstablished, Ipv4(10, 0, 0, 200));  // a negative key
    rig.table.rows = {listed};
    rig.table.overstateCount = 1'000'000;  // only the buffer's rows are read
    sweep.SweepConnections();
    EXPECT_EQ(std::make_pair(last.rows, rig.table.entries.size()), std::make_pair(1001u, std::size_t{1}));

    rig.table.failWith = 87;
    sweep.SweepConnections();
    EXPECT_FALSE(last.fetched);

    // A table that doubles before every fetch: given up after four.
    rig.table.failWith = platform::kNoError;
    rig.table.rows.assign(1000, listed);
    rig.table.beforeFetch = [&] { rig.table.rows.resize(rig.table.rows.size() * 2, listed); };
    sweep.SweepConnections();
    EXPECT_EQ(std::make_tuple(last.fetched, last.fetchCalls, rig.table.entries.size()),
              std::make_tuple(false, 4, std::size_t{1}));

    rig.table.beforeFetch = nullptr;
    rig.table.overstateCount = 0;
    rig.table.rows = {Row(platform::kTcpStateDeleteTcb, listed.remoteAddr), listed};  // the first already going
    sweep.SweepConnections();
    EXPECT_EQ(rig.table.entries.size(), 2u) << "the listed row torn down, the one already going skipped";
    rig.pump.onPump = [&] { rig.pump.quitting = true; };  // asked to quit while the first row waits
    sweep.SweepConnections();
    EXPECT_EQ(rig.table.entries.size(), 2u);
}

}  // namespace
}  // namespace vantorel
