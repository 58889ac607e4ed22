// The registry through advapi32's ANSI entry points.
#pragma once

#include "platform/registry.h"

namespace vantorel::win32 {

class Win32Registry final : public platform::Registry {
public:
    std::int32_t OpenKey(platform::RegKey parent, const std::string& path, std::int32_t access,
                         platform::RegKey& key) override;
    std::int32_t CreateKey(platform::RegKey parent, const std::string& path, std::int32_t access,
                           platform::RegKey& key) override;
    std::int32_t CloseKey(platform::RegKey key) override;
    std::int32_t DeleteKey(platform::RegKey parent, const std::string& path) override;
    std::int32_t DeleteValue(platform::RegKey key, const std::string& name) override;
    std::int32_t QueryValue(platform::RegKey key, const std::string& name, std::int32_t& type,
                            std::vector<std::uint8_t>& data, std::uint32_t& count) override;
    std::int32_t SetValue(platform::RegKey key, const std::string& name, std::int32_t type, const std::uint8_t* data,
                          std::uint32_t count) override;
    std::int32_t EnumKey(platform::RegKey key, std::uint32_t index, std::uint32_t nameCapacity,
                         std::string& name) override;
    std::int32_t EnumValue(platform::RegKey key, std::uint32_t index, std::uint32_t nameCapacity, std::string& name,
                           std::int32_t& type, std::vector<std::uint8_t>& data, std::uint32_t& count) override;
    std::int32_t ConnectRegistry(const std::string& computer, platform::RegKey root, platform::RegKey& key) override;
    std::uint32_t ExpandEnvironment(const std::string& source, std::uint32_t capacity, std::string& expanded) override;
};

}  // namespace vantorel::win32
