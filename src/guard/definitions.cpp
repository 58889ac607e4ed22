#include "guard/definitions.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace vantorel {

DefinitionList Definitions;

namespace {

bool IsSkippedBlank(char c) { return c == ' ' || c == '\t' || c == '\n'; }
bool IsDigit(char c) { return c >= '0' && c <= '9'; }

int DigitValue(char c, int base) {
    int v = -1;
    if (c >= '0' && c <= '9') v = c - '0';
    else if (c >= 'a' && c <= 'f') v = c - 'a' + 10;
    else if (c >= 'A' && c <= 'F') v = c - 'A' + 10;
    return v < base ? v : -1;
}

// Strips leading zeros from a run of decimal digits, keeping at least one digit.
std::string WithoutLeadingZeros(const std::string& digits) {
    std::size_t first = digits.find_first_not_of('0');
    return first == std::string::npos ? std::string("0") : digits.substr(first);
}

// Writes a double in plain decimal form, without an exponent.
std::string PlainDecimal(double value) {
    if (value == 0 || !std::isfinite(value)) return "0";
    char buffer[400];
    if (std::fabs(value) < 1e15 && value == std::floor(value)) {
        std::snprintf(buffer, sizeof buffer, "%.0f", value);
        return buffer;
    }
    std::snprintf(buffer, sizeof buffer, "%.15g", value);
    if (std::strchr(buffer, 'e') == nullptr) return buffer;
    // Large or tiny magnitudes: 15 significant digits written out in full.
    std::snprintf(buffer, sizeof buffer, std::fabs(value) >= 1 ? "%.0f" : "%.17f", value);
    std::string text = buffer;
    if (text.find('.') != std::string::npos) {
        while (text.back() == '0') text.pop_back();
        if (text.back() == '.') text.pop_back();
    }
    return text;
}

}  // namespace

std::optional<std::string> ReadLeadingNumber(std::string_view text) {
    // Blanks, tabs and line feeds anywhere are skipped: collect the characters that matter.
    std::string chars;
    chars.reserve(std::min<std::size_t>(text.size(), 64));
    std::size_t i = 0;
    auto next = [&]() -> char {
        while (i < text.size() && IsSkippedBlank(text[i])) ++i;
        return i < text.size() ? text[i] : '\0';
    };

    char c = next();
    if (c == '&') {
        ++i;
        char kind = next();
        int base = (kind == 'H' || kind == 'h') ? 16 : (kind == 'O' || kind == 'o') ? 8 : 0;
        if (base == 0) return std::nullopt;
        ++i;
        std::uint64_t value = 0;
        bool any = false;
        for (c = next(); DigitValue(c, base) >= 0; ++i, c = next()) {
            any = true;
            std::uint64_t digit = static_cast<std::uint64_t>(DigitValue(c, base));
            if (value > (UINT64_MAX - digit) / static_cast<std::uint64_t>(base)) break;  // stays bounded
            value = value * static_cast<std::uint64_t>(base) + digit;
        }
        if (!any) return std::nullopt;
        return std::to_string(value);
    }

    bool negative = false;
    if (c == '-' || c == '+') {
        negative = c == '-';
        ++i;
        c = next();
    }
    std::string whole;
    for (; IsDigit(c); ++i, c = next()) whole.push_back(c);
    std::string fraction;
    bool point = false;
    if (c == '.') {
        point = true;
        ++i;
        for (c = next(); IsDigit(c); ++i, c = next()) fraction.push_back(c);
    }
    if (whole.empty() && fraction.empty()) return std::nullopt;

    std::string exponent;
    if (c == 'e' || c == 'E' || c == 'd' || c == 'D') {
        std::size_t save = i;
        ++i;
        std::string digits;
        c = next();
        if (c == '-' || c == '+') {
            digits.push_back(c);
            ++i;
            c = next();
        }
        std::size_t signLength = digits.size();
        for (; IsDigit(c); ++i, c = next()) digits.push_back(c);
        if (digits.size() > signLength) exponent = digits;
        else i = save;
    }

    if (!point && exponent.empty()) {
        // A plain integer keeps every digit, however long.
        std::string digits = WithoutLeadingZeros(whole);
        if (digits == "0") return std::string("0");
        if (negative) digits.insert(digits.begin(), '-');
        return digits;
    }
    std::string number(negative ? "-" : "");
    number.append(whole.empty() ? "0" : whole).append(".").append(fraction);
    if (!exponent.empty()) {
        // Exponents far outside a double's range are clamped before they reach strtod.
        long e = std::strtol(exponent.c_str(), nullptr, 10);
        e = std::clamp(e, -400L, 400L);
        number.append("e").append(std::to_string(e));
    }
    return PlainDecimal(std::strtod(number.c_str(), nullptr));
}

std::int32_t FastSplit(const std::string& expression, std::vector<std::string>& resultSplit,
                       const std::string& delimiter) {
    std::size_t count = 1;
    if (!expression.empty() && !delimiter.empty()) {
        for (std::size_t p = expression.find(delimiter); p != std::string::npos; p = expression.find(delimiter, p + 1))
            ++count;
    }
    resultSplit.clear();
    resultSplit.reserve(count);
    SplitPieces(expression, delimiter, [&](std::string_view piece, bool last) {
        if (!last) {
            resultSplit.emplace_back(piece);
        } else if (resultSplit.empty()) {
            resultSplit.emplace_back(piece);  // no separator: the whole text, as it stands
        } else if (auto number = ReadLeadingNumber(piece)) {
            resultSplit.push_back(std::move(*number));
        }
    });
    return 0;
}

std::string_view ChooseSeparator(std::string_view text) {
    return text.find('\r') != std::string_view::npos ? std::string_view("\r\n") : std::string_view("\n");
}

bool ParseCanonicalKey(std::string_view text, std::int32_t& key) {
    std::size_t i = 0;
    bool negative = false;
    if (!text.empty() && text[0] == '-') {
        negative = true;
        i = 1;
    }
    std::size_t digits = text.size() - i;
    if (digits == 0 || digits > 10) return false;
    if (text[i] == '0' && (digits > 1 || negative)) return false;
    std::int64_t value = 0;
    for (; i < text.size(); ++i) {
        if (!IsDigit(text[i])) return false;
        value = value * 10 + (text[i] - '0');
    }
    if (negative) value = -value;
    if (value < INT32_MIN || value > INT32_MAX) return false;
    key = static_cast<std::int32_t>(value);
    return true;
}

std::string_view FormatKey(std::int32_t key, char* buffer) {
    char digits[11];
    std::uint32_t magnitude = key < 0 ? 0u - static_cast<std::uint32_t>(key) : static_cast<std::uint32_t>(key);
    int n = 0;
    do {
        digits[n++] = static_cast<char>('0' + magnitude % 10);
        magnitude /= 10;
    } while (magnitude != 0);
    std::size_t length = 0;
    if (key < 0) buffer[length++] = '-';
    while (n > 0) buffer[length++] = digits[--n];
    return std::string_view(buffer, length);
}

void DefinitionList::LineBits::Count() {
    before.resize(words.size());
    std::uint32_t count = 0;
    for (std::size_t i = 0; i < words.size(); ++i) {
        before[i] = count;
        count += static_cast<std::uint32_t>(__builtin_popcountll(words[i]));
    }
}

std::size_t DefinitionList::LineBits::Rank(std::size_t line) const {
    std::uint64_t below = words[line / 64] & ((std::uint64_t{1} << (line % 64)) - 1);
    return before[line / 64] + static_cast<std::size_t>(__builtin_popcountll(below));
}

DefinitionList DefinitionList::FromText(std::string_view text) {
    std::string_view separator = ChooseSeparator(text);
    // Every line in file order, the last piece normalised as the splitter does (a text without any
    // separator is one line, as it stands).
    auto forEachLine = [&](auto&& onLine) {
        bool any = false;
        SplitPieces(text, separator, [&](std::string_view piece, bool last) {
            if (!last || !any) {
                onLine(piece);
                any = true;
            } else if (auto number = ReadLeadingNumber(piece)) {
                onLine(std::string_view(*number));
            }
        });
    };
    // The pieces are counted first (no parsing): room for every line's bits and for a key on every
    // line that is not blank, given back at the end when other lines took much of it.
    std::size_t pieces = 0, blanks = 0;
    SplitPieces(text, separator, [&](std::string_view piece, bool last) {
        ++pieces;
        if (piece.empty() && !last) ++blanks;
    });
    DefinitionList list;
    list.blank_.Resize(pieces);
    list.odd_.Resize(pieces);
    list.keys_.reserve(pieces - blanks);
    std::string_view previous;  // the previous line, for the order check
    std::size_t position = 0;
    forEachLine([&](std::string_view line) {
        if (position > 0 && previous.compare(line) > 0) list.sorted_ = false;
        previous = line;
        std::int32_t key = 0;
        if (line.empty()) {
            list.blank_.Set(position);
        } else if (ParseCanonicalKey(line, key)) {
            list.keys_.push_back(key);
        } else {
            list.odd_.Set(position);
            list.oddText_.append(line);
            list.oddEnds_.push_back(static_cast<std::uint32_t>(list.oddText_.size()));
        }
        ++position;
    });
    list.lines_ = position;
    if (list.keys_.capacity() > list.keys_.size() + list.keys_.size() / 8 + 64) list.keys_.shrink_to_fit();
    list.oddText_.shrink_to_fit();
    list.oddEnds_.shrink_to_fit();
    list.blank_.Count();
    list.odd_.Count();
    list.BuildIndex();
    return list;
}

std::string_view DefinitionList::TextAt(std::size_t position, char* buffer) const {
    if (blank_.Test(position)) return {};
    if (odd_.Test(position)) {
        std::size_t k = odd_.Rank(position);
        std::size_t begin = k == 0 ? 0 : oddEnds_[k - 1];
        return std::string_view(oddText_).substr(begin, oddEnds_[k] - begin);
    }
    return FormatKey(keys_[position - blank_.Rank(position) - odd_.Rank(position)], buffer);
}

std::string DefinitionList::at(std::size_t position) const {
    char buffer[12];
    return std::string(TextAt(position, buffer));
}

std::int32_t DefinitionList::FindText(std::string_view key) const {
    if (lines_ == 0) return kNoDefinition;
    std::int64_t lo = 0;
    std::int64_t hi = static_cast<std::int64_t>(lines_) - 1;
    char buffer[12];
    while (lo <= hi) {
        std::int64_t mid = (lo + hi) / 2;
        int order = TextAt(static_cast<std::size_t>(mid), buffer).compare(key);
        if (order < 0) lo = mid + 1;
        else if (order == 0) return static_cast<std::int32_t>(mid);
        else hi = mid - 1;
    }
    return kNoDefinition;
}

std::size_t DefinitionList::BucketFor(std::int32_t key) const {
    // Multiplicative hash; its high bits pick the bucket (no power-of-two size needed).
    std::uint64_t h = static_cast<std::uint64_t>(static_cast<std::uint32_t>(key)) * 0x9E3779B97F4A7C15ull;
    return static_cast<std::size_t>((static_cast<unsigned __int128>(h) * buckets_.size()) >> 64);
}

std::pair<std::size_t, std::size_t> DefinitionList::SlotOf(std::int32_t key) const {
    for (std::size_t b = BucketFor(key);; b = b + 1 == buckets_.size() ? 0 : b + 1) {
        const Bucket& bucket = buckets_[b];
        for (std::size_t i = 0; i < kSlotsPerBucket; ++i)
            if (bucket.positionsPlusOne[i] == 0 || bucket.keys[i] == key) return {b, i};
    }
}

void DefinitionList::BuildIndex() {
    // Room for the distinct keys: a sorted file lists a repeated key on neighbouring lines, so
    // counting the changes from one key to the next counts them (a file out of order only gets a
    // roomier index).
    std::size_t distinct = 0;
    for (std::size_t k = 0; k < keys_.size(); ++k) distinct += k == 0 || keys_[k] != keys_[k - 1] ? 1 : 0;
    buckets_.assign(distinct / 6 + 1, Bucket{});  // at most 6 of 8 slots filled on average
    std::vector<std::int32_t> repeated;
    std::size_t k = 0;
    for (std::size_t i = 0; i < lines_; ++i) {
        if (blank_.Test(i) || odd_.Test(i)) continue;
        const std::int32_t key = keys_[k++];
        auto [b, slot] = SlotOf(key);
        Bucket& bucket = buckets_[b];
        if (bucket.positionsPlusOne[slot] == 0) {
            bucket.keys[slot] = key;
            bucket.positionsPlusOne[slot] = static_cast<std::uint32_t>(i + 1);
        } else if (sorted_ && (repeated.empty() || repeated.back() != key)) {
            repeated.push_back(key);
        }
    }
    if (!repeated.empty()) {
        // A key listed on several lines: the halving search stops on one of them, not always the
        // first. Record where it stops so both searches answer alike.
        char buffer[12];
        for (std::int32_t key : repeated) {
            auto [b, slot] = SlotOf(key);
            buckets_[b].positionsPlusOne[slot] = static_cast<std::uint32_t>(FindText(FormatKey(key, buffer)) + 1);
        }
    }
}

std::int32_t DefinitionList::FindKey(std::int32_t key) const {
    if (buckets_.empty()) return kNoDefinition;
#if defined(__SSE2__)
    const __m128i wanted = _mm_set1_epi32(key);
    const __m128i zero = _mm_setzero_si128();
    for (std::size_t b = BucketFor(key);; b = b + 1 == buckets_.size() ? 0 : b + 1) {
        const Bucket& bucket = buckets_[b];
        auto mask = [](__m128i equal) { return _mm_movemask_ps(_mm_castsi128_ps(equal)); };
        const auto* keys = reinterpret_cast<const __m128i*>(bucket.keys);
        const auto* positions = reinterpret_cast<const __m128i*>(bucket.positionsPlusOne);
        int free = mask(_mm_cmpeq_epi32(_mm_load_si128(positions), zero)) |
                   mask(_mm_cmpeq_epi32(_mm_load_si128(positions + 1), zero)) << 4;
        int match = (mask(_mm_cmpeq_epi32(_mm_load_si128(keys), wanted)) |
                     mask(_mm_cmpeq_epi32(_mm_load_si128(keys + 1), wanted)) << 4) &
                    ~free;
        if (match != 0) return static_cast<std::int32_t>(bucket.positionsPlusOne[__builtin_ctz(match)] - 1);
        if (free != 0) return kNoDefinition;
    }
#else
    auto [b, slot] = SlotOf(key);
    std::uint32_t positionPlusOne = buckets_[b].positionsPlusOne[slot];
    return positionPlusOne == 0 ? kNoDefinition : static_cast<std::int32_t>(positionPlusOne - 1);
#endif
}

std::size_t DefinitionList::MemoryBytes() const {
    return keys_.capacity() * sizeof(std::int32_t) + buckets_.capacity() * sizeof(Bucket) + blank_.Bytes() +
           odd_.Bytes() + oddText_.capacity() + oddEnds_.capacity() * sizeof(std::uint32_t);
}

std::int32_t FindDefinition(const DefinitionList& list, std::string_view key) {
    std::int32_t rowKey = 0;
    if (ParseCanonicalKey(key, rowKey)) return list.FindKey(rowKey);
    return list.FindText(key);
}

std::int32_t FindDefinition(const DefinitionList& list, std::int32_t key) { return list.FindKey(key); }

}  // namespace vantorel
