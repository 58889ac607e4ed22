// A definitions file that is there but cannot be used, through the Windows file calls under Wine:
// a folder of that name, a file locked without read sharing, a file over the size limit.
#include <windows.h>

#include <gtest/gtest.h>

#include <fstream>
#include <string>

#include "guard/read_definitions.h"
#include "platform/win32/files_win32.h"

namespace vantorel {
namespace {

TEST(Win32Files, ADefinitionsFileThatCannotBeUsedIsAskedForLikeAMissingOne) {
    char temp[MAX_PATH];
    ::GetTempPathA(MAX_PATH, temp);
    const std::string folder = std::string(temp) + "vantorel-test-" + std::to_string(::GetCurrentProcessId());
    ::CreateDirectoryA(folder.c_str(), nullptr);
    win32::Win32Files files;
    const std::string path = DefinitionsPath(folder);
    auto attempt = [&](const char* what) {
        int missing = 0;
        DefinitionList list = DefinitionList::FromText("67305985");
        EXPECT_FALSE(LoadDefinitions(
            path, files, [&] { ++missing; }, list))
            << what;
        EXPECT_EQ(missing, 1) << what;
        EXPECT_EQ(list.size(), 0u) << what;
    };
    ASSERT_TRUE(::CreateDirectoryA(path.c_str(), nullptr));  // a folder of that name
    attempt("a folder");
    ::RemoveDirectoryA(path.c_str());

    std::ofstream(path, std::ios::binary) << "67305985";  // held open by another program that shares no reading
    HANDLE locked = ::CreateFileA(path.c_str(), GENERIC_READ, 0, nullptr, OPEN_EXISTING, 0, nullptr);
    ASSERT_NE(locked, INVALID_HANDLE_VALUE);
    attempt("a locked file");
    ::CloseHandle(locked);

    // Past the size limit (a sparse file: nothing is written), refused for its size alone.
    HANDLE big = ::CreateFileA(path.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, 0, nullptr);
    LARGE_INTEGER end;
    end.QuadPart = static_cast<LONGLONG>(kMaxDefinitionsBytes) + 1;
    ASSERT_TRUE(::SetFilePointerEx(big, end, nullptr, FILE_BEGIN) && ::SetEndOfFile(big));
    ::CloseHandle(big);
    attempt("a file over 256 MB");
    EXPECT_EQ(files.ReadableSize(path), kMaxDefinitionsBytes + 1);
    ::DeleteFileA(path.c_str());
    ::RemoveDirectoryA(folder.c_str());
}

}  // namespace
}  // namespace vantorel
