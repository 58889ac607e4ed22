// Reading sw2.def from the program's folder at start-up.
//
// The missing-file message and the updates window belong to the windows; start-up hands them in as
// `onMissing`, which runs once when the file is not there, before the file is looked for again.
#pragma once

#include <functional>
#include <optional>
#include <string>

#include "guard/definitions.h"
#include "platform/files.h"

namespace vantorel {

inline constexpr const char* kDefinitionsFileName = "sw2.def";

// The definitions path: the program folder followed by "\sw2.def".
std::string DefinitionsPath(const std::string& programFolder);

// Reads the whole file. When it does not exist, calls `onMissing` (if set) and tries again.
// Returns nothing when the file is still missing or cannot be read.
std::optional<std::string> ReadDefinitions(const std::string& path, platform::Files& files,
                                           const std::function<void()>& onMissing);

// ReadDefinitions and the split into `list`. Returns false, leaving `list` empty, when there was
// nothing to read; start-up then carries on with an empty list.
bool LoadDefinitions(const std::string& path, platform::Files& files, const std::function<void()>& onMissing,
                     DefinitionList& list);

}  // namespace vantorel
