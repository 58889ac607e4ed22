#include "ui/options/draw_progress.h"

#include <cmath>
#include <string>

namespace vantorel {

void DrawProgress(platform::PictureBox& box, std::int16_t percent, std::uint32_t foreColor, std::uint32_t backColor) {
    box.SetAutoRedraw(true);
    const double tx = box.TwipsPerPixelX();
    const double ty = box.TwipsPerPixelY();
    const double w = std::nearbyint(box.ScaleWidth() - 2 * tx);
    const double h = std::nearbyint(box.ScaleHeight() - 2 * ty);
    box.SetBackColor(backColor);
    box.SetForeColor(foreColor);
    if (percent > 100) percent = 100;
    const std::string text = std::to_string(percent) + "%";

    box.SetDrawMode(platform::DrawMode::CopyPen);
    box.SetCurrentX((w - box.TextWidth(text)) / 2);
    box.SetCurrentY((h - box.TextHeight(text)) / 2);
    box.Print(text);

    box.SetDrawMode(platform::DrawMode::XorPen);
    const double right = w / 100 * percent;
    if (right <= tx) return;  // 0 (or less) is no bar, not a sliver turned back over the border
    box.FillBox(tx, ty, right, h, foreColor);
    box.FillBox(tx, ty, right, h, backColor);
}

}  // namespace vantorel
