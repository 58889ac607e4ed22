#include "guard/read_definitions.h"

namespace vantorel {

std::string DefinitionsPath(const std::string& programFolder) { return programFolder + "\\" + kDefinitionsFileName; }

bool DefinitionsUsable(const std::string& path, platform::Files& files) {
    std::optional<std::uint64_t> size = files.ReadableSize(path);
    return size && *size <= kMaxDefinitionsBytes;
}

std::optional<std::string> ReadDefinitions(const std::string& path, platform::Files& files,
                                           const std::function<void()>& onMissing) {
    if (!DefinitionsUsable(path, files)) {
        if (onMissing) onMissing();
        if (!DefinitionsUsable(path, files)) return std::nullopt;
    }
    std::string text;
    // A file that grew past the limit since it was looked at is not kept either.
    if (!files.ReadAll(path, text) || text.size() > kMaxDefinitionsBytes) return std::nullopt;
    return text;
}

bool LoadDefinitions(const std::string& path, platform::Files& files, const std::function<void()>& onMissing,
                     DefinitionList& list) {
    std::optional<std::string> text = ReadDefinitions(path, files, onMissing);
    if (!text) {
        list = DefinitionList();
        return false;
    }
    list = DefinitionList::FromText(*text);
    return true;
}

}  // namespace vantorel
