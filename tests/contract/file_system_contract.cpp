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

TEST_P(FileSystemContract, FoldersAreCreatedOneLevelAtATime) {
    platform::FileError error;
    const std::string one = fs_.folder + "\\one", two = one + "\\two";
    EXPECT_TRUE(fs_.disk->FolderExists(fs_.folder));
    EXPECT_TRUE(fs_.disk->FolderExists(fs_.folder + "\\")) << "a trailing backslash names the same folder";
    EXPECT_FALSE(fs_.disk->FolderExists(one));
    EXPECT_FALSE(fs_.disk->CreateFolder(two, error));
    EXPECT_EQ(error.number, 3) << "the path is not found";
    EXPECT_FALSE(error.description.empty());
    EXPECT_FALSE(fs_.disk->CreateNew(two + "\\file", error));
    EXPECT_EQ(error.number, 3);
    EXPECT_TRUE(fs_.disk->CreateFolder(one + "\\", error));
    EXPECT_TRUE(fs_.disk->FolderExists(one));
    EXPECT_FALSE(fs_.disk->FileExists(one)) << "a folder is no file";
    EXPECT_TRUE(WriteWhole(*fs_.disk, one + "\\f", "x"));
    EXPECT_TRUE(fs_.disk->FileExists(one + "\\f"));
    EXPECT_FALSE(fs_.disk->FolderExists(one + "\\f")) << "a file is no folder";
    if (fs_.cleanUp) {
        auto previous = fs_.cleanUp;
        fs_.cleanUp = [this, one, previous] {
            fs_.disk->Delete(one + "\\f");
            previous();
        };
    }
}

TEST_P(FileSystemContract, NewFilesStartEmptyAndTakeEveryWrite) {
    const std::string path = fs_.folder + "\\data.part";
    ASSERT_TRUE(WriteWhole(*fs_.disk, path, std::string(100000, 'a')));
    platform::FileError error;
    auto file = fs_.disk->CreateNew(path, error);
    ASSERT_TRUE(file);
    std::string expected;
    for (int i = 0; i < 300; ++i) {
        std::string piece(i % 7 == 0 ? 0 : 1024, static_cast<char>(i));
        expected += piece;
        ASSERT_TRUE(file->Write(piece, error));
    }
    ASSERT_TRUE(file->Close(error));
    std::string content;
    ASSERT_TRUE(fs_.files->ReadAll(path, content));
    EXPECT_EQ(content.size(), expected.size()) << "the old, longer content is gone";
    EXPECT_TRUE(content == expected);
    EXPECT_TRUE(fs_.disk->Delete(path));
    EXPECT_FALSE(fs_.disk->Delete(path));
    EXPECT_FALSE(fs_.disk->FileExists(path));
}

TEST_P(FileSystemContract, ReplacePutsTheNewFileInPlaceInOneStep) {
    const std::string from = fs_.folder + "\\sw2.def.part", to = fs_.folder + "\\sw2.def";
    platform::FileError error;
    // Onto a missing destination, then over an existing one.
    ASSERT_TRUE(WriteWhole(*fs_.disk, from, "first"));
    ASSERT_TRUE(fs_.disk->Replace(from, to, error));
    ASSERT_TRUE(WriteWhole(*fs_.disk, from, "second"));
    ASSERT_TRUE(fs_.disk->Replace(from, to, error));
    std::string content;
    ASSERT_TRUE(fs_.files->ReadAll(to, content));
    EXPECT_EQ(content, "second");
    EXPECT_FALSE(fs_.disk->FileExists(from));

    // From nothing: refused, the destination kept.
    EXPECT_FALSE(fs_.disk->Replace(from, to, error));
    EXPECT_EQ(error.number, 2) << "the file is not found";
    ASSERT_TRUE(fs_.files->ReadAll(to, content));
    EXPECT_EQ(content, "second");
    EXPECT_TRUE(fs_.disk->Delete(to));
}

TEST_P(FileSystemContract, FreeSpaceOfTheDrive) {
    std::uint32_t bytesPerSector = 0, sectorsPerCluster = 0, freeClusters = 0;
    ASSERT_TRUE(fs_.disk->QueryDiskFreeSpace(fs_.folder.substr(0, 3), bytesPerSector, sectorsPerCluster,
                                             freeClusters));
    EXPECT_GT(bytesPerSector, 0u);
    EXPECT_GT(sectorsPerCluster, 0u);
    EXPECT_GT(freeClusters, 0u);
}

}  // namespace
}  // namespace vantorel::testing
