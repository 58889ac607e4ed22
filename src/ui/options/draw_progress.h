// DrawProgress: paints a percentage bar with its label into a picture box.
#pragma once

#include <cstdint>

#include "platform/picture_box.h"

namespace vantorel {

// Highlight colour for the bar and the text, window colour for the background (system colour
// references), as the update panel paints them.
inline constexpr std::uint32_t kProgressForeColor = 0x8000000Du;
inline constexpr std::uint32_t kProgressBackColor = 0x80000005u;

// Clears `box` to `backColor`, writes the percent (at most 100) followed by "%" centred in
// `foreColor`, and lays the bar over it from the left with two XOR passes, so the part of the text
// under the bar shows in the background colour.
void DrawProgress(platform::PictureBox& box, std::int16_t percent, std::uint32_t foreColor, std::uint32_t backColor);

}  // namespace vantorel
