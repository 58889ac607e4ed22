#include "ui/options/frm_options.h"

#include <gtest/gtest.h>

#include "fakes/fake_file_system.h"
#include "fakes/fake_http_transfer.h"
#include "fakes/fake_message_pump.h"
#include "fakes/fake_registry.h"
#include "fakes/fake_updates_frame.h"
#include "fakes/fake_task_scheduler.h"
#include "fakes/fake_widgets.h"
#include "settings/settings.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;
using platform::kHkeyCurrentUser;
using platform::kHkeyLocalMachine;

constexpr const char* kExe = "C:\\Program Files\\Vantorel\\vantorel.exe";
constexpr const char* kQuotedExe = "\"C:\\Program Files\\Vantorel\\vantorel.exe\"";

struct OptionsWindow {
    FakeFrame options{"Options", false}, updates{"Updates", false};
    FakeCheckBox start{"Boot when Windows boots"}, tray{"Start minimized to system tray"},
        debugger{"Disable script debugging in Interent Explorer"};
    FakeButton close{"&Close"}, update{"&Check for Updates"};
    FakeLabel definitions{"Definitions Updates:"}, program{"Program Updates:"};
    int unloads = 0;
    std::vector<std::string> messages;
    FakeRegistry& registry;
    FakeTaskScheduler scheduler;
    FakeMessagePump pump;
    FakeFileSystem disk;
    FakeHttpTransfer inet, fd1, fd2, fd3;
    FakeUpdatesFrame frame;
    FrmOptions form;

    explicit OptionsWindow(FakeRegistry& r)
        : registry(r),
          form(OptionsPlatform{r, scheduler, pump, disk, disk, inet, fd1, fd2, fd3},
               OptionsControls{{&options, &updates}, {&start, &tray, &debugger}, &close, &update, {&definitions, &program}},
               frame, UpdateTarget{"C:\\Program Files\\Vantorel", {1, 0}}, kExe, [this] { ++unloads; },
               [this](const std::string& m) { messages.push_back(m); }) {}
};

Variant Read(FakeRegistry& registry, std::int32_t root, const std::string& key, const std::string& name) {
    RegistryRoutines reg(registry);
    reg.hkey(root);
    reg.KeyRoot(key);
    return reg.GetRegistryValue(name);
}

std::size_t ValueCount(FakeRegistry& registry, std::int32_t root, const std::string& key) {
    RegistryRoutines reg(registry);
    return reg.EnumRegistryValues(root, key).size();
}

TEST(FrmOptions, EmptyRegistryShowsWhatIsInEffectAndWritesNothing) {
    FakeRegistry registry;
    OptionsWindow window(registry);
    window.form.Form_Load();
    EXPECT_FALSE(window.start.Value()) << "no Run value exists: the program does not start with Windows";
    EXPECT_FALSE(window.tray.Value()) << "start-up reads a missing Tray as 0";
    EXPECT_TRUE(window.debugger.Value()) << "Internet Explorer's own default";
    EXPECT_EQ(ValueCount(registry, kHkeyLocalMachine, "SOFTWARE\\Vantorel"), 0u);
    EXPECT_EQ(ValueCount(registry, kHkeyCurrentUser, "SOFTWARE\\Microsoft\\Internet Explorer\\Main"), 0u);
    EXPECT_EQ(ValueCount(registry, kHkeyLocalMachine, kRunKey), 0u);
}

TEST(FrmOptions, LoadShowsStoredValuesAndOnlyExactMatchesCheck) {
    FakeRegistry registry;
    {
        OptionsWindow window(registry);
        window.form.Form_Load();
        window.start.UserToggle();
        window.tray.UserToggle();
    }
    OptionsWindow window(registry);
    window.form.Form_Load();
    EXPECT_TRUE(window.start.Value());
    EXPECT_TRUE(window.tray.Value());

    RegistryRoutines vantorel(registry);
    vantorel.hkey(kHkeyLocalMachine);
    vantorel.KeyRoot(kSettingsKey);
    RegistryRoutines ie(registry);
    ie.hkey(kHkeyCurrentUser);
    ie.KeyRoot(kInternetExplorerMainKey);
    for (const auto& [start, tray, debugger, expectStart, expectTray, expectDebugger] :
         std::vector<std::tuple<Variant, Variant, std::string, bool, bool, bool>>{
             {std::string("2"), std::string("0"), "Yes", false, false, false},
             {std::string("abc"), std::string(" 1 "), "no", false, true, false},
             {std::int32_t{1}, std::string("1x"), "yes", true, false, true},
         }) {
        vantorel.SetRegistryValue("Start", start, std::holds_alternative<std::int32_t>(start) ? 4 : 1);
        vantorel.SetRegistryValue("Tray", tray, 1);
        ie.SetRegistryValue("Disable Script Debugger", debugger, 1);
        OptionsWindow again(registry);
        again.form.Form_Load();
        EXPECT_EQ(again.start.Value(), expectStart) << VariantText(start);
        EXPECT_EQ(again.tray.Value(), expectTray) << VariantText(tray);
        EXPECT_EQ(again.debugger.Value(), expectDebugger) << debugger;
    }
}

TEST(FrmOptions, TogglingStoresEachOptionAtOnce) {
    FakeRegistry registry;
    OptionsWindow window(registry);
    window.form.Form_Load();

    window.start.UserToggle();  // on
    EXPECT_EQ(window.scheduler.tasks, (std::map<std::string, std::string>{{"Vantorel", kQuotedExe}}));
    EXPECT_EQ(Read(registry, kHkeyLocalMachine, kRunKey, "Vantorel"), Variant(std::string(kQuotedExe)));
    EXPECT_EQ(Read(registry, kHkeyLocalMachine, kSettingsKey, "Start"), Variant(std::string("1")));
    window.start.UserToggle();  // off
    EXPECT_TRUE(IsEmpty(Read(registry, kHkeyLocalMachine, kRunKey, "Vantorel"))) << "autostart entry removed";
    EXPECT_TRUE(window.scheduler.tasks.empty()) << "logon task removed";
    EXPECT_EQ(Read(registry, kHkeyLocalMachine, kSettingsKey, "Start"), Variant(std::string("0")));
    window.start.UserToggle();
    window.start.UserToggle();  // removing a value twice is harmless
    EXPECT_EQ(Read(registry, kHkeyLocalMachine, kSettingsKey, "Start"), Variant(std::string("0")));

    window.tray.UserToggle();
    EXPECT_EQ(Read(registry, kHkeyLocalMachine, kSettingsKey, "Tray"), Variant(std::string("1")));
    window.tray.UserToggle();
    EXPECT_EQ(Read(registry, kHkeyLocalMachine, kSettingsKey, "Tray"), Variant(std::string("0")));

    window.debugger.UserToggle();  // was checked by default
    EXPECT_EQ(Read(registry, kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger"),
              Variant(std::string("no")));
    window.debugger.UserToggle();
    EXPECT_EQ(Read(registry, kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger"),
              Variant(std::string("yes")));

    window.close.UserClick();
    EXPECT_EQ(window.unloads, 1);
}

TEST(FrmOptions, StartWithWindowsThatTheSchedulerRefusesIsUndoneAndSaysWhy) {
    FakeRegistry registry;
    OptionsWindow window(registry);
    window.form.Form_Load();
    window.scheduler.failure = {"ITaskFolder::RegisterTask", static_cast<std::int32_t>(0x80070005u),
                                "Access is denied."};
    window.start.UserToggle();  // on, refused
    EXPECT_FALSE(window.start.Value()) << "the box shows unchecked again";
    EXPECT_EQ(ValueCount(registry, kHkeyLocalMachine, kRunKey), 0u);
    EXPECT_EQ(ValueCount(registry, kHkeyLocalMachine, "SOFTWARE\\Vantorel"), 0u);

    window.scheduler.failure = {};
    window.start.UserToggle();  // on
    window.scheduler.failure = {"ITaskFolder::DeleteTask", static_cast<std::int32_t>(0x80070005u), "Access is denied."};
    window.start.UserToggle();  // off, refused: the task still starts the program
    EXPECT_TRUE(window.start.Value());
    EXPECT_EQ(Read(registry, kHkeyLocalMachine, kRunKey, "Vantorel"), Variant(std::string(kQuotedExe)));
    EXPECT_EQ(Read(registry, kHkeyLocalMachine, kSettingsKey, "Start"), Variant(std::string("1")));
    EXPECT_EQ(window.messages,
              (std::vector<std::string>{
                  "Vantorel cannot be set to start when Windows boots: the Task Scheduler refused its task "
                  "\"Vantorel\".\n\nITaskFolder::RegisterTask failed with HRESULT 0x80070005: Access is denied.",
                  "Vantorel still starts when Windows boots: the Task Scheduler refused its task \"Vantorel\".\n\n"
                  "ITaskFolder::DeleteTask failed with HRESULT 0x80070005: Access is denied."}));
}

TEST(FrmOptions, LoadLeavesStoredValuesAloneEvenWhenSettingABoxClicksIt) {
    FakeRegistry registry;
    RegistryRoutines vantorel(registry);
    vantorel.hkey(kHkeyLocalMachine);
    vantorel.KeyRoot(kSettingsKey);
    vantorel.CreateKey();
    vantorel.SetRegistryValue("Start", std::string("1"), 1);  // stored, but the Run value was removed by hand
    vantorel.SetRegistryValue("Tray", std::string("1"), 1);

    OptionsWindow window(registry);
    window.start.RaiseClickWhenSet(true);
    window.tray.RaiseClickWhenSet(true);
    window.debugger.RaiseClickWhenSet(true);
    window.form.Form_Load();
    EXPECT_TRUE(window.start.Value());
    EXPECT_TRUE(IsEmpty(Read(registry, kHkeyLocalMachine, kRunKey, "Vantorel"))) << "no autostart path rewritten";
    EXPECT_EQ(ValueCount(registry, kHkeyCurrentUser, "SOFTWARE\\Microsoft\\Internet Explorer\\Main"), 0u);
    EXPECT_EQ(registry.OpenHandles(), 0u);
}

}  // namespace
}  // namespace vantorel
