#include "guard/read_definitions.h"

#include <gtest/gtest.h>

#include "fakes/fake_files.h"

namespace vantorel {
namespace {

using testing::FakeFiles;

TEST(ReadDefinitions, ReadsTheFileInTheProgramFolder) {
    EXPECT_EQ(DefinitionsPath("C:\\Program Files\\Vantorel"), "C:\\Program Files\\Vantorel\\sw2.def");
    FakeFiles files;
    files.Put("C:\\V\\sw2.def", std::string("-5\n7\0x", 6));
    int missing = 0;
    auto text = ReadDefinitions("C:\\V\\sw2.def", files, [&] { ++missing; });
    ASSERT_TRUE(text.has_value());
    EXPECT_EQ(*text, std::string("-5\n7\0x", 6)) << "read whole, NUL bytes included";
    EXPECT_EQ(missing, 0);
}

TEST(ReadDefinitions, MissingFileAsksForHelpThenLooksAgain) {
    FakeFiles files;
    const std::string path = "C:\\V\\sw2.def";
    int missing = 0;
    // The updates window fetched the file while it was open.
    DefinitionList list;
    EXPECT_TRUE(LoadDefinitions(path, files, [&] { ++missing; files.Put(path, "1\n2\n"); }, list));
    EXPECT_EQ(missing, 1);
    EXPECT_EQ(list.size(), 2u);

    // Still missing afterwards: an empty list, no key can match.
    files.Remove(path);
    list = DefinitionList::FromText("3");
    EXPECT_FALSE(LoadDefinitions(path, files, [&] { ++missing; }, list));
    EXPECT_EQ(missing, 2);
    EXPECT_EQ(list.size(), 0u);
    EXPECT_EQ(FindDefinition(list, std::int32_t{3}), kNoDefinition);
    EXPECT_EQ(FindDefinition(list, "3"), kNoDefinition);

    // Present but unreadable: asked for like a missing file, nothing read.
    files.Put(path, "4");
    files.MakeUnreadable(path);
    EXPECT_FALSE(ReadDefinitions(path, files, [&] { ++missing; }).has_value());
    EXPECT_EQ(missing, 3);
    EXPECT_FALSE(ReadDefinitions(path, files, nullptr).has_value());
}

}  // namespace
}  // namespace vantorel
