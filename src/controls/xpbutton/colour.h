// The button's colour arithmetic on packed 0x00BBGGRR values, and rounding to nearest with halves
// to even.
#pragma once

#include <cstdint>

#include "platform/canvas.h"

namespace vantorel::xpbutton {

using platform::Rgb;

// Rounds to the nearest integer, halves to even (0.5 -> 0, 1.5 -> 2, -1.5 -> -2). Values beyond the
// 32-bit range saturate; NaN gives 0.
std::int32_t RoundHalfEven(double value);

// Adds `amount` to each channel (halved first, toward zero, when `softBevel`); with `scaleBlue`
// blue gains blue × amount / 192 instead. Channels clamp at 255 for a positive amount and at 0
// for a negative one.
Rgb ShiftColor(Rgb colour, std::int32_t amount, bool scaleBlue, bool softBevel);

// Each channel c' = c × (255 − a) / 255 + a, clamped to at most 255.
Rgb BlendToWhite(Rgb colour, std::int32_t a);

inline constexpr Rgb MakeRgb(int r, int g, int b) {
    return static_cast<Rgb>(r) | (static_cast<Rgb>(g) << 8) | (static_cast<Rgb>(b) << 16);
}
inline constexpr int Red(Rgb c) { return static_cast<int>(c & 0xFF); }
inline constexpr int Green(Rgb c) { return static_cast<int>((c >> 8) & 0xFF); }
inline constexpr int Blue(Rgb c) { return static_cast<int>((c >> 16) & 0xFF); }

}  // namespace vantorel::xpbutton
