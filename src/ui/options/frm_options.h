// FrmOptions: the options window's logic. Two frames: the options (three check boxes stored in the
// registry as soon as they are toggled) and the updates (the update check runs there). The window
// keeps no state of its own beyond its controls; every value lives in the registry, and each step
// makes its own registry routines object.
#pragma once

#include <array>
#include <functional>
#include <string>

#include "platform/registry.h"
#include "platform/widgets.h"

namespace vantorel {

// The options window's controls, as the window declares them.
struct OptionsControls {
    std::array<platform::Frame*, 2> F{};        // 0 "Options", 1 "Updates"
    std::array<platform::CheckBox*, 3> Box{};   // start with Windows, start in the tray, script debugger
    platform::Button* BtnCancel = nullptr;      // "&Close"
    platform::Button* BtnUpdate = nullptr;      // "&Check for Updates"
    std::array<platform::Label*, 2> L{};        // definitions and program status lines
};

class FrmOptions {
public:
    // `executablePath`: the program's folder + "\" + its base name + ".exe", written as the
    // autostart entry. `unload` closes the window.
    FrmOptions(const OptionsControls& controls, platform::Registry& registry, std::string executablePath,
               std::function<void()> unload);

    // Shows the boxes as the stored settings are in effect. Writes no value; a box click that the
    // check box raises while the load sets it is ignored.
    void Form_Load();

    // A box was toggled by the user: store its new state.
    void Box_Click(int index);

    void BtnCancel_Click();

private:
    OptionsControls controls_;
    platform::Registry& registry_;
    std::string executablePath_;
    std::function<void()> unload_;
    bool loading_ = false;
};

}  // namespace vantorel
