// The push button's properties, property store and the input cases real window messages under Wine
// (tests/win32/xpbutton_win32_test.cpp) do not reach: handlers that change their arguments, drags,
// key sequences, hidden and batched painting, ambient changes and the end of the control.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "controls/xpbutton/kirel_xp_button.h"
#include "fakes/fake_button_host.h"
#include "fakes/raster_canvas.h"

namespace vantorel::xpbutton {
namespace {

using testing::FakeButtonHost;
using testing::MemoryPicture;
using testing::RasterCanvas;
using Log = std::vector<std::string>;

struct Fixture {
    FakeButtonHost host;
    RasterCanvas canvas;
    KirelXPButton button{host, canvas};
    Log log;

    // A new control, shown and sized, noting its clicks and hover events.
    Fixture() {
        button.InitNewControl();
        button.OnShow();
        button.OnResize();
        button.events.Click = [this] { log.push_back("Click"); };
        button.events.MouseOver = [this] { log.push_back("MouseOver"); };
        button.events.MOUSEOUT = [this] { log.push_back("MOUSEOUT"); };
        host.notified.clear();
    }
    // Whether the control painted since Mark().
    void Mark() { canvas.FillBox(0, 0, canvas.width(), canvas.height(), 0x0A0B0C); }
    bool Painted() const { return canvas.At(5, 5) != 0x0A0B0C; }
    int Clicks() const { return static_cast<int>(std::count(log.begin(), log.end(), "Click")); }
};

TEST(XPButtonProperties, NewControlDefaultsAndTheStoreRoundTrip) {
    FakeButtonHost host;
    host.systemColours[platform::kColorBtnText] = 0x123456;
    RasterCanvas canvas;
    KirelXPButton fresh(host, canvas);
    fresh.InitNewControl();
    EXPECT_EQ(fresh.Caption() + " " + fresh.FontName() + " " + host.windowFont.name + " " + fresh.Version(),
              "KirelXPButton1 Verdana Verdana 2.0.6");
    EXPECT_EQ((std::vector<Rgb>{fresh.BackColor(), fresh.BackOver(), fresh.ForeColor(), fresh.ForeOver(),
                                fresh.MaskColor()}),
              (std::vector<Rgb>{0xFFFFFF, 0xFFFFFF, 0x123456, 0xFF0000, 0xC0C0C0}));
    EXPECT_EQ(std::make_tuple(fresh.ButtonType(), fresh.ColorScheme(), fresh.Enabled(), fresh.ShowFocusRect(),
                              fresh.UseMaskColor(), fresh.SoftBevel()),
              std::make_tuple(3, 1, true, true, true, false));
    EXPECT_TRUE(host.notified.empty()) << "no setter ran";

    Fixture f;
    KirelXPButton& b = f.button;
    auto picture = std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 2, 2, std::vector<Rgb>(4, 0x102030));
    auto over = std::make_shared<MemoryPicture>(platform::PictureKind::kIcon, 1, 1, std::vector<Rgb>(1, 0x0000FF));
    auto cursor = std::make_shared<MemoryPicture>(platform::PictureKind::kIcon, 1, 1, std::vector<Rgb>(1, 0));
    const FontDesc font{"Tahoma", 11.5, true, true, false, true};
    b.SetButtonType(9);
    b.SetCaption("&Go now");
    b.SetEnabled(false);
    b.SetFont(font);
    b.SetColorScheme(2);
    b.SetShowFocusRect(false);
    b.SetBackColor(0x00FF00);
    b.SetBackOver(0x0000FF);
    b.SetForeColor(0x111111);
    b.SetForeOver(0x222222);
    b.SetMaskColor(0xFF00FF);
    b.SetMousePointer(11);
    b.SetMouseIcon(cursor);
    b.SetPictureNormal(picture);
    b.SetPictureOver(over);
    b.SetUseMaskColor(false);
    b.SetSoftBevel(true);
    b.SetPicturePosition(3);
    b.SetUseGreyscale(true);
    b.SetSpecialEffect(2);
    b.SetCheckBoxBehaviour(true);
    b.SetValue(true);
    b.SetImageIndex(7);
    PropertyBag bag;
    b.WriteProperties(bag);
    EXPECT_EQ(bag.Keys(), (std::vector<std::string>{"BTYPE", "TX", "ENAB", "FONT", "COLTYPE", "FOCUSR", "BCOL",
                                                    "BCOLO", "FCOL", "FCOLO", "MCOL", "MPTR", "MICON", "PICN", "PICH",
                                                    "UMCOL", "SOFT", "PICPOS", "NGREY", "FX", "HAND", "CHECK", "VALUE",
                                                    "ImageIndex"}));
    EXPECT_TRUE(std::holds_alternative<std::int16_t>(*bag.Find("MPTR")));
    EXPECT_TRUE(bag.ReadBool("HAND", false));

    FakeButtonHost host2;
    RasterCanvas canvas2;
    KirelXPButton c(host2, canvas2);
    c.ReadProperties(bag);
    PropertyBag again;  // what was read writes back the same, but for HAND (false once read)
    c.WriteProperties(again);
    EXPECT_EQ(again.Keys(), bag.Keys());
    for (const std::string& key : bag.Keys()) {
        if (key != "HAND") {
            EXPECT_TRUE(*again.Find(key) == *bag.Find(key)) << key;
        }
    }
    EXPECT_FALSE(again.ReadBool("HAND", true));
    EXPECT_EQ(std::make_tuple(c.accessKey(), host2.windowEnabled, host2.windowFont, host2.pointer, host2.mouseIcon,
                              c.pictureRect().width),
              std::make_tuple('g', false, font, 11, platform::PicturePtr(cursor), 2))
        << "the window follows what was read";
    EXPECT_TRUE(host2.notified.empty()) << "reading runs no setter";
    c.SetImageIndex(0);
    PropertyBag zero;
    c.WriteProperties(zero);
    EXPECT_FALSE(zero.Contains("ImageIndex")) << "ImageIndex 0 is not written";
}

TEST(XPButtonProperties, ReadDefaultsFromAStore) {
    FakeButtonHost host;
    RasterCanvas canvas;
    KirelXPButton b(host, canvas);
    b.ReadProperties(PropertyBag{});
    EXPECT_EQ(std::make_tuple(b.ButtonType(), b.Caption(), b.Enabled(), b.ColorScheme(), b.MaskColor(), b.ImageIndex()),
              std::make_tuple(2, std::string(), true, 1, 0xC0C0C0u, 0)) << "a fresh control gets type 3, a read one 2";
    EXPECT_EQ(b.PictureNormal(), nullptr);
    EXPECT_EQ((std::vector<Rgb>{b.BackColor(), b.BackOver(), b.ForeColor(), b.ForeOver()}),
              (std::vector<Rgb>{0x80000000u | platform::kColorBtnFace, 0x80000000u | platform::kColorBtnFace,
                                0x80000000u | platform::kColorBtnText, 0x80000000u | platform::kColorBtnText}));
    PropertyBag bag;  // BCOL and FCOL without over colours: the over colours follow them
    bag.Write("BCOL", std::int32_t{0x0000FF});
    bag.Write("FCOL", std::int32_t{0x00FF00});
    KirelXPButton c(host, canvas);
    c.ReadProperties(bag);
    EXPECT_EQ(std::make_pair(c.BackOver(), c.ForeOver()), std::make_pair(0x0000FFu, 0x00FF00u));
}

TEST(XPButtonProperties, SettersNotifyAndRepaintAsStated) {
    Fixture f;
    KirelXPButton& b = f.button;
    f.host.designMode = true;  // in design mode BackColor drags BackOver along; at run time not
    b.SetBackColor(0x0000FF);
    f.host.designMode = false;
    b.SetBackColor(0x00FF00);
    EXPECT_EQ(b.BackOver(), 0x0000FFu);
    b.SetValue(true);  // without CheckBoxBehaviour: stored and notified, not painted
    auto pic = std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 1, 1, std::vector<Rgb>{0});
    f.Mark();
    b.SetPictureOver(pic);  // away from the pointer: no paint
    EXPECT_FALSE(f.Painted());
    EXPECT_EQ(f.host.notified, (Log{"BCOL", "BCOL", "VALUE", "PICO"}));
    f.host.refuseMouseIcon = true;
    b.SetMouseIcon(pic);
    EXPECT_EQ(b.MouseIcon(), nullptr) << "a refused pointer picture keeps the old one";

    // Font pieces change the window font and repaint, without notification; sizes round halves to even.
    f.host.notified.clear();
    b.SetFontBold(true);
    b.SetFontSize(12);
    EXPECT_EQ(std::make_tuple(f.host.windowFont.bold, f.host.windowFont.size, f.host.notified.empty()),
              std::make_tuple(true, 12.0, true));
    EXPECT_TRUE(f.Painted());
    for (auto [size, rounded] : {std::pair{10.5, 10}, std::pair{11.5, 12}}) {
        FontDesc font = b.Font();
        font.size = size;
        b.SetFont(font);
        EXPECT_EQ(b.FontSize(), rounded);
    }
    b.SetFontBold(false);  // ButtonType 5 in design mode makes the font bold
    f.host.designMode = true;
    b.SetButtonType(5);
    EXPECT_TRUE(b.FontBold());
    EXPECT_EQ(f.host.notified.back(), "BTYPE");
}

TEST(XPButtonInput, HandlersThatChangeTheirArgumentsAndKeySequences) {
    Fixture f;
    f.button.events.MouseDown = [](std::int16_t& b, std::int16_t&, float&, float&) { b = 2; };
    f.button.OnMouseDown(1, 0, 0, 0);
    EXPECT_EQ(f.button.lastState(), 0) << "a MouseDown handler that makes the button 2 stops the pressed paint";
    f.button.events.MouseDown = nullptr;
    f.button.OnMouseDown(4, 0, 1, 1);  // middle button: pressed, then up, no click
    EXPECT_EQ(f.button.lastState(), 2);
    f.button.OnMouseUp(4, 0, 1, 1);
    f.button.OnClick();
    EXPECT_EQ(f.button.lastState(), 0);
    EXPECT_EQ(f.Clicks(), 0);

    f.button.OnKeyDown(32, 0);  // space, another key, space up: no click
    f.button.OnKeyDown(65, 0);
    f.button.OnKeyUp(32, 0);
    EXPECT_EQ(f.Clicks(), 0);
    f.button.events.KeyDown = [](std::int16_t& k, std::int16_t&) { k = 0; };  // stops the control's handling
    f.button.OnKeyDown(39, 0);
    f.button.OnKeyDown(32, 0);
    f.button.OnKeyUp(32, 0);
    EXPECT_TRUE(f.host.sentKeys.empty());
    EXPECT_EQ(f.Clicks(), 0);

    f.button.SetCheckBoxBehaviour(true);  // the click handler sees the new Value; a toggle is no store change
    std::vector<bool> seen;
    f.button.events.Click = [&] { seen.push_back(f.button.Value()); };
    f.host.notified.clear();
    f.button.OnAccessKey();
    EXPECT_EQ(seen, std::vector<bool>{true});
    EXPECT_TRUE(f.host.notified.empty());
    f.button.Paint(0, true);
    EXPECT_EQ(f.button.lastState(), 2) << "with Value true every paint shows pressed";
    f.button.SetEnabled(false);  // a disabled control never clicks, whatever the platform reports
    f.button.OnMouseDown(1, 0, 1, 1);
    f.button.OnClick();
    f.button.OnAccessKey();
    EXPECT_EQ(seen.size(), 1u);
}

TEST(XPButtonInput, DraggingOutAndBackIn) {
    Fixture f;
    f.host.pointerOver = true;
    f.button.OnMouseMove(0, 0, 1, 1);
    f.button.OnMouseMove(0, 0, 2, 2);  // already hovering: nothing more
    EXPECT_EQ(f.log, Log{"MouseOver"});
    EXPECT_EQ(f.host.timerPeriod, 3);
    f.button.OnMouseDown(1, 0, 1, 1);
    f.host.pointerOver = false;
    f.button.OnMouseMove(1, 0, 100, 1);  // leaving with the left button held paints up
    EXPECT_EQ(f.button.lastState(), 0);
    f.host.pointerOver = true;
    f.button.OnMouseMove(1, 0, 1, 1);  // back in, still holding: pressed, the hover flag clear
    EXPECT_EQ(f.button.lastState(), 2);
    EXPECT_FALSE(f.button.hovering());
    f.Mark();
    f.button.OnMouseMove(2, 0, 1, 1);  // moves with the right button stop after the event
    EXPECT_FALSE(f.Painted());
}

TEST(XPButtonInput, FocusHidingBatchingAmbientChangesAndTheEnd) {
    Fixture f;
    f.button.SetButtonType(1);
    f.button.OnGotFocus();
    EXPECT_EQ(f.canvas.focusRects, std::vector<Box>{(Box{4, 4, 71, 19})});
    f.button.OnLostFocus();
    EXPECT_TRUE(f.canvas.focusRects.empty());

    f.button.OnHide();  // hidden: painting is dropped and the next show paints in full
    f.Mark();
    f.button.SetCaption("Off");
    EXPECT_FALSE(f.Painted());
    f.button.OnShow();
    EXPECT_TRUE(f.Painted());
    f.button.DisableRefresh();  // batched until Refresh
    f.Mark();
    f.button.SetBackColor(0x123456);
    f.button.SetCaption("On");
    EXPECT_FALSE(f.Painted());
    f.button.Refresh();
    EXPECT_TRUE(f.Painted());
    f.host.height = 0;  // height 0 paints nothing (and does not fail)
    f.button.OnResize();
    f.button.Paint(0, true);

    f.host.height = 23;  // an ambient change recomputes unless the scheme is custom
    f.button.OnResize();
    f.host.systemColours[platform::kColorBtnFace] = 0x0000AA;
    f.button.OnAmbientChanged();
    EXPECT_EQ(f.button.palette().FaceColor, 0x0000AAu);
    f.button.SetColorScheme(2);
    f.host.systemColours[platform::kColorBtnFace] = 0x00BB00;
    f.button.OnAmbientChanged();
    EXPECT_EQ(f.button.palette().FaceColor, 0x123456u);

    f.host.pointerOver = true;  // terminating releases the shape, stops the hover timer and painting
    f.button.OnMouseMove(0, 0, 1, 1);
    f.button.OnTerminate();
    EXPECT_FALSE(f.host.shapeHeld);
    EXPECT_FALSE(f.host.timerRunning);
    EXPECT_FALSE(f.button.paintingEnabled());
}

TEST(XPButtonInput, AccessKeyParsing) {
    // Only the first doubled "&&" is skipped.
    const std::pair<const char*, char> cases[] = {{"&Save", 's'}, {"Save && Exit", 0}, {"A&&B &Run", 'r'}, {"Go&", 0},
                                                  {"&", 0}, {"x", 0}, {"A&&B &&C &D", 0}, {"E&xit", 'x'}};
    for (auto [caption, key] : cases) EXPECT_EQ(AccessKeyOf(caption), key) << caption;
}

}  // namespace
}  // namespace vantorel::xpbutton
