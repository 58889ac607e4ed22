// The address of the web server that holds the update files and the help page: a setting with a
// built-in default, so an installation (or a test) can point the program at its own server.
#pragma once

#include <string>

#include "platform/registry.h"

namespace vantorel {

inline constexpr const char* kDefaultServerAddress = "http://www.vantorel.com";

// HKEY_LOCAL_MACHINE "SOFTWARE\Vantorel\" value "Server" (for example "http://127.0.0.1:8080" or
// "https://updates.example.org"), without trailing slashes; the default when it is missing or empty.
std::string ServerAddress(platform::Registry& registry);

}  // namespace vantorel
