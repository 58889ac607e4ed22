#include "settings/server_address.h"

#include "settings/registry_routines.h"

namespace vantorel {

std::string ServerAddress(platform::Registry& registry) {
    RegistryRoutines reg(registry);
    reg.hkey(platform::kHkeyLocalMachine);
    reg.KeyRoot("SOFTWARE\\Vantorel\\");
    std::string address = VariantText(reg.GetRegistryValue("Server", std::string(kDefaultServerAddress)));
    while (!address.empty() && (address.back() == '/' || address.back() == ' ')) address.pop_back();
    return address.empty() ? std::string(kDefaultServerAddress) : address;
}

}  // namespace vantorel
