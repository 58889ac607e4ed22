// The program's own settings under SOFTWARE\Vantorel, read and written straight through advapi32 for
// the Wine tests that check what the program stored (so they do not go through the code under test).
#pragma once

#include <windows.h>

#include <gtest/gtest.h>

#include <cstring>
#include <string>

namespace vantorel::testing {

inline void DeleteSettings() {
    ::RegDeleteKeyA(HKEY_CURRENT_USER, "SOFTWARE\\Vantorel");
    ::RegDeleteKeyA(HKEY_LOCAL_MACHINE, "SOFTWARE\\Vantorel");
}

// The text of a REG_SZ setting, or "<missing>".
inline std::string ReadSetting(HKEY root, const char* name) {
    char data[64] = {};
    DWORD size = sizeof data;
    if (::RegGetValueA(root, "SOFTWARE\\Vantorel", name, RRF_RT_REG_SZ, nullptr, data, &size) != ERROR_SUCCESS)
        return "<missing>";
    return data;
}

inline void WriteSetting(HKEY root, const char* name, const char* value) {
    HKEY key = nullptr;
    ASSERT_EQ(::RegCreateKeyExA(root, "SOFTWARE\\Vantorel", 0, nullptr, 0, KEY_WRITE, nullptr, &key, nullptr), 0);
    ::RegSetValueExA(key, name, 0, REG_SZ, reinterpret_cast<const BYTE*>(value),
                     static_cast<DWORD>(std::strlen(value) + 1));
    ::RegCloseKey(key);
}

}  // namespace vantorel::testing
