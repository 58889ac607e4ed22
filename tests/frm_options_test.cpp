// The options window's logic where the real window cannot go: stored texts that are not exactly "1"
// or "yes", and a Task Scheduler that refuses the logon task. The real window on the real registry
// and Wine's scheduler, with real clicks, is tests/win32/options_window_test.cpp.
#include "ui/options/frm_options.h"

#include <gtest/gtest.h>

#include <cstdlib>

#include "fakes/fake_file_system.h"
#include "fakes/fake_http_transfer.h"
#include "fakes/fake_message_pump.h"
#include "fakes/fake_registry.h"
#include "fakes/fake_task_scheduler.h"
#include "fakes/fake_widgets.h"
#include "settings/settings.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;

constexpr const char* kQuotedExe = "\"C:\\vantorel.exe\"";

// The updates frame: no check runs in these tests.
struct SilentFrame final : UpdatesFrame {
    void SetBtnUpdateEnabled(bool) override {}
    void SetLCaption(int, const std::string&) override {}
    void ShowPb() override {}
    platform::PictureBox& pb() override { std::abort(); }
    void MsgBoxExclamation(const std::string&, const std::string&) override {}
};

struct OptionsRig {
    explicit OptionsRig(FakeRegistry& registry)
        : form(OptionsPlatform{registry, scheduler, pump, disk, disk, inet, fd1, fd2, fd3},
               OptionsControls{{&f[0], &f[1]}, {&box[0], &box[1], &box[2]}, &close, &update, {&l[0], &l[1]}}, frame,
               UpdateTarget{"C:\\Vantorel", {1, 0}}, "C:\\vantorel.exe", [] {},
               [this](const std::string& m) { messages.push_back(m); }) {}
    FakeFrame f[2];
    FakeCheckBox box[3];
    FakeButton close, update;
    FakeLabel l[2];
    FakeTaskScheduler scheduler;
    FakePump pump;
    FakeFileSystem disk;
    FakeHttpTransfer inet, fd1, fd2, fd3;
    SilentFrame frame;
    std::vector<std::string> messages;
    FrmOptions form;
};

Variant Read(FakeRegistry& registry, const std::string& key, const std::string& name) {
    RegistryRoutines reg(registry);
    reg.hkey(platform::kHkeyLocalMachine);
    reg.KeyRoot(key);
    return reg.GetRegistryValue(name);
}

TEST(FrmOptions, OnlyExactStoredValuesCheckTheirBoxes) {
    FakeRegistry registry;
    RegistryRoutines vantorel(registry), ie(registry), run(registry);
    vantorel.hkey(platform::kHkeyLocalMachine);
    vantorel.KeyRoot(kSettingsKey);
    vantorel.CreateKey();
    ie.hkey(platform::kHkeyCurrentUser);
    ie.KeyRoot(kInternetExplorerMainKey);
    ie.CreateKey();
    run.hkey(platform::kHkeyLocalMachine);
    run.KeyRoot(std::string(kRunKey) + "\\");
    run.CreateKey();
    run.SetRegistryValue("Vantorel", std::string("C:\\vantorel.exe"), platform::kRegSz);
    const std::tuple<Variant, std::string, std::string, bool, bool, bool> cases[] = {
        {std::string("2"), "0", "Yes", false, false, false},
        {std::string("abc"), " 1 ", "no", false, true, false},
        {std::int32_t{1}, "1x", "yes", true, false, true},
    };
    for (const auto& [start, tray, debugger, expectStart, expectTray, expectDebugger] : cases) {
        vantorel.SetRegistryValue("Start", start, std::holds_alternative<std::int32_t>(start) ? 4 : 1);
        vantorel.SetRegistryValue("Tray", tray, 1);
        ie.SetRegistryValue("Disable Script Debugger", debugger, 1);
        OptionsRig rig(registry);
        rig.form.Form_Load();
        EXPECT_EQ(std::make_tuple(rig.box[0].Value(), rig.box[1].Value(), rig.box[2].Value()),
                  std::make_tuple(expectStart, expectTray, expectDebugger))
            << VariantText(start) << " " << tray << " " << debugger;
    }
}

TEST(FrmOptions, StartWithWindowsThatTheSchedulerRefusesIsUndoneAndSaysWhy) {
    FakeRegistry registry;
    OptionsRig rig(registry);
    rig.form.Form_Load();
    rig.scheduler.failure = {"ITaskFolder::RegisterTask", static_cast<std::int32_t>(0x80070005u), "Access is denied."};
    rig.box[0].UserToggle();  // on, refused
    EXPECT_FALSE(rig.box[0].Value()) << "the box shows unchecked again";
    EXPECT_TRUE(IsEmpty(Read(registry, std::string(kRunKey) + "\\", "Vantorel")));
    EXPECT_TRUE(IsEmpty(Read(registry, kSettingsKey, "Start")));

    rig.scheduler.failure = {};
    rig.box[0].UserToggle();  // on
    EXPECT_EQ(rig.scheduler.tasks, (std::map<std::string, std::string>{{"Vantorel", kQuotedExe}}));
    rig.scheduler.failure = {"ITaskFolder::DeleteTask", static_cast<std::int32_t>(0x80070005u), "Access is denied."};
    rig.box[0].UserToggle();  // off, refused: the task still starts the program
    EXPECT_TRUE(rig.box[0].Value());
    EXPECT_EQ(Read(registry, std::string(kRunKey) + "\\", "Vantorel"), Variant(std::string(kQuotedExe)));
    EXPECT_EQ(Read(registry, kSettingsKey, "Start"), Variant(std::string("1")));
    EXPECT_EQ(rig.messages,
              (std::vector<std::string>{
                  "Vantorel cannot be set to start when Windows boots: the Task Scheduler refused its task "
                  "\"Vantorel\".\n\nITaskFolder::RegisterTask failed with HRESULT 0x80070005: Access is denied.",
                  "Vantorel still starts when Windows boots: the Task Scheduler refused its task \"Vantorel\".\n\n"
                  "ITaskFolder::DeleteTask failed with HRESULT 0x80070005: Access is denied."}));
}

}  // namespace
}  // namespace vantorel
