// The definitions list: splitting the file, canonical keys, and lookups in sorted, unsorted and
// hostile files. Lookups answering exactly as the halving search over the texts, for any sorted file,
// are the fuzz target tests/fuzz/definitions_sorted.cpp.
#include "guard/definitions.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <tuple>

namespace vantorel {
namespace {

std::vector<std::string> Split(const std::string& text, const std::string& delimiter) {
    std::vector<std::string> pieces{"stale", "content"};
    EXPECT_EQ(FastSplit(text, pieces, delimiter), 0);
    return pieces;
}

std::vector<std::string> Elements(const DefinitionList& list) {
    std::vector<std::string> out;
    for (std::size_t i = 0; i < list.size(); ++i) out.push_back(list.at(i));
    return out;
}

using Pieces = std::vector<std::string>;

TEST(FastSplit, SplitsAtTheChosenSeparatorAndNormalisesTheLastPiece) {
    const std::tuple<std::string, std::string, Pieces> cases[] = {
        {"-5\n10\n7", "\n", {"-5", "10", "7"}},
        {"1\r2\r\n3\n4\r\n5", "\r\n", {"1\r2", "3\n4", "5"}},  // a lone CR or LF stays inside its line
        {"12\r34\r", "\r\n", {"12\r34\r"}},                    // without a separator: one element, not normalised
        {"", "\n", {""}},
        {"abc", "", {"abc"}},
        {"1\n\n2", "\n", {"1", "", "2"}},     // inner empty lines stay
        {"1\r\n2\r\n", "\r\n", {"1", "2"}},   // a final line break adds no key "0"
        {"A\r\nB\r\nZ", "\r\n", {"A", "B"}},  // nor does a last piece without a number
        {"1\n-", "\n", {"1"}},
        {"1\n\x1a", "\n", {"1"}},
        {"aaa", "aa", {"", ""}},  // overlapping finds never cut a negative length
        {"xaaa7", "aa", {"x", "", "7"}},
    };
    for (const auto& [text, delimiter, pieces] : cases) EXPECT_EQ(Split(text, delimiter), pieces) << text;
    const std::pair<const char*, const char*> last[] = {{"-77", "-77"},
                                                        {"0042", "42"},
                                                        {"-0", "0"},
                                                        {"+5", "5"},
                                                        {"123\x1a", "123"},
                                                        {"1.5", "1.5"},
                                                        {"1e3", "1000"},
                                                        {".5", "0.5"},
                                                        {"&HFF", "255"},
                                                        {"1 2\t3", "123"},
                                                        {"99999999999999999999999", "99999999999999999999999"},
                                                        {"1e999999999999", "0"}};
    for (auto [piece, normalised] : last)
        EXPECT_EQ(Split(std::string("1\n") + piece, "\n").back(), normalised) << piece;
}

TEST(CanonicalKeys, ParseAndFormatRoundTrip) {
    std::int32_t key = 0;
    for (std::int32_t value : {0, 1, -1, 67305985, -939524086, INT32_MAX, INT32_MIN}) {
        char buffer[12];
        std::string_view text = FormatKey(value, buffer);
        EXPECT_EQ(text, std::to_string(value));
        ASSERT_TRUE(ParseCanonicalKey(text, key));
        EXPECT_EQ(key, value);
    }
    for (const char* odd :
         {"", "-", "-0", "007", "+5", " 5", "5 ", "2147483648", "-2147483649", "12345678901", "1.0", "5\r", "abc"})
        EXPECT_FALSE(ParseCanonicalKey(odd, key)) << odd;
}

TEST(DefinitionList, EveryLineCountsUnsortedFilesStillMatchAndATrailingLineBreakBlocksNoListeningRow) {
    const std::tuple<std::string, std::vector<std::int32_t>, std::vector<std::int32_t>> cases[] = {
        {"-9\n12\n5", {-9, 5, 12, 7, 0}, {0, 2, 1, kNoDefinition, kNoDefinition}},
        {"9\n10\n-1\n9\n3", {9, 10, -1, 3, 4}, {0, 1, 2, 4, kNoDefinition}},  // out of order
        {"-100\r\n-200\r\n-300\r\n", {-300, 0}, {2, kNoDefinition}},          // no stray "0" sorting last
    };
    for (const auto& [text, keys, found] : cases) {
        DefinitionList list = DefinitionList::FromText(text);
        std::vector<std::int32_t> got;
        for (std::int32_t key : keys) got.push_back(FindDefinition(list, key));
        EXPECT_EQ(got, found) << text;
    }
    EXPECT_EQ(FindDefinition(DefinitionList::FromText("-9\n12\n5"), "-9"), 0);
}

TEST(DefinitionList, BadInputGivesHarmlessKeys) {
    DefinitionList empty = DefinitionList::FromText("");
    EXPECT_EQ(Elements(empty), (Pieces{""}));
    EXPECT_EQ(FindDefinition(empty, std::int32_t{0}), kNoDefinition);
    EXPECT_EQ(FindDefinition(empty, ""), 0) << "the empty line is searchable as text, never by a row";

    // CRs but no CR LF pair: one element holding the whole text.
    DefinitionList crOnly = DefinitionList::FromText("1\r2\r3\r");
    EXPECT_EQ(Elements(crOnly), (Pieces{"1\r2\r3\r"}));
    EXPECT_EQ(FindDefinition(crOnly, std::int32_t{1}), kNoDefinition);

    // Keys that overflow 32 bits never match the row key they would wrap to.
    DefinitionList overflow = DefinitionList::FromText("2147483648\n4294967297\n-2147483649\n5");
    EXPECT_EQ(FindDefinition(overflow, std::int32_t{INT32_MIN}), kNoDefinition);
    EXPECT_EQ(FindDefinition(overflow, std::int32_t{1}), kNoDefinition);
    EXPECT_EQ(FindDefinition(overflow, std::int32_t{5}), 3);
    EXPECT_EQ(FindDefinition(overflow, "2147483648"), 0) << "the text search still sees the line";

    // A giant line (100 MB) before a real key.
    DefinitionList bigThenKey = DefinitionList::FromText(std::string(100u << 20, '7') + "\n8");
    EXPECT_EQ(bigThenKey.size(), 2u);
    EXPECT_EQ(FindDefinition(bigThenKey, std::int32_t{8}), 1);
}

}  // namespace
}  // namespace vantorel
