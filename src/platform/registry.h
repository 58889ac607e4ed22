// The registry calls the registry routines make, one method each, with the registry's own status
// codes (0 success, 2 not found, 234 more data, 259 no more items). Keys are opaque handles; the
// predefined roots are their 32-bit codes sign-extended, as the system defines them.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace vantorel::platform {

using RegKey = std::intptr_t;

inline constexpr RegKey RootKey(std::int32_t code) { return static_cast<RegKey>(code); }
inline constexpr std::int32_t kHkeyClassesRoot = static_cast<std::int32_t>(0x80000000u);
inline constexpr std::int32_t kHkeyCurrentUser = static_cast<std::int32_t>(0x80000001u);
inline constexpr std::int32_t kHkeyLocalMachine = static_cast<std::int32_t>(0x80000002u);
inline constexpr std::int32_t kHkeyUsers = static_cast<std::int32_t>(0x80000003u);

inline constexpr std::int32_t kKeyRead = 0x20019;
inline constexpr std::int32_t kKeyWrite = 0x20006;
inline constexpr std::int32_t kKeyAllAccess = 0xF003F;

inline constexpr std::int32_t kRegNone = 0;
inline constexpr std::int32_t kRegSz = 1;
inline constexpr std::int32_t kRegExpandSz = 2;
inline constexpr std::int32_t kRegBinary = 3;
inline constexpr std::int32_t kRegDword = 4;
inline constexpr std::int32_t kRegDwordBigEndian = 5;
inline constexpr std::int32_t kRegMultiSz = 7;

inline constexpr std::int32_t kErrorSuccess = 0;
inline constexpr std::int32_t kErrorFileNotFound = 2;
inline constexpr std::int32_t kErrorAccessDenied = 5;
inline constexpr std::int32_t kErrorInvalidParameter = 87;
inline constexpr std::int32_t kErrorMoreData = 234;
inline constexpr std::int32_t kErrorNoMoreItems = 259;
inline constexpr std::int32_t kErrorBadNetpath = 53;

class Registry {
public:
    Registry() = default;
    Registry(const Registry&) = delete;
    Registry& operator=(const Registry&) = delete;
    virtual ~Registry() = default;

    // RegOpenKeyExA. On success `key` receives a handle that must be closed.
    virtual std::int32_t OpenKey(RegKey parent, const std::string& path, std::int32_t access, RegKey& key) = 0;

    // RegCreateKeyExA with reserved 0, an empty class, option 0 and default security; the
    // disposition is dropped.
    virtual std::int32_t CreateKey(RegKey parent, const std::string& path, std::int32_t access, RegKey& key) = 0;

    virtual std::int32_t CloseKey(RegKey key) = 0;
    virtual std::int32_t DeleteKey(RegKey parent, const std::string& path) = 0;
    virtual std::int32_t DeleteValue(RegKey key, const std::string& name) = 0;

    // RegQueryValueExA into `data` (its size is the buffer). On return `type` and `count` hold what
    // the registry reported; with 234 `count` is the size needed and `data` is not filled.
    virtual std::int32_t QueryValue(RegKey key, const std::string& name, std::int32_t& type,
                                    std::vector<std::uint8_t>& data, std::uint32_t& count) = 0;

    // RegSetValueExA with `count` bytes of `data`. For the string types the ANSI entry point counts
    // a terminator in when the caller left it out, so stored strings are always terminated.
    virtual std::int32_t SetValue(RegKey key, const std::string& name, std::int32_t type, const std::uint8_t* data,
                                  std::uint32_t count) = 0;

    // RegEnumKeyExA with a name buffer of `nameCapacity` characters; `name` receives the text up to
    // its first NUL.
    virtual std::int32_t EnumKey(RegKey key, std::uint32_t index, std::uint32_t nameCapacity, std::string& name) = 0;

    // RegEnumValueA with a name buffer of `nameCapacity` characters and `data` as the data buffer.
    // `count` receives the data's byte count (the size needed with 234).
    virtual std::int32_t EnumValue(RegKey key, std::uint32_t index, std::uint32_t nameCapacity, std::string& name,
                                   std::int32_t& type, std::vector<std::uint8_t>& data, std::uint32_t& count) = 0;

    // RegConnectRegistryA. On success `key` receives a handle that must be closed.
    virtual std::int32_t ConnectRegistry(const std::string& computer, RegKey root, RegKey& key) = 0;

    // ExpandEnvironmentStringsA into a buffer of `capacity` characters: returns the characters the
    // expansion needs including its terminator (0 on failure); `expanded` receives the buffer's text
    // up to its first NUL when it fitted.
    virtual std::uint32_t ExpandEnvironment(const std::string& source, std::uint32_t capacity,
                                            std::string& expanded) = 0;
};

}  // namespace vantorel::platform
