// A correctly sorted sw2.def answers every lookup, by text and by row key, exactly as the halving
// search over the split texts: keys listed, absent, next to listed ones, repeated, or odd lines.
#include <fuzzer/FuzzedDataProvider.h>

#include <algorithm>
#include <cstdlib>
#include <string>
#include <vector>

#include "guard/definitions.h"

using namespace vantorel;

namespace {
std::int32_t HalvingSearch(const std::vector<std::string>& list, const std::string& key) {
    std::int64_t lo = 0, hi = static_cast<std::int64_t>(list.size()) - 1;
    while (lo <= hi) {
        const std::int64_t mid = (lo + hi) / 2;
        const int order = list[mid].compare(key);
        if (order == 0) return static_cast<std::int32_t>(mid);
        if (order < 0) lo = mid + 1;
        else hi = mid - 1;
    }
    return kNoDefinition;
}
}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    FuzzedDataProvider in(data, size);
    const bool crlf = in.ConsumeBool(), finalBreak = in.ConsumeBool(), rowKeys = in.ConsumeBool();
    const std::string separator = crlf ? "\r\n" : "\n";
    std::vector<std::string> lines;
    char buffer[12];
    if (rowKeys) {  // real keys, some listed twice
        while (in.remaining_bytes() >= 4) {
            lines.emplace_back(FormatKey(in.ConsumeIntegral<std::int32_t>(), buffer));
            if (in.ConsumeProbability<float>() < 0.1f) lines.push_back(lines.back());
        }
    } else {  // any lines, odd ones included
        for (const std::string rest = in.ConsumeRemainingBytesAsString(); const char c : rest) {
            if (lines.empty() || c == '\n') lines.emplace_back();
            if (c != '\n' && (crlf || c != '\r')) lines.back().push_back(c);
        }
    }
    std::sort(lines.begin(), lines.end());
    std::string text;
    for (std::size_t i = 0; i < lines.size(); ++i) text += (i == 0 ? "" : separator) + lines[i];
    if (finalBreak) text += separator;

    std::vector<std::string> split;
    FastSplit(text, split, std::string(ChooseSeparator(text)));
    if (!std::is_sorted(split.begin(), split.end())) return -1;  // not a correctly sorted file
    const DefinitionList list = DefinitionList::FromText(text);

    std::vector<std::string> keys = split;
    for (const std::string& line : split) {
        std::int32_t key = 0;
        if (!ParseCanonicalKey(line, key)) continue;
        if (key != INT32_MIN) keys.emplace_back(FormatKey(key - 1, buffer));
        if (key != INT32_MAX) keys.emplace_back(FormatKey(key + 1, buffer));
    }
    for (const std::string& key : {"0", "-1", "", "-", "00", "-0", "2147483648", "-2147483648"}) keys.push_back(key);
    for (const std::string& key : keys) {
        const std::int32_t expected = HalvingSearch(split, key);
        if (FindDefinition(list, key) != expected) std::abort();
        std::int32_t rowKey = 0;
        if (ParseCanonicalKey(key, rowKey) && FindDefinition(list, rowKey) != expected) std::abort();
    }
    return 0;
}
