// FrmMain, the main window's logic: the five buttons of the BtnO array, going to the tray when
// minimised, the unload order, the once-a-second status light and the missing-definitions flow of
// start-up. The guard (state, start-up order, sweeps, tray notifications) is driven from here.
//
// The window's controls come in as platform widgets, so the same logic runs on the Win32 controls
// and on fakes.
#pragma once

#include <array>
#include <cstdint>
#include <string>

#include "guard/guard.h"
#include "guard/guard_view.h"
#include "platform/shell.h"
#include "platform/notify_area.h"
#include "platform/widgets.h"

namespace vantorel {

inline constexpr const char* kHelpPage = "/vt/help.php";
inline constexpr const char* kDefinitionsErrorTitle = "Definitions Error";
inline constexpr const char* kDefinitionsErrorText = "Reading definitions, installation corrupted re-install at ";
inline constexpr const char* kNoDefinitionsText =
    "The definitions file sw2.def is still missing. Vantorel carries on without definitions and intercepts "
    "nothing until they are installed (Updates).";
// Added to the messages when sw2.def is there but cannot be used.
inline constexpr const char* kUnreadableDefinitionsText =
    "The definitions file sw2.def could not be read: it is locked by another program, not readable with "
    "your rights, a folder, or larger than 256 MB.";
inline constexpr const char* kStillUnreadableText =
    "The definitions file sw2.def still cannot be read. Vantorel carries on without definitions and intercepts "
    "nothing until they are installed (Updates).";
inline constexpr const char* kTrayTipMinimised = "Vantorel";

// BtnO indexes.
enum BtnOIndex : int { kBtnTray = 0, kBtnExit = 1, kBtnHelp = 2, kBtnUpdates = 3, kBtnOptions = 4 };
// Lights indexes.
enum LightIndex : int { kLightDark = 0, kLightBright = 1, kLightPadlock = 2 };

struct FrmMainPlatform {
    GuardPlatform guard;
    platform::NotifyArea& tray;
    platform::Shell& shell;
    platform::Application& application;
};

struct FrmMainControls {
    platform::Window& frmMain;
    platform::Switch& btnOnOff;
    platform::Timer& tmr;
    platform::Timer& timer;
    std::array<platform::Button*, 5> btnO;  // "&Tray", "&Exit", "&Help", "&Updates", "&Options"
    std::array<platform::Frame*, 2> uf;     // "Update", "Options"
    std::array<platform::Label*, 2> l;
    std::array<platform::IconHandle, 3> lights;  // dark bulb, lit bulb, padlock
};

class FrmMain final : private GuardView {
public:
    // Wires the buttons' clicks to BtnOClick.
    FrmMain(FrmMainPlatform platform, FrmMainControls controls, std::string programFolder);
    // The controls' handlers hold on to this object.
    FrmMain(const FrmMain&) = delete;
    FrmMain& operator=(const FrmMain&) = delete;

    // Start-up: false when another instance runs (the caller then ends, having shown nothing).
    bool Initialize() { return guard_.Initialize(); }
    void Load() { guard_.Load(); }

    // The handlers of the window's events.
    void BtnOClick(int index);
    void BtnOnOffClick() { guard_.BtnOnOffClick(); }
    void TmrTick() { guard_.TmrTick(); }
    void TimerTick();
    void Resize();
    // The window's mouse-move handler with the raw low word of the position (the tray's code).
    void MouseMove(std::uint32_t code);
    // The icon came back to a fresh notification area (the taskbar restarted): add it again.
    void TaskbarCreated();
    // A close request (title bar, system menu, the system): unloads the window.
    void QueryUnload() { Unload(); }
    // Removes the tray icon, stops both timers and ends the program. Runs once; later calls (the
    // window's own destruction after the end was asked for) do nothing.
    void Unload();

    // "Definitions Error", then the updates window; when the file is still missing (or still cannot
    // be used) after it has closed, a second message says the program carries on without definitions.
    // A file that is there but cannot be used gets the same flow, its messages saying so.
    void DefinitionsMissing();

    // The help page's address: the web server's base address + "/vt/help.php".
    std::string HelpAddress() const;

    bool Unloaded() const { return unloaded_; }
    Guard& guard() { return guard_; }

private:
    // The guard's view: the count in the caption and the tray tip.
    void CountLoaded(std::int32_t count) override;
    void CountIntercepted(std::int32_t count) override;

    FrmMainPlatform platform_;
    FrmMainControls controls_;
    std::string programFolder_;
    Guard guard_;
    std::int32_t lightPhase_ = 0;
    bool unloaded_ = false;
};

}  // namespace vantorel
