// Whole-file access for the definitions and version files.
#pragma once

#include <string>

namespace vantorel::platform {

class Files {
public:
    Files() = default;
    Files(const Files&) = delete;
    Files& operator=(const Files&) = delete;
    virtual ~Files() = default;

    // True when `path` names an existing file or folder.
    virtual bool Exists(const std::string& path) = 0;

    // Reads the whole file as bytes into `content`. On failure returns false and leaves `content`
    // untouched.
    virtual bool ReadAll(const std::string& path, std::string& content) = 0;
};

}  // namespace vantorel::platform
