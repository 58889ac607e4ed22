// The push button's palette, colour arithmetic, geometry and looks, checked pixel by pixel on the
// raster canvas (text and ovals are recorded there, so only the solid parts are compared).
#include <gtest/gtest.h>

#include <cmath>
#include <memory>
#include <vector>

#include "controls/xpbutton/kirel_xp_button.h"
#include "fakes/fake_button_host.h"
#include "fakes/raster_canvas.h"

namespace vantorel::xpbutton {
namespace {

using testing::FakeButtonHost;
using testing::MemoryPicture;
using testing::RasterCanvas;

Rgb S(Rgb c, int n) { return ShiftColor(c, n, false, false); }
Rgb SB(Rgb c, int n) { return ShiftColor(c, n, true, false); }

struct Look {
    FakeButtonHost host;
    RasterCanvas canvas;
    KirelXPButton button{host, canvas};

    Look(std::int32_t type, std::int32_t w = 40, std::int32_t h = 20, std::int32_t scheme = 1) {
        host.width = w;
        host.height = h;
        button.InitNewControl();
        button.OnResize();
        button.SetColorScheme(scheme);
        button.SetCaption("Go");
        button.OnShow();
        button.SetButtonType(type);
    }
    const Palette& p() const { return button.palette(); }
    Rgb At(int x, int y) const { return canvas.At(x, y); }
    void Hover() {
        host.pointerOver = true;
        button.OnMouseMove(0, 0, 1, 1);
    }
    void Press() { button.Paint(2, true); }
    void Disable() { button.SetEnabled(false); }
};

TEST(XPButtonColour, ShiftBlendAndRounding) {
    // Blue scaling: 0xC0C0C0 + 48 gives 240 in every channel; a full blue clamps at 255.
    EXPECT_EQ(ShiftColor(0xC0C0C0, 48, true, false), 0xF0F0F0u);
    EXPECT_EQ(ShiftColor(0xFFC0C0, 48, true, false), 0xFFF0F0u);
    // Without blue scaling blue moves like the others; clamping at 0 for negative amounts.
    EXPECT_EQ(ShiftColor(0x804020, -64, false, false), 0x400000u);
    EXPECT_EQ(ShiftColor(MakeRgb(250, 10, 100), 10, false, false), MakeRgb(255, 20, 110));
    // Blue scaling truncates toward zero: 240 × −2 / 192 = −2.5 → −2.
    EXPECT_EQ(Blue(ShiftColor(0xF0F0F0, -2, true, false)), 238);
    // SoftBevel halves toward zero: −1 → 0, −3 → −1, 47 → 23.
    EXPECT_EQ(ShiftColor(0x808080, -1, false, true), 0x808080u);
    EXPECT_EQ(ShiftColor(0x808080, -3, false, true), 0x7F7F7Fu);
    EXPECT_EQ(ShiftColor(0x808080, 47, false, true), 0x979797u);
    // BlendToWhite: c × (255 − a) / 255 + a, truncating.
    EXPECT_EQ(BlendToWhite(0x000000, 176), MakeRgb(176, 176, 176));
    EXPECT_EQ(BlendToWhite(MakeRgb(10, 36, 106), 176), MakeRgb(10 * 79 / 255 + 176, 36 * 79 / 255 + 176, 106 * 79 / 255 + 176));
    EXPECT_EQ(BlendToWhite(0xFFFFFF, 128), 0xFFFFFFu);
    // Halves to even.
    EXPECT_EQ(RoundHalfEven(0.5), 0);
    EXPECT_EQ(RoundHalfEven(1.5), 2);
    EXPECT_EQ(RoundHalfEven(-0.5), 0);
    EXPECT_EQ(RoundHalfEven(-1.5), -2);
    EXPECT_EQ(RoundHalfEven(-2.5), -2);
    EXPECT_EQ(RoundHalfEven(76.5), 76);
    EXPECT_EQ(RoundHalfEven(2.6), 3);
    // A corrupt stored size saturates instead of overflowing.
    EXPECT_EQ(RoundHalfEven(1e300), INT32_MAX);
    EXPECT_EQ(RoundHalfEven(-1e300), INT32_MIN);
    EXPECT_EQ(RoundHalfEven(std::nan("")), 0);
}

TEST(XPButtonColour, PaletteBySchemes) {
    Look custom(2, 40, 20, 2);
    custom.button.SetBackColor(0x406080);
    custom.button.SetForeColor(0x80000000u | platform::kColorHighlight);  // a system colour reference
    const Palette& p = custom.p();
    EXPECT_EQ(p.FaceColor, 0x406080u);
    EXPECT_EQ(p.TextColor, 0x6A240Au);
    EXPECT_EQ(p.ShadowColor, S(0x406080, -64));
    EXPECT_EQ(p.DarkShadowColor, 0u);
    EXPECT_EQ(p.LightColor, S(0x406080, 31));
    EXPECT_EQ(p.HighlightColor, S(0x406080, 47));
    EXPECT_EQ(p.AccentColor, S(0x406080, -128));
    EXPECT_EQ(p.AccentLightColor, 0x406080u);
    EXPECT_EQ(p.BaseColor, S(0x406080, 48));

    // Scheme 3 ignores BackColor and ForeColor; BaseColor is blue-scaled for ButtonType 3.
    Look fixed(3, 40, 20, 3);
    fixed.button.SetBackColor(0x123456);
    EXPECT_EQ(fixed.p().FaceColor, 0xC0C0C0u);
    EXPECT_EQ(fixed.p().AccentLightColor, 0xD1ADADu);
    EXPECT_EQ(fixed.p().BaseColor, 0xF0F0F0u);

    // Scheme 4 follows the parent's drawing colours and is recomputed on ambient change.
    Look parent(2, 40, 20, 4);
    EXPECT_EQ(parent.p().FaceColor, parent.host.parentBack);
    EXPECT_EQ(parent.p().TextOverColor, parent.host.parentText);
    parent.host.parentBack = 0x010203;
    parent.button.OnAmbientChanged();
    EXPECT_EQ(parent.p().FaceColor, 0x010203u);
    EXPECT_EQ(parent.p().AccentLightColor, BlendToWhite(0x6A240A, 176));

    // Hovering with the custom scheme draws the whole look from BackOver, then restores.
    Look over(2, 40, 20, 2);
    over.button.SetBackColor(0x00C000);
    over.button.SetBackOver(0x0000C0);
    over.Hover();
    EXPECT_EQ(over.At(20, 10), 0x0000C0u);
    EXPECT_EQ(over.At(0, 0), S(0x0000C0, 47));
    EXPECT_EQ(over.button.BackColor(), 0x00C000u);
    EXPECT_EQ(over.p().FaceColor, 0x00C000u);
}

TEST(XPButtonLooks, GradientRowsRoundHalvesToEven) {
    // H = 50: step 0.5; rows 3, 4, 5, 6, 7 use −2 (−1.5), −2, −2 (−2.5), −3, −4 (−3.5).
    Look g(3, 20, 50, 3);
    const Rgb base = 0xF0F0F0;
    EXPECT_EQ(g.At(10, 3), SB(base, -2));
    EXPECT_EQ(g.At(10, 4), SB(base, -2));
    EXPECT_EQ(g.At(10, 5), SB(base, -2));
    EXPECT_EQ(g.At(10, 6), SB(base, -3));
    EXPECT_EQ(g.At(10, 7), MakeRgb(236, 236, 235));  // blue: 240 − 960/192
    // SoftBevel halves every amount, the gradient steps included: H = 25, row 3 uses −3 → −1.
    Look soft(3, 20, 25, 3);
    soft.button.SetSoftBevel(true);
    const Rgb softBase = ShiftColor(0xC0C0C0, 48, true, true);
    EXPECT_EQ(softBase, 0xD8D8D8u);
    EXPECT_EQ(soft.At(10, 3), ShiftColor(softBase, -1, true, false));
    EXPECT_EQ(soft.At(10, 5), ShiftColor(softBase, -2, true, false));
}

TEST(XPButtonLooks, BevelledLooks) {
    {
        Look l(1);
        const Palette p = l.p();
        EXPECT_EQ(l.At(0, 0), p.DarkShadowColor);
        EXPECT_EQ(l.At(39, 19), p.DarkShadowColor);
        EXPECT_EQ(l.At(1, 1), p.HighlightColor);
        EXPECT_EQ(l.At(38, 1), p.ShadowColor);
        EXPECT_EQ(l.At(1, 18), p.ShadowColor);
        EXPECT_EQ(l.At(2, 2), p.HighlightColor);
        EXPECT_EQ(l.At(37, 17), p.ShadowColor);
        EXPECT_EQ(l.At(20, 10), p.FaceColor);
        l.Press();
        EXPECT_EQ(l.At(1, 1), p.ShadowColor);
        EXPECT_EQ(l.At(38, 18), p.HighlightColor);
        EXPECT_EQ(l.At(0, 0), p.DarkShadowColor);
    }
    {
        Look l(2);
        const Palette p = l.p();
        EXPECT_EQ(l.At(0, 0), p.HighlightColor);
        EXPECT_EQ(l.At(39, 0), p.DarkShadowColor);
        EXPECT_EQ(l.At(0, 19), p.DarkShadowColor);
        EXPECT_EQ(l.At(1, 1), p.LightColor);
        EXPECT_EQ(l.At(38, 18), p.ShadowColor);
        EXPECT_EQ(l.canvas.texts.at(0).box, l.button.captionRect());
        l.Press();
        EXPECT_EQ(l.At(0, 0), p.DarkShadowColor);
        EXPECT_EQ(l.At(39, 19), p.HighlightColor);
        EXPECT_EQ(l.At(1, 1), p.ShadowColor);
        EXPECT_EQ(l.At(38, 18), p.LightColor);
        EXPECT_EQ(l.canvas.texts.at(0).box, l.button.captionRectDown());
        // The default button: dark frame round an inset bevel, then a doubled frame when pressed.
        l.host.isDefault = true;
        l.button.Paint(0, true);
        EXPECT_EQ(l.At(0, 0), p.DarkShadowColor);
        EXPECT_EQ(l.At(1, 1), p.HighlightColor);
        EXPECT_EQ(l.At(38, 18), p.DarkShadowColor);
        l.Press();
        EXPECT_EQ(l.At(1, 1), p.ShadowColor);
        EXPECT_EQ(l.At(38, 18), p.ShadowColor);
        EXPECT_EQ(l.At(2, 2), p.FaceColor);
        l.Disable();
        EXPECT_EQ(l.At(0, 0), p.HighlightColor);
        ASSERT_EQ(l.canvas.texts.size(), 2u);  // engraved caption
        EXPECT_EQ(l.canvas.texts[0].colour, p.HighlightColor);
        EXPECT_EQ(l.canvas.texts[1].colour, p.ShadowColor);
    }
    {
        Look l(6);
        const Palette p = l.p();
        EXPECT_EQ(l.At(0, 0), S(p.LightColor, 8));
        EXPECT_EQ(l.At(39, 19), p.ShadowColor);
        EXPECT_EQ(l.At(1, 1), S(p.LightColor, 8));
        l.Press();
        EXPECT_EQ(l.At(0, 0), p.ShadowColor);
        EXPECT_EQ(l.At(38, 18), S(p.LightColor, 8));
    }
    for (int type : {7, 8, 12}) {
        Look l(type);
        const Palette p = l.p();
        EXPECT_EQ(l.At(0, 0), type == 7 ? p.HighlightColor : p.FaceColor) << type;
        l.Hover();
        EXPECT_EQ(l.At(0, 0), p.HighlightColor) << type;
        EXPECT_EQ(l.At(39, 19), type == 12 ? p.DarkShadowColor : p.ShadowColor) << type;
        EXPECT_EQ(l.At(1, 1), type == 12 ? p.LightColor : p.FaceColor) << type;
        l.Press();
        EXPECT_EQ(l.At(0, 0), type == 12 ? p.DarkShadowColor : p.ShadowColor) << type;
        EXPECT_EQ(l.At(39, 19), p.HighlightColor) << type;
        l.Disable();
        EXPECT_EQ(l.At(0, 0), type == 7 ? p.HighlightColor : p.FaceColor) << type;
    }
}

TEST(XPButtonLooks, GradientLookTrims) {
    Look l(3, 40, 20, 3);
    const Rgb b = l.p().BaseColor;
    EXPECT_EQ(l.At(0, 5), 0x733C00u);
    EXPECT_EQ(l.At(1, 1), 0x7B4D10u);
    EXPECT_EQ(l.At(38, 18), 0x7B4D10u);
    EXPECT_EQ(l.At(1, 5), SB(b, -5));
    EXPECT_EQ(l.At(2, 5), SB(b, -10));
    EXPECT_EQ(l.At(38, 5), SB(b, -36));
    EXPECT_EQ(l.At(5, 18), SB(b, -48));
    EXPECT_EQ(l.At(5, 1), SB(b, 16));
    l.button.OnGotFocus();  // the blue trim
    EXPECT_EQ(l.At(1, 5), 0xE7AE8Cu);
    EXPECT_EQ(l.At(5, 18), 0xEF826Bu);
    EXPECT_TRUE(l.canvas.focusRects.empty());
    l.Hover();  // the orange trim wins
    EXPECT_EQ(l.At(1, 5), 0x31B2FFu);
    EXPECT_EQ(l.At(5, 2), 0x8CDBFFu);
    EXPECT_EQ(l.At(2, 5), 0x6BCBFFu);
    l.Press();
    const Rgb q = SB(b, -32);
    EXPECT_EQ(l.At(37, 5), b);
    EXPECT_EQ(l.At(1, 5), SB(q, -32));
    EXPECT_EQ(l.At(5, 1), SB(q, -32));
    EXPECT_EQ(l.At(0, 5), 0x733C00u);
    l.Disable();
    EXPECT_EQ(l.At(5, 5), SB(b, -24));
    EXPECT_EQ(l.At(0, 5), SB(b, -84));
    EXPECT_EQ(l.At(1, 1), SB(b, -72));
    EXPECT_EQ(l.canvas.texts.at(0).colour, SB(b, -104));
}

TEST(XPButtonLooks, FlatAndFramedLooks) {
    {
        Look l(4);
        const Palette p = l.p();
        EXPECT_EQ(l.At(20, 10), p.LightColor);
        EXPECT_EQ(l.At(0, 10), p.DarkShadowColor);
        EXPECT_EQ(l.At(38, 10), p.ShadowColor);
        EXPECT_EQ(l.At(37, 10), p.FaceColor);
        EXPECT_EQ(l.At(2, 10), p.HighlightColor);
        EXPECT_EQ(l.At(3, 3), p.HighlightColor);
        EXPECT_EQ(l.At(37, 17), p.ShadowColor);
        l.Press();
        const Rgb f = S(p.ShadowColor, -16);
        EXPECT_EQ(l.At(20, 10), f);
        EXPECT_EQ(l.At(1, 10), S(p.ShadowColor, -64));
        EXPECT_EQ(l.At(2, 10), S(p.ShadowColor, -32));
        EXPECT_EQ(l.At(37, 10), p.ShadowColor);
        EXPECT_EQ(l.At(38, 10), f);
        EXPECT_EQ(l.canvas.texts.at(0).colour, p.LightColor);
        // The pressed caption effect copies use the pressed fill as their base.
        l.button.SetSpecialEffect(3);
        l.Press();
        EXPECT_EQ(l.canvas.texts.at(0).colour, S(f, -40));
        EXPECT_EQ(l.p().BaseColor, S(p.FaceColor, 48));
    }
    {
        Look l(5);
        const Palette p = l.p();
        EXPECT_EQ(l.At(20, 10), S(p.FaceColor, 12));
        EXPECT_EQ(l.At(1, 10), p.HighlightColor);
        EXPECT_EQ(l.At(0, 10), S(p.ShadowColor, -26));
        EXPECT_EQ(l.At(39, 10), p.HighlightColor);
        EXPECT_EQ(l.At(38, 10), S(p.ShadowColor, -26));
        EXPECT_EQ(l.At(1, 18), S(p.ShadowColor, 26));
        l.button.OnGotFocus();
        const Box c = l.button.captionRect();
        EXPECT_EQ(l.At(c.left - 2, c.top - 1), 0xCC9999u);
        l.Press();
        EXPECT_EQ(l.At(20, 10), S(p.ShadowColor, 16));
        EXPECT_EQ(l.At(39, 10), p.HighlightColor);
        EXPECT_EQ(l.At(c.left - 2, c.top - 1), 0xCC9999u);
        EXPECT_EQ(l.canvas.texts.at(0).box, c);  // unmoved when pressed
        l.Disable();
        EXPECT_EQ(l.At(0, 10), p.ShadowColor);
        EXPECT_EQ(l.At(39, 10), p.ShadowColor);
        EXPECT_EQ(l.canvas.texts.at(0).colour, p.ShadowColor);
    }
    {
        Look l(9);
        const Palette p = l.p();
        EXPECT_EQ(l.At(0, 0), p.FaceColor);
        l.Hover();
        EXPECT_EQ(l.At(0, 0), p.AccentColor);
        EXPECT_EQ(l.At(20, 10), p.AccentLightColor);
        l.Press();
        EXPECT_EQ(l.At(20, 10), BlendToWhite(p.AccentColor, 128));
        EXPECT_EQ(l.At(0, 0), p.AccentColor);
    }
    {
        Look l(14);
        const Palette p = l.p();
        EXPECT_EQ(l.At(0, 10), S(p.ShadowColor, -50));
        EXPECT_EQ(l.At(1, 10), S(p.FaceColor, -9));
        EXPECT_EQ(l.At(2, 2), p.HighlightColor);
        EXPECT_EQ(l.At(3, 10), p.HighlightColor);
        EXPECT_EQ(l.At(20, 10), S(p.HighlightColor, -29));  // 58/20 × 10 = 29
        l.host.isDefault = true;
        l.button.Paint(0, true);
        EXPECT_TRUE(l.canvas.texts.at(0).font.bold);
        EXPECT_FALSE(l.button.FontBold());
        l.Hover();
        EXPECT_EQ(l.At(20, 10), p.LightColor);
        l.Press();
        EXPECT_EQ(l.At(20, 10), S(p.FaceColor, -9));
        EXPECT_EQ(l.At(0, 10), S(p.ShadowColor, -48));
        EXPECT_EQ(l.At(38, 10), p.HighlightColor);
        EXPECT_EQ(l.canvas.texts.at(0).colour, S(p.ShadowColor, -50));
    }
}

TEST(XPButtonLooks, SpecialLooksAndStates) {
    {
        Look l(10);
        for (int y = 0; y < 20; ++y)
            for (int x = 0; x < 40; ++x) ASSERT_EQ(l.At(x, y), l.p().FaceColor);
        EXPECT_TRUE(l.canvas.texts.empty());
    }
    {
        Look l(0);  // outside 1 to 14: face only
        EXPECT_TRUE(l.canvas.texts.empty());
        EXPECT_EQ(l.At(0, 0), l.p().FaceColor);
    }
    {
        Look l(11);  // the parent's pixels in place of the face
        EXPECT_EQ(l.At(0, 0), l.host.parentPixel);
        EXPECT_EQ(l.At(39, 19), l.host.parentPixel);
        EXPECT_GE(l.host.backgroundCaptures, 1);
    }
    {
        // A resize arriving while the background is captured is ignored; Refresh captures again.
        Look l(11);
        const int captures = l.host.backgroundCaptures;
        l.host.duringCapture = [&] {
            l.host.height = 0;
            l.button.OnResize();
        };
        l.button.Refresh();
        EXPECT_EQ(l.host.backgroundCaptures, captures + 1);
        EXPECT_EQ(l.button.height(), 20);
        EXPECT_EQ(l.At(5, 5), l.host.parentPixel);
        l.host.duringCapture = nullptr;
        l.host.height = 20;
        // A show captures again; a hidden control does not capture when its type is set.
        l.button.OnHide();
        l.button.SetButtonType(11);
        EXPECT_EQ(l.host.backgroundCaptures, captures + 1);
        l.button.OnShow();
        EXPECT_EQ(l.host.backgroundCaptures, captures + 2);
    }
    {
        Look l(13);
        ASSERT_EQ(l.canvas.ovals.size(), 1u);
        EXPECT_EQ(l.canvas.ovals[0].pen, l.p().FaceColor);
        l.Hover();
        EXPECT_EQ(l.canvas.ovals.at(0).pen, l.p().ShadowColor);
        l.Press();
        EXPECT_EQ(l.canvas.ovals.at(0).brush, S(l.p().FaceColor, -32));
    }
    {
        // Paint(1) draws the face only; a checked two-state button is always drawn pressed,
        // but a disabled one still shows the disabled recipe.
        Look l(1);
        l.button.Paint(1, true);
        EXPECT_EQ(l.At(0, 0), l.p().FaceColor);
        EXPECT_TRUE(l.canvas.texts.empty());
        l.button.SetCheckBoxBehaviour(true);
        l.button.SetValue(true);
        l.Hover();
        EXPECT_EQ(l.At(1, 1), l.p().ShadowColor);
        l.Disable();
        EXPECT_EQ(l.At(1, 1), l.p().HighlightColor);
    }
    {
        // An unforced repaint with nothing changed does not touch the surface.
        Look l(3);
        const auto calls = l.canvas.drawCalls;
        l.button.Paint(0, false);
        l.button.OnMouseUp(1, 0, 0, 0);
        EXPECT_EQ(l.canvas.drawCalls, calls);
        l.button.Paint(2, false);
        EXPECT_GT(l.canvas.drawCalls, calls);
    }
}

TEST(XPButtonGeometry, RegionsFocusAndCaption) {
    Look l(1, 75, 23);
    auto removed = [&](int type) {
        l.button.SetButtonType(type);
        return l.host.shape;
    };
    using P = std::pair<std::int32_t, std::int32_t>;
    platform::WindowShape s = removed(1);
    EXPECT_FALSE(s.ellipse);
    EXPECT_EQ(s.removed, (std::vector<P>{{0, 0}, {74, 0}, {0, 22}, {74, 22}}));
    EXPECT_EQ(removed(14).removed.size(), 4u);
    EXPECT_EQ(removed(5).removed, (std::vector<P>{{0, 22}, {74, 0}}));
    s = removed(3);
    EXPECT_EQ(s.removed.size(), 12u);
    EXPECT_NE(std::find(s.removed.begin(), s.removed.end(), P{73, 22}), s.removed.end());
    EXPECT_NE(std::find(s.removed.begin(), s.removed.end(), P{0, 21}), s.removed.end());
    EXPECT_EQ(removed(4).removed, s.removed);
    EXPECT_TRUE(removed(13).ellipse);
    EXPECT_TRUE(removed(2).removed.empty());
    EXPECT_GT(l.host.shapesReleased, 0);

    EXPECT_EQ(l.button.focusRect(), (Box{4, 4, 71, 19}));
    l.button.SetButtonType(9);
    EXPECT_EQ(l.button.focusRect(), (Box{3, 3, 72, 20}));
    l.button.SetButtonType(14);
    EXPECT_EQ(l.button.focusRect(), (Box{6, 6, 71, 19}));

    // "Save": 28 × 13 at (1, 1) in the box, moved by ((75 − 29) / 2, (23 − 14) / 2).
    l.button.SetCaption("Save");
    EXPECT_EQ(l.button.captionRect(), (Box{24, 5, 52, 18}));
    EXPECT_EQ(l.button.captionRectDown(), (Box{25, 6, 53, 19}));

    // A 16 × 16 picture to the left: box (17, 1, 73, 21), caption moved by (15, 4).
    auto picture = std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 16, 16,
                                                   std::vector<Rgb>(256, 0x00FF00));
    l.button.SetPictureNormal(picture);
    EXPECT_EQ(l.button.pictureRect().width, 16);
    EXPECT_EQ(l.button.captionRect(), (Box{32, 5, 60, 18}));
    EXPECT_EQ(l.button.pictureRect().x, 32 - 16 - 4);
    EXPECT_EQ(l.button.pictureRect().y, 3);
    l.button.SetPicturePosition(1);  // right: box (1, 1, 57, 21), dx = (75 − 16 − 29 − 4) / 2
    EXPECT_EQ(l.button.captionRect(), (Box{14, 5, 42, 18}));
    EXPECT_EQ(l.button.pictureRect().x, 46);
    l.button.SetPicturePosition(3);  // below: dy = (23 − 16 − 14 − 4) / 2 = −5
    EXPECT_EQ(l.button.captionRect().top, -4);
    EXPECT_EQ(l.button.pictureRect().y, l.button.captionRect().bottom + 2);
    l.button.SetCaption("  ");  // an empty caption centres the picture
    EXPECT_EQ(l.button.pictureRect().x, (75 - 16) / 2);
    EXPECT_EQ(l.button.pictureRect().y, (23 - 16) / 2);
}

TEST(XPButtonPictures, BlitPictureRules) {
    Look l(10, 8, 8, 3);
    const Rgb key = 0xC0C0C0;
    // Row 0: key colour, mid-grey sum 385, grey sum 384, pure red.
    std::vector<Rgb> pixels = {key, MakeRgb(129, 128, 128), MakeRgb(128, 128, 128), MakeRgb(255, 0, 0)};
    MemoryPicture picture(platform::PictureKind::kBitmap, 4, 1, pixels);
    const Rgb face = l.p().FaceColor;
    l.button.BlitPicture(0, 0, 4, 1, picture, key, -1, false, false, false);
    EXPECT_EQ(l.At(0, 0), face);  // the key colour is never drawn
    EXPECT_EQ(l.At(1, 0), pixels[1]);
    EXPECT_EQ(l.At(3, 0), pixels[3]);
    // Dark-only silhouette: drawn only where red + green + blue < 385 (black is a colour).
    l.button.BlitPicture(0, 1, 4, 1, picture, key, 0x000000, true, false, false);
    EXPECT_EQ(l.At(0, 1), face);
    EXPECT_EQ(l.At(1, 1), face);
    EXPECT_EQ(l.At(2, 1), 0u);
    EXPECT_EQ(l.At(3, 1), 0u);
    // Greyscale: pure red gives 76.
    l.button.BlitPicture(0, 2, 4, 1, picture, key, -1, false, true, false);
    EXPECT_EQ(l.At(3, 2), MakeRgb(76, 76, 76));
    EXPECT_EQ(l.At(0, 2), face);
    // Blend: two thirds picture, one third background, truncating.
    l.button.BlitPicture(0, 3, 4, 1, picture, key, -1, false, false, true);
    EXPECT_EQ(l.At(3, 3), MakeRgb((2 * 255 + 192) / 3, (0 + 192) / 3, (0 + 192) / 3));
    // Without UseMaskColor the key colour is drawn too; negative sizes mean the picture's own.
    l.button.SetUseMaskColor(false);
    l.button.BlitPicture(0, 4, -1, -1, picture, key, 0x0000FF, false, false, false);
    EXPECT_EQ(l.At(0, 4), 0x0000FFu);
    EXPECT_EQ(l.At(3, 4), 0x0000FFu);
    EXPECT_EQ(l.At(4, 4), face);
    // Pixels beyond the surface are dropped, not wrapped.
    l.button.BlitPicture(6, 7, 4, 1, picture, key, 0x00FF00, false, false, false);
    EXPECT_EQ(l.At(6, 7), 0x00FF00u);
    EXPECT_EQ(l.At(0, 7), face);
    // An icon's transparent parts take the mask colour and so stay transparent.
    l.button.SetUseMaskColor(true);
    MemoryPicture icon(platform::PictureKind::kIcon, 2, 1, {0x0000FF, 0x00FF00}, {true, false});
    l.button.BlitPicture(0, 5, 2, 1, icon, key, -1, false, false, false);
    EXPECT_EQ(l.At(0, 5), face);
    EXPECT_EQ(l.At(1, 5), 0x00FF00u);
}

TEST(XPButtonPictures, HimetricSizeRoundsHalvesToEven) {
    // At 127 dpi one pixel is 20 HIMETRIC: 50 → 2.5 → 2, 70 → 3.5 → 4, 61 → 3.05 → 3.
    Look l(2);
    l.host.dpi = 127;
    auto sized = [&](std::int32_t hw, std::int32_t hh) {
        auto picture = std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 1, 1, std::vector<Rgb>{0});
        picture->SetHimetric(hw, hh);
        l.button.SetPictureNormal(picture);
        return std::pair{l.button.pictureRect().width, l.button.pictureRect().height};
    };
    EXPECT_EQ(sized(50, 70), (std::pair{2, 4}));
    EXPECT_EQ(sized(61, 0), (std::pair{3, 0}));
    l.button.SetPictureNormal(nullptr);
    EXPECT_EQ(l.button.pictureRect().width, 0);
    EXPECT_EQ(l.button.pictureRect().height, 0);
}

TEST(XPButtonPictures, PictureByStateAndEffects) {
    // A 2 × 2 black square with a key-coloured corner on a 40 × 20 classic button.
    Look l(2, 40, 20, 3);
    std::vector<Rgb> px = {0xC0C0C0, 0x000000, 0x000000, 0x000000};
    auto normal = std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 2, 2, px);
    l.button.SetCaption("");
    l.button.SetPictureNormal(normal);
    const auto r = l.button.pictureRect();
    EXPECT_EQ(r.x, 19);
    EXPECT_EQ(r.y, 9);
    const Palette p = l.p();
    EXPECT_EQ(l.At(r.x, r.y), p.FaceColor);
    EXPECT_EQ(l.At(r.x + 1, r.y), 0u);
    // Pressed: moved by (1, 1).
    l.Press();
    EXPECT_EQ(l.At(r.x + 1, r.y + 1), p.FaceColor);
    EXPECT_EQ(l.At(r.x + 2, r.y + 1), 0u);
    // Disabled: engraved, highlight at (+1, +1) under the shadow silhouette.
    l.Disable();
    EXPECT_EQ(l.At(r.x + 1, r.y), p.ShadowColor);
    EXPECT_EQ(l.At(r.x + 2, r.y + 2), p.HighlightColor);
    // Hover with PictureOver shows it instead.
    l.button.SetEnabled(true);
    auto over = std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 2, 2, std::vector<Rgb>(4, 0x0000FF));
    l.button.SetPictureOver(over);
    l.Hover();
    EXPECT_EQ(l.At(r.x, r.y), 0x0000FFu);
    // Raised effect: a darker copy below-right and a lighter one above-left, behind the picture.
    l.host.pointerOver = false;
    l.button.OnOverTimer();
    l.button.SetSpecialEffect(1);
    EXPECT_EQ(l.At(r.x + 2, r.y + 2), S(p.FaceColor, -40));
    EXPECT_EQ(l.At(r.x, r.y - 1), S(p.FaceColor, 40));
    EXPECT_EQ(l.At(r.x + 1, r.y), 0u);
    // Sunken: the lighter copy below-right; drop shadow: only the darker copy below-right.
    l.button.SetSpecialEffect(2);
    EXPECT_EQ(l.At(r.x + 2, r.y + 2), S(p.FaceColor, 40));
    EXPECT_EQ(l.At(r.x, r.y - 1), S(p.FaceColor, -40));
    l.button.SetSpecialEffect(3);
    EXPECT_EQ(l.At(r.x + 2, r.y + 2), S(p.FaceColor, -40));
    EXPECT_EQ(l.At(r.x, r.y - 1), p.FaceColor);
    // Caption effect copies: sunken puts the lighter copy below-right, then the text.
    l.button.SetCaption("Go");
    l.button.SetSpecialEffect(2);
    ASSERT_EQ(l.canvas.texts.size(), 3u);
    EXPECT_EQ(l.canvas.texts[0].colour, S(p.FaceColor, 40));
    EXPECT_EQ(l.canvas.texts[0].box, Offset(l.button.captionRect(), 1, 1));
    EXPECT_EQ(l.canvas.texts[1].colour, S(p.FaceColor, -40));
    EXPECT_EQ(l.canvas.texts[2].colour, p.TextColor);
    // Position 4 draws the caption again over the picture.
    l.button.SetSpecialEffect(0);
    l.button.SetPicturePosition(4);
    EXPECT_EQ(l.canvas.texts.size(), 2u);
    // ButtonType 9 is see-through until hovered.
    l.button.SetButtonType(9);
    const auto r9 = l.button.pictureRect();
    EXPECT_EQ(l.At(r9.x + 1, r9.y), MakeRgb(192 / 3, 192 / 3, 192 / 3));
}

}  // namespace
}  // namespace vantorel::xpbutton
