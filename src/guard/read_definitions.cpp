#include "guard/read_definitions.h"

namespace vantorel {

std::string DefinitionsPath(const std::string& programFolder) {
    return programFolder + "\\" + kDefinitionsFileName;
}

std::optional<std::string> ReadDefinitions(const std::string& path, platform::Files& files,
                                           const std::function<void()>& onMissing) {
    if (!files.Exists(path)) {
        if (onMissing) onMissing();
        if (!files.Exists(path)) return std::nullopt;
    }
    std::string text;
    if (!files.ReadAll(path, text)) return std::nullopt;
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
