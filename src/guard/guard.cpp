#include "guard/guard.h"

#include <utility>

#include "guard/attempts.h"
#include "guard/read_definitions.h"
#include "settings/settings.h"

namespace vantorel {

Guard::Guard(GuardPlatform platform, GuardWindow window, GuardView& view, std::string programFolder,
             std::function<void()> onDefinitionsMissing)
    : platform_(platform),
      window_(window),
      programFolder_(std::move(programFolder)),
      onDefinitionsMissing_(std::move(onDefinitionsMissing)),
      view_(view),
      sweep_(SweepServices{platform.table, platform.pump, platform.registry, view}, Definitions, attemptCount_) {}

bool Guard::Initialize() { return !platform_.instance.PreviousInstance(); }

void Guard::Load() {
    platform_.instance.CreateNamedMutex(kMutexName);

    platform::Window& frm = window_.frmMain;
    frm.Move((platform_.windows.ScreenWidth() - frm.Width()) / 2,
             (platform_.windows.ScreenHeight() - frm.Height()) / 2);

    if (ReadIntSetting(platform_.registry, platform::kHkeyLocalMachine, kTrayValue, 0) == 0) frm.SetVisible(true);

    window_.btnOnOff.SetValue(ReadIntSetting(platform_.registry, platform::kHkeyCurrentUser, kStateValue, 0) != 0);

    LoadDefinitions(DefinitionsPath(programFolder_), platform_.files, onDefinitionsMissing_, Definitions);

    attemptCount_ = ReadIntSetting(platform_.registry, platform::kHkeyCurrentUser, kAttemptsValue, 0);
    view_.CountLoaded(attemptCount_);

    window_.tmr.SetInterval(kTmrInterval);
    Toggle();

    window_.timer.SetInterval(kTimerInterval);
    window_.timer.SetEnabled(true);
}

void Guard::Toggle() {
    bool on = window_.btnOnOff.Value();
    std::uint32_t colour = on ? kOnColour : kOffColour;
    window_.btnOnOff.SetBackColor(colour);
    window_.btnOnOff.SetBackOver(colour);
    window_.btnOnOff.SetCaption(on ? "ON" : "OFF");
    OpenSettings(platform_.registry, platform::kHkeyCurrentUser)
        .SetRegistryValue(kStateValue, std::string(on ? "1" : "0"), platform::kRegSz);
    window_.tmr.SetEnabled(on);
}

void Guard::TmrTick() {
    if (sweep_.Running() && platform_.pump.InOwnTimerTick()) return;
    ++sweepsRun_;
    sweep_.SweepConnections();
}

void Guard::Unload() {
    window_.tmr.SetEnabled(false);
    window_.timer.SetEnabled(false);
}

}  // namespace vantorel
