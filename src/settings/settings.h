// The program's settings: where each lives in the registry, under which name, and the few ways the
// program reads them. Every routine makes its own short-lived registry routines object.
#pragma once

#include <cstdint>
#include <string>

#include "platform/registry.h"
#include "settings/registry_routines.h"

namespace vantorel {

// The program's own key, below HKEY_CURRENT_USER (the guard's state and count) and below
// HKEY_LOCAL_MACHINE (the start options and the server's address).
inline constexpr const char* kSettingsKey = "SOFTWARE\\Vantorel\\";
inline constexpr const char* kStateValue = "State";        // HKCU: "1" while the guard is on
inline constexpr const char* kAttemptsValue = "Attempts";  // HKCU: the count of attempts intercepted
inline constexpr const char* kTrayValue = "Tray";          // HKLM: "1" starts the program in the tray
inline constexpr const char* kStartValue = "Start";        // HKLM: "1" starts the program with Windows
inline constexpr const char* kServerValue = "Server";      // HKLM: the update and help server

// The autostart entry: value "Vantorel" of the machine's Run key.
inline constexpr const char* kRunKey = "SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Run";
inline constexpr const char* kRunValue = "Vantorel";

// Internet Explorer's script debugger switch, below HKEY_CURRENT_USER.
inline constexpr const char* kInternetExplorerMainKey = "SOFTWARE\\Microsoft\\Internet Explorer\\Main\\";
inline constexpr const char* kScriptDebuggerValue = "Disable Script Debugger";

inline constexpr const char* kDefaultServerAddress = "http://www.vantorel.com";

// A routines object on `root`/`keyRoot` whose key exists (created when missing).
RegistryRoutines OpenOrCreate(platform::Registry& registry, std::int32_t root, const std::string& keyRoot);

// The program's own key below `root`, created when missing.
inline RegistryRoutines OpenSettings(platform::Registry& registry, std::int32_t root) {
    return OpenOrCreate(registry, root, kSettingsKey);
}

// A setting of the program's key read as a 32-bit integer: the value's number, or `fallback` when it
// is missing, cannot be read or is not a whole number ("abc").
std::int32_t ReadIntSetting(platform::Registry& registry, std::int32_t root, const std::string& name,
                            std::int32_t fallback);

// HKEY_LOCAL_MACHINE "Server" (for example "http://127.0.0.1:8080" or "https://updates.example.org"),
// without trailing slashes; the default when it is missing or empty. The only place the address is
// read: an installation (or a test) points the program at its own server there.
std::string ServerAddress(platform::Registry& registry);

}  // namespace vantorel
