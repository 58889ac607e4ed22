// Whole-file reads and the existence test through the Windows API.
#pragma once

#include <string>

#include "platform/files.h"

namespace vantorel::win32 {

class Win32Files final : public platform::Files {
public:
    bool Exists(const std::string& path) override;
    bool ReadAll(const std::string& path, std::string& content) override;
    std::optional<std::uint64_t> ReadableSize(const std::string& path) override;
};

// The folder of the running executable, without a trailing backslash.
std::string ProgramFolder();

}  // namespace vantorel::win32
