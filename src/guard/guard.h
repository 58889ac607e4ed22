// The guard's on/off state and the order in which the main window brings the system up.
//
// The state lives in the ON/OFF switch's Value; Toggle applies it to everything else: the switch's
// colours and caption, the "State" setting and the sweep timer Tmr. Start-up refuses a second
// instance, places and shows the window, loads the settings, the definitions and the count (shown
// through the view, which also adds the tray icon), applies the stored state and starts the status
// timer, in that order, so no sweep can run before the list is loaded. The guard owns the count of
// attempts intercepted.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "guard/guard_view.h"
#include "guard/sweep.h"
#include "platform/connection_table.h"
#include "platform/files.h"
#include "platform/message_pump.h"
#include "platform/registry.h"
#include "platform/window.h"

namespace vantorel {

inline constexpr std::uint32_t kTmrInterval = 55;
inline constexpr std::uint32_t kTimerInterval = 1000;
inline constexpr std::uint32_t kOnColour = 0x00FF00;   // 65280, green
inline constexpr std::uint32_t kOffColour = 0x0000C0;  // 192, dark red
inline constexpr const char* kMutexName = "Vantorel";

struct GuardPlatform {
    platform::Registry& registry;
    platform::Files& files;
    platform::ConnectionTable& table;
    platform::WindowManager& windows;
    platform::MessagePump& pump;
    platform::Instance& instance;
};

// The parts of the main window the guard drives.
struct GuardWindow {
    platform::Window& frmMain;
    platform::Switch& btnOnOff;
    platform::Timer& tmr;    // the sweep timer
    platform::Timer& timer;  // the status timer
};

class Guard {
public:
    // `view` shows the count; `onDefinitionsMissing` shows the "Definitions Error" message and the
    // updates window.
    Guard(GuardPlatform platform, GuardWindow window, GuardView& view, std::string programFolder,
          std::function<void()> onDefinitionsMissing);
    Guard(const Guard&) = delete;
    Guard& operator=(const Guard&) = delete;

    // Window initialisation. False when another instance is already running: the caller then ends
    // at once, having shown and changed nothing.
    bool Initialize();

    // Window load: the rest of start-up, ending with both timers set.
    void Load();

    // Applies the switch's Value to its look, to "State" and to Tmr.
    void Toggle();

    // A click on the switch, after it flipped its own Value.
    void BtnOnOffClick() { Toggle(); }

    // Tick of Tmr: one sweep. A tick that the running sweep's own yield takes from the queue is
    // dropped, so sweeps never nest. A tick taken by a loop running below that yield (a modal
    // window or message box opened from a click the sweep let through) finds the sweep held up for
    // as long as that window stays open: the held sweep gives way and a fresh one runs, so the guard
    // keeps sweeping every 55 ms whatever window is open.
    void TmrTick();

    // Unload: both timers stop.
    void Unload();

    // The count of attempts intercepted: the stored count from start-up on, grown by the sweeps.
    std::int32_t AttemptCount() const { return attemptCount_; }

    ConnectionSweep& Sweep() { return sweep_; }
    bool Sweeping() const { return sweep_.Running(); }
    std::uint64_t SweepsRun() const { return sweepsRun_; }

private:
    GuardPlatform platform_;
    GuardWindow window_;
    std::string programFolder_;
    std::function<void()> onDefinitionsMissing_;
    GuardView& view_;
    std::int32_t attemptCount_ = 0;
    ConnectionSweep sweep_;
    std::uint64_t sweepsRun_ = 0;
};

}  // namespace vantorel
