// The options window's logic where the real window cannot go: stored texts that are not exactly "1"
// or "yes", and a Task Scheduler that refuses the logon task. The real window on the real registry
// and Wine's scheduler, with real clicks, is tests/win32/options_updates_win32_test.cpp.
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

// The options window's logic on fakes; it is its own updates frame, where no check runs.
struct OptionsRig final : UpdatesFrame {
    OptionsRig()
        : form(
              OptionsPlatform{registry, scheduler, pump, disk, disk, inet, fd1, fd2, fd3},
              OptionsControls{{&f[0], &f[1]}, {&box[0], &box[1], &box[2]}, &close, &update, {&l[0], &l[1]}}, *this,
              UpdateTarget{"C:\\Vantorel", {1, 0}}, "C:\\vantorel.exe", [] {},
              [this](const std::string& m) { messages.push_back(m); }) {}
    void SetBtnUpdateEnabled(bool) override {}
    void SetLCaption(int, const std::string&) override {}
    void ShowPb() override {}
    platform::PictureBox& pb() override { std::abort(); }
    void MsgBoxExclamation(const std::string&, const std::string&) override {}

    Variant Read(const std::string& key, const std::string& name) {
        RegistryRoutines reg(registry);
        reg.hkey(platform::kHkeyLocalMachine);
        reg.KeyRoot(key);
        return reg.GetRegistryValue(name);
    }

    FakeRegistry registry;
    FakeFrame f[2];
    FakeCheckBox box[3];
    FakeButton close, update;
    FakeLabel l[2];
    FakeTaskScheduler scheduler;
    FakePump pump;
    FakeFileSystem disk;
    FakeHttpTransfer inet, fd1, fd2, fd3;
    std::vector<std::string> messages;
    FrmOptions form;
};

TEST(FrmOptions, OnlyExactStoredValuesCheckTheirBoxes) {
    using platform::kHkeyLocalMachine;
    const std::tuple<std::int32_t, std::string, std::string, std::string, std::string> cases[] = {
        {platform::kRegSz, "2", " 1 ", "Yes", "010"},
        {platform::kRegDword, std::string("\1\0\0\0", 4), "1x", "yes", "101"},
    };
    for (const auto& [type, start, tray, debugger, boxes] : cases) {
        OptionsRig rig;
        auto put = [&](std::int32_t root, const char* key, const char* name, const std::string& v, std::int32_t t) {
            rig.registry.PutRaw(root, key, name, t, {v.begin(), v.end()});
        };
        put(kHkeyLocalMachine, kSettingsKey, "Start", start, type);
        put(kHkeyLocalMachine, kSettingsKey, "Tray", tray, platform::kRegSz);
        put(platform::kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger", debugger, 1);
        rig.form.Form_Load();
        std::string got;
        for (const FakeCheckBox& box : rig.box) got += box.Value() ? '1' : '0';
        EXPECT_EQ(got, boxes) << tray << " " << debugger;
    }
}

TEST(FrmOptions, StartWithWindowsThatTheSchedulerRefusesIsUndoneAndSaysWhy) {
    OptionsRig rig;
    rig.form.Form_Load();
    rig.scheduler.failure = {"ITaskFolder::RegisterTask", static_cast<std::int32_t>(0x80070005u), "Access is denied."};
    rig.box[0].UserToggle();  // on, refused
    EXPECT_FALSE(rig.box[0].Value()) << "the box shows unchecked again";
    EXPECT_TRUE(IsEmpty(rig.Read(std::string(kRunKey) + "\\", "Vantorel")));
    EXPECT_TRUE(IsEmpty(rig.Read(kSettingsKey, "Start")));

    rig.scheduler.failure = {};
    rig.box[0].UserToggle();  // on
    rig.scheduler.failure = {"ITaskFolder::DeleteTask", static_cast<std::int32_t>(0x80070005u), "Access is denied."};
    rig.box[0].UserToggle();  // off, refused: the task still starts the program
    EXPECT_TRUE(rig.box[0].Value());
    EXPECT_EQ(rig.scheduler.tasks, (std::map<std::string, std::string>{{"Vantorel", kQuotedExe}}));
    EXPECT_EQ(rig.Read(std::string(kRunKey) + "\\", "Vantorel"), Variant(std::string(kQuotedExe)));
    EXPECT_EQ(rig.Read(kSettingsKey, "Start"), Variant(std::string("1")));
    EXPECT_EQ(rig.messages,
              (std::vector<std::string>{
                  "Vantorel cannot be set to start when Windows boots: the Task Scheduler refused its task "
                  "\"Vantorel\".\n\nITaskFolder::RegisterTask failed with HRESULT 0x80070005: Access is denied.",
                  "Vantorel still starts when Windows boots: the Task Scheduler refused its task \"Vantorel\".\n\n"
                  "ITaskFolder::DeleteTask failed with HRESULT 0x80070005: Access is denied."}));
}

}  // namespace
}  // namespace vantorel
