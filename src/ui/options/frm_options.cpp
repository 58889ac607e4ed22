#include "ui/options/frm_options.h"

#include <cstdio>

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

// "CALL failed with HRESULT 0x80070005: TEXT".
std::string Describe(const platform::TaskFailure& failure) {
    char code[16];
    std::snprintf(code, sizeof code, "0x%08X", static_cast<unsigned>(failure.hresult));
    return failure.call + " failed with HRESULT " + code + (failure.text.empty() ? "" : ": " + failure.text);
}

}  // namespace

FrmOptions::FrmOptions(OptionsPlatform platform, const OptionsControls& controls, UpdatesFrame& frame,
                       const UpdateTarget& target, std::string executablePath, std::function<void()> unload,
                       std::function<void(const std::string&)> showMessage)
    : controls_(controls),
      registry_(platform.registry),
      scheduler_(platform.scheduler),
      executablePath_(std::move(executablePath)),
      unload_(std::move(unload)),
      showMessage_(std::move(showMessage)),
      FD1_(platform.fd1, platform.disk, platform.pump),
      FD2_(platform.fd2, platform.disk, platform.pump),
      FD3_(platform.fd3, platform.disk, platform.pump),
      check_(frame, platform.inet, platform.pump, platform.files, FD1_, FD2_, FD3_, target.programFolder,
             target.version, ServerAddress(platform.registry)) {
    for (int i = 0; i < 3; ++i)
        if (controls_.Box[i]) controls_.Box[i]->Click = [this, i] { Box_Click(i); };
    if (controls_.BtnCancel) controls_.BtnCancel->Click = [this] { BtnCancel_Click(); };
    check_.ConnectEvents();
    if (controls_.BtnUpdate) controls_.BtnUpdate->Click = [this] { check_.BtnUpdate_Click(); };
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
        case 0: StartWithWindows(checked); break;
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
        default: break;
    }
}

void FrmOptions::StartWithWindows(bool checked) {
    // Quoted: an unquoted path with blanks ("C:\Program Files\...") could start another program.
    const std::string command = "\"" + executablePath_ + "\"";
    platform::TaskFailure failure =
        checked ? scheduler_.RegisterLogonTask(kStartTaskName, command) : scheduler_.DeleteTask(kStartTaskName);
    if (failure.Failed()) {
        loading_ = true;  // a box that clicks when set from code must not start this again
        controls_.Box[0]->SetValue(!checked);
        loading_ = false;
        if (showMessage_)
            showMessage_(std::string(checked ? "Vantorel cannot be set to start when Windows boots"
                                             : "Vantorel still starts when Windows boots") +
                         ": the Task Scheduler refused its task \"" + kStartTaskName + "\".\n\n" + Describe(failure));
        return;
    }
    if (checked) {
        RegistryRoutines run = OpenOrCreate(registry_, kHkeyLocalMachine, kRunKey);
        run.SetRegistryValue(kRunValue, command, platform::kRegSz);
    } else {
        RegistryRoutines run(registry_);
        run.hkey(kHkeyLocalMachine);
        run.KeyRoot(std::string(kRunKey) + "\\");
        run.DeleteValue(kRunValue);
    }
    RegistryRoutines reg = OpenSettings(registry_, kHkeyLocalMachine);
    reg.SetRegistryValue(kStartValue, std::string(checked ? "1" : "0"), platform::kRegSz);
}

void FrmOptions::BtnCancel_Click() {
    if (unload_) unload_();
}

}  // namespace vantorel
