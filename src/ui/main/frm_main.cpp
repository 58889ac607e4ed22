#include "ui/main/frm_main.h"

#include <utility>

#include "guard/attempts.h"
#include "guard/read_definitions.h"
#include "settings/settings.h"
#include "ui/main/tray.h"

namespace vantorel {

FrmMain::FrmMain(FrmMainPlatform platform, FrmMainControls controls, std::string programFolder)
    : platform_(platform),
      controls_(controls),
      programFolder_(std::move(programFolder)),
      guard_(platform.guard, GuardWindow{controls.frmMain, controls.btnOnOff, controls.tmr, controls.timer}, *this,
             programFolder_, [this] { DefinitionsMissing(); }) {
    for (int i = 0; i < static_cast<int>(controls_.btnO.size()); ++i) {
        if (controls_.btnO[i] != nullptr) controls_.btnO[i]->Click = [this, i] { BtnOClick(i); };
    }
}

std::string FrmMain::HelpAddress() const { return ServerAddress(platform_.guard.registry) + kHelpPage; }

void FrmMain::BtnOClick(int index) {
    platform::Window& frm = controls_.frmMain;
    switch (index) {
        case kBtnTray: frm.SetVisible(false); break;
        case kBtnExit: Unload(); break;
        case kBtnHelp:
            platform_.shell.Execute(frm.Handle(), "open", HelpAddress(), "", "", platform::kSwShowNormal);
            break;
        case kBtnUpdates: platform_.application.ShowOptionsModal(frm.Handle(), 1); break;
        case kBtnOptions: platform_.application.ShowOptionsModal(frm.Handle(), 0); break;
        default: break;
    }
}

void FrmMain::TimerTick() {
    platform::Window& frm = controls_.frmMain;
    if (!controls_.tmr.Enabled() && lightPhase_ > 0) {
        frm.SetIcon(controls_.lights[kLightDark]);
        lightPhase_ = 0;
    } else if (!controls_.tmr.Enabled()) {
        frm.SetIcon(controls_.lights[kLightBright]);
        lightPhase_ = 1;
    } else {
        frm.SetIcon(controls_.lights[kLightPadlock]);
    }
    ModifyTrayIcon(platform_.tray, frm, StatusText(guard_.AttemptCount(), CountForm::BlankBeforeSign),
                   kTrayCallbackMessage);
}

void FrmMain::CountLoaded(std::int32_t count) {
    platform::Window& frm = controls_.frmMain;
    std::string status = StatusText(count, CountForm::BlankBeforeSign);
    frm.SetCaption(status);
    AddTrayIcon(platform_.tray, frm, frm.Icon(), status, kTrayCallbackMessage);
}

void FrmMain::CountIntercepted(std::int32_t count) {
    std::string status = StatusText(count, CountForm::Plain);
    controls_.frmMain.SetCaption(status);
    ModifyTrayIcon(platform_.tray, controls_.frmMain, status, kTrayCallbackMessage);
}

void FrmMain::MouseMove(std::uint32_t code) {
    TrayMouseNotification(controls_.frmMain, platform_.guard.windows, platform_.guard.pump, code);
}

void FrmMain::TaskbarCreated() {
    platform::Window& frm = controls_.frmMain;
    AddTrayIcon(platform_.tray, frm, frm.Icon(), frm.Caption(), kTrayCallbackMessage);
}

void FrmMain::Resize() {
    platform::Window& frm = controls_.frmMain;
    if (frm.State() == platform::WindowState::Minimized) {
        AddTrayIcon(platform_.tray, frm, frm.Icon(), kTrayTipMinimised, kTrayCallbackMessage);
        // BringToFront shows the window it raises (SWP_SHOWWINDOW), so the window is hidden after
        // it: minimising must end with the window in the tray, not back on the taskbar.
        BringToFront(platform_.guard.windows, platform_.guard.pump, frm.Handle());
        frm.SetVisible(false);
    }
    platform_.guard.windows.DeleteSystemMenuCommand(frm.Handle(), platform::kScSize);
}

void FrmMain::Unload() {
    if (unloaded_) return;
    unloaded_ = true;
    RemoveTrayIcon(platform_.tray, controls_.frmMain);
    guard_.Unload();
    platform_.application.EndProgram();
}

void FrmMain::DefinitionsMissing() {
    platform::WindowHandle owner = controls_.frmMain.Handle();
    const std::string path = DefinitionsPath(programFolder_);
    std::string text = kDefinitionsErrorText + ServerAddress(platform_.guard.registry) + "/";
    if (platform_.guard.files.Exists(path)) text += std::string("\n\n") + kUnreadableDefinitionsText;
    platform_.shell.ShowMessage(owner, text, kDefinitionsErrorTitle, platform::kMbOk | platform::kMbIconStop);
    platform_.application.ShowOptionsModal(owner, 1);
    if (!DefinitionsUsable(path, platform_.guard.files)) {
        platform_.shell.ShowMessage(owner,
                                    platform_.guard.files.Exists(path) ? kStillUnreadableText : kNoDefinitionsText,
                                    kDefinitionsErrorTitle, platform::kMbOk | platform::kMbIconExclamation);
    }
}

}  // namespace vantorel
