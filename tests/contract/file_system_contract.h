// The download's file-system contract, run against the in-memory fake natively and against both
// the fake and the Windows file system under Wine, so the fake the downloader's tests rely on
// answers like the real thing.
#pragma once

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>

#include "platform/file_system.h"
#include "platform/files.h"

namespace vantorel::testing {

struct FileSystemUnderTest {
    platform::FileSystem* disk = nullptr;
    platform::Files* files = nullptr;  // reads back what `disk` wrote
    std::string folder;                // an existing, empty folder to work in, no trailing backslash
    std::function<void()> cleanUp;
};

struct FileSystemMaker {
    std::string name;
    std::function<FileSystemUnderTest()> make;
};

inline void PrintTo(const FileSystemMaker& maker, std::ostream* out) { *out << maker.name; }

class FileSystemContract : public ::testing::TestWithParam<FileSystemMaker> {
protected:
    void SetUp() override { fs_ = GetParam().make(); }
    void TearDown() override {
        if (fs_.cleanUp) fs_.cleanUp();
    }
    FileSystemUnderTest fs_;
};

FileSystemUnderTest MakeFakeFileSystem();

}  // namespace vantorel::testing
