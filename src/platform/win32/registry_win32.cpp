#include "platform/win32/registry_win32.h"

#include <windows.h>

namespace vantorel::win32 {

namespace {

HKEY H(platform::RegKey key) { return reinterpret_cast<HKEY>(key); }
platform::RegKey K(HKEY key) { return reinterpret_cast<platform::RegKey>(key); }

}  // namespace

std::int32_t Win32Registry::OpenKey(platform::RegKey parent, const std::string& path, std::int32_t access,
                                    platform::RegKey& key) {
    HKEY opened = nullptr;
    LONG status = ::RegOpenKeyExA(H(parent), path.c_str(), 0, static_cast<REGSAM>(access), &opened);
    if (status == ERROR_SUCCESS) key = K(opened);
    return status;
}

std::int32_t Win32Registry::CreateKey(platform::RegKey parent, const std::string& path, std::int32_t access,
                                      platform::RegKey& key) {
    HKEY created = nullptr;
    SECURITY_ATTRIBUTES security{};  // all zero: default security, not inherited
    char emptyClass[] = "";
    LONG status = ::RegCreateKeyExA(H(parent), path.c_str(), 0, emptyClass, 0, static_cast<REGSAM>(access), &security,
                                    &created, nullptr);
    if (status == ERROR_SUCCESS) key = K(created);
    return status;
}

std::int32_t Win32Registry::CloseKey(platform::RegKey key) { return ::RegCloseKey(H(key)); }

std::int32_t Win32Registry::DeleteKey(platform::RegKey parent, const std::string& path) {
    return ::RegDeleteKeyA(H(parent), path.c_str());
}

std::int32_t Win32Registry::DeleteValue(platform::RegKey key, const std::string& name) {
    return ::RegDeleteValueA(H(key), name.c_str());
}

std::int32_t Win32Registry::QueryValue(platform::RegKey key, const std::string& name, std::int32_t& type,
                                       std::vector<std::uint8_t>& data, std::uint32_t& count) {
    DWORD valueType = 0;
    DWORD size = count <= data.size() ? count : static_cast<DWORD>(data.size());
    LONG status = ::RegQueryValueExA(H(key), name.c_str(), nullptr, &valueType, data.data(), &size);
    type = static_cast<std::int32_t>(valueType);
    count = size;
    return status;
}

std::int32_t Win32Registry::SetValue(platform::RegKey key, const std::string& name, std::int32_t type,
                                     const std::uint8_t* data, std::uint32_t count) {
    return ::RegSetValueExA(H(key), name.c_str(), 0, static_cast<DWORD>(type), data, count);
}

std::int32_t Win32Registry::EnumKey(platform::RegKey key, std::uint32_t index, std::uint32_t nameCapacity,
                                    std::string& name) {
    std::string buffer(nameCapacity, ' ');
    DWORD length = nameCapacity;
    char className[1] = {0};
    DWORD classLength = sizeof className;
    LONG status = ::RegEnumKeyExA(H(key), index, buffer.data(), &length, nullptr, className, &classLength, nullptr);
    if (status == ERROR_SUCCESS) name = buffer.substr(0, buffer.find('\0'));
    return status;
}

std::int32_t Win32Registry::EnumValue(platform::RegKey key, std::uint32_t index, std::uint32_t nameCapacity,
                                      std::string& name, std::int32_t& type, std::vector<std::uint8_t>& data,
                                      std::uint32_t& count) {
    std::string buffer(nameCapacity, '\0');
    DWORD length = nameCapacity;
    DWORD valueType = 0;
    DWORD size = count <= data.size() ? count : static_cast<DWORD>(data.size());
    LONG status = ::RegEnumValueA(H(key), index, buffer.data(), &length, nullptr, &valueType, data.data(), &size);
    if (status == ERROR_SUCCESS) name = buffer.substr(0, length);
    type = static_cast<std::int32_t>(valueType);
    count = size;
    return status;
}

std::int32_t Win32Registry::ConnectRegistry(const std::string& computer, platform::RegKey root, platform::RegKey& key) {
    HKEY connected = nullptr;
    LONG status = ::RegConnectRegistryA(computer.c_str(), H(root), &connected);
    if (status == ERROR_SUCCESS) key = K(connected);
    return status;
}

std::uint32_t Win32Registry::ExpandEnvironment(const std::string& source, std::uint32_t capacity,
                                               std::string& expanded) {
    std::string buffer(capacity + 1, '\0');  // one spare byte so a zero capacity still has a pointer
    DWORD needed = ::ExpandEnvironmentStringsA(source.c_str(), buffer.data(), capacity);
    if (needed != 0 && needed <= capacity) expanded = buffer.substr(0, buffer.find('\0'));
    return needed;
}

}  // namespace vantorel::win32
