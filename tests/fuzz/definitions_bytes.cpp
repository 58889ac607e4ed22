// Any bytes as sw2.def: loading ends without a crash or hang, the list holds the pieces the
// splitter cuts in memory bounded by the file's size, and every answer points at a line that holds
// the key (a listed row key is always found, even in a file out of order).
#include <cstdlib>
#include <string>
#include <vector>

#include "guard/definitions.h"

using namespace vantorel;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    const DefinitionList list = DefinitionList::FromText(text);
    std::vector<std::string> pieces;
    FastSplit(text, pieces, std::string(ChooseSeparator(text)));
    if (list.size() != pieces.size()) std::abort();
    if (list.MemoryBytes() > 64 * size + 4096) std::abort();

    char buffer[12];
    auto check = [&](const std::string& key) {
        const std::int32_t at = FindDefinition(list, key);
        if (at != kNoDefinition && (at < 0 || static_cast<std::size_t>(at) >= list.size() || list.at(at) != key))
            std::abort();
        std::int32_t rowKey = 0;
        if (!ParseCanonicalKey(key, rowKey)) return;
        const std::int32_t byKey = FindDefinition(list, rowKey);
        if (byKey != kNoDefinition && list.at(byKey) != FormatKey(rowKey, buffer)) std::abort();
    };
    for (std::size_t i = 0; i < pieces.size(); ++i) {
        if (list.at(i) != pieces[i]) std::abort();
        check(pieces[i]);
        std::int32_t rowKey = 0;
        if (ParseCanonicalKey(pieces[i], rowKey) && FindDefinition(list, rowKey) == kNoDefinition) std::abort();
    }
    return 0;
}
