#include "download/leading_number.h"

#include <cctype>
#include <cmath>
#include <cstdlib>

namespace vantorel {

double LeadingNumber(const std::string& text) {
    std::size_t i = 0;
    const std::size_t n = text.size();
    while (i < n && (text[i] == ' ' || text[i] == '\t')) ++i;
    const std::size_t start = i;
    auto digits = [&] {
        std::size_t from = i;
        while (i < n && std::isdigit(static_cast<unsigned char>(text[i]))) ++i;
        return i - from;
    };
    if (i < n && (text[i] == '+' || text[i] == '-')) ++i;
    std::size_t count = digits();
    if (i < n && text[i] == '.') {
        ++i;
        count += digits();
    }
    if (count == 0) return 0.0;
    std::size_t end = i;
    if (i < n && (text[i] == 'e' || text[i] == 'E')) {
        ++i;
        if (i < n && (text[i] == '+' || text[i] == '-')) ++i;
        if (digits() > 0) end = i;
    }
    // strtod on a copy that holds only the number, so no locale or hex form can creep in.
    std::string number = text.substr(start, end - start);
    return std::strtod(number.c_str(), nullptr);  // too large reads as infinity
}

bool RoundToInt32(double value, std::int32_t& result) {
    if (!std::isfinite(value)) return false;
    double rounded = std::nearbyint(value);  // the default rounding mode: to nearest, halves to even
    if (rounded < -2147483648.0 || rounded > 2147483647.0) return false;
    result = static_cast<std::int32_t>(rounded);
    return true;
}

}  // namespace vantorel
