// The definitions list: the blocked remote addresses read from sw2.def at start.
//
// The file holds one key per line, each a connection's remote address field read as a signed
// 32-bit integer and written in decimal, in ascending order by plain byte comparison. The list is
// built once at start-up and searched by the connection sweep for every row it examines, so the
// in-memory form is compact whatever the file holds: canonical keys are kept as 32-bit integers in
// file order, a blank line costs two bits, the rare line that is not a canonical key keeps only its
// bytes and a 4-byte end mark, and a small open-addressing index answers a row key in one or two
// cache lines. Lookups answer exactly as the halving search over the texts would on a
// correctly sorted file.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace vantorel {

// Result of FindDefinition when the key is not in the list. Positions start at 0, so a miss must be
// told apart from the first line.
inline constexpr std::int32_t kNoDefinition = -1;

// Calls onPiece(piece, isLast) for every piece of `expression` between occurrences of `delimiter`.
// After a find at position p the search goes on from p + 1, as the splitter always has; pieces of an
// overlapping delimiter come out empty instead of with a negative length. With an empty expression or
// delimiter there is one piece, the whole expression. Returns the number of separators found.
template <typename OnPiece>
std::size_t SplitPieces(std::string_view expression, std::string_view delimiter, OnPiece&& onPiece) {
    if (expression.empty() || delimiter.empty()) {
        onPiece(expression, true);
        return 0;
    }
    std::size_t finds = 0;
    std::size_t pieceStart = 0;
    std::size_t pos = expression.find(delimiter);
    while (pos != std::string_view::npos) {
        std::size_t end = pos > pieceStart ? pos : pieceStart;
        onPiece(expression.substr(pieceStart, end - pieceStart), false);
        ++finds;
        pieceStart = pos + delimiter.size();
        pos = expression.find(delimiter, pos + 1);
    }
    onPiece(pieceStart <= expression.size() ? expression.substr(pieceStart) : std::string_view(), true);
    return finds;
}

// Reads the leading number of `text` the way the splitter normalises its last piece: blanks, tabs
// and line feeds are skipped anywhere, then an optional sign, digits, an optional fraction and
// exponent, or "&H"/"&O" followed by hexadecimal/octal digits; reading stops at the first character
// that cannot continue the number. Returns the number in plain decimal form ("0042" -> "42"), or
// nothing when the text holds no number at all.
std::optional<std::string> ReadLeadingNumber(std::string_view text);

// Splits `expression` at `delimiter` into `resultSplit` (its former content is replaced). The last
// piece is normalised by ReadLeadingNumber; a last piece that holds no number (an empty piece after a
// final line break, say) adds no element, so a file never gains a key "0" it does not list. A text
// without any separator is one element, unchanged. The result is always 0.
std::int32_t FastSplit(const std::string& expression, std::vector<std::string>& resultSplit,
                       const std::string& delimiter);

// The separator of a definitions text: CR LF when it holds a CR anywhere, else LF.
std::string_view ChooseSeparator(std::string_view text);

// True when `text` is a key exactly as a row writes it: an optional "-", no leading zeros, within
// the signed 32-bit range ("0" is canonical, "-0" is not).
bool ParseCanonicalKey(std::string_view text, std::int32_t& key);

// Writes `key` in canonical form into `buffer` (at least 11 characters) and returns the text.
std::string_view FormatKey(std::int32_t key, char* buffer);

class DefinitionList {
public:
    DefinitionList() = default;

    // Splits a whole definitions text with the separator it calls for and builds the list. Gives the
    // same elements as FastSplit with ChooseSeparator.
    static DefinitionList FromText(std::string_view text);

    std::size_t size() const { return lines_; }
    bool empty() const { return lines_ == 0; }

    // The element at `position` as text.
    std::string at(std::size_t position) const;

    // The halving search of the list for `key` by plain byte comparison: the position where it
    // stops on the key, or kNoDefinition.
    std::int32_t FindText(std::string_view key) const;

    // The same answer for a row's key without any text work: one probe of the index. On a list out
    // of order, every listed key is still found (at its first line).
    std::int32_t FindKey(std::int32_t key) const;

    // True when the lines stand in ascending byte order, as the file format requires.
    bool sorted() const { return sorted_; }

    // Bytes held on the heap by the list after loading.
    std::size_t MemoryBytes() const;

private:
    // The index: open addressing over buckets of one cache line each, filled to about three
    // quarters. A key's bucket is picked by its hash; a full bucket spills into the next. A bucket
    // holds eight keys and, beside them, their positions plus one (0 marks a free slot; slots fill
    // from the left and are never freed), so one lookup compares the eight keys at once and nearly
    // always reads a single cache line, listed key or not.
    static constexpr std::size_t kSlotsPerBucket = 8;
    struct alignas(64) Bucket {
        std::int32_t keys[kSlotsPerBucket];
        std::uint32_t positionsPlusOne[kSlotsPerBucket];
    };

    // One bit per line, with the count of set bits before every 64 lines.
    struct LineBits {
        std::vector<std::uint64_t> words;
        std::vector<std::uint32_t> before;
        void Resize(std::size_t lines) { words.assign((lines + 63) / 64, 0); }
        void Set(std::size_t line) { words[line / 64] |= std::uint64_t{1} << (line % 64); }
        void Count();
        bool Test(std::size_t line) const { return (words[line / 64] >> (line % 64)) & 1; }
        std::size_t Rank(std::size_t line) const;  // set bits before `line`
        std::size_t Bytes() const { return words.capacity() * 8 + before.capacity() * 4; }
    };

    std::string_view TextAt(std::size_t position, char* buffer) const;
    std::size_t BucketFor(std::int32_t key) const;
    // The key's slot, or the free slot where it belongs, as (bucket, index in the bucket).
    std::pair<std::size_t, std::size_t> SlotOf(std::int32_t key) const;
    void BuildIndex();

    std::size_t lines_ = 0;
    std::vector<std::int32_t> keys_;      // the lines that are canonical keys, in file order
    LineBits blank_;                      // empty lines
    LineBits odd_;                        // other lines that are not canonical keys
    std::string oddText_;                 // their bytes, one after the other
    std::vector<std::uint32_t> oddEnds_;  // where each one ends in oddText_
    std::vector<Bucket> buckets_;
    bool sorted_ = true;
};

// The program-wide definitions list, filled once at start.
extern DefinitionList Definitions;

// Position of `key` in `list`, or kNoDefinition. A key in the form a row writes goes through the
// index; any other text is searched by halving with byte comparison (it can only match an odd line).
std::int32_t FindDefinition(const DefinitionList& list, std::string_view key);
std::int32_t FindDefinition(const DefinitionList& list, std::int32_t key);

}  // namespace vantorel
