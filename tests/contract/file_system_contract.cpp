#include "contract/file_system_contract.h"

#include "fakes/fake_file_system.h"

namespace vantorel::testing {

FileSystemUnderTest MakeFakeFileSystem() {
    auto fake = std::make_shared<FakeFileSystem>();
    FileSystemUnderTest fs;
    fs.disk = fake.get();
    fs.files = fake.get();
    fs.folder = "C:\\Vantorel";
    fs.cleanUp = [fake] {};  // keeps the fake alive for the test
    return fs;
}

namespace {

bool WriteWhole(platform::FileSystem& disk, const std::string& path, const std::string& content) {
    platform::FileError error;
    auto file = disk.CreateNew(path, error);
    return file && file->Write(content, error) && file->Close(error);
}

TEST_P(FileSystemContract, FoldersFilesReplaceAndFreeSpace) {
    platform::FileError error;
    const std::string one = fs_.folder + "\\one", two = one + "\\two";
    const std::string part = one + "\\sw2.def.part", to = one + "\\sw2.def";
    EXPECT_TRUE(fs_.disk->FolderExists(fs_.folder + "\\")) << "a trailing backslash names the same folder";
    EXPECT_FALSE(fs_.disk->CreateFolder(two, error));
    EXPECT_EQ(error.number, 3) << "folders are created one level at a time";
    EXPECT_FALSE(fs_.disk->CreateNew(two + "\\file", error));
    EXPECT_EQ(error.number, 3);
    ASSERT_TRUE(fs_.disk->CreateFolder(one + "\\", error));
    EXPECT_TRUE(fs_.disk->FolderExists(one));
    EXPECT_FALSE(fs_.disk->FileExists(one)) << "a folder is no file";

    // A new file over a longer one starts empty and takes every write, empty ones included.
    ASSERT_TRUE(WriteWhole(*fs_.disk, part, std::string(100000, 'a')));
    EXPECT_FALSE(fs_.disk->FolderExists(part)) << "a file is no folder";
    auto file = fs_.disk->CreateNew(part, error);
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
    ASSERT_TRUE(fs_.disk->Replace(part, to, error));
    ASSERT_TRUE(WriteWhole(*fs_.disk, part, "second"));
    ASSERT_TRUE(fs_.files->ReadAll(to, content));
    EXPECT_TRUE(content == expected);
    ASSERT_TRUE(fs_.disk->Replace(part, to, error));
    EXPECT_FALSE(fs_.disk->FileExists(part));
    EXPECT_FALSE(fs_.disk->Replace(part, to, error));
    EXPECT_EQ(error.number, 2) << "from nothing: refused, the destination kept";
    ASSERT_TRUE(fs_.files->ReadAll(to, content));
    EXPECT_EQ(content, "second");
    EXPECT_TRUE(fs_.disk->Delete(to));
    EXPECT_FALSE(fs_.disk->Delete(to));

    std::uint32_t bytesPerSector = 0, sectorsPerCluster = 0, freeClusters = 0;
    ASSERT_TRUE(fs_.disk->QueryDiskFreeSpace(fs_.folder.substr(0, 3), bytesPerSector, sectorsPerCluster, freeClusters));
    EXPECT_GT(std::uint64_t{bytesPerSector} * sectorsPerCluster * freeClusters, 0u);
}

}  // namespace
}  // namespace vantorel::testing
