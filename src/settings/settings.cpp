#include "settings/settings.h"

namespace vantorel {

RegistryRoutines OpenOrCreate(platform::Registry& registry, std::int32_t root, const std::string& keyRoot) {
    RegistryRoutines reg(registry);
    reg.hkey(root);
    reg.KeyRoot(keyRoot);
    if (!reg.KeyExists()) reg.CreateKey();
    return reg;
}

std::int32_t ReadIntSetting(platform::Registry& registry, std::int32_t root, const std::string& name,
                            std::int32_t fallback) {
    Variant value = OpenSettings(registry, root).GetRegistryValue(name, std::to_string(fallback));
    return VariantInt32(value).value_or(fallback);
}

std::string ServerAddress(platform::Registry& registry) {
    RegistryRoutines reg(registry);
    reg.hkey(platform::kHkeyLocalMachine);
    reg.KeyRoot(kSettingsKey);
    std::string address = VariantText(reg.GetRegistryValue(kServerValue, std::string(kDefaultServerAddress)));
    while (!address.empty() && (address.back() == '/' || address.back() == ' ')) address.pop_back();
    return address.empty() ? std::string(kDefaultServerAddress) : address;
}

}  // namespace vantorel
