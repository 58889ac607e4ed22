#include "controls/xpbutton/colour.h"

#include <algorithm>
#include <cmath>

namespace vantorel::xpbutton {

std::int32_t RoundHalfEven(double value) {
    // Values beyond the 32-bit range (a corrupt stored font size, say) saturate; NaN reads as 0.
    if (std::isnan(value)) return 0;
    if (value >= 2147483647.0) return INT32_MAX;
    if (value <= -2147483648.0) return INT32_MIN;
    double floor = std::floor(value);
    double diff = value - floor;
    if (diff > 0.5) return static_cast<std::int32_t>(floor) + 1;
    if (diff < 0.5) return static_cast<std::int32_t>(floor);
    auto f = static_cast<std::int64_t>(floor);
    return static_cast<std::int32_t>(f % 2 == 0 ? f : f + 1);
}

Rgb ShiftColor(Rgb colour, std::int32_t amount, bool scaleBlue, bool softBevel) {
    if (softBevel) amount /= 2;
    std::int32_t r = Red(colour) + amount;
    std::int32_t g = Green(colour) + amount;
    std::int32_t b = scaleBlue ? Blue(colour) + (Blue(colour) * amount) / 192 : Blue(colour) + amount;
    auto clamp = [amount](std::int32_t v) {
        if (amount > 0) return std::min(v, 255);
        if (amount < 0) return std::max(v, 0);
        return v;
    };
    return MakeRgb(clamp(r), clamp(g), clamp(b));
}

Rgb BlendToWhite(Rgb colour, std::int32_t a) {
    auto channel = [a](int c) { return std::min((c * (255 - a)) / 255 + a, 255); };
    return MakeRgb(channel(Red(colour)), channel(Green(colour)), channel(Blue(colour)));
}

}  // namespace vantorel::xpbutton
