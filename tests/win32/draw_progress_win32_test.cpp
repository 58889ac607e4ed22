// DrawProgress with real GDI under Wine, on a picture box the size of the update panel's: the XOR
// passes leave the bar in the highlight colour and turn the label's strokes under it into the
// window colour; 0 percent draws no bar.
#include <windows.h>

#include <gtest/gtest.h>

#include "platform/win32/picture_box_win32.h"
#include "ui/options/draw_progress.h"

namespace vantorel {
namespace {

TEST(DrawProgressGdi, BarAndInvertedLabelOnARealBitmap) {
    win32::GdiPictureBox pb(393, 17);
    ASSERT_EQ(pb.TwipsPerPixelX(), 15) << "the sizes below assume 96 dots per inch";
    const COLORREF fore = ::GetSysColor(COLOR_HIGHLIGHT), back = ::GetSysColor(COLOR_WINDOW);
    ASSERT_NE(fore, back);

    DrawProgress(pb, 50, kProgressForeColor, kProgressBackColor);
    const int labelLeft = static_cast<int>((5865 - pb.TextWidth("50%")) / 2 / 15);
    const int labelRight = labelLeft + static_cast<int>(pb.TextWidth("50%") / 15);
    const int row = 8;
    EXPECT_EQ(pb.Pixel(0, row), back) << "the border column stays clear";
    EXPECT_EQ(pb.Pixel(1, row), fore);
    EXPECT_EQ(pb.Pixel(labelLeft - 5, row), fore);
    EXPECT_EQ(pb.Pixel(labelRight + 5, row), back);
    EXPECT_EQ(pb.Pixel(100, 0), back);

    // The bar covers the columns whose left edge lies before half of the inner width (5865 twips).
    for (int x = 0; x < 393; ++x) {
        if (x >= labelLeft - 1 && x <= labelRight + 1) continue;
        EXPECT_EQ(pb.Pixel(x, 2) == fore, x >= 1 && x * 15 < 5865 / 2.0) << "column " << x;
    }

    // Inside the label the text shows on both sides of the bar's end (column 195): under the bar
    // as pixels that are not the bar's colour, beyond it as pixels that are not the background.
    // (Wine smooths the glyphs, so their edges are blends of the two colours.)
    int strokesUnderBar = 0, strokesBeyond = 0;
    for (int y = 1; y < 15; ++y) {
        for (int x = labelLeft; x <= labelRight; ++x) {
            if (x <= 195 && pb.Pixel(x, y) != fore) ++strokesUnderBar;
            if (x > 195 && pb.Pixel(x, y) != back) ++strokesBeyond;
        }
    }
    EXPECT_GT(strokesUnderBar, 5);
    EXPECT_GT(strokesBeyond, 5);

    // 0 percent: nothing in the highlight colour outside the label.
    DrawProgress(pb, 0, kProgressForeColor, kProgressBackColor);
    const int zeroLeft = static_cast<int>((5865 - pb.TextWidth("0%")) / 2 / 15);
    const int zeroRight = zeroLeft + static_cast<int>(pb.TextWidth("0%") / 15);
    int outside = 0;
    for (int y = 0; y < 17; ++y)
        for (int x = 0; x < 393; ++x)
            if ((x < zeroLeft - 1 || x > zeroRight + 1) && pb.Pixel(x, y) != back) ++outside;
    EXPECT_EQ(outside, 0);
}

}  // namespace
}  // namespace vantorel
