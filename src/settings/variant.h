// The values settings pass around: empty, text, a 32-bit signed integer or an array of bytes.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace vantorel {

using Bytes = std::vector<std::uint8_t>;
using Variant = std::variant<std::monostate, std::string, std::int32_t, Bytes>;

inline bool IsEmpty(const Variant& v) { return std::holds_alternative<std::monostate>(v); }

// The value as text: a number in decimal with no leading blank, bytes as the characters they are.
std::string VariantText(const Variant& v);

// The value as a 32-bit integer: empty is 0, a text must be a decimal integer in range (blanks
// around it allowed). Nothing for anything else.
std::optional<std::int32_t> VariantInt32(const Variant& v);

}  // namespace vantorel
