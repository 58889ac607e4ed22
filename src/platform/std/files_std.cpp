#include "platform/std/files_std.h"

#include <cstdio>
#include <sys/stat.h>

namespace vantorel::platform {

bool StdFiles::Exists(const std::string& path) {
    struct stat info {};
    return ::stat(path.c_str(), &info) == 0;
}

bool StdFiles::ReadAll(const std::string& path, std::string& content) {
    std::FILE* file = std::fopen(path.c_str(), "rb");
    if (file == nullptr) return false;
    std::string data;
    bool ok = std::fseek(file, 0, SEEK_END) == 0;
    long length = ok ? std::ftell(file) : -1;
    ok = ok && length >= 0 && std::fseek(file, 0, SEEK_SET) == 0;
    if (ok) {
        data.resize(static_cast<std::size_t>(length));
        ok = std::fread(data.data(), 1, data.size(), file) == data.size();
    }
    std::fclose(file);
    if (ok) content.swap(data);
    return ok;
}

}  // namespace vantorel::platform
