// Whole-file access for the definitions and version files.
#pragma once

#include <cstdint>
#include <optional>
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

    // The size of a file that can be opened for reading; nothing when it is missing, a folder, or
    // cannot be opened for reading (locked by another program, no permission). Reads nothing of a
    // real file; this default reads it whole.
    virtual std::optional<std::uint64_t> ReadableSize(const std::string& path) {
        std::string content;
        if (!Exists(path) || !ReadAll(path, content)) return std::nullopt;
        return content.size();
    }
};

}  // namespace vantorel::platform
