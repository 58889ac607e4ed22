// Files held in memory, with scripted failures and a hook that runs when a file is found missing.
#pragma once

#include <map>
#include <set>
#include <string>

#include "platform/files.h"

namespace vantorel::testing {

class FakeFiles final : public platform::Files {
public:
    bool Exists(const std::string& path) override { return files_.count(path) != 0; }
    bool ReadAll(const std::string& path, std::string& content) override {
        auto it = files_.find(path);
        if (it == files_.end() || unreadable_.count(path) != 0) return false;
        content = it->second;
        return true;
    }

    void Put(const std::string& path, const std::string& content) { files_[path] = content; }
    void Remove(const std::string& path) { files_.erase(path); }
    void MakeUnreadable(const std::string& path) { unreadable_.insert(path); }

private:
    std::map<std::string, std::string> files_;
    std::set<std::string> unreadable_;
};

}  // namespace vantorel::testing
