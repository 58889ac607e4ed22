// The progress painter on a picture box that keeps its pixels: what the user sees for 50, 150 and
// 0 percent on a box the size of the update panel's (5895 × 255 twips at 15 twips per pixel).
#include "ui/options/draw_progress.h"

#include <gtest/gtest.h>

#include "fakes/fake_picture_box.h"

namespace vantorel {
namespace {

using testing::FakePictureBox;

const std::uint32_t kFore = FakePictureBox::Resolve(kProgressForeColor);
const std::uint32_t kBack = FakePictureBox::Resolve(kProgressBackColor);

TEST(DrawProgress, HalfBarShowsTheLabelInverseWhereTheBarCoversIt) {
    FakePictureBox pb(393, 17);
    DrawProgress(pb, 50, kProgressForeColor, kProgressBackColor);
    EXPECT_TRUE(pb.autoRedraw);
    EXPECT_EQ(pb.printed, (std::vector<std::string>{"50%"}));

    const int row = 7;  // through the middle of bar and label
    // The label "50%" is 21 pixels wide and centred on the 391-pixel drawing width: columns 185-205.
    // The bar runs from the first pixel inside the border to half the drawing width (column 195).
    EXPECT_EQ(pb.Pixel(0, row), kBack) << "the border column stays clear";
    EXPECT_EQ(pb.Pixel(1, row), kFore) << "the bar starts inside the border";
    EXPECT_EQ(pb.Pixel(100, row), kFore);
    EXPECT_EQ(pb.Pixel(184, row), kFore);
    EXPECT_EQ(pb.Pixel(185, row), kBack) << "label under the bar shows in the background colour";
    EXPECT_EQ(pb.Pixel(195, row), kBack);
    EXPECT_EQ(pb.Pixel(196, row), kFore) << "label beyond the bar shows in the fore colour";
    EXPECT_EQ(pb.Pixel(205, row), kFore);
    EXPECT_EQ(pb.Pixel(206, row), kBack);
    EXPECT_EQ(pb.Pixel(300, row), kBack);
    EXPECT_EQ(pb.Pixel(100, 0), kBack) << "top border";
    EXPECT_EQ(pb.Pixel(100, 15), kBack) << "bottom border";
}

TEST(DrawProgress, AboveAHundredIsAFullBarLabelledAHundredAndZeroIsNoBar) {
    FakePictureBox full(393, 17);
    DrawProgress(full, 150, kProgressForeColor, kProgressBackColor);
    EXPECT_EQ(full.printed, (std::vector<std::string>{"100%"}));
    int foreOnRow = 0;
    for (int x = 0; x < full.Width(); ++x) foreOnRow += full.Pixel(x, 7) == kFore;
    EXPECT_EQ(foreOnRow, 390 - 28) << "the whole drawing width but the label's 28 columns";
    EXPECT_EQ(full.Pixel(390, 7), kFore);
    EXPECT_EQ(full.Pixel(195, 7), kBack);

    FakePictureBox empty(393, 17);
    DrawProgress(empty, 0, kProgressForeColor, kProgressBackColor);
    EXPECT_EQ(empty.printed, (std::vector<std::string>{"0%"}));
    int fore = 0;
    for (int y = 0; y < empty.Height(); ++y)
        for (int x = 0; x < empty.Width(); ++x) fore += empty.Pixel(x, y) == kFore;
    EXPECT_EQ(fore, 14 * 13) << "only the label, 14 × 13 pixels, in the fore colour";

    // Painting again starts from a clear box: a smaller percent leaves no trace of the larger.
    DrawProgress(full, 0, kProgressForeColor, kProgressBackColor);
    EXPECT_EQ(full.Pixel(390, 7), kBack);
}

}  // namespace
}  // namespace vantorel
