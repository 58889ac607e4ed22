// RegistryRoutines: the program's only way to the registry, where every setting lives.
//
// An object holds a root key and a key path; every operation opens what it needs and closes it
// before returning, so no handle outlives a call. Failures never raise: each operation reports them
// in its result (False, an empty text, the default value, a status code). Callers make their own
// object for each setting they touch and drop it when they return.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/registry.h"
#include "settings/collection.h"
#include "settings/variant.h"

namespace vantorel {

struct RegistryItem {
    std::string name;
    Variant value;
};

class RegistryRoutines {
public:
    explicit RegistryRoutines(platform::Registry& registry) : registry_(registry) {}

    std::int32_t hkey() const { return hkey_; }
    void hkey(std::int32_t value) { hkey_ = value; }
    const std::string& KeyRoot() const { return keyRoot_; }
    void KeyRoot(const std::string& value) { keyRoot_ = value; }
    const std::string& Subkey() const { return subkey_; }
    void Subkey(const std::string& value) { subkey_ = value; }

    // True when the object path opens for reading.
    bool KeyExists();

    // Creates (or opens) KeyRoot + "\" + the key name (`keyName`, else Subkey): "0" on success,
    // the empty text on failure.
    std::string CreateKey(const std::optional<std::string>& keyName = std::nullopt);

    // Deletes KeyRoot + "\" + keyName; the registry's status code.
    std::int32_t DeleteKey(const std::string& keyName);

    // Deletes a value of the object path; the status code of the open or of the deletion.
    std::int32_t DeleteValue(const std::string& valueName);

    // The subkeys of `keyName` below `hkey` (of `hkey` itself when `keyName` is empty).
    Collection<std::string> EnumRegistryKeys(std::int32_t hkey, const std::string& keyName);

    // The values of `keyName` below `hkey`, converted for display (binary as hex pairs, multi-strings
    // comma-separated).
    Collection<RegistryItem> EnumRegistryValues(std::int32_t hkey, const std::string& keyName);

    // One value of the object path, converted by its type; `defaultValue` (or empty) when the key or
    // the value is missing or the type is not converted.
    Variant GetRegistryValue(const std::string& valueName, const Variant& defaultValue = Variant());

    // Writes one value of the object path as type `valueType`. True when written, and when a type that
    // is not converted left nothing to write; False when the key does not open, the write fails or
    // the value cannot take the type.
    bool SetRegistryValue(const std::string& valueName, const Variant& value, std::int32_t valueType);

    // The same on another computer's registry; "Error!" when it cannot be reached.
    Variant ReadRemoteRegistryValue(const std::string& remoteComputer, std::int32_t hkey, const std::string& valueName,
                                    const std::optional<std::string>& keyPath = std::nullopt);
    bool WriteRemoteRegistryValue(const std::string& remoteComputer, std::int32_t hkey, const std::string& valueName,
                                  const Variant& value, std::int32_t valueType,
                                  const std::optional<std::string>& keyPath = std::nullopt);

    // Cuts `item` at its first NUL and returns it.
    static std::string TrimNull(std::string& item);

private:
    std::string ObjectPath() const { return keyRoot_ + "\\" + subkey_; }
    Variant ReadValue(platform::RegKey key, const std::string& name, Variant result);
    bool WriteValue(platform::RegKey key, const std::string& name, const Variant& value, std::int32_t type);
    std::string ExpandText(const std::string& text);

    platform::Registry& registry_;
    std::int32_t hkey_ = 0;
    std::string keyRoot_;
    std::string subkey_;
};

}  // namespace vantorel
