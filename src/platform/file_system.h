// The file and disk operations of a download: folders, a file written in pieces, an atomic
// replace, deletion and the free space of a drive. Paths are full Windows paths in the system code
// page ("C:\Program Files\Vantorel\sw2.def").
#pragma once

#include <cstdint>
#include <memory>
#include <string>

namespace vantorel::platform {

// A failed file operation: the system error number and its description.
struct FileError {
    std::int32_t number = 0;
    std::string description;
};

// A file open for writing; closes itself when dropped.
class FileWriter {
public:
    FileWriter() = default;
    FileWriter(const FileWriter&) = delete;
    FileWriter& operator=(const FileWriter&) = delete;
    virtual ~FileWriter() = default;

    // Appends all of `data`. An implementation may gather small writes into larger ones; a failure
    // then shows at a later Write or at Close.
    virtual bool Write(const std::string& data, FileError& error) = 0;
    // Closes the file, reporting a failure to flush it.
    virtual bool Close(FileError& error) = 0;
};

class FileSystem {
public:
    FileSystem() = default;
    FileSystem(const FileSystem&) = delete;
    FileSystem& operator=(const FileSystem&) = delete;
    virtual ~FileSystem() = default;

    virtual bool FileExists(const std::string& path) = 0;
    virtual bool FolderExists(const std::string& path) = 0;
    // Creates one folder level.
    virtual bool CreateFolder(const std::string& path, FileError& error) = 0;
    // Opens `path` for writing as a new, empty file (an existing file of that name is emptied).
    virtual std::unique_ptr<FileWriter> CreateNew(const std::string& path, FileError& error) = 0;
    // Puts `from` in place of `to` in one step: `to` holds either its old content or all of `from`.
    virtual bool Replace(const std::string& from, const std::string& to, FileError& error) = 0;
    virtual bool Delete(const std::string& path) = 0;
    // GetDiskFreeSpaceA on `root` (which ends in "\"); false and zeros when it fails.
    virtual bool QueryDiskFreeSpace(const std::string& root, std::uint32_t& bytesPerSector,
                                    std::uint32_t& sectorsPerCluster, std::uint32_t& freeClusters) = 0;
};

}  // namespace vantorel::platform
