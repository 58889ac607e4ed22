#include "guard/definitions_check.h"

#include <cstdint>

namespace vantorel {
namespace {

bool IsKey(std::string_view line) {
    std::size_t digits = !line.empty() && line[0] == '-' ? 1 : 0;
    if (digits == line.size()) return false;
    const std::int64_t limit = digits == 1 ? 2147483648LL : 2147483647LL;
    std::int64_t value = 0;
    for (std::size_t i = digits; i < line.size(); ++i) {
        if (line[i] < '0' || line[i] > '9') return false;
        value = value * 10 + (line[i] - '0');
        if (value > limit) return false;
    }
    return true;
}

}  // namespace

std::string DefinitionsListProblem(std::string_view text) {
    if (text.empty()) return "it is empty";
    const std::string_view separator = text.find('\r') != std::string_view::npos ? "\r\n" : "\n";
    std::size_t line = 1, start = 0;
    while (start < text.size()) {
        std::size_t end = text.find(separator, start);
        if (end == std::string_view::npos) end = text.size();
        if (!IsKey(text.substr(start, end - start))) return "line " + std::to_string(line) + " is not an address key";
        start = end + separator.size();
        ++line;
    }
    return std::string();
}

}  // namespace vantorel
