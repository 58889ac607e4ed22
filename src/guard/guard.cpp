#include "guard/guard.h"

#include <utility>

#include "guard/attempts.h"
#include "guard/read_definitions.h"
#include "settings/registry_routines.h"
#include "ui/main/tray.h"

namespace vantorel {

namespace {

RegistryRoutines Settings(platform::Registry& registry, std::int32_t root) {
    RegistryRoutines reg(registry);
    reg.hkey(root);
    reg.KeyRoot(kSettingsKey);
    return reg;
}

}  // namespace

std::int32_t ReadIntSetting(platform::Registry& registry, std::int32_t root, const std::string& name,
                            std::int32_t fallback) {
    RegistryRoutines reg = Settings(registry, root);
    if (!reg.KeyExists()) reg.CreateKey();
    Variant value = reg.GetRegistryValue(name, std::to_string(fallback));
    return VariantInt32(value).value_or(fallback);
}

Guard::Guard(GuardPlatform platform, GuardWindow window, std::string programFolder,
             std::function<void()> onDefinitionsMissing)
    : platform_(platform),
      window_(window),
      programFolder_(std::move(programFolder)),
      onDefinitionsMissing_(std::move(onDefinitionsMissing)),
      sweep_(SweepServices{platform.table, platform.pump, platform.registry, window.frmMain, platform.tray}) {}

bool Guard::Initialize() { return !platform_.instance.PreviousInstance(); }

void Guard::Load() {
    platform_.instance.CreateNamedMutex(kMutexName);

    platform::Window& frm = window_.frmMain;
    frm.Move((platform_.windows.ScreenWidth() - frm.Width()) / 2, (platform_.windows.ScreenHeight() - frm.Height()) / 2);

    if (ReadIntSetting(platform_.registry, platform::kHkeyLocalMachine, "Tray", 0) == 0) frm.SetVisible(true);

    window_.btnOnOff.Value(ReadIntSetting(platform_.registry, platform::kHkeyCurrentUser, "State", 0) != 0);

    LoadDefinitions(DefinitionsPath(programFolder_), platform_.files, onDefinitionsMissing_, Definitions);

    AttemptCount = ReadIntSetting(platform_.registry, platform::kHkeyCurrentUser, "Attempts", 0);
    std::string status = StatusText(AttemptCount, CountForm::BlankBeforeSign);
    frm.SetCaption(status);

    AddTrayIcon(platform_.tray, frm, frm.Icon(), status, kTrayCallbackMessage);

    window_.tmr.Interval(kTmrInterval);
    Toggle();

    window_.timer.Interval(kTimerInterval);
    window_.timer.Enabled(true);
}

void Guard::Toggle() {
    bool on = window_.btnOnOff.Value();
    std::uint32_t colour = on ? kOnColour : kOffColour;
    window_.btnOnOff.BackColor(colour);
    window_.btnOnOff.BackOver(colour);
    window_.btnOnOff.Caption(on ? "ON" : "OFF");
    RegistryRoutines reg = Settings(platform_.registry, platform::kHkeyCurrentUser);
    if (!reg.KeyExists()) reg.CreateKey();
    reg.SetRegistryValue("State", std::string(on ? "1" : "0"), platform::kRegSz);
    window_.tmr.Enabled(on);
}

void Guard::TmrTick() {
    if (sweep_.Running() && platform_.pump.InOwnTimerTick()) return;
    ++sweepsRun_;
    sweep_.SweepConnections();
}

void Guard::MouseMove(std::uint32_t code) {
    TrayMouseNotification(window_.frmMain, platform_.windows, platform_.pump, code);
}

void Guard::TaskbarCreated() {
    AddTrayIcon(platform_.tray, window_.frmMain, window_.frmMain.Icon(), window_.frmMain.Caption(),
                kTrayCallbackMessage);
}

void Guard::Unload() {
    RemoveTrayIcon(platform_.tray, window_.frmMain);
    window_.tmr.Enabled(false);
    window_.timer.Enabled(false);
}

}  // namespace vantorel
