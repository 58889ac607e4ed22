// Whether a downloaded text can stand in for sw2.def: the update check asks before the new file
// replaces the installed one, so an error page served as a success, an empty answer or binary
// bytes never leave the guard protecting against nothing.
#pragma once

#include <string>
#include <string_view>

namespace vantorel {

// Empty when `text` reads as a definitions list: at least one line, and every line (split at CR LF
// when the text holds a CR, else at LF; one final line break adds no line) a decimal integer with
// an optional "-" that fits a signed 32-bit number. Otherwise what is wrong with it, in words.
std::string DefinitionsListProblem(std::string_view text);

}  // namespace vantorel
