// The push button's properties and property store, and the input that real window messages under
// Wine (tests/win32/xpbutton_win32_test.cpp) do not stage: dragging out and back, and the end of
// the control.
#include <gtest/gtest.h>

#include <string>
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

struct Fixture {
    FakeButtonHost host;
    RasterCanvas canvas;
    KirelXPButton button{host, canvas};
};

TEST(XPButtonProperties, NewControlDefaultsAndTheStoreRoundTrip) {
    Fixture n;
    n.host.systemColours[platform::kColorBtnText] = 0x123456;
    KirelXPButton& fresh = n.button;
    fresh.InitNewControl();
    EXPECT_EQ(fresh.Caption() + " " + fresh.FontName() + " " + n.host.windowFont.name + " " + fresh.Version(),
              "KirelXPButton1 Verdana Verdana 2.0.6");
    EXPECT_EQ(
        (std::vector<Rgb>{fresh.BackColor(), fresh.BackOver(), fresh.ForeColor(), fresh.ForeOver(), fresh.MaskColor()}),
        (std::vector<Rgb>{0xFFFFFF, 0xFFFFFF, 0x123456, 0xFF0000, 0xC0C0C0}));
    EXPECT_EQ(std::make_tuple(fresh.ButtonType(), fresh.ColorScheme(), fresh.Enabled(), fresh.ShowFocusRect(),
                              fresh.UseMaskColor(), fresh.SoftBevel()),
              std::make_tuple(3, 1, true, true, true, false));
    EXPECT_TRUE(n.host.notified.empty()) << "no setter ran";
    PropertyBag written;
    fresh.WriteProperties(written);
    EXPECT_TRUE(written.ReadBool("HAND", false));
    EXPECT_FALSE(written.Contains("ImageIndex")) << "ImageIndex 0 is not written";

    // A value other than the default under every key, in the order the control writes them.
    PicturePtr picture = std::make_shared<MemoryPicture>(PictureKind::kBitmap, 2, 2, std::vector<Rgb>(4));
    PicturePtr over = std::make_shared<MemoryPicture>(PictureKind::kIcon, 1, 1, std::vector<Rgb>(1));
    PicturePtr cursor = std::make_shared<MemoryPicture>(PictureKind::kIcon, 1, 1, std::vector<Rgb>(1));
    const FontDesc font{"Tahoma", 10.5, true, true, false, true};  // its size rounds half to even
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
    Fixture r;
    r.button.ReadProperties(bag);
    PropertyBag again;  // what was read writes back the same
    r.button.WriteProperties(again);
    EXPECT_EQ(again.Keys(), bag.Keys());
    for (const std::string& key : bag.Keys()) EXPECT_TRUE(*again.Find(key) == *bag.Find(key)) << key;
    EXPECT_EQ(std::make_tuple(r.button.accessKey(), r.host.windowEnabled, r.host.windowFont, r.host.pointer,
                              r.host.mouseIcon, r.button.pictureRect().width, r.button.FontSize()),
              std::make_tuple('g', false, font, 11, cursor, 2, 10))
        << "the window follows what was read";
    EXPECT_TRUE(r.host.notified.empty()) << "reading runs no setter";
}

TEST(XPButtonProperties, ReadDefaultsFromAStore) {
    Fixture f;
    KirelXPButton& b = f.button;
    b.ReadProperties(PropertyBag{});
    EXPECT_EQ(std::make_tuple(b.ButtonType(), b.Caption(), b.Enabled(), b.ColorScheme(), b.MaskColor(), b.ImageIndex()),
              std::make_tuple(2, std::string(), true, 1, 0xC0C0C0u, 0))
        << "a fresh control gets type 3, a read one 2";
    EXPECT_EQ(b.PictureNormal(), nullptr);
    EXPECT_EQ((std::vector<Rgb>{b.BackColor(), b.BackOver(), b.ForeColor(), b.ForeOver()}),
              (std::vector<Rgb>{0x80000000u | platform::kColorBtnFace, 0x80000000u | platform::kColorBtnFace,
                                0x80000000u | platform::kColorBtnText, 0x80000000u | platform::kColorBtnText}));
    PropertyBag bag;  // BCOL and FCOL without over colours: the over colours follow them
    bag.Write("BCOL", std::int32_t{0x0000FF});
    bag.Write("FCOL", std::int32_t{0x00FF00});
    b.ReadProperties(bag);
    EXPECT_EQ(std::make_pair(b.BackOver(), b.ForeOver()), std::make_pair(0x0000FFu, 0x00FF00u));
}

TEST(XPButtonProperties, SettersNotifyAsStated) {
    Fixture f;
    KirelXPButton& b = f.button;
    b.InitNewControl();
    f.host.designMode = true;  // in design mode BackColor drags BackOver along; at run time not
    b.SetBackColor(0x0000FF);
    f.host.designMode = false;
    b.SetBackColor(0x00FF00);
    EXPECT_EQ(b.BackOver(), 0x0000FFu);
    b.SetValue(true);
    b.SetPictureOver(nullptr);
    EXPECT_EQ(f.host.notified, (std::vector<std::string>{"BCOL", "BCOL", "VALUE", "PICO"}));

    // Font pieces change the window font, without notification.
    f.host.notified.clear();
    b.SetFontBold(true);
    b.SetFontSize(12);
    EXPECT_EQ(std::make_tuple(f.host.windowFont.bold, f.host.windowFont.size, f.host.notified.empty()),
              std::make_tuple(true, 12.0, true));
    b.SetFontBold(false);  // ButtonType 5 in design mode makes the font bold
    f.host.designMode = true;
    b.SetButtonType(5);
    EXPECT_TRUE(b.FontBold());
    EXPECT_EQ(f.host.notified.back(), "BTYPE");
}

TEST(XPButtonInput, DraggingOutAndBackAndTheEnd) {
    Fixture f;
    f.button.InitNewControl();
    f.button.OnShow();
    f.button.OnResize();
    f.host.pointerOver = true;  // hovering, pressed, dragged out and back in
    f.button.OnMouseMove(0, 0, 1, 1);
    f.button.OnMouseDown(1, 0, 1, 1);
    f.host.pointerOver = false;
    f.button.OnMouseMove(1, 0, 100, 1);  // leaving with the left button held paints up
    EXPECT_EQ(f.button.lastState(), 0);
    f.host.pointerOver = true;
    f.button.OnMouseMove(1, 0, 1, 1);  // back in, still holding: pressed, the hover flag clear
    EXPECT_EQ(f.button.lastState(), 2);
    EXPECT_FALSE(f.button.hovering());

    f.button.OnMouseUp(1, 0, 1, 1);
    f.button.OnMouseMove(0, 0, 1, 1);  // hovering again
    f.button.OnTerminate();            // the end releases the shape and stops the hover timer and painting
    EXPECT_EQ(f.host.shape, platform::WindowShape{});
    EXPECT_FALSE(f.host.timerRunning);
    EXPECT_FALSE(f.button.paintingEnabled());
}

}  // namespace
}  // namespace vantorel::xpbutton
