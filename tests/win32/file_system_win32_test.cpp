// The file-system contract on the Windows file system under Wine (in a scratch folder below the
// temporary folder), and on the fake in the same run.
#include <windows.h>

#include "contract/file_system_contract.h"
#include "platform/win32/file_system_win32.h"
#include "platform/win32/files_win32.h"

namespace vantorel::testing {
namespace {

FileSystemUnderTest MakeWin32FileSystem() {
    struct Real {
        win32::Win32FileSystem disk;
        win32::Win32Files files;
    };
    auto real = std::make_shared<Real>();
    char temp[MAX_PATH];
    ::GetTempPathA(MAX_PATH, temp);
    static int counter = 0;
    std::string folder =
        std::string(temp) + "vtfs-" + std::to_string(::GetCurrentProcessId()) + "-" + std::to_string(++counter);
    ::CreateDirectoryA(folder.c_str(), nullptr);
    FileSystemUnderTest fs;
    fs.disk = &real->disk;
    fs.files = &real->files;
    fs.folder = folder;
    fs.cleanUp = [real, folder] {
        ::RemoveDirectoryA((folder + "\\one").c_str());
        EXPECT_TRUE(::RemoveDirectoryA(folder.c_str())) << "something was left behind in " << folder;
    };
    return fs;
}

INSTANTIATE_TEST_SUITE_P(RealAndFake, FileSystemContract,
                         ::testing::Values(FileSystemMaker{"Win32", MakeWin32FileSystem},
                                           FileSystemMaker{"Fake", MakeFakeFileSystem}),
                         [](const auto& info) { return info.param.name; });

}  // namespace
}  // namespace vantorel::testing
