#include "ui/options/frm_options.h"

#include "settings/settings.h"

namespace vantorel {

namespace {

using platform::kHkeyCurrentUser;
using platform::kHkeyLocalMachine;

// "1" (as text or number) is checked; anything else, a missing value included, is not.
bool IsOne(const Variant& value) {
    std::optional<std::int32_t> number = VariantInt32(value);
    return number && !IsEmpty(value) && *number == 1;
}

}  // namespace

FrmOptions::FrmOptions(const OptionsControls& controls, platform::Registry& registry, std::string executablePath,
                       std::function<void()> unload)
    : controls_(controls),
      registry_(registry),
      executablePath_(std::move(executablePath)),
      unload_(std::move(unload)) {
    for (int i = 0; i < 3; ++i)
        if (controls_.Box[i]) controls_.Box[i]->Click = [this, i] { Box_Click(i); };
    if (controls_.BtnCancel) controls_.BtnCancel->Click = [this] { BtnCancel_Click(); };
}

void FrmOptions::Form_Load() {
    loading_ = true;
    // A setting never stored is not in effect: no Run value exists and start-up reads "Tray" as
    // "0", so both boxes show unchecked until the user sets them.
    {
        RegistryRoutines reg = OpenSettings(registry_, kHkeyLocalMachine);
        if (IsOne(reg.GetRegistryValue(kStartValue, std::string("0")))) controls_.Box[0]->SetValue(true);
    }
    {
        RegistryRoutines reg = OpenSettings(registry_, kHkeyLocalMachine);
        if (IsOne(reg.GetRegistryValue(kTrayValue, std::string("0")))) controls_.Box[1]->SetValue(true);
    }
    {
        // Internet Explorer's own default is "yes".
        RegistryRoutines reg = OpenOrCreate(registry_, kHkeyCurrentUser, kInternetExplorerMainKey);
        Variant value = reg.GetRegistryValue(kScriptDebuggerValue, std::string("yes"));
        const auto* text = std::get_if<std::string>(&value);
        if (text != nullptr && *text == "yes") controls_.Box[2]->SetValue(true);
    }
    loading_ = false;
}

void FrmOptions::Box_Click(int index) {
    if (loading_ || index < 0 || index > 2) return;
    bool checked = controls_.Box[index]->Value();
    switch (index) {
        case 0: {
            if (checked) {
                RegistryRoutines run = OpenOrCreate(registry_, kHkeyLocalMachine, kRunKey);
                run.SetRegistryValue(kRunValue, executablePath_, platform::kRegSz);
            } else {
                RegistryRoutines run(registry_);
                run.hkey(kHkeyLocalMachine);
                run.KeyRoot(std::string(kRunKey) + "\\");
                run.DeleteValue(kRunValue);
            }
            RegistryRoutines reg = OpenSettings(registry_, kHkeyLocalMachine);
            reg.SetRegistryValue(kStartValue, std::string(checked ? "1" : "0"), platform::kRegSz);
            break;
        }
        case 1: {
            RegistryRoutines reg(registry_);
            reg.hkey(kHkeyLocalMachine);
            reg.KeyRoot(kSettingsKey);
            if (checked && !reg.KeyExists()) reg.CreateKey();
            reg.SetRegistryValue(kTrayValue, std::string(checked ? "1" : "0"), platform::kRegSz);
            break;
        }
        case 2: {
            RegistryRoutines reg = OpenOrCreate(registry_, kHkeyCurrentUser, kInternetExplorerMainKey);
            reg.SetRegistryValue(kScriptDebuggerValue, std::string(checked ? "yes" : "no"), platform::kRegSz);
            break;
        }
        default:
            break;
    }
}

void FrmOptions::BtnCancel_Click() {
    if (unload_) unload_();
}

}  // namespace vantorel
