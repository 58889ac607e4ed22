// Reading sw2.def from the program's folder at start-up.
//
// The missing-file message and the updates window belong to the windows; start-up hands them in as
// `onMissing`, which runs once when the file cannot be used (not there, cannot be read, or larger
// than kMaxDefinitionsBytes), before the file is looked at again.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

#include "guard/definitions.h"
#include "platform/files.h"

namespace vantorel {

inline constexpr const char* kDefinitionsFileName = "sw2.def";
// The largest definitions file read: far beyond any real list (20 MB holds two million keys).
inline constexpr std::uint64_t kMaxDefinitionsBytes = 256u << 20;

// The definitions path: the program folder followed by "\sw2.def".
std::string DefinitionsPath(const std::string& programFolder);

// True when the file is there, can be opened for reading and holds at most kMaxDefinitionsBytes.
bool DefinitionsUsable(const std::string& path, platform::Files& files);

// Reads the whole file. When it cannot be used, calls `onMissing` (if set) and tries again.
// Returns nothing when the file still cannot be used or cannot be read.
std::optional<std::string> ReadDefinitions(const std::string& path, platform::Files& files,
                                           const std::function<void()>& onMissing);

// ReadDefinitions and the split into `list`. Returns false, leaving `list` empty, when there was
// nothing to read; start-up then carries on with an empty list.
bool LoadDefinitions(const std::string& path, platform::Files& files, const std::function<void()>& onMissing,
                     DefinitionList& list);

}  // namespace vantorel
