// The main window, the guard and the connection sweep behind them, against fakes, for what the real
// window, table and program (tests/win32/, tests/linux/, tests/e2e/) cannot stage: malformed
// settings, the missing-definitions flow before the tray icon, the unload order, the light's blink,
// sweeps that never nest, a modal window opened in the middle of a sweep, rows already being
// deleted, a quit mid-sweep, and fetches that fail, overstate their count or never fit.
#include "ui/main/frm_main.h"

#include <gtest/gtest.h>

#include <array>
#include <cstring>
#include <functional>
#include <string>
#include <tuple>
#include <vector>

#include "fakes/fake_file_system.h"
#include "fakes/fake_guard_platform.h"
#include "fakes/fake_message_pump.h"
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
// Remote addresses as the table holds them (network order read little-endian): the definitions list
// 1.2.3.4 and 10.0.0.200 (a negative key), not 9.9.9.9.
constexpr std::uint32_t kListed = 0x04030201, kListedNegative = 0xC800000A, kUnlisted = 0x09090909;

platform::TcpRow Row(std::uint32_t state, std::uint32_t remote) { return {state, 0x0100000A, 0x3930, remote, 0x5000}; }

// Everything around the window: the shell, the application, the notification area, the window
// manager and the instance test, noting what the window asks of them in one event log.
class FakeDesktop final : public platform::Shell,
                          public platform::Application,
                          public platform::NotifyArea,
                          public platform::WindowManager,
                          public platform::Instance {
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
    bool ShellNotifyIcon(std::uint32_t message, const platform::NotifyIconData& data) override {
        events.push_back("Tray " + std::to_string(message));
        tray.push_back(data);
        return true;
    }
    bool SetWindowPos(platform::WindowHandle, platform::WindowHandle, std::int32_t, std::int32_t, std::int32_t,
                      std::int32_t, std::uint32_t) override {
        return true;
    }
    std::int32_t ScreenWidth() const override { return 1024; }
    std::int32_t ScreenHeight() const override { return 768; }
    bool DeleteSystemMenuCommand(platform::WindowHandle, std::uint32_t) override { return true; }
    bool PreviousInstance() override { return false; }
    void CreateNamedMutex(const std::string&) override {}
    std::function<void()> onOptions;
    std::vector<std::string> events, texts;
    std::vector<platform::NotifyIconData> tray;
};

class FakeWindow final : public platform::Window {
public:
    platform::WindowHandle Handle() const override { return 0x1234; }
    platform::IconHandle Icon() const override { return icon; }
    void SetIcon(platform::IconHandle i) override { icon = i; }
    std::string Caption() const override { return caption; }
    void SetCaption(const std::string& text) override { caption = text; }
    bool Visible() const override { return visible; }
    void SetVisible(bool v) override { visible = v; }
    platform::WindowState State() const override { return platform::WindowState::Normal; }
    void SetState(platform::WindowState) override {}
    std::int32_t Width() const override { return 616; }
    std::int32_t Height() const override { return 320; }
    void Move(std::int32_t, std::int32_t) override {}
    platform::IconHandle icon = 0x777;
    std::string caption;
    bool visible = false;
};

class FakeSwitch final : public platform::Switch {
public:
    bool Value() const override { return value; }
    void SetValue(bool v) override { value = v; }
    std::string Caption() const override { return caption; }
    void SetCaption(const std::string& c) override { caption = c; }
    std::uint32_t BackColor() const override { return backColor; }
    void SetBackColor(std::uint32_t c) override { backColor = c; }
    std::uint32_t BackOver() const override { return backOver; }
    void SetBackOver(std::uint32_t c) override { backOver = c; }
    bool value = false;
    std::string caption;
    std::uint32_t backColor = 0x8000000F, backOver = 0x8000000F;
};

class FakeTimer final : public platform::Timer {
public:
    std::uint32_t Interval() const override { return 0; }
    void SetInterval(std::uint32_t) override {}
    bool Enabled() const override { return enabled; }
    void SetEnabled(bool e) override { enabled = e; }
    bool enabled = false;
};

// A scripted connection table that notes every teardown asked of it.
class FakeConnectionTable final : public platform::ConnectionTable {
public:
    std::uint32_t GetTcpTable(void* table, std::uint32_t& size, bool) override {
        if (beforeFetch) beforeFetch();
        if (failWith != platform::kNoError) return failWith;
        std::uint32_t needed = platform::TcpTableBytes(static_cast<std::uint32_t>(rows.size()));
        if (size < needed) {
            size = needed;
            return platform::kErrorInsufficientBuffer;
        }
        auto count = static_cast<std::uint32_t>(rows.size()) + overstateCount;
        std::memcpy(table, &count, 4);
        if (!rows.empty()) std::memcpy(static_cast<char*>(table) + 4, rows.data(), rows.size() * sizeof(rows[0]));
        return platform::kNoError;
    }
    std::uint32_t SetTcpEntry(const platform::TcpRow& row) override {
        entries.push_back(row);
        return platform::kNoError;
    }
    std::vector<platform::TcpRow> rows, entries;
    std::uint32_t failWith = platform::kNoError;
    std::uint32_t overstateCount = 0;  // a count larger than the rows written
    std::function<void()> beforeFetch;
};

// The main window with every platform piece faked.
struct MainRig {
    FakeDesktop desktop;
    FakeRegistry registry;
    FakeFileSystem files;
    FakeConnectionTable table;
    FakePump pump;
    FakeWindow frm;
    FakeSwitch btnOnOff;
    FakeTimer tmr, timer;
    FakeButton btnO[5];
    std::array<platform::Button*, 5> buttons{&btnO[0], &btnO[1], &btnO[2], &btnO[3], &btnO[4]};
    FrmMain form{
        FrmMainPlatform{GuardPlatform{registry, files, table, desktop, pump, desktop}, desktop, desktop, desktop},
        FrmMainControls{frm, btnOnOff, tmr, timer, buttons, {}, {}, {kDark, kBright, kPadlock}}, kFolder};

    MainRig() { files.files[kDefinitionsPath] = "-939524086\r\n67305985"; }
    void Put(std::int32_t root, const std::string& name, const std::string& value) {
        registry.PutRaw(root, kSettingsKey, name, platform::kRegSz, {value.begin(), value.end()});
    }
    void Start() {
        ASSERT_TRUE(form.Initialize());
        form.Load();
    }
    // The window's icon after each of `n` status ticks, as the tray icon shows it.
    Icons Ticks(int n) {
        Icons shown;
        for (int i = 0; i < n; ++i) {
            form.TimerTick();
            shown.push_back(desktop.tray.back().icon);
        }
        return shown;
    }
};

TEST(FrmMain, StartsOnSettingsThatAreNoNumbersBlinksUntilSwitchedOnOpensHelpAndUnloadsOnce) {
    MainRig rig;
    rig.Put(kHkeyCurrentUser, "State", "9999999999");
    rig.Put(kHkeyCurrentUser, "Attempts", "-1");
    rig.Put(kHkeyLocalMachine, "Tray", "yes");
    rig.Put(kHkeyLocalMachine, "Server", "http://127.0.0.1:8080");
    rig.Start();
    EXPECT_EQ(std::make_tuple(rig.btnOnOff.caption, rig.btnOnOff.backColor, rig.btnOnOff.backOver, rig.tmr.enabled,
                              rig.frm.visible),
              std::make_tuple("OFF", 192u, 192u, false, true));
    EXPECT_EQ(rig.frm.caption, "Vantorel - -1 attempts intercepted") << "the stored count, no blank before its sign";
    EXPECT_EQ(StoredSetting(rig.registry, kHkeyCurrentUser, "State"), "0");
    EXPECT_EQ(rig.Ticks(3), (Icons{kBright, kDark, kBright}));

    rig.btnOnOff.SetValue(true);  // the button flips itself before it reports the click
    rig.form.BtnOnOffClick();
    EXPECT_EQ(std::make_tuple(rig.btnOnOff.caption, rig.btnOnOff.backColor, rig.btnOnOff.backOver),
              std::make_tuple("ON", 0xFF00u, 0xFF00u));
    EXPECT_EQ(rig.Ticks(2), (Icons{kPadlock, kPadlock}));

    // A teardown writes the count without the blank; the next tick puts it back.
    rig.table.rows = {Row(kTcpStateEstablished, kListed)};
    rig.form.TmrTick();
    EXPECT_EQ(rig.desktop.tray.back().tip, "Vantorel - 0 attempts intercepted");
    rig.form.TimerTick();
    EXPECT_EQ(rig.desktop.tray.back().tip, "Vantorel -  0 attempts intercepted");

    rig.desktop.events.clear();
    rig.btnO[kBtnHelp].UserClick();
    rig.btnO[kBtnExit].UserClick();
    rig.form.QueryUnload();  // the window's destruction, which the end brings, unloads nothing again
    EXPECT_EQ(rig.desktop.events,
              (std::vector<std::string>{"open http://127.0.0.1:8080/vt/help.php 1 4660", "Tray 2", "End"}));
    EXPECT_FALSE(rig.tmr.enabled || rig.timer.enabled) << "both timers stopped";
}

TEST(Guard, SweepsNeverNestAndAModalWindowOpenedInTheMiddleOfASweepNeverPausesTheGuard) {
    MainRig rig;
    rig.Put(kHkeyCurrentUser, "State", "1");
    rig.Start();
    rig.table.rows = {Row(5, kUnlisted), Row(5, kListed), Row(5, kUnlisted)};
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

TEST(StartUp, MissingDefinitionsAreReportedAndTheUpdatesWindowOpensBeforeTheTrayIcon) {
    MainRig rig;
    rig.files.files.clear();
    rig.Put(kHkeyLocalMachine, "Server", "https://updates.example.org");
    rig.Start();
    const std::string box = "MessageBox Definitions Error ";
    EXPECT_EQ(rig.desktop.events, (std::vector<std::string>{box + "16 4660", "Options 1", box + "48 4660", "Tray 0"}));
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
              (std::vector<std::string>{
                  std::string(kDefinitionsErrorText) + "http://www.vantorel.com/\n\n" + kUnreadableDefinitionsText,
                  kStillUnreadableText}));
    EXPECT_EQ(Definitions.size(), 0u);
}

TEST(SweepConnections, FetchesThatOverstateFailOrNeverFitRowsBeingDeletedAndAQuit) {
    MainRig rig;
    rig.Start();
    ConnectionSweep& sweep = rig.form.guard().Sweep();
    const SweepResult& last = sweep.LastSweep();
    const platform::TcpRow listed = Row(kTcpStateEstablished, kListedNegative);
    rig.table.rows = {listed};
    rig.table.overstateCount = 1'000'000;  // only the buffer's rows are read
    sweep.SweepConnections();
    EXPECT_EQ(std::make_pair(last.rows, rig.table.entries.size()), std::make_pair(1001u, std::size_t{1}));

    rig.table.failWith = 87;
    sweep.SweepConnections();
    EXPECT_FALSE(last.fetched);
    rig.table.failWith = platform::kNoError;

    // The first row already going is skipped, the second torn down; asked to quit while the third
    // waits (and only then), the sweep stops there.
    rig.table.rows = {Row(platform::kTcpStateDeleteTcb, kListedNegative), listed, listed};
    int yields = 0;
    rig.pump.onPump = [&] { rig.pump.quitting = ++yields == 3; };
    sweep.SweepConnections();
    EXPECT_EQ(rig.table.entries.size(), 2u);

    // A table that doubles before every fetch: given up after four.
    rig.table.rows.assign(1000, listed);
    rig.table.beforeFetch = [&] { rig.table.rows.resize(rig.table.rows.size() * 2, listed); };
    sweep.SweepConnections();
    EXPECT_EQ(std::make_tuple(last.fetched, last.fetchCalls, rig.table.entries.size()),
              std::make_tuple(false, 4, std::size_t{2}));
}

}  // namespace
}  // namespace vantorel
