// The text the system gives for an error number, for messages shown to the user.
#pragma once

#include <windows.h>

#include <string>

namespace vantorel::win32 {

// FormatMessageA of `code`, from `module`'s message table when given (WinINet's 12xxx codes live in
// wininet.dll) and the system's otherwise; trailing line ends removed. "Error <code>" when neither
// knows it.
inline std::string SystemMessage(DWORD code, HMODULE module = nullptr) {
    char* text = nullptr;
    DWORD flags = FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS;
    if (module != nullptr) flags |= FORMAT_MESSAGE_FROM_HMODULE;
    DWORD length = ::FormatMessageA(flags, module, code, 0, reinterpret_cast<LPSTR>(&text), 0, nullptr);
    std::string result;
    if (length != 0 && text != nullptr) result.assign(text, length);
    if (text != nullptr) ::LocalFree(text);
    while (!result.empty() && (result.back() == '\n' || result.back() == '\r' || result.back() == ' '))
        result.pop_back();
    if (result.empty()) result = "Error " + std::to_string(code);
    return result;
}

}  // namespace vantorel::win32
