// Reading one field out of a raw HTTP response header (status line first, lines ending in CR LF).
#pragma once

#include <cctype>
#include <string>

namespace vantorel::platform {

// The value of the first field named `name` (compared without regard to case), with the blanks
// around it removed; empty when there is no such field.
inline std::string HeaderField(const std::string& header, const std::string& name) {
    std::size_t line = header.find('\n');  // the status line holds no fields
    while (line != std::string::npos && line + 1 < header.size()) {
        std::size_t start = line + 1;
        line = header.find('\n', start);
        std::size_t end = line == std::string::npos ? header.size() : line;
        std::size_t colon = header.find(':', start);
        if (colon == std::string::npos || colon >= end || colon - start != name.size()) continue;
        bool same = true;
        for (std::size_t i = 0; i < name.size() && same; ++i) {
            same = std::tolower(static_cast<unsigned char>(header[start + i])) ==
                   std::tolower(static_cast<unsigned char>(name[i]));
        }
        if (!same) continue;
        std::size_t first = header.find_first_not_of(" \t", colon + 1);
        std::size_t last = header.find_last_not_of(" \t\r", end - 1);
        if (first == std::string::npos || first >= end || last < first) return std::string();
        return header.substr(first, last - first + 1);
    }
    return std::string();
}

}  // namespace vantorel::platform
