// The push button's colour arithmetic, palette, looks, geometry and pictures on the raster canvas
// (text and ovals are recorded there, so only the solid parts are compared pixel by pixel). That
// GDI draws the same pixels is proved under Wine (tests/win32/xpbutton_win32_test.cpp).
#include <gtest/gtest.h>

#include <memory>
#include <tuple>
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
    // Plays the steps in order: f focus, h hover, p press, d disable, D paint as the default button.
    void Play(const std::string& steps) {
        for (char step : steps) {
            if (step == 'f') button.OnGotFocus();
            if (step == 'h') Hover();
            if (step == 'p') Press();
            if (step == 'd') button.SetEnabled(false);
            if (step == 'D') {
                host.isDefault = true;
                button.Paint(0, true);
            }
        }
    }
};

TEST(XPButtonColour, ShiftBlendAndRounding) {
    const std::tuple<Rgb, int, bool, bool, Rgb> shifts[] = {
        {0xC0C0C0, 48, true, false, 0xF0F0F0},                // blue scaling: 192 + 48 in every channel
        {0xFFC0C0, 48, true, false, 0xFFF0F0},                // a full blue clamps at 255
        {0x804020, -64, false, false, 0x400000},              // clamps at 0
        {0xF0F0F0, -2, true, false, MakeRgb(238, 238, 238)},  // blue: 240 × −2 / 192 = −2.5 → −2
        {0x808080, -3, false, true, 0x7F7F7F},                // SoftBevel halves toward zero: −3 → −1
        {0x808080, 47, false, true, 0x979797},                // 47 → 23
    };
    for (auto [from, amount, blue, soft, to] : shifts) EXPECT_EQ(ShiftColor(from, amount, blue, soft), to) << from;
    EXPECT_EQ(BlendToWhite(MakeRgb(10, 36, 106), 176),  // c × (255 − a) / 255 + a, truncating
              MakeRgb(10 * 79 / 255 + 176, 36 * 79 / 255 + 176, 106 * 79 / 255 + 176));
    EXPECT_EQ(BlendToWhite(0xFFFFFF, 128), 0xFFFFFFu);
    const std::pair<double, int> halves[] = {{0.5, 0},   {1.5, 2},   {-0.5, 0}, {-1.5, -2},
                                             {-2.5, -2}, {76.5, 76}, {2.6, 3}};
    for (auto [value, rounded] : halves) EXPECT_EQ(RoundHalfEven(value), rounded) << value;
}

TEST(XPButtonColour, PaletteBySchemes) {
    Look custom(2, 40, 20, 2);
    custom.button.SetBackColor(0x406080);
    custom.button.SetForeColor(0x80000000u | platform::kColorHighlight);  // a system colour reference
    const Palette& p = custom.p();
    EXPECT_EQ((std::vector<Rgb>{p.FaceColor, p.TextColor, p.ShadowColor, p.DarkShadowColor, p.LightColor,
                                p.HighlightColor, p.AccentColor, p.AccentLightColor, p.BaseColor}),
              (std::vector<Rgb>{0x406080, 0x6A240A, S(0x406080, -64), 0, S(0x406080, 31), S(0x406080, 47),
                                S(0x406080, -128), 0x406080, S(0x406080, 48)}));

    Look fixed(3, 40, 20, 3);  // scheme 3 ignores BackColor; BaseColor is blue-scaled for ButtonType 3
    fixed.button.SetBackColor(0x123456);
    EXPECT_EQ(std::make_tuple(fixed.p().FaceColor, fixed.p().AccentLightColor, fixed.p().BaseColor),
              std::make_tuple(0xC0C0C0u, 0xD1ADADu, 0xF0F0F0u));

    Look parent(2, 40, 20, 4);  // scheme 4 follows the parent's colours, recomputed on ambient change
    EXPECT_EQ(std::make_pair(parent.p().FaceColor, parent.p().TextOverColor),
              std::make_pair(parent.host.parentBack, parent.host.parentText));
    parent.host.parentBack = 0x010203;
    parent.button.OnAmbientChanged();
    EXPECT_EQ(std::make_pair(parent.p().FaceColor, parent.p().AccentLightColor),
              std::make_pair(Rgb{0x010203}, BlendToWhite(0x6A240A, 176)));

    Look over(2, 40, 20, 2);  // hovering with the custom scheme draws the look from BackOver, then restores
    over.button.SetBackColor(0x00C000);
    over.button.SetBackOver(0x0000C0);
    over.Hover();
    EXPECT_EQ(std::make_pair(over.At(20, 10), over.At(0, 0)), std::make_pair(Rgb{0x0000C0}, S(0x0000C0, 47)));
    EXPECT_EQ(std::make_pair(over.button.BackColor(), over.p().FaceColor), std::make_pair(0x00C000u, 0x00C000u));
}

// Expected colours: a palette entry shifted, or a fixed colour.
struct Want {
    Rgb Palette::*entry = nullptr;
    int shift = 0;
    Rgb fixed = 0;
};
constexpr Rgb Palette::*F = &Palette::FaceColor;
constexpr Rgb Palette::*H = &Palette::HighlightColor;
constexpr Rgb Palette::*L = &Palette::LightColor;
constexpr Rgb Palette::*Sh = &Palette::ShadowColor;
constexpr Rgb Palette::*D = &Palette::DarkShadowColor;
constexpr Rgb Palette::*A = &Palette::AccentColor;
constexpr Rgb Palette::*AL = &Palette::AccentLightColor;
Want C(Rgb c) { return {nullptr, 0, c}; }
// A pixel, or with y = T the colour of caption text x in drawing order.
struct Pixel {
    int x, y;
    Want want;
};
constexpr int T = -1;

// Pixels of every look on a 40 × 20 button, in the states played by Look::Play.
TEST(XPButtonLooks, EveryLookInEveryState) {
    const Rgb b = 0xF0F0F0;    // BaseColor of scheme 3, shifted with blue scaling by the gradient look
    const Rgb q = SB(b, -32);  // the pressed gradient's base
    const std::tuple<int, int, const char*, std::vector<Pixel>> cases[] = {
        {1, 1, "", {{0, 0, {D}}, {1, 1, {H}}, {38, 1, {Sh}}, {1, 18, {Sh}}, {2, 2, {H}}, {37, 17, {Sh}}}},
        {1, 1, "p", {{1, 1, {Sh}}, {38, 18, {H}}, {0, 0, {D}}}},
        {2, 1, "", {{0, 0, {H}}, {39, 0, {D}}, {0, 19, {D}}, {1, 1, {L}}, {38, 18, {Sh}}}},
        {2, 1, "p", {{0, 0, {D}}, {39, 19, {H}}, {1, 1, {Sh}}, {38, 18, {L}}}},
        {2, 1, "D", {{0, 0, {D}}, {1, 1, {H}}, {38, 18, {D}}}},  // the default: dark frame round an inset bevel
        {2, 1, "Dp", {{1, 1, {Sh}}, {38, 18, {Sh}}, {2, 2, {F}}}},
        {2, 1, "Dpd", {{0, 0, {H}}, {0, T, {H}}, {1, T, {Sh}}}},  // the caption engraved
        {3, 3, "", {{0, 5, C(0x733C00)}, {1, 1, C(0x7B4D10)}, {1, 5, C(SB(b, -5))}, {2, 5, C(SB(b, -10))}}},
        // Row 10 of the gradient: 25 / 20 × 10 = 12.5, rounded to even.
        {3, 3, "", {{38, 5, C(SB(b, -36))}, {5, 18, C(SB(b, -48))}, {5, 1, C(SB(b, 16))}, {20, 10, C(SB(b, -12))}}},
        {3, 3, "f", {{1, 5, C(0xE7AE8C)}, {5, 18, C(0xEF826B)}}},                       // the blue trim
        {3, 3, "fh", {{1, 5, C(0x31B2FF)}, {5, 2, C(0x8CDBFF)}, {2, 5, C(0x6BCBFF)}}},  // orange wins
        {3, 3, "fhp", {{0, 5, C(0x733C00)}, {37, 5, C(b)}, {1, 5, C(SB(q, -32))}, {5, 1, C(SB(q, -32))}}},
        {3, 3, "fhpd", {{5, 5, C(SB(b, -24))}, {0, 5, C(SB(b, -84))}, {1, 1, C(SB(b, -72))}, {0, T, C(SB(b, -104))}}},
        {4, 1, "", {{20, 10, {L}}, {0, 10, {D}}, {38, 10, {Sh}}, {37, 10, {F}}, {2, 10, {H}}, {3, 3, {H}}}},
        {4, 1, "p", {{20, 10, {Sh, -16}}, {1, 10, {Sh, -64}}, {2, 10, {Sh, -32}}, {37, 10, {Sh}}, {38, 10, {Sh, -16}}}},
        {5, 1, "", {{20, 10, {F, 12}}, {1, 10, {H}}, {0, 10, {Sh, -26}}, {39, 10, {H}}, {1, 18, {Sh, 26}}}},
        {5, 1, "p", {{20, 10, {Sh, 16}}, {39, 10, {H}}}},
        {5, 1, "pd", {{0, 10, {Sh}}, {39, 10, {Sh}}, {0, T, {Sh}}}},
        {6, 1, "", {{0, 0, {L, 8}}, {39, 19, {Sh}}, {1, 1, {L, 8}}}},
        {6, 1, "p", {{0, 0, {Sh}}, {38, 18, {L, 8}}}},
        {4, 1, "p", {{0, T, {L}}}},
        {7, 1, "", {{0, 0, {H}}}},
        {8, 1, "", {{0, 0, {F}}}},
        {12, 1, "", {{0, 0, {F}}}},
        {7, 1, "h", {{0, 0, {H}}, {39, 19, {Sh}}, {1, 1, {F}}}},
        {8, 1, "h", {{0, 0, {H}}, {39, 19, {Sh}}, {1, 1, {F}}}},
        {12, 1, "h", {{0, 0, {H}}, {39, 19, {D}}, {1, 1, {L}}}},
        {7, 1, "hp", {{0, 0, {Sh}}, {39, 19, {H}}}},
        {8, 1, "hp", {{0, 0, {Sh}}, {39, 19, {H}}}},
        {12, 1, "hp", {{0, 0, {D}}, {39, 19, {H}}}},
        {7, 1, "hpd", {{0, 0, {H}}}},
        {8, 1, "hpd", {{0, 0, {F}}}},
        {9, 1, "h", {{0, 0, {A}}, {20, 10, {AL}}}},
        {9, 1, "hp", {{0, 0, {A}}, {20, 10, C(BlendToWhite(0x6A240A, 128))}}},  // the fake's highlight colour
        {10, 1, "hp", {{0, 0, {F}}, {39, 19, {F}}}},                            // the face alone
        // The gradient of ButtonType 14 reaches H − 29 (58 / 20 × 10) at row 10.
        {14, 1, "", {{0, 10, {Sh, -50}}, {1, 10, {F, -9}}, {2, 2, {H}}, {3, 10, {H}}, {20, 10, {H, -29}}}},
        {14, 1, "Dh", {{20, 10, {L}}}},
        {14, 1, "Dhp", {{20, 10, {F, -9}}, {0, 10, {Sh, -48}}, {38, 10, {H}}, {0, T, {Sh, -50}}}},
        {0, 1, "", {{0, 0, {F}}}},  // outside 1 to 14: the face only
    };
    for (const auto& [type, scheme, steps, pixels] : cases) {
        Look look(type, 40, 20, scheme);
        look.Play(steps);
        for (const Pixel& px : pixels) {
            const Rgb want = px.want.entry ? S(look.p().*px.want.entry, px.want.shift) : px.want.fixed;
            EXPECT_EQ(px.y == T ? look.canvas.texts.at(px.x).colour : look.At(px.x, px.y), want)
                << type << " \"" << steps << "\" (" << px.x << ", " << px.y << ")";
        }
    }
}

TEST(XPButtonLooks, CaptionsOfTheLooks) {
    Look l(2);  // the caption moves down-right when pressed
    EXPECT_EQ(l.canvas.texts.at(0).box, l.button.captionRect());
    l.Press();
    EXPECT_EQ(l.canvas.texts.at(0).box, l.button.captionRectDown());
    Look g(3, 40, 20, 3);
    g.Play("f");
    EXPECT_TRUE(g.canvas.focusRects.empty()) << "the gradient look shows focus by its trim";
    Look e(4);
    e.button.SetSpecialEffect(3);  // the pressed caption's effect copies use the pressed fill as their base
    e.Press();
    EXPECT_EQ(e.canvas.texts.at(0).colour, S(S(e.p().ShadowColor, -16), -40));
    Look f(5);
    f.Play("fp");  // the focus frame stays, the caption does not move when pressed
    const Box c = f.button.captionRect();
    EXPECT_EQ(std::make_pair(f.At(c.left - 2, c.top - 1), f.canvas.texts.at(0).box), std::make_pair(0xCC9999u, c));
    Look d(14);
    d.Play("D");  // the default button's caption is bold without changing the font
    EXPECT_TRUE(d.canvas.texts.at(0).font.bold);
    EXPECT_FALSE(d.button.FontBold());
    EXPECT_TRUE(Look(0).canvas.texts.empty());
    EXPECT_TRUE(Look(10).canvas.texts.empty());
}

TEST(XPButtonLooks, SpecialLooksAndStates) {
    // The transparent look: the parent's pixels in place of the face (where they come from and a
    // resize during the capture are proved under Wine); shown again, it copies the parent as it is now.
    Look parent(11);
    parent.button.OnHide();
    parent.host.parentPixel = 0x445566;
    parent.button.OnShow();
    EXPECT_EQ(parent.At(5, 5), 0x445566u);

    Look oval(13);
    EXPECT_EQ(oval.canvas.ovals.at(0).pen, oval.p().FaceColor);
    oval.Hover();
    EXPECT_EQ(oval.canvas.ovals.at(0).pen, oval.p().ShadowColor);
    oval.Press();
    EXPECT_EQ(oval.canvas.ovals.at(0).brush, S(oval.p().FaceColor, -32));

    Look soft(3, 40, 20, 3);  // SoftBevel halves every amount, the gradient steps included
    soft.button.SetSoftBevel(true);
    EXPECT_EQ(soft.At(20, 10), ShiftColor(ShiftColor(0xC0C0C0, 48, true, true), -12, true, true));

    // Paint(1) draws the face only; a checked two-state button is drawn pressed, unless disabled.
    Look l(1);
    l.button.Paint(1, true);
    EXPECT_EQ(l.At(0, 0), l.p().FaceColor);
    EXPECT_TRUE(l.canvas.texts.empty());
    l.button.SetCheckBoxBehaviour(true);
    l.button.SetValue(true);
    l.Hover();
    EXPECT_EQ(l.At(1, 1), l.p().ShadowColor);
    l.button.SetEnabled(false);
    EXPECT_EQ(l.At(1, 1), l.p().HighlightColor);

    // An unforced repaint with nothing changed leaves the surface alone.
    Look same(3);
    same.canvas.FillBox(0, 0, 40, 20, 0x123456);
    same.button.Paint(0, false);
    same.button.OnMouseUp(1, 0, 0, 0);
    EXPECT_EQ(same.At(20, 10), 0x123456u);
    same.button.Paint(2, false);
    EXPECT_NE(same.At(20, 10), 0x123456u);
}

TEST(XPButtonGeometry, RegionsFocusAndCaption) {
    Look l(1, 75, 23);
    auto shape = [&](int type) {
        l.button.SetButtonType(type);
        return l.host.shape;
    };
    using P = std::pair<std::int32_t, std::int32_t>;
    EXPECT_EQ(shape(1).removed, (std::vector<P>{{0, 0}, {74, 0}, {0, 22}, {74, 22}}));
    EXPECT_EQ(shape(14).removed.size(), 4u);
    EXPECT_EQ(shape(5).removed, (std::vector<P>{{0, 22}, {74, 0}}));
    const std::vector<P> rounded = shape(3).removed;
    EXPECT_EQ(rounded.size(), 12u);
    EXPECT_NE(std::find(rounded.begin(), rounded.end(), P{73, 22}), rounded.end());
    EXPECT_NE(std::find(rounded.begin(), rounded.end(), P{0, 21}), rounded.end());
    EXPECT_EQ(shape(4).removed, rounded);
    EXPECT_TRUE(shape(13).ellipse);
    EXPECT_TRUE(shape(2).removed.empty());

    const std::pair<int, Box> focus[] = {{1, {4, 4, 71, 19}}, {9, {3, 3, 72, 20}}, {14, {6, 6, 71, 19}}};
    for (const auto& [type, box] : focus) {
        l.button.SetButtonType(type);
        EXPECT_EQ(l.button.focusRect(), box) << type;
    }

    // "Save": 28 × 13 at (1, 1) in the box, moved by ((75 − 29) / 2, (23 − 14) / 2).
    l.button.SetCaption("Save");
    EXPECT_EQ(l.button.captionRect(), (Box{24, 5, 52, 18}));
    EXPECT_EQ(l.button.captionRectDown(), (Box{25, 6, 53, 19}));
    // A 16 × 16 picture to the left: box (17, 1, 73, 21), caption moved by (15, 4).
    l.button.SetPictureNormal(
        std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 16, 16, std::vector<Rgb>(256)));
    auto placed = [&] {
        const auto r = l.button.pictureRect();
        return std::make_tuple(l.button.captionRect(), r.x, r.y);
    };
    EXPECT_EQ(placed(), std::make_tuple(Box{32, 5, 60, 18}, 32 - 16 - 4, 3));
    l.button.SetPicturePosition(1);  // right: box (1, 1, 57, 21), dx = (75 − 16 − 29 − 4) / 2
    EXPECT_EQ(placed(), std::make_tuple(Box{14, 5, 42, 18}, 46, 3));
    l.button.SetPicturePosition(3);  // below: dy = (23 − 16 − 14 − 4) / 2 = −5
    EXPECT_EQ(l.button.captionRect().top, -4);
    EXPECT_EQ(l.button.pictureRect().y, l.button.captionRect().bottom + 2);
    l.button.SetCaption("  ");  // an empty caption centres the picture
    EXPECT_EQ(std::make_pair(l.button.pictureRect().x, l.button.pictureRect().y),
              std::make_pair((75 - 16) / 2, (23 - 16) / 2));

    // At 127 dpi one pixel is 20 HIMETRIC: 50 → 2.5 → 2, 70 → 3.5 → 4, 61 → 3.05 → 3.
    l.host.dpi = 127;
    auto picture = std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 1, 1, std::vector<Rgb>{0});
    picture->SetHimetric(50, 70);
    l.button.SetPictureNormal(picture);
    EXPECT_EQ(std::make_pair(l.button.pictureRect().width, l.button.pictureRect().height), std::make_pair(2, 4));
    picture->SetHimetric(61, 0);
    l.button.SetPictureNormal(picture);
    EXPECT_EQ(std::make_pair(l.button.pictureRect().width, l.button.pictureRect().height), std::make_pair(3, 0));
}

// The pictures are drawn on a face (0x406080) that differs from the mask colour (0xC0C0C0), so a
// key-coloured pixel that is drawn shows.
constexpr Rgb kFace = 0x406080, kKey = 0xC0C0C0;

TEST(XPButtonPictures, BlitPictureRules) {
    Look l(10, 8, 8, 2);
    l.button.SetBackColor(kFace);
    ASSERT_EQ(l.p().FaceColor, kFace);
    // Key colour, mid-grey sum 385, grey sum 384, pure red.
    const std::vector<Rgb> px = {kKey, MakeRgb(129, 128, 128), MakeRgb(128, 128, 128), MakeRgb(255, 0, 0)};
    MemoryPicture picture(platform::PictureKind::kBitmap, 4, 1, px);
    auto row = [&](int y, int n = 4) {
        std::vector<Rgb> out;
        for (int x = 0; x < n; ++x) out.push_back(l.At(x, y));
        return out;
    };
    l.button.BlitPicture(0, 0, 4, 1, picture, kKey, -1, false, false, false);
    EXPECT_EQ(row(0), (std::vector<Rgb>{kFace, px[1], px[2], px[3]})) << "the key colour is never drawn";
    l.button.BlitPicture(0, 1, 4, 1, picture, kKey, 0x000000, true, false, false);
    EXPECT_EQ(row(1), (std::vector<Rgb>{kFace, kFace, 0, 0})) << "dark-only silhouette: red + green + blue < 385";
    l.button.BlitPicture(0, 2, 4, 1, picture, kKey, -1, false, true, false);
    EXPECT_EQ(row(2)[0], kFace);
    EXPECT_EQ(row(2)[3], MakeRgb(76, 76, 76)) << "greyscale of pure red";
    l.button.BlitPicture(0, 3, 4, 1, picture, kKey, -1, false, false, true);
    EXPECT_EQ(row(3)[0], kFace);
    EXPECT_EQ(row(3)[3], MakeRgb((2 * 255 + 0x80) / 3, 0x60 / 3, 0x40 / 3)) << "two thirds picture, one third face";
    // Without UseMaskColor the key colour is drawn too; negative sizes mean the picture's own.
    l.button.SetUseMaskColor(false);
    l.button.BlitPicture(0, 4, -1, -1, picture, kKey, 0x0000FF, false, false, false);
    EXPECT_EQ(row(4, 5), (std::vector<Rgb>{0x0000FF, 0x0000FF, 0x0000FF, 0x0000FF, kFace}));
    // Pixels beyond the surface are dropped, not wrapped.
    l.button.BlitPicture(6, 7, 4, 1, picture, kKey, 0x00FF00, false, false, false);
    EXPECT_EQ(row(7, 1)[0], kFace);
    EXPECT_EQ(l.At(6, 7), 0x00FF00u);
    // An icon's transparent parts take the mask colour and so stay transparent.
    l.button.SetUseMaskColor(true);
    MemoryPicture icon(platform::PictureKind::kIcon, 2, 1, {0x0000FF, 0x00FF00}, {true, false});
    l.button.BlitPicture(0, 5, 2, 1, icon, kKey, -1, false, false, false);
    EXPECT_EQ(row(5, 2), (std::vector<Rgb>{kFace, 0x00FF00}));
}

TEST(XPButtonPictures, PictureByStateAndEffects) {
    // A 2 × 2 black square with a key-coloured corner, centred on a 40 × 20 button.
    Look l(2, 40, 20, 2);
    l.button.SetBackColor(kFace);
    l.button.SetBackOver(kFace);
    l.button.SetCaption("");
    l.button.SetPictureNormal(
        std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 2, 2, std::vector<Rgb>{kKey, 0, 0, 0}));
    const auto r = l.button.pictureRect();
    const Palette p = l.p();
    auto at = [&](int dx, int dy) { return l.At(r.x + dx, r.y + dy); };
    EXPECT_EQ(std::make_pair(r.x, r.y), std::make_pair(19, 9));
    EXPECT_EQ(std::make_pair(at(0, 0), at(1, 0)), std::make_pair(kFace, Rgb{0}));
    l.Press();  // moved by (1, 1)
    EXPECT_EQ(std::make_pair(at(1, 1), at(2, 1)), std::make_pair(kFace, Rgb{0}));
    l.button.SetEnabled(false);  // engraved: highlight at (+1, +1) under the shadow silhouette
    EXPECT_EQ(std::make_pair(at(1, 0), at(2, 2)), std::make_pair(p.ShadowColor, p.HighlightColor));
    l.button.SetEnabled(true);
    l.button.SetPictureOver(
        std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 2, 2, std::vector<Rgb>(4, 0x0000FF)));
    l.Hover();
    EXPECT_EQ(at(0, 0), 0x0000FFu) << "hovering shows PictureOver";
    l.host.pointerOver = false;
    l.button.OnOverTimer();
    // Raised: a darker copy below-right and a lighter one above-left; sunken the other way round;
    // drop shadow: only the darker copy below-right. The key-coloured corner casts no copy.
    const std::tuple<int, Rgb, Rgb> effects[] = {
        {1, S(kFace, -40), S(kFace, 40)}, {2, S(kFace, 40), S(kFace, -40)}, {3, S(kFace, -40), kFace}};
    for (const auto& [effect, belowRight, aboveLeft] : effects) {
        l.button.SetSpecialEffect(effect);
        EXPECT_EQ(std::make_tuple(at(2, 2), at(0, -1), at(1, 0), at(-1, -1)),
                  std::make_tuple(belowRight, aboveLeft, Rgb{0}, kFace))
            << effect;
    }
    // Caption copies: sunken puts the lighter copy below-right, then the darker, then the text.
    l.button.SetCaption("Go");
    l.button.SetSpecialEffect(2);
    ASSERT_EQ(l.canvas.texts.size(), 3u);
    EXPECT_EQ(std::make_tuple(l.canvas.texts[0].colour, l.canvas.texts[1].colour, l.canvas.texts[2].colour),
              std::make_tuple(S(kFace, 40), S(kFace, -40), p.TextColor));
    EXPECT_EQ(l.canvas.texts[0].box, Offset(l.button.captionRect(), 1, 1));
    l.button.SetSpecialEffect(0);
    l.button.SetPicturePosition(4);
    EXPECT_EQ(l.canvas.texts.size(), 2u) << "position 4 draws the caption again over the picture";
    l.button.SetButtonType(9);  // see-through until hovered: two thirds picture, one third face
    EXPECT_EQ(l.At(l.button.pictureRect().x + 1, l.button.pictureRect().y), MakeRgb(0x80 / 3, 0x60 / 3, 0x40 / 3));
}

}  // namespace
}  // namespace vantorel::xpbutton
