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
    std::map<std::string, std::string> files;
    std::set<std::string> unreadable;
    std::set<std::string> folders{"C:", "C:\\Vantorel"};
    std::uint32_t freeClusters = 1000000;  // of 4096 bytes
    std::optional<platform::FileError> createFolderFails, createFails, writeFails, closeFails, replaceFails;
    std::size_t writeFailsAt = 0;  // a write fails once the file would grow beyond this size

    // platform::Files, over the same files.
    bool Exists(const std::string& path) override { return files.count(path) != 0 || FolderExists(path); }
    bool ReadAll(const std::string& path, std::string& content) override {
        auto it = files.find(path);
        if (it == files.end() || unreadable.count(path) != 0) return false;
        content = it->second;
        return true;
    }

    bool FileExists(const std::string& path) override { return files.count(path) != 0; }
    bool FolderExists(const std::string& path) override { return folders.count(Trim(path)) != 0; }
    bool CreateFolder(const std::string& path, platform::FileError& error) override {
        std::string folder = Trim(path);
        if (!Succeeds(createFolderFails, error) || !ParentExists(folder, error)) return false;
        folders.insert(folder);
        return true;
    }
    std::unique_ptr<platform::FileWriter> CreateNew(const std::string& path, platform::FileError& error) override {
        if (!Succeeds(createFails, error) || !ParentExists(path, error)) return nullptr;
        files[path].clear();
        return std::make_unique<Writer>(*this, path);
    }
    bool Replace(const std::string& from, const std::string& to, platform::FileError& error) override {
        if (!Succeeds(replaceFails, error)) return false;
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
    bool QueryDiskFreeSpace(const std::string&, std::uint32_t& bps, std::uint32_t& spc, std::uint32_t& free) override {
        bps = 512;
        spc = 8;
        free = freeClusters;
        return true;
    }

private:
    static std::string Trim(std::string path) {
        while (!path.empty() && path.back() == '\\') path.pop_back();
        return path;
    }
    static bool Succeeds(const std::optional<platform::FileError>& failure, platform::FileError& error) {
        if (failure) error = *failure;
        return !failure;
    }
    bool ParentExists(const std::string& path, platform::FileError& error) const {
        std::size_t slash = path.rfind('\\');
        if (slash != std::string::npos && folders.count(path.substr(0, slash)) != 0) return true;
        error = {3, "The system cannot find the path specified."};
        return false;
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
        bool Close(platform::FileError& error) override { return Succeeds(owner_.closeFails, error); }

    private:
        FakeFileSystem& owner_;
        std::string path_;
    };
};

}  // namespace vantorel::testing
