#include "guard/definitions.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>

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

TEST(FastSplit, SplitsAtTheChosenSeparatorOnly) {
    EXPECT_EQ(Split("-5\n10\n7", "\n"), (Pieces{"-5", "10", "7"}));
    EXPECT_EQ(Split("1\r\n2\r\n3", "\r\n"), (Pieces{"1", "2", "3"}));
    // With CR LF chosen, a lone CR or LF stays inside its line.
    EXPECT_EQ(Split("1\r2\r\n3\n4\r\n5", "\r\n"), (Pieces{"1\r2", "3\n4", "5"}));
    // Without any separator the whole text is one element, not normalised.
    EXPECT_EQ(Split("12\r34\r", "\r\n"), (Pieces{"12\r34\r"}));
    EXPECT_EQ(Split("abc", "\n"), (Pieces{"abc"}));
    EXPECT_EQ(Split("", "\n"), (Pieces{""}));
    EXPECT_EQ(Split("abc", ""), (Pieces{"abc"}));
    // Inner empty lines stay as they are.
    EXPECT_EQ(Split("1\n\n2", "\n"), (Pieces{"1", "", "2"}));
}

TEST(FastSplit, LastPieceIsNormalisedToANumber) {
    EXPECT_EQ(Split("1\n12345", "\n").back(), "12345");
    EXPECT_EQ(Split("1\n-77", "\n").back(), "-77");
    EXPECT_EQ(Split("1\n0042", "\n").back(), "42");
    EXPECT_EQ(Split("1\n00", "\n").back(), "0");
    EXPECT_EQ(Split("1\n-0", "\n").back(), "0");
    EXPECT_EQ(Split("1\n+5", "\n").back(), "5");
    EXPECT_EQ(Split("1\n123\x1a", "\n").back(), "123") << "end-of-file mark dropped";
    EXPECT_EQ(Split("1\r\n1 2\t3\n4x", "\r\n").back(), "1234") << "blanks, tabs and line feeds skipped";
    EXPECT_EQ(Split("1\n1.5", "\n").back(), "1.5");
    EXPECT_EQ(Split("1\n1e3", "\n").back(), "1000");
    EXPECT_EQ(Split("1\n2e", "\n").back(), "2") << "an exponent mark without digits is not taken";
    EXPECT_EQ(Split("1\n.5", "\n").back(), "0.5");
    EXPECT_EQ(Split("1\n&HFF", "\n").back(), "255");
    EXPECT_EQ(Split("1\n&o17", "\n").back(), "15");
    EXPECT_EQ(Split("1\n99999999999999999999999", "\n").back(), "99999999999999999999999");
    EXPECT_EQ(Split("1\n1e999999999999", "\n").back(), "0") << "out of range stays bounded";
}

TEST(FastSplit, LastPieceWithoutANumberAddsNoKey) {
    // A file that ends with a line break must not gain a key "0".
    EXPECT_EQ(Split("1\r\n2\r\n", "\r\n"), (Pieces{"1", "2"}));
    EXPECT_EQ(Split("A\r\nB\r\nZ", "\r\n"), (Pieces{"A", "B"}));
    EXPECT_EQ(Split("-5\n-7\n", "\n"), (Pieces{"-5", "-7"}));
    EXPECT_EQ(Split("1\n-", "\n"), (Pieces{"1"}));
    EXPECT_EQ(Split("1\n&H", "\n"), (Pieces{"1"}));
    EXPECT_EQ(Split("1\n\x1a", "\n"), (Pieces{"1"}));
    EXPECT_EQ(Split("\n", "\n"), (Pieces{""}));
}

TEST(FastSplit, OverlappingDelimiterNeverCutsANegativeLength) {
    EXPECT_EQ(Split("aaa", "aa"), (Pieces{"", ""})) << "finds at 1 and 2; the empty last piece holds no number";
    EXPECT_EQ(Split("xaaa7", "aa"), (Pieces{"x", "", "7"}));
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
    for (const char* odd : {"", "-", "-0", "007", "+5", " 5", "5 ", "2147483648", "-2147483649", "12345678901",
                            "1.0", "5\r", "abc"})
        EXPECT_FALSE(ParseCanonicalKey(odd, key)) << odd;
}

TEST(DefinitionList, EveryLineCountsIncludingTheFirst) {
    DefinitionList list = DefinitionList::FromText("-9\n12\n5");
    ASSERT_EQ(Elements(list), (Pieces{"-9", "12", "5"}));
    EXPECT_EQ(FindDefinition(list, "-9"), 0) << "the first line is a listed address too";
    EXPECT_EQ(FindDefinition(list, "12"), 1);
    EXPECT_EQ(FindDefinition(list, "5"), 2);
    EXPECT_EQ(FindDefinition(list, std::int32_t{-9}), 0);
    EXPECT_EQ(FindDefinition(list, std::int32_t{5}), 2);
    EXPECT_EQ(FindDefinition(list, "7"), kNoDefinition);
    EXPECT_EQ(FindDefinition(list, std::int32_t{0}), kNoDefinition);
    EXPECT_EQ(list.FindText("-9"), 0);
}

TEST(DefinitionList, ListeningRowsAreNotBlockedByATrailingLineBreak) {
    // All keys negative: a stray "0" would sort last and match every listening row.
    DefinitionList list = DefinitionList::FromText("-100\r\n-200\r\n-300\r\n");
    EXPECT_EQ(list.size(), 3u);
    EXPECT_EQ(FindDefinition(list, std::int32_t{0}), kNoDefinition);
    EXPECT_EQ(FindDefinition(list, std::int32_t{-300}), 2);
}

TEST(DefinitionList, KeysMatchTheAddressesTheyName) {
    // 1.2.3.4 -> 67305985; 10.0.0.200 -> -939524086 (bytes in network order read little-endian).
    DefinitionList list = DefinitionList::FromText("-939524086\n67305985\n");
    EXPECT_EQ(FindDefinition(list, std::int32_t{0x04030201}), 1);
    EXPECT_EQ(FindDefinition(list, static_cast<std::int32_t>(0xC800000Au)), 0);
}

TEST(DefinitionList, IndexAnswersExactlyAsTheHalvingSearch) {
    // Random sorted lists with duplicates and odd lines: every probe answers as the text search.
    std::mt19937 random(7);
    for (int round = 0; round < 40; ++round) {
        std::vector<std::string> lines;
        int n = 1 + static_cast<int>(random() % 300);
        for (int i = 0; i < n; ++i) {
            auto value = static_cast<std::int32_t>(random() % 64) - 32;  // small range: many duplicates
            if (random() % 5 == 0) value = static_cast<std::int32_t>(random());
            lines.push_back(std::to_string(value));
            if (random() % 40 == 0) lines.push_back(random() % 2 ? "0042" : " 7");
            if (random() % 20 == 0) lines.push_back("");
        }
        std::sort(lines.begin(), lines.end());
        std::string text;
        for (const auto& line : lines) text += line + "\n";
        text.pop_back();
        // The normalised last piece may change the last line; sort order must still hold.
        DefinitionList list = DefinitionList::FromText(text);
        ASSERT_EQ(Elements(list), Split(text, "\n")) << "every line as the splitter gives it";
        if (!list.sorted()) continue;
        for (std::int32_t probe = -40; probe <= 40; ++probe) {
            char buffer[12];
            ASSERT_EQ(list.FindKey(probe), list.FindText(FormatKey(probe, buffer))) << "probe " << probe;
        }
        for (const auto& line : lines) {
            std::int32_t key = 0;
            if (ParseCanonicalKey(line, key)) {
                ASSERT_EQ(list.FindKey(key), list.FindText(line));
            }
        }
    }
}

TEST(DefinitionList, OutOfOrderFilesStillFindEveryListedKey) {
    DefinitionList list = DefinitionList::FromText("9\n10\n-1\n9\n3");
    EXPECT_FALSE(list.sorted());
    EXPECT_EQ(FindDefinition(list, std::int32_t{9}), 0);
    EXPECT_EQ(FindDefinition(list, std::int32_t{10}), 1);
    EXPECT_EQ(FindDefinition(list, std::int32_t{-1}), 2);
    EXPECT_EQ(FindDefinition(list, std::int32_t{3}), 4);
    EXPECT_EQ(FindDefinition(list, std::int32_t{4}), kNoDefinition);
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

    // Binary bytes, NULs included.
    std::mt19937 random(11);
    std::string binary;
    for (int i = 0; i < 4096; ++i) binary.push_back(static_cast<char>(random() & 0xFF));
    for (int i = 0; i < 4096; i += 97) binary.replace(static_cast<std::size_t>(i), 2, "\r\n");
    DefinitionList junk = DefinitionList::FromText(binary);
    EXPECT_GT(junk.size(), 1u);
    for (std::size_t i = 0; i < junk.size(); ++i) (void)junk.at(i);

    // Keys that overflow 32 bits never match the row key they would wrap to.
    DefinitionList overflow = DefinitionList::FromText("2147483648\n4294967297\n-2147483649\n5");
    EXPECT_EQ(FindDefinition(overflow, std::int32_t{INT32_MIN}), kNoDefinition);
    EXPECT_EQ(FindDefinition(overflow, std::int32_t{1}), kNoDefinition);
    EXPECT_EQ(FindDefinition(overflow, std::int32_t{5}), 3);
    EXPECT_EQ(FindDefinition(overflow, "2147483648"), 0) << "the text search still sees the line";

    // One giant line (no separator) and a giant line before a real key.
    std::string giant(100u << 20, '7');  // 100 MB, one line
    DefinitionList big = DefinitionList::FromText(giant);
    EXPECT_EQ(big.size(), 1u);
    EXPECT_EQ(FindDefinition(big, std::int32_t{7}), kNoDefinition);
    DefinitionList bigThenKey = DefinitionList::FromText(giant + "\n8");
    EXPECT_EQ(bigThenKey.size(), 2u);
    EXPECT_EQ(FindDefinition(bigThenKey, std::int32_t{8}), 1);
}

TEST(DefinitionList, StaysSmallInMemory) {
    std::vector<std::string> lines;
    for (std::int64_t i = 0; i < 100000; ++i) lines.push_back(std::to_string(i * 40503 - 2000000000));
    std::sort(lines.begin(), lines.end());
    std::string text;
    for (const auto& line : lines) text += line + "\r\n";
    DefinitionList list = DefinitionList::FromText(text);
    EXPECT_EQ(list.size(), 100000u);
    EXPECT_TRUE(list.sorted());
    EXPECT_LE(list.MemoryBytes(), 16u * list.size());

    // Blank lines cost next to nothing, other lines little more than their bytes.
    DefinitionList blanks = DefinitionList::FromText(std::string(1u << 20, '\n'));
    EXPECT_EQ(blanks.size(), 1u << 20);
    EXPECT_LE(blanks.MemoryBytes(), (1u << 20) / 2);
    std::string odd;
    for (int i = 0; i < 100000; ++i) odd += i % 2 ? "x\n" : "1\n";
    EXPECT_LE(DefinitionList::FromText(odd).MemoryBytes(), 4 * odd.size());
}

}  // namespace
}  // namespace vantorel
