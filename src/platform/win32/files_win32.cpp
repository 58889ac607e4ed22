#include "platform/win32/files_win32.h"

#include <windows.h>
#include <shlwapi.h>

#include "platform/win32/unique_handle.h"

namespace vantorel::win32 {

bool Win32Files::Exists(const std::string& path) { return ::PathFileExistsA(path.c_str()) != FALSE; }

bool Win32Files::ReadAll(const std::string& path, std::string& content) {
    UniqueFile file(::CreateFileA(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                                  FILE_ATTRIBUTE_NORMAL | FILE_FLAG_SEQUENTIAL_SCAN, nullptr));
    if (!file) return false;
    LARGE_INTEGER size{};
    if (!::GetFileSizeEx(file.get(), &size) || size.QuadPart < 0) return false;
    std::string data;
    data.resize(static_cast<std::size_t>(size.QuadPart));
    std::size_t done = 0;
    while (done < data.size()) {
        DWORD chunk = static_cast<DWORD>(std::min<std::size_t>(data.size() - done, 1u << 30));
        DWORD read = 0;
        if (!::ReadFile(file.get(), data.data() + done, chunk, &read, nullptr) || read == 0) return false;
        done += read;
    }
    content.swap(data);
    return true;
}

std::optional<std::uint64_t> Win32Files::ReadableSize(const std::string& path) {
    // Opened exactly as ReadAll opens it, so a file this accepts can be read.
    UniqueFile file(::CreateFileA(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                                  FILE_ATTRIBUTE_NORMAL, nullptr));
    LARGE_INTEGER size{};
    if (!file || !::GetFileSizeEx(file.get(), &size) || size.QuadPart < 0) return std::nullopt;
    return static_cast<std::uint64_t>(size.QuadPart);
}

std::string ProgramFolder() {
    std::string path(MAX_PATH, '\0');
    for (;;) {
        DWORD length = ::GetModuleFileNameA(nullptr, path.data(), static_cast<DWORD>(path.size()));
        if (length == 0) return ".";
        if (length < path.size()) {
            path.resize(length);
            break;
        }
        path.resize(path.size() * 2);
    }
    std::size_t slash = path.find_last_of("\\/");
    return slash == std::string::npos ? std::string(".") : path.substr(0, slash);
}

}  // namespace vantorel::win32
