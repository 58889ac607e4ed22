#include "settings/variant.h"

#include <cctype>
#include <cstdlib>

#include "settings/collection.h"

namespace vantorel {

std::string VariantText(const Variant& v) {
    if (const auto* text = std::get_if<std::string>(&v)) return *text;
    if (const auto* number = std::get_if<std::int32_t>(&v)) return std::to_string(*number);
    if (const auto* bytes = std::get_if<Bytes>(&v)) return std::string(bytes->begin(), bytes->end());
    return std::string();
}

std::optional<std::int32_t> VariantInt32(const Variant& v) {
    if (IsEmpty(v)) return 0;
    if (const auto* number = std::get_if<std::int32_t>(&v)) return *number;
    const auto* text = std::get_if<std::string>(&v);
    if (text == nullptr) return std::nullopt;
    std::size_t begin = text->find_first_not_of(" \t");
    std::size_t end = text->find_last_not_of(" \t");
    if (begin == std::string::npos) return std::nullopt;
    std::string digits = text->substr(begin, end - begin + 1);
    std::size_t i = (digits[0] == '-' || digits[0] == '+') ? 1 : 0;
    if (i == digits.size() || digits.size() - i > 10) return std::nullopt;
    for (std::size_t k = i; k < digits.size(); ++k)
        if (!std::isdigit(static_cast<unsigned char>(digits[k]))) return std::nullopt;
    long long value = std::strtoll(digits.c_str(), nullptr, 10);
    if (value < INT32_MIN || value > INT32_MAX) return std::nullopt;
    return static_cast<std::int32_t>(value);
}

bool EqualsIgnoringCase(std::string_view a, std::string_view b) {
    if (a.size() != b.size()) return false;
    for (std::size_t i = 0; i < a.size(); ++i)
        if (std::tolower(static_cast<unsigned char>(a[i])) != std::tolower(static_cast<unsigned char>(b[i])))
            return false;
    return true;
}

}  // namespace vantorel
