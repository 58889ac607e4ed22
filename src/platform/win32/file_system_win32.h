// The download's file and disk operations through the Windows API.
#pragma once

#include "platform/file_system.h"

namespace vantorel::win32 {

class Win32FileSystem final : public platform::FileSystem {
public:
    bool FileExists(const std::string& path) override;
    bool FolderExists(const std::string& path) override;
    bool CreateFolder(const std::string& path, platform::FileError& error) override;
    // The file is flushed to the disk when closed, so a replace never puts a half-written file in place.
    std::unique_ptr<platform::FileWriter> CreateNew(const std::string& path, platform::FileError& error) override;
    // MoveFileExA with MOVEFILE_REPLACE_EXISTING: one rename on the same volume.
    bool Replace(const std::string& from, const std::string& to, platform::FileError& error) override;
    bool Delete(const std::string& path) override;
    bool QueryDiskFreeSpace(const std::string& root, std::uint32_t& bytesPerSector, std::uint32_t& sectorsPerCluster,
                            std::uint32_t& freeClusters) override;
};

}  // namespace vantorel::win32
