#include "settings/registry_routines.h"

#include <cstdio>

namespace vantorel {

using platform::RegKey;
using platform::RootKey;

namespace {

constexpr std::uint32_t kValueBuffer = 1024;
constexpr std::uint32_t kEnumDataBuffer = 4096;
constexpr std::uint32_t kNameBuffer = 260;

std::string TextOf(const Bytes& data, std::size_t count) {
    return std::string(reinterpret_cast<const char*>(data.data()), count);
}

// A stored string without its terminator. A string stored without one (possible through the wide
// entry points) keeps its last character instead of losing it.
std::string StringOf(const Bytes& data, std::uint32_t count) {
    if (count == 0) return std::string();
    return TextOf(data, data[count - 1] == 0 ? count - 1 : count);
}

// The first four bytes, little-endian; a shorter value reads as if the rest of the buffer were zero.
std::int32_t DwordOf(const Bytes& data, std::uint32_t count) {
    std::uint32_t value = 0;
    for (std::uint32_t i = 0; i < 4 && i < count && i < data.size(); ++i) value |= std::uint32_t{data[i]} << (8 * i);
    return static_cast<std::int32_t>(value);
}

std::string HexPairs(const Bytes& data, std::uint32_t count) {
    std::string text;
    char pair[4];
    for (std::uint32_t i = 0; i < count && i < data.size(); ++i) {
        std::snprintf(pair, sizeof pair, "%02X", data[i]);
        if (i != 0) text.push_back(' ');
        text += pair;
    }
    return text;
}

// Queries `name`, growing the buffer once when the registry asks for more room. The buffer is cut
// to what was returned only by the callers, which look at `count`.
std::int32_t QueryWithRetry(platform::Registry& registry, RegKey key, const std::string& name, std::int32_t& type,
                            Bytes& data, std::uint32_t& count) {
    data.assign(kValueBuffer, 0);
    count = kValueBuffer;
    std::int32_t status = registry.QueryValue(key, name, type, data, count);
    if (status == platform::kErrorMoreData) {
        data.assign(count, 0);
        status = registry.QueryValue(key, name, type, data, count);
    }
    if (count > data.size()) count = static_cast<std::uint32_t>(data.size());
    return status;
}

// A key this object opened, created or connected, closed when the scope ends.
class ScopedKey {
public:
    explicit ScopedKey(platform::Registry& registry) : registry_(registry) {}
    ~ScopedKey() {
        if (owned_) registry_.CloseKey(key_);
    }
    ScopedKey(const ScopedKey&) = delete;
    ScopedKey& operator=(const ScopedKey&) = delete;

    // Where the opening call puts the key.
    RegKey& out() { return key_; }
    // Takes the status of that call: the key is owned (and closed later) only when it succeeded.
    bool Took(std::int32_t status) {
        owned_ = status == platform::kErrorSuccess;
        return owned_;
    }
    RegKey get() const { return key_; }

private:
    platform::Registry& registry_;
    RegKey key_ = 0;
    bool owned_ = false;
};

}  // namespace

bool RegistryRoutines::KeyExists() {
    ScopedKey key(registry_);
    return key.Took(registry_.OpenKey(RootKey(hkey_), ObjectPath(), platform::kKeyRead, key.out()));
}

std::string RegistryRoutines::CreateKey(const std::optional<std::string>& keyName) {
    ScopedKey key(registry_);
    std::string path = keyRoot_ + "\\" + keyName.value_or(subkey_);
    return key.Took(registry_.CreateKey(RootKey(hkey_), path, platform::kKeyAllAccess, key.out())) ? "0" : "";
}

std::int32_t RegistryRoutines::DeleteKey(const std::string& keyName) {
    return registry_.DeleteKey(RootKey(hkey_), keyRoot_ + "\\" + keyName);
}

std::int32_t RegistryRoutines::DeleteValue(const std::string& valueName) {
    ScopedKey key(registry_);
    std::int32_t status = registry_.OpenKey(RootKey(hkey_), ObjectPath(), platform::kKeyAllAccess, key.out());
    if (!key.Took(status)) return status;
    return registry_.DeleteValue(key.get(), valueName);
}

Collection<std::string> RegistryRoutines::EnumRegistryKeys(std::int32_t hkey, const std::string& keyName) {
    Collection<std::string> keys;
    RegKey key = RootKey(hkey);
    ScopedKey opened(registry_);
    if (!keyName.empty()) {
        if (!opened.Took(registry_.OpenKey(RootKey(hkey), keyName, platform::kKeyRead, opened.out()))) return keys;
        key = opened.get();
    }
    for (std::uint32_t index = 0;; ++index) {
        std::string name;
        if (registry_.EnumKey(key, index, kNameBuffer, name) != platform::kErrorSuccess) break;
        keys.Add(name, name);
    }
    return keys;
}

Collection<RegistryItem> RegistryRoutines::EnumRegistryValues(std::int32_t hkey, const std::string& keyName) {
    Collection<RegistryItem> values;
    RegKey key = RootKey(hkey);
    ScopedKey opened(registry_);
    if (!keyName.empty()) {
        if (!opened.Took(registry_.OpenKey(RootKey(hkey), keyName, platform::kKeyRead, opened.out()))) return values;
        key = opened.get();
    }
    for (std::uint32_t index = 0;; ++index) {
        std::string name;
        std::int32_t type = 0;
        Bytes data(kEnumDataBuffer, 0);
        std::uint32_t count = kEnumDataBuffer;
        std::int32_t status = registry_.EnumValue(key, index, kNameBuffer, name, type, data, count);
        if (status == platform::kErrorMoreData) {
            data.assign(count, 0);
            status = registry_.EnumValue(key, index, kNameBuffer, name, type, data, count);
        }
        if (status != platform::kErrorSuccess) break;
        if (count > data.size()) count = static_cast<std::uint32_t>(data.size());

        Variant value;
        switch (type) {
            case platform::kRegSz: value = StringOf(data, count); break;
            case platform::kRegExpandSz: {
                std::string text = count == 0 ? std::string() : ExpandText(StringOf(data, count));
                value = TrimNull(text);
                break;
            }
            case platform::kRegBinary: value = HexPairs(data, count); break;
            case platform::kRegDword: value = DwordOf(data, count); break;
            case platform::kRegMultiSz: {
                std::string text = count < 2 ? std::string() : TextOf(data, count - 2);
                for (char& c : text)
                    if (c == '\0') c = ',';
                value = text;
                break;
            }
            default: break;
        }
        values.Add(name, RegistryItem{name, std::move(value)});
    }
    return values;
}

std::string RegistryRoutines::ExpandText(const std::string& text) {
    // The expansion gets a buffer as long as the stored text; when it needs more, the stored text
    // stands unexpanded.
    std::string expanded;
    auto capacity = static_cast<std::uint32_t>(text.size());
    std::uint32_t needed = registry_.ExpandEnvironment(text, capacity, expanded);
    if (needed == 0 || needed > capacity) return text;
    return expanded;
}

Variant RegistryRoutines::ReadValue(RegKey key, const std::string& name, Variant result) {
    std::int32_t type = platform::kRegNone;
    Bytes data;
    std::uint32_t count = 0;
    if (QueryWithRetry(registry_, key, name, type, data, count) != platform::kErrorSuccess) return result;
    switch (type) {
        case platform::kRegSz:
            if (count != 0) result = StringOf(data, count);
            break;
        case platform::kRegExpandSz:
            if (count != 0) result = ExpandText(StringOf(data, count));
            break;
        case platform::kRegBinary: result = Bytes(data.begin(), data.begin() + count); break;
        case platform::kRegDword: result = DwordOf(data, count); break;
        case platform::kRegMultiSz: {
            if (count < 2) break;
            std::string text = TextOf(data, count - 2);
            std::string first = text;
            if (!TrimNull(first).empty()) result = text;
            break;
        }
        default: break;
    }
    return result;
}

Variant RegistryRoutines::GetRegistryValue(const std::string& valueName, const Variant& defaultValue) {
    ScopedKey key(registry_);
    if (!key.Took(registry_.OpenKey(RootKey(hkey_), ObjectPath(), platform::kKeyRead, key.out()))) return defaultValue;
    return ReadValue(key.get(), valueName, defaultValue);
}

bool RegistryRoutines::WriteValue(RegKey key, const std::string& name, const Variant& value, std::int32_t type) {
    switch (type) {
        case platform::kRegSz:
        case platform::kRegExpandSz:
        case platform::kRegMultiSz: {
            std::string text = VariantText(value);
            return registry_.SetValue(key, name, type, reinterpret_cast<const std::uint8_t*>(text.c_str()),
                                      static_cast<std::uint32_t>(text.size())) == platform::kErrorSuccess;
        }
        case platform::kRegBinary: {
            const auto* bytes = std::get_if<Bytes>(&value);
            if (bytes == nullptr) return false;
            return registry_.SetValue(key, name, type, bytes->data(), static_cast<std::uint32_t>(bytes->size())) ==
                   platform::kErrorSuccess;
        }
        case platform::kRegDword: {
            std::optional<std::int32_t> number = VariantInt32(value);
            if (!number) return false;
            auto bits = static_cast<std::uint32_t>(*number);
            std::uint8_t le[4] = {static_cast<std::uint8_t>(bits), static_cast<std::uint8_t>(bits >> 8),
                                  static_cast<std::uint8_t>(bits >> 16), static_cast<std::uint8_t>(bits >> 24)};
            return registry_.SetValue(key, name, type, le, 4) == platform::kErrorSuccess;
        }
        default: return true;  // a type that is not converted: nothing to write
    }
}

bool RegistryRoutines::SetRegistryValue(const std::string& valueName, const Variant& value, std::int32_t valueType) {
    ScopedKey key(registry_);
    if (!key.Took(registry_.OpenKey(RootKey(hkey_), ObjectPath(), platform::kKeyWrite, key.out()))) return false;
    return WriteValue(key.get(), valueName, value, valueType);
}

Variant RegistryRoutines::ReadRemoteRegistryValue(const std::string& remoteComputer, std::int32_t hkey,
                                                  const std::string& valueName,
                                                  const std::optional<std::string>& keyPath) {
    ScopedKey remote(registry_);
    if (!remote.Took(registry_.ConnectRegistry(remoteComputer, RootKey(hkey), remote.out())))
        return std::string("Error!");
    ScopedKey key(registry_);
    if (!key.Took(registry_.OpenKey(remote.get(), keyPath.value_or(ObjectPath()), platform::kKeyAllAccess, key.out())))
        return Variant();
    return ReadValue(key.get(), valueName, Variant());
}

bool RegistryRoutines::WriteRemoteRegistryValue(const std::string& remoteComputer, std::int32_t hkey,
                                                const std::string& valueName, const Variant& value,
                                                std::int32_t valueType, const std::optional<std::string>& keyPath) {
    ScopedKey remote(registry_);
    if (!remote.Took(registry_.ConnectRegistry(remoteComputer, RootKey(hkey), remote.out()))) return false;
    ScopedKey key(registry_);
    if (!key.Took(registry_.OpenKey(remote.get(), keyPath.value_or(ObjectPath()), platform::kKeyAllAccess, key.out())))
        return false;
    return WriteValue(key.get(), valueName, value, valueType);
}

std::string RegistryRoutines::TrimNull(std::string& item) {
    std::size_t nul = item.find('\0');
    if (nul != std::string::npos) item.erase(nul);
    return item;
}

}  // namespace vantorel
