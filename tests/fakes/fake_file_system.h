// Files and folders held in memory, with a scriptable free space and scriptable failures of each
// operation. Paths are compared as given; a folder's trailing "\" is ignored.
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>

#include "platform/file_system.h"
#include "platform/files.h"

namespace vantorel::testing {

class FakeFileSystem final : public platform::FileSystem, public platform::Files {
public:
    std::set<std::string> unreadable;

    // platform::Files, over the same files.
    bool Exists(const std::string& path) override { return files.count(path) != 0 || FolderExists(path); }
    bool ReadAll(const std::string& path, std::string& content) override {
        auto it = files.find(path);
        if (it == files.end() || unreadable.count(path) != 0) return false;
        content = it->second;
        return true;
    }

    std::map<std::string, std::string> files;
    std::set<std::string> folders{"C:", "C:\\Vantorel"};
    std::uint32_t bytesPerSector = 512, sectorsPerCluster = 8, freeClusters = 1000000;
    std::string lastFreeSpaceRoot;
    std::optional<platform::FileError> createFolderFails, createFails, writeFails, closeFails, replaceFails;
    std::size_t writeFailsAt = 0;  // a write fails once the file would grow beyond this size

    bool FileExists(const std::string& path) override { return files.count(path) != 0; }
    bool FolderExists(const std::string& path) override { return folders.count(Trim(path)) != 0; }
    bool CreateFolder(const std::string& path, platform::FileError& error) override {
        std::string folder = Trim(path);
        std::size_t slash = folder.rfind('\\');
        if (createFolderFails) {
            error = *createFolderFails;
            return false;
        }
        if (slash == std::string::npos || folders.count(folder.substr(0, slash)) == 0) {
            error = {3, "The system cannot find the path specified."};
            return false;
        }
        folders.insert(folder);
        return true;
    }
    std::unique_ptr<platform::FileWriter> CreateNew(const std::string& path, platform::FileError& error) override {
        std::size_t slash = path.rfind('\\');
        if (createFails) {
            error = *createFails;
            return nullptr;
        }
        if (slash == std::string::npos || folders.count(path.substr(0, slash)) == 0) {
            error = {3, "The system cannot find the path specified."};
            return nullptr;
        }
        files[path].clear();
        return std::make_unique<Writer>(*this, path);
    }
    bool Replace(const std::string& from, const std::string& to, platform::FileError& error) override {
        if (replaceFails) {
            error = *replaceFails;
            return false;
        }
        auto it = files.find(from);
        if (it == files.end()) {
            error = {2, "The system cannot find the file specified."};
            return false;
        }
        files[to] = it->second;
        files.erase(from);
        return true;
    }
    bool Delete(const std::string& path) override { return files.erase(path) != 0; }
    bool QueryDiskFreeSpace(const std::string& root, std::uint32_t& bps, std::uint32_t& spc,
                            std::uint32_t& free) override {
        lastFreeSpaceRoot = root;
        bps = bytesPerSector;
        spc = sectorsPerCluster;
        free = freeClusters;
        return true;
    }

private:
    static std::string Trim(std::string path) {
        while (!path.empty() && path.back() == '\\') path.pop_back();
        return path;
    }

    class Writer final : public platform::FileWriter {
    public:
        Writer(FakeFileSystem& owner, std::string path) : owner_(owner), path_(std::move(path)) {}
        bool Write(const std::string& data, platform::FileError& error) override {
            std::string& content = owner_.files.at(path_);
            if (owner_.writeFails && content.size() + data.size() > owner_.writeFailsAt) {
                error = *owner_.writeFails;
                return false;
            }
            content += data;
            return true;
        }
        bool Close(platform::FileError& error) override {
            if (owner_.closeFails) {
                error = *owner_.closeFails;
                return false;
            }
            return true;
        }

    private:
        FakeFileSystem& owner_;
        std::string path_;
    };
};

}  // namespace vantorel::testing
