// Reading numbers out of texts the way the program's version files and HTTP headers are read:
// the leading decimal number of a text, and rounding to a 32-bit integer with halves to even.
#pragma once

#include <cstdint>
#include <string>

namespace vantorel {

// The number at the start of `text`: leading blanks are skipped, then an optional sign, digits,
// an optional fraction and an optional exponent; reading stops at the first character that cannot
// continue the number. 0 when there is no number ("1.10" reads as 1.1, "21\r\n" as 21).
double LeadingNumber(const std::string& text);

// Rounds to the nearest integer, halves to the even neighbour. False, leaving `result` alone, when
// the value does not fit a signed 32-bit integer (or is not a number).
bool RoundToInt32(double value, std::int32_t& result);

}  // namespace vantorel
