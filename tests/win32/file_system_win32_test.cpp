// The download's file system under Wine (in a scratch folder below the temporary folder) and the
// in-memory fake that the native downloader tests rely on, held to the same answers.
#include <windows.h>

#include <gtest/gtest.h>

#include "fakes/fake_file_system.h"
#include "platform/win32/file_system_win32.h"
#include "platform/win32/files_win32.h"

namespace vantorel {
namespace {

class FileSystemContract : public ::testing::TestWithParam<bool> {  // true: the Windows one
protected:
    void SetUp() override {
        if (!GetParam()) return;
        char temp[MAX_PATH];
        ::GetTempPathA(MAX_PATH, temp);
        folder_ = std::string(temp) + "vtfs-" + std::to_string(::GetCurrentProcessId());
        ::CreateDirectoryA(folder_.c_str(), nullptr);
    }
    void TearDown() override {
        if (!GetParam()) return;
        ::RemoveDirectoryA((folder_ + "\\one").c_str());
        EXPECT_TRUE(::RemoveDirectoryA(folder_.c_str())) << "something was left behind in " << folder_;
    }
    bool WriteWhole(const std::string& path, const std::string& content) {
        platform::FileError error;
        auto file = disk_->CreateNew(path, error);
        return file && file->Write(content, error) && file->Close(error);
    }

    win32::Win32FileSystem realDisk_;
    win32::Win32Files realFiles_;
    testing::FakeFileSystem fake_;
    platform::FileSystem* disk_ = GetParam() ? static_cast<platform::FileSystem*>(&realDisk_) : &fake_;
    platform::Files* files_ = GetParam() ? static_cast<platform::Files*>(&realFiles_) : &fake_;  // reads `disk_`
    std::string folder_ = "C:\\Vantorel";  // an existing, empty folder
};

TEST_P(FileSystemContract, FoldersFilesReplaceAndFreeSpace) {
    platform::FileError error;
    const std::string one = folder_ + "\\one", two = one + "\\two";
    const std::string part = one + "\\sw2.def.part", to = one + "\\sw2.def";
    EXPECT_TRUE(disk_->FolderExists(folder_ + "\\")) << "a trailing backslash names the same folder";
    EXPECT_FALSE(disk_->CreateFolder(two, error));
    EXPECT_EQ(error.number, 3) << "folders are created one level at a time";
    EXPECT_FALSE(disk_->CreateNew(two + "\\file", error));
    EXPECT_EQ(error.number, 3);
    ASSERT_TRUE(disk_->CreateFolder(one + "\\", error));
    EXPECT_TRUE(disk_->FolderExists(one));
    EXPECT_FALSE(disk_->FileExists(one)) << "a folder is no file";

    // A new file over a longer one starts empty and takes every write, empty ones included.
    ASSERT_TRUE(WriteWhole(part, std::string(100000, 'a')));
    EXPECT_FALSE(disk_->FolderExists(part)) << "a file is no folder";
    auto file = disk_->CreateNew(part, error);
    ASSERT_TRUE(file);
    std::string expected, content;
    for (int i = 0; i < 300; ++i) {
        std::string piece(i % 7 == 0 ? 0 : 1024, static_cast<char>(i));
        expected += piece;
        ASSERT_TRUE(file->Write(piece, error));
    }
    ASSERT_TRUE(file->Close(error));
    file.reset();
    // Replace puts it in place, onto a missing destination and over an existing one.
    ASSERT_TRUE(disk_->Replace(part, to, error));
    ASSERT_TRUE(WriteWhole(part, "second"));
    ASSERT_TRUE(files_->ReadAll(to, content));
    EXPECT_TRUE(content == expected);
    ASSERT_TRUE(disk_->Replace(part, to, error));
    EXPECT_FALSE(disk_->FileExists(part));
    EXPECT_FALSE(disk_->Replace(part, to, error));
    EXPECT_EQ(error.number, 2) << "from nothing: refused, the destination kept";
    ASSERT_TRUE(files_->ReadAll(to, content));
    EXPECT_EQ(content, "second");
    EXPECT_TRUE(disk_->Delete(to));
    EXPECT_FALSE(disk_->Delete(to));

    std::uint32_t bytesPerSector = 0, sectorsPerCluster = 0, freeClusters = 0;
    ASSERT_TRUE(disk_->QueryDiskFreeSpace(folder_.substr(0, 3), bytesPerSector, sectorsPerCluster, freeClusters));
    EXPECT_GT(std::uint64_t{bytesPerSector} * sectorsPerCluster * freeClusters, 0u);
}

INSTANTIATE_TEST_SUITE_P(RealAndFake, FileSystemContract, ::testing::Values(true, false),
                         [](const auto& info) { return info.param ? "Win32" : "Fake"; });

}  // namespace
}  // namespace vantorel
