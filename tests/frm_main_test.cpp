// The main window's logic against fake widgets and platform: the BtnO actions by index, going to
// the tray when minimised, the unload order, the status light's blink sequence and the tray tip,
// and the missing-definitions flow of start-up.
#include "ui/main/frm_main.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

#include "fakes/fake_files.h"
#include "fakes/fake_guard_platform.h"
#include "fakes/fake_registry.h"
#include "fakes/fake_widgets.h"
#include "guard/attempts.h"
#include "guard/definitions.h"
#include "settings/settings.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;

const std::string kFolder = "C:\\Program Files\\Vantorel";
const std::string kDefinitionsPath = kFolder + "\\sw2.def";
constexpr platform::IconHandle kDark = 0xD0, kBright = 0xB0, kPadlock = 0xA0;

class FakeShell final : public platform::Shell {
public:
    struct ExecuteCall {
        platform::WindowHandle owner;
        std::string operation, file, parameters, directory;
        std::int32_t show;
    };
    struct Box {
        platform::WindowHandle owner;
        std::string text, title;
        std::uint32_t style;
    };
    std::intptr_t Execute(platform::WindowHandle owner, const std::string& operation, const std::string& file,
                               const std::string& parameters, const std::string& directory,
                               std::int32_t show) override {
        executes.push_back({owner, operation, file, parameters, directory, show});
        events.push_back("ShellExecute");
        return 2;  // "file not found": the window does not look at it
    }
    void ShowMessage(platform::WindowHandle owner, const std::string& text, const std::string& title,
                    std::uint32_t style) override {
        boxes.push_back({owner, text, title, style});
        events.push_back("MessageBox " + title);
    }
    std::vector<ExecuteCall> executes;
    std::vector<Box> boxes;
    std::vector<std::string>& events;
    explicit FakeShell(std::vector<std::string>& log) : events(log) {}
};

class FakeApplication final : public platform::Application {
public:
    explicit FakeApplication(std::vector<std::string>& log) : events(log) {}
    void ShowOptionsModal(platform::WindowHandle owner, int frameIndex) override {
        options.push_back({owner, frameIndex});
        events.push_back("Options " + std::to_string(frameIndex));
        if (onOptions) onOptions();
    }
    void EndProgram() override {
        ++ends;
        events.push_back("End");
        if (onEnd) onEnd();
    }
    std::function<void()> onEnd;
    std::vector<std::pair<platform::WindowHandle, int>> options;
    std::function<void()> onOptions;
    int ends = 0;
    std::vector<std::string>& events;
};

struct MainRig {
    std::vector<std::string> events;
    FakeRegistry registry;
    FakeFiles files;
    FakeConnectionTable table;
    FakeNotifyArea tray;
    FakeWindowManager windows;
    FakePump pump;
    FakeInstance instance;
    FakeShell shell{events};
    FakeApplication application{events};
    FakeWindow frm;
    FakeSwitch btnOnOff;
    FakeTimer tmr, timer;
    FakeButton btnO[5] = {FakeButton("&Tray"), FakeButton("&Exit"), FakeButton("&Help"), FakeButton("&Updates"),
                          FakeButton("&Options")};
    FakeFrame uf[2] = {FakeFrame("Update"), FakeFrame("Options")};
    FakeLabel l[2] = {FakeLabel("Selectable options such as starting when windows boots..."),
                      FakeLabel("Check for Vantorel updates...")};
    FrmMain form{FrmMainPlatform{GuardPlatform{registry, files, table, windows, pump, instance}, tray, shell,
                                 application},
                 FrmMainControls{frm, btnOnOff, tmr, timer, {&btnO[0], &btnO[1], &btnO[2], &btnO[3], &btnO[4]},
                                 {&uf[0], &uf[1]}, {&l[0], &l[1]}, {kDark, kBright, kPadlock}},
                 kFolder};

    MainRig() {
        files.Put(kDefinitionsPath, "-939524086\r\n67305985");  // 67305985 is 1.2.3.4
    }
    void Put(std::int32_t root, const std::string& name, const std::string& value) {
        RegistryRoutines reg(registry);
        reg.hkey(root);
        reg.KeyRoot(kSettingsKey);
        reg.CreateKey();
        reg.SetRegistryValue(name, value, platform::kRegSz);
    }
    void Start() {
        ASSERT_TRUE(form.Initialize());
        form.Load();
    }
    void ClickSwitch() {
        btnOnOff.Value(!btnOnOff.Value());  // the button flips itself first
        form.BtnOnOffClick();
    }
    std::size_t TrayCalls(std::uint32_t message) const {
        std::size_t n = 0;
        for (const auto& c : tray.calls) n += c.message == message ? 1 : 0;
        return n;
    }
};

TEST(FrmMainButtons, EachIndexDoesItsOwnAction) {
    MainRig rig;
    rig.Start();
    ASSERT_TRUE(rig.frm.visible);
    const std::size_t trayCalls = rig.tray.calls.size();

    rig.btnO[kBtnTray].UserClick();  // "&Tray": hidden, the icon already there, nothing else
    EXPECT_FALSE(rig.frm.visible);
    EXPECT_EQ(rig.tray.calls.size(), trayCalls);
    EXPECT_TRUE(rig.timer.enabled);
    EXPECT_EQ(rig.application.ends, 0);

    rig.btnO[kBtnHelp].UserClick();  // the help page on the default server, shown normal
    ASSERT_EQ(rig.shell.executes.size(), 1u);
    const auto& help = rig.shell.executes[0];
    EXPECT_EQ(help.owner, rig.frm.handle);
    EXPECT_EQ(help.operation, "open");
    EXPECT_EQ(help.file, "http://www.vantorel.com/vt/help.php");
    EXPECT_EQ(help.parameters, "");
    EXPECT_EQ(help.directory, "");
    EXPECT_EQ(help.show, 1);

    // The help page follows the configured server.
    rig.Put(platform::kHkeyLocalMachine, "Server", "http://127.0.0.1:8080");
    rig.btnO[kBtnHelp].UserClick();
    ASSERT_EQ(rig.shell.executes.size(), 2u);
    EXPECT_EQ(rig.shell.executes[1].file, "http://127.0.0.1:8080/vt/help.php");

    rig.btnO[kBtnUpdates].UserClick();
    rig.btnO[kBtnOptions].UserClick();
    using Opened = std::pair<platform::WindowHandle, int>;
    EXPECT_EQ(rig.application.options, (std::vector<Opened>{{rig.frm.handle, 1}, {rig.frm.handle, 0}}));
    EXPECT_EQ(rig.application.ends, 0);
    EXPECT_TRUE(rig.shell.boxes.empty());
}

TEST(FrmMainButtons, AModalWindowOpenedInTheMiddleOfASweepNeverPausesTheGuard) {
    MainRig rig;
    rig.Put(platform::kHkeyCurrentUser, "State", "1");
    rig.Start();
    rig.table.rows = {Row(5, Ipv4(9, 9, 9, 9)), Row(5, Ipv4(1, 2, 3, 4)), Row(5, Ipv4(8, 8, 8, 8))};
    // The click on "&Options" reaches the window while the first sweep lets messages run; the
    // options window's own loop then ticks three times while it is open; a tick that a running
    // sweep's own yield takes is still dropped.
    rig.pump.onPump = [&] {
        if (rig.pump.pumps == 1) rig.btnO[kBtnOptions].UserClick();
        if (rig.pump.pumps == 2) rig.pump.OwnTick([&] { rig.form.TmrTick(); });
    };
    std::vector<std::int32_t> counts;
    rig.application.onOptions = [&] {
        for (int tick = 0; tick < 3; ++tick) {
            rig.form.TmrTick();
            counts.push_back(rig.form.guard().AttemptCount());
        }
    };
    rig.form.TmrTick();
    EXPECT_EQ(counts, (std::vector<std::int32_t>{1, 2, 3})) << "each tick tears the listed row down";
    EXPECT_EQ(rig.form.guard().SweepsRun(), 4u);
    EXPECT_EQ(rig.table.fetches, 4);
    EXPECT_EQ(rig.form.guard().AttemptCount(), 3) << "the held sweep never looks at another row";
    EXPECT_FALSE(rig.form.guard().Sweeping());
    rig.form.TmrTick();
    EXPECT_EQ(rig.form.guard().AttemptCount(), 4);
}

TEST(FrmMainUnload, ExitRemovesTheIconStopsBothTimersThenEndsOnce) {
    MainRig rig;
    rig.Put(platform::kHkeyCurrentUser, "State", "1");
    rig.Start();
    ASSERT_TRUE(rig.tmr.enabled);
    ASSERT_TRUE(rig.timer.enabled);
    // What has happened by the time the program is asked to end.
    bool timersStoppedAtEnd = false;
    std::size_t deletesAtEnd = 0;
    rig.application.onEnd = [&] {
        timersStoppedAtEnd = !rig.tmr.enabled && !rig.timer.enabled;
        deletesAtEnd = rig.TrayCalls(platform::kNimDelete);
    };
    rig.events.clear();
    rig.btnO[kBtnExit].UserClick();
    EXPECT_EQ(rig.application.ends, 1);
    EXPECT_TRUE(timersStoppedAtEnd);
    EXPECT_EQ(deletesAtEnd, 1u);
    EXPECT_EQ(rig.tray.calls.back().message, platform::kNimDelete);
    EXPECT_EQ(rig.events, std::vector<std::string>{"End"});

    // The window's own destruction, which the end brings, unloads nothing a second time.
    rig.form.QueryUnload();
    rig.form.Unload();
    EXPECT_EQ(rig.application.ends, 1);
    EXPECT_EQ(rig.TrayCalls(platform::kNimDelete), 1u);
    // "State" keeps its last value for the next start.
    RegistryRoutines reg(rig.registry);
    reg.hkey(platform::kHkeyCurrentUser);
    reg.KeyRoot(kSettingsKey);
    EXPECT_EQ(VariantText(reg.GetRegistryValue("State", std::string("?"))), "1");
}

TEST(FrmMainUnload, TheCloseButtonUnloadsTheSameWay) {
    MainRig rig;
    rig.Start();
    rig.form.QueryUnload();
    EXPECT_EQ(rig.application.ends, 1);
    EXPECT_FALSE(rig.tmr.enabled);
    EXPECT_FALSE(rig.timer.enabled);
    EXPECT_EQ(rig.TrayCalls(platform::kNimDelete), 1u);
}

TEST(FrmMainResize, MinimisingGoesToTheTrayAndEveryResizeDropsTheSizeCommand) {
    MainRig rig;
    rig.Start();
    const std::size_t adds = rig.TrayCalls(platform::kNimAdd);
    const std::size_t positions = rig.windows.calls.size();

    rig.form.Resize();  // the first showing: normal state
    EXPECT_EQ(rig.TrayCalls(platform::kNimAdd), adds);
    EXPECT_TRUE(rig.frm.visible);
    ASSERT_EQ(rig.windows.deletedCommands.size(), 1u);
    EXPECT_EQ(rig.windows.deletedCommands[0], std::make_pair(rig.frm.handle, std::uint32_t{0xF000}));

    rig.frm.state = platform::WindowState::Minimized;
    rig.form.Resize();
    ASSERT_EQ(rig.TrayCalls(platform::kNimAdd), adds + 1);
    const auto& add = rig.tray.calls.back();
    ASSERT_EQ(add.message, platform::kNimAdd);
    EXPECT_EQ(add.data.tip, "Vantorel");
    EXPECT_EQ(add.data.icon, rig.frm.icon);
    EXPECT_EQ(add.data.callbackMessage, 512u);
    EXPECT_FALSE(rig.frm.visible) << "minimising ends hidden";
    // BringToFront: topmost, then not topmost, never activating.
    ASSERT_EQ(rig.windows.calls.size(), positions + 2);
    EXPECT_EQ(rig.windows.calls[positions].insertAfter, platform::kHwndTopmost);
    EXPECT_EQ(rig.windows.calls[positions + 1].insertAfter, platform::kHwndNoTopmost);
    EXPECT_EQ(rig.windows.calls[positions + 1].flags, 0x53u);
    EXPECT_EQ(rig.windows.deletedCommands.size(), 2u);

    // A click on the icon brings it back in the normal state.
    rig.form.MouseMove(514);  // left button up
    EXPECT_TRUE(rig.frm.visible);
    EXPECT_EQ(rig.frm.state, platform::WindowState::Normal);
}

TEST(StatusDisplay, BlinksBrightFirstHoldsThePadlockWhileOnAndResumesFromThePhase) {
    MainRig rig;
    rig.Start();
    ASSERT_FALSE(rig.tmr.enabled);
    EXPECT_EQ(rig.form.LightPhase(), 0);
    for (int i = 0; i < 5; ++i) rig.form.TimerTick();
    EXPECT_EQ(rig.frm.icons, (std::vector<platform::IconHandle>{kBright, kDark, kBright, kDark, kBright}));
    EXPECT_EQ(rig.form.LightPhase(), 1);

    rig.ClickSwitch();  // on, after a bright phase
    rig.frm.icons.clear();
    for (int i = 0; i < 3; ++i) rig.form.TimerTick();
    EXPECT_EQ(rig.frm.icons, (std::vector<platform::IconHandle>{kPadlock, kPadlock, kPadlock}));
    EXPECT_EQ(rig.form.LightPhase(), 1);

    rig.ClickSwitch();  // off again: the stored bright phase is followed by dark
    rig.frm.icons.clear();
    for (int i = 0; i < 3; ++i) rig.form.TimerTick();
    EXPECT_EQ(rig.frm.icons, (std::vector<platform::IconHandle>{kDark, kBright, kDark}));

    // Every tick refreshes the tray: modify, with the window's icon now and the count with a blank.
    const auto& last = rig.tray.calls.back();
    EXPECT_EQ(last.message, platform::kNimModify);
    EXPECT_EQ(last.data.icon, kDark);
    EXPECT_EQ(last.data.tip, "Vantorel -  0 attempts intercepted");
    EXPECT_EQ(last.data.callbackMessage, 512u);
}

TEST(StatusDisplay, GuardOnFromStartShowsThePadlockAndTheTipGetsItsBlankBackAfterATeardown) {
    MainRig rig;
    rig.Put(platform::kHkeyCurrentUser, "State", "1");
    rig.Put(platform::kHkeyCurrentUser, "Attempts", "41");
    rig.Start();
    rig.form.TimerTick();
    EXPECT_EQ(rig.frm.icons, std::vector<platform::IconHandle>{kPadlock});
    EXPECT_EQ(rig.tray.calls.back().data.tip, "Vantorel -  41 attempts intercepted");

    rig.table.rows = {Row(5, Ipv4(1, 2, 3, 4))};  // an established connection to a listed address
    rig.form.TmrTick();
    ASSERT_EQ(rig.form.guard().AttemptCount(), 42);
    EXPECT_EQ(rig.tray.calls.back().data.tip, "Vantorel - 42 attempts intercepted");
    rig.form.TimerTick();
    EXPECT_EQ(rig.tray.calls.back().data.tip, "Vantorel -  42 attempts intercepted");
    EXPECT_EQ(rig.frm.icons, (std::vector<platform::IconHandle>{kPadlock, kPadlock}));

    MainRig negative;  // past the wrap: no blank before a negative count
    negative.Put(platform::kHkeyCurrentUser, "Attempts", "-5");
    negative.Start();
    negative.form.TimerTick();
    EXPECT_EQ(negative.tray.calls.back().data.tip, "Vantorel - -5 attempts intercepted");
}

TEST(MissingDefinitions, MessageThenUpdatesThenASecondMessageAndTheProgramCarriesOn) {
    MainRig rig;
    rig.files.Remove(kDefinitionsPath);
    rig.Put(platform::kHkeyLocalMachine, "Server", "https://updates.example.org");
    rig.Start();

    EXPECT_EQ(rig.events, (std::vector<std::string>{"MessageBox Definitions Error", "Options 1",
                                                    "MessageBox Definitions Error"}));
    ASSERT_EQ(rig.shell.boxes.size(), 2u);
    EXPECT_EQ(rig.shell.boxes[0].text,
              "Reading definitions, installation corrupted re-install at https://updates.example.org/");
    EXPECT_EQ(rig.shell.boxes[0].style, 0x10u);
    EXPECT_EQ(rig.shell.boxes[0].owner, rig.frm.handle);
    EXPECT_EQ(rig.shell.boxes[1].text, kNoDefinitionsText);
    // Both before the tray icon exists; start-up then runs to its end with an empty list.
    EXPECT_EQ(rig.TrayCalls(platform::kNimAdd), 1u);
    EXPECT_EQ(rig.application.ends, 0);
    EXPECT_EQ(Definitions.size(), 0u);
    EXPECT_EQ(rig.frm.caption, "Vantorel -  0 attempts intercepted");
    EXPECT_TRUE(rig.timer.enabled);
}

TEST(MissingDefinitions, AFileThatCannotBeReadIsReportedLikeAMissingOne) {
    MainRig rig;
    rig.files.MakeUnreadable(kDefinitionsPath);
    rig.Start();
    EXPECT_EQ(rig.events, (std::vector<std::string>{"MessageBox Definitions Error", "Options 1",
                                                    "MessageBox Definitions Error"}));
    ASSERT_EQ(rig.shell.boxes.size(), 2u);
    EXPECT_EQ(rig.shell.boxes[0].text, std::string("Reading definitions, installation corrupted re-install at "
                                                   "http://www.vantorel.com/\n\n") + kUnreadableDefinitionsText);
    EXPECT_EQ(rig.shell.boxes[1].text, kStillUnreadableText);
    EXPECT_EQ(Definitions.size(), 0u);
    EXPECT_TRUE(rig.timer.enabled);
}

TEST(MissingDefinitions, AFileInstalledByTheUpdatesWindowIsReadWithoutASecondMessage) {
    MainRig rig;
    rig.files.Remove(kDefinitionsPath);
    rig.application.onOptions = [&] { rig.files.Put(kDefinitionsPath, "67305985\n"); };
    rig.Start();
    EXPECT_EQ(rig.events, (std::vector<std::string>{"MessageBox Definitions Error", "Options 1"}));
    EXPECT_EQ(rig.shell.boxes.size(), 1u);
    EXPECT_GE(FindDefinition(Definitions, "67305985"), 0);
}

}  // namespace
}  // namespace vantorel
