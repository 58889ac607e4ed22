// The push button on the fake host: its property store; colour arithmetic, palette, looks, pictures,
// painting and geometry on the raster canvas (text and ovals are recorded there, so only the solid
// parts are compared pixel by pixel); and the input real window messages under Wine do not stage.
// That GDI draws the same pixels, and the input the window turns messages into, are proved under
// Wine (tests/win32/xpbutton_win32_test.cpp).
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <tuple>
#include <vector>

#include "controls/xpbutton/kirel_xp_button.h"
#include "fakes/fake_button_host.h"
#include "fakes/raster_canvas.h"

namespace vantorel::xpbutton {
namespace {

using platform::PictureKind;
using testing::FakeButtonHost;
using testing::MemoryPicture;
using testing::RasterCanvas;

Rgb S(Rgb c, int n) { return ShiftColor(c, n, false, false); }
Rgb SB(Rgb c, int n) { return ShiftColor(c, n, true, false); }

using testing::kKey;
using testing::kRow;
using Look = testing::Look<RasterCanvas>;

TEST(XPButtonProperties, StoreRoundTrip) {
    // A value other than the default under every key, in the order the control writes them.
    PicturePtr picture = std::make_shared<MemoryPicture>(PictureKind::kBitmap, 2, 2, std::vector<Rgb>(4));
    PicturePtr over = std::make_shared<MemoryPicture>(PictureKind::kIcon, 1, 1, std::vector<Rgb>(1));
    PicturePtr cursor = std::make_shared<MemoryPicture>(PictureKind::kIcon, 1, 1, std::vector<Rgb>(1));
    const FontDesc font{"Tahoma", 10.5, true, true, false, true};
    const std::pair<const char*, PropertyValue> stored[] = {{"BTYPE", 9},       {"TX", std::string("&Go now")},
                                                            {"ENAB", false},    {"FONT", font},
                                                            {"COLTYPE", 2},     {"FOCUSR", false},
                                                            {"BCOL", 0x00FF00}, {"BCOLO", 0x0000FF},
                                                            {"FCOL", 0x111111}, {"FCOLO", 0x222222},
                                                            {"MCOL", 0xFF00FF}, {"MPTR", std::int16_t{11}},
                                                            {"MICON", cursor},  {"PICN", picture},
                                                            {"PICH", over},     {"UMCOL", false},
                                                            {"SOFT", true},     {"PICPOS", 3},
                                                            {"NGREY", true},    {"FX", 2},
                                                            {"HAND", false},    {"CHECK", true},
                                                            {"VALUE", true},    {"ImageIndex", std::int16_t{7}}};
    PropertyBag bag;
    for (const auto& [key, value] : stored) bag.Write(key, value);
    Look r(2);
    r.button.ReadProperties(bag);
    PropertyBag again;  // what was read writes back the same
    r.button.WriteProperties(again);
    EXPECT_EQ(again.Keys(), bag.Keys());
    for (const std::string& key : bag.Keys()) EXPECT_TRUE(*again.Find(key) == *bag.Find(key)) << key;
}

TEST(XPButtonInput, DraggingOutAndBackAndTheEnd) {
    Look l(2);
    l.Play("h");  // hovering, pressed, dragged out and back in
    l.button.OnMouseDown(1, 0, 1, 1);
    l.host.pointerOver = false;
    l.button.OnMouseMove(1, 0, 100, 1);  // leaving with the left button held paints up
    EXPECT_EQ(l.button.lastState(), 0);
    l.host.pointerOver = true;
    l.button.OnMouseMove(1, 0, 1, 1);  // back in, still holding: pressed, the hover flag clear
    EXPECT_EQ(std::make_pair(l.button.lastState(), l.button.hovering()), std::make_pair(2, false));
    l.button.OnTerminate();  // the end stops painting
    EXPECT_FALSE(l.button.paintingEnabled());
}

TEST(XPButtonColour, ShiftAndBlend) {
    const std::tuple<Rgb, int, bool, bool, Rgb> shifts[] = {
        {0xC0C0C0, 48, true, false, 0xF0F0F0},                // blue scaling: 192 + 48 in every channel
        {0x804020, -64, false, false, 0x400000},              // clamps at 0
        {0xF0F0F0, -2, true, false, MakeRgb(238, 238, 238)},  // blue: 240 × −2 / 192 = −2.5 → −2
        {0x808080, -3, false, true, 0x7F7F7F},                // SoftBevel halves toward zero: −3 → −1
    };
    for (auto [from, amount, blue, soft, to] : shifts) EXPECT_EQ(ShiftColor(from, amount, blue, soft), to) << from;
    EXPECT_EQ(BlendToWhite(MakeRgb(10, 36, 106), 176),  // c × (255 − a) / 255 + a, truncating
              MakeRgb(10 * 79 / 255 + 176, 36 * 79 / 255 + 176, 106 * 79 / 255 + 176));
}

TEST(XPButtonColour, CustomPaletteAndAmbientChanges) {
    Look custom(2, 40, 20, 2);
    custom.button.SetBackColor(0x406080);  // recomputed and painted at once, as the switch's colour changes
    EXPECT_EQ(custom.At(20, 10), 0x406080u);
    custom.button.SetForeColor(0x80000000u | platform::kColorHighlight);  // a system colour reference
    const Palette& p = custom.p();
    EXPECT_EQ((std::vector<Rgb>{p.FaceColor, p.TextColor, p.ShadowColor, p.DarkShadowColor, p.LightColor,
                                p.HighlightColor, p.AccentColor, p.AccentLightColor, p.BaseColor}),
              (std::vector<Rgb>{0x406080, 0x6A240A, S(0x406080, -64), 0, S(0x406080, 31), S(0x406080, 47),
                                S(0x406080, -128), 0x406080, S(0x406080, 48)}));
    custom.host.systemColours[platform::kColorHighlight] = 0x010203;
    custom.button.OnAmbientChanged();  // the custom scheme is not recomputed
    EXPECT_EQ(p.TextColor, 0x6A240Au);

    Look over(2, 40, 20, 2);  // hovering with the custom scheme draws the look from BackOver, then restores
    over.Play("h");
    EXPECT_EQ(std::make_pair(over.At(20, 10), over.At(0, 0)), std::make_pair(Rgb{0x30C080}, S(0x30C080, 47)));
    EXPECT_EQ(std::make_pair(over.button.BackColor(), over.p().FaceColor), std::make_pair(0x3080C0u, 0x3080C0u));
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
constexpr Rgb Palette::*Tx = &Palette::TextColor;
Want C(Rgb c) { return {nullptr, 0, c}; }
// A pixel; or with y = T the colour of caption text x in drawing order, with O or B the pen or the
// brush of oval x.
struct Pixel {
    int x, y;
    Want want;
};
constexpr int T = -1, O = -2, B = -3;
// ButtonType, ColorScheme, the steps played on a 40 × 20 button captioned "Go", the pixels it shows.
using Case = std::tuple<int, int, const char*, std::vector<Pixel>>;

void ExpectPixels(const std::vector<Case>& cases) {
    for (const auto& [type, scheme, steps, pixels] : cases) {
        Look look(type, 40, 20, scheme);
        look.Play(steps);
        for (const Pixel& px : pixels) {
            const auto& c = look.canvas;
            const Rgb got = px.y == T   ? c.texts.at(px.x)
                            : px.y == O ? c.ovals.at(px.x).first
                            : px.y == B ? c.ovals.at(px.x).second
                                        : c.At(px.x, px.y);
            EXPECT_EQ(got, px.want.entry ? S(look.p().*px.want.entry, px.want.shift) : px.want.fixed)
                << type << " \"" << steps << "\" (" << px.x << ", " << px.y << ")";
        }
    }
}

TEST(XPButtonLooks, EveryLookInEveryState) {
    const Rgb b = 0xF0F0F0;    // BaseColor of scheme 3 (0xC0C0C0 + 48, blue-scaled for ButtonType 3)
    const Rgb q = SB(b, -32);  // the pressed gradient's base
    ExpectPixels({
        {1, 1, "", {{0, 0, {D}}, {1, 1, {H}}, {38, 1, {Sh}}, {1, 18, {Sh}}, {2, 2, {H}}, {37, 17, {Sh}}}},
        {1, 1, "p", {{1, 1, {Sh}}, {38, 18, {H}}, {0, 0, {D}}}},
        {1, 1, "cv", {{1, 1, {Sh}}}},  // a checked two-state button is drawn pressed,
        {1, 1, "cvd", {{1, 1, {H}}}},  // unless disabled
        {2, 1, "", {{0, 0, {H}}, {39, 0, {D}}, {0, 19, {D}}, {1, 1, {L}}, {38, 18, {Sh}}}},
        {2, 1, "p", {{0, 0, {D}}, {39, 19, {H}}, {1, 1, {Sh}}, {38, 18, {L}}}},
        {2, 1, "D", {{0, 0, {D}}, {1, 1, {H}}, {38, 18, {D}}}},  // the default: dark frame round an inset bevel
        {2, 1, "Dp", {{1, 1, {Sh}}, {38, 18, {Sh}}, {2, 2, {F}}}},
        {2, 1, "Dpd", {{0, 0, {H}}, {0, T, {H}}, {1, T, {Sh}}}},  // the caption engraved
        {3, 3, "", {{0, 5, C(0x733C00)}, {1, 1, C(0x7B4D10)}, {1, 5, C(SB(b, -5))}, {2, 5, C(SB(b, -10))}}},
        // Row 10 of the gradient: 25 / 20 × 10 = 12.5, rounded to even.
        {3, 3, "", {{38, 5, C(SB(b, -36))}, {5, 18, C(SB(b, -48))}, {5, 1, C(SB(b, 16))}, {20, 10, C(SB(b, -12))}}},
        // SoftBevel halves every amount, the gradient steps included.
        {3, 2, "", {{5, 1, C(SB(SB(0x3080C0, 48), 16))}}},  // the custom scheme's BaseColor is blue-scaled too
        {3, 3, "s", {{20, 10, C(ShiftColor(ShiftColor(0xC0C0C0, 48, true, true), -12, true, true))}}},
        {3, 3, "f", {{1, 5, C(0xE7AE8C)}, {5, 18, C(0xEF826B)}}},                       // the blue trim
        {3, 3, "fh", {{1, 5, C(0x31B2FF)}, {5, 2, C(0x8CDBFF)}, {2, 5, C(0x6BCBFF)}}},  // orange wins
        {3, 3, "fhp", {{0, 5, C(0x733C00)}, {37, 5, C(b)}, {1, 5, C(SB(q, -32))}, {5, 1, C(SB(q, -32))}}},
        {3, 3, "fhpd", {{5, 5, C(SB(b, -24))}, {0, 5, C(SB(b, -84))}, {1, 1, C(SB(b, -72))}, {0, T, C(SB(b, -104))}}},
        {4, 1, "", {{20, 10, {L}}, {0, 10, {D}}, {38, 10, {Sh}}, {37, 10, {F}}, {2, 10, {H}}, {3, 3, {H}}}},
        {4, 1, "p", {{20, 10, {Sh, -16}}, {1, 10, {Sh, -64}}, {2, 10, {Sh, -32}}, {37, 10, {Sh}}, {38, 10, {Sh, -16}}}},
        {4, 1, "p", {{0, T, {L}}}},
        {4, 1, "3p", {{0, T, C(S(S(0x808080, -16), -40))}}},  // the effect copy's base is the pressed fill
        {5, 1, "", {{20, 10, {F, 12}}, {1, 10, {H}}, {0, 10, {Sh, -26}}, {39, 10, {H}}, {1, 18, {Sh, 26}}}},
        {5, 1, "p", {{20, 10, {Sh, 16}}, {39, 10, {H}}}},
        {5, 1, "fp", {{11, 3, C(0xCC9999)}}},  // the focus frame round the caption stays when pressed
        {5, 1, "pd", {{0, 10, {Sh}}, {39, 10, {Sh}}, {0, T, {Sh}}}},
        {6, 1, "", {{0, 0, {L, 8}}, {39, 19, {Sh}}, {1, 1, {L, 8}}}},
        {6, 1, "p", {{0, 0, {Sh}}, {38, 18, {L, 8}}}},
        {7, 1, "", {{0, 0, {H}}, {39, 19, {Sh}}, {1, 1, {F}}}},
        {8, 1, "", {{0, 0, {F}}}},
        {12, 1, "", {{0, 0, {F}}}},
        {8, 1, "h", {{0, 0, {H}}, {39, 19, {Sh}}, {1, 1, {F}}}},
        {12, 1, "h", {{0, 0, {H}}, {39, 19, {D}}, {1, 1, {L}}}},
        {7, 1, "hp", {{0, 0, {Sh}}, {39, 19, {H}}}},
        {12, 1, "hp", {{0, 0, {D}}, {39, 19, {H}}}},
        {7, 1, "hpd", {{0, 0, {H}}}},
        {8, 1, "hpd", {{0, 0, {F}}}},
        {9, 1, "h", {{0, 0, {A}}, {20, 10, {AL}}}},
        {9, 1, "hp", {{0, 0, {A}}, {20, 10, C(BlendToWhite(0x6A240A, 128))}}},  // the fake's highlight colour
        {10, 1, "hp", {{0, 0, {F}}, {39, 19, {F}}}},                            // the face alone
        {10, 3, "", {{0, 0, C(0xC0C0C0)}}},  // scheme 3 has fixed colours, whatever BackColor
        {9, 3, "h", {{20, 10, C(0xD1ADAD)}}},
        {13, 1, "", {{0, O, {F}}}},
        {13, 1, "h", {{0, O, {Sh}}}},
        {13, 1, "hp", {{0, O, {D}}, {0, B, {F, -32}}}},
        // The gradient of ButtonType 14 reaches H − 29 (58 / 20 × 10) at row 10.
        {14, 1, "", {{0, 10, {Sh, -50}}, {1, 10, {F, -9}}, {2, 2, {H}}, {3, 10, {H}}, {20, 10, {H, -29}}}},
        {14, 1, "Dh", {{20, 10, {L}}}},
        {14, 1, "Dhp", {{20, 10, {F, -9}}, {0, 10, {Sh, -48}}, {38, 10, {H}}, {0, T, {Sh, -50}}}},
        {0, 1, "", {{0, 0, {F}}}},  // outside 1 to 14: the face only
    });
}

// The row of four lies at (7, 9) to (10, 9), left of the caption "Go" (14 × 13, centred in the rest);
// right of it from (27, 9), below it from (18, 16), and centred from (18, 9) without a caption. The
// icon lies at (8, 9) and (9, 9).
TEST(XPButtonPictures, EveryRuleOnEveryPath) {
    ASSERT_NE(FakeButtonHost().systemColours.at(platform::kColorBtnFace), kKey);
    const Rgb red = kRow[3];
    ExpectPixels({
        {2, 1, "P", {{7, 9, {F}}, {8, 9, C(kRow[1])}, {9, 9, C(kRow[2])}, {10, 9, C(red)}}},  // the key is never drawn
        {2, 1, "Pm", {{7, 9, C(kKey)}, {9, 10, {F}}}},    // without UseMaskColor; without an effect, no copies
        {2, 1, "I", {{8, 9, {F}}, {9, 9, C(0x00FF00)}}},  // an icon's transparent parts take the key colour
        {2, 1, "Pg", {{7, 9, {F}}, {10, 9, C(MakeRgb(76, 76, 76))}}},  // greyscale
        {2, 1, "Pp", {{8, 10, {F}}, {11, 10, C(red)}}},                // pressed: moved by (1, 1)
        // Disabled, engraved: dark pixels only (sum under 385), in highlight at (+1, +1) under shadow.
        {2, 1, "Pd", {{8, 9, {F}}, {9, 9, {Sh}}, {9, 10, {F}}, {10, 10, {H}}}},
        {2, 1, "POh", {{7, 9, C(0xFF0000)}}},  // hovering shows PictureOver
        {2, 1, "PR", {{27, 9, {F}}, {28, 9, C(kRow[1])}}},
        {2, 1, "PV", {{18, 16, {F}}, {19, 16, C(kRow[1])}}},
        {2, 1, "PVn", {{18, 9, {F}}, {19, 9, C(kRow[1])}}},
        // Raised: a darker copy below-right and a lighter one above-left; drop shadow: only the
        // darker copy below-right. The key-coloured pixel casts no copy.
        {2, 1, "P1", {{11, 10, {F, -40}}, {9, 10, {F, -40}}, {9, 8, {F, 40}}, {8, 10, {F}}, {6, 8, {F}}}},
        {2, 1, "P3", {{11, 10, {F, -40}}, {9, 8, {F}}}},
        {2, 1, "2", {{0, T, {F, 40}}, {1, T, {F, -40}}, {2, T, {Tx}}}},  // the caption's copies: the same order
        {2, 1, "PX", {{1, T, {Tx}}}},  // behind the caption: the caption is drawn again over the picture
        // See-through until hovered: two thirds picture, one third face (0xC8D0D4).
        {9, 1, "P", {{10, 9, C(MakeRgb((2 * 255 + 0xD4) / 3, 0xD0 / 3, 0xC8 / 3))}}},
    });
}

TEST(XPButtonLooks, WhenThereIsPainting) {
    Look l(3);
    auto mark = [&] { l.canvas.FillBox(0, 0, 40, 20, 0x123456); };
    auto painted = [&] { return l.At(20, 10) != 0x123456u; };
    mark();                    // unforced repaints with nothing changed, a value without two states and moves with the
    l.button.Paint(0, false);  // right button draw nothing
    l.button.OnMouseUp(1, 0, 0, 0);
    l.button.SetValue(true);
    l.button.OnMouseMove(2, 0, 1, 1);
    EXPECT_FALSE(painted());
    l.button.Paint(2, false);
    EXPECT_TRUE(painted());
    l.button.OnHide();  // hidden: painting is dropped and the next show paints in full
    mark();
    l.button.SetCaption("Off");
    EXPECT_FALSE(painted());
    l.button.OnShow();
    EXPECT_TRUE(painted());
}

TEST(XPButtonGeometry, FocusRectangles) {
    Look l(1, 75, 23);
    // Focused, the looks draw their focus rectangle; the gradient look shows focus by its trim.
    l.button.OnGotFocus();
    const std::pair<int, std::vector<Box>> focus[] = {
        {3, {}}, {1, {{4, 4, 71, 19}}}, {9, {{3, 3, 72, 20}}}, {14, {{6, 6, 71, 19}}}};
    for (const auto& [type, boxes] : focus) {
        l.button.SetButtonType(type);
        EXPECT_EQ(l.canvas.focusRects, boxes) << type;
    }
    l.button.OnLostFocus();
    EXPECT_TRUE(l.canvas.focusRects.empty());
}

}  // namespace
}  // namespace vantorel::xpbutton
