// The push button's properties, property store and input state machine, on the raster canvas with
// a scripted host.
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

struct Fixture {
    FakeButtonHost host;
    RasterCanvas canvas;
    KirelXPButton button{host, canvas};
    std::vector<std::string> log;

    // A new control, shown and sized, recording every event.
    Fixture() {
        button.InitNewControl();
        button.OnShow();
        button.OnResize();
        auto mouse = [this](const char* name) {
            return [this, name](std::int16_t& b, std::int16_t& s, float& x, float& y) {
                log.push_back(std::string(name) + " " + std::to_string(b) + " " + std::to_string(s) + " " +
                              std::to_string(static_cast<int>(x)) + " " + std::to_string(static_cast<int>(y)));
            };
        };
        button.events.MouseDown = mouse("MouseDown");
        button.events.MouseMove = mouse("MouseMove");
        button.events.MouseUp = mouse("MouseUp");
        button.events.Click = [this] { log.push_back("Click"); };
        button.events.MouseOver = [this] { log.push_back("MouseOver"); };
        button.events.MOUSEOUT = [this] { log.push_back("MOUSEOUT"); };
        button.events.KeyDown = [this](std::int16_t& k, std::int16_t&) { log.push_back("KeyDown " + std::to_string(k)); };
        button.events.KeyUp = [this](std::int16_t& k, std::int16_t&) { log.push_back("KeyUp " + std::to_string(k)); };
        button.events.KeyPress = [this](std::int16_t& k) { log.push_back("KeyPress " + std::to_string(k)); };
        canvas.clears = 0;
        host.notified.clear();
    }
};

TEST(XPButtonProperties, NewControlDefaults) {
    FakeButtonHost host;
    RasterCanvas canvas;
    KirelXPButton b(host, canvas);
    b.InitNewControl();
    EXPECT_EQ(b.ButtonType(), 3);
    EXPECT_EQ(b.Caption(), "KirelXPButton1");
    EXPECT_EQ(b.FontName(), "Verdana");
    EXPECT_EQ(host.windowFont.name, "Verdana");
    EXPECT_EQ(b.BackColor(), 0xFFFFFFu);
    EXPECT_EQ(b.BackOver(), 0xFFFFFFu);
    EXPECT_EQ(b.ForeColor(), host.SystemColour(platform::kColorBtnText));
    EXPECT_EQ(b.ForeOver(), 0xFF0000u);
    EXPECT_EQ(b.MaskColor(), 0xC0C0C0u);
    EXPECT_EQ(b.ColorScheme(), 1);
    EXPECT_TRUE(b.Enabled());
    EXPECT_TRUE(b.ShowFocusRect());
    EXPECT_TRUE(b.UseMaskColor());
    EXPECT_FALSE(b.SoftBevel());
    EXPECT_EQ(b.Version(), "2.0.6");
    // No setter ran: nothing notified, nothing painted.
    EXPECT_TRUE(host.notified.empty());
    EXPECT_EQ(canvas.clears, 0);

    // The new-control foreground follows the system's button text.
    FakeButtonHost other;
    other.systemColours[platform::kColorBtnText] = 0x123456;
    KirelXPButton c(other, canvas);
    c.InitNewControl();
    EXPECT_EQ(c.ForeColor(), 0x123456u);
}

TEST(XPButtonProperties, StoreRoundTripKeepsEveryValue) {
    Fixture f;
    KirelXPButton& b = f.button;
    auto picture = std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 2, 2, std::vector<Rgb>(4, 0x102030));
    auto over = std::make_shared<MemoryPicture>(platform::PictureKind::kIcon, 1, 1, std::vector<Rgb>(1, 0x0000FF));
    auto cursor = std::make_shared<MemoryPicture>(platform::PictureKind::kIcon, 1, 1, std::vector<Rgb>(1, 0));
    b.SetButtonType(9);
    b.SetCaption("&Go now");
    b.SetEnabled(false);
    FontDesc font{"Tahoma", 11.5, true, true, false, true};
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
    const std::vector<std::string> order = {"BTYPE", "TX", "ENAB", "FONT", "COLTYPE", "FOCUSR", "BCOL", "BCOLO",
                                            "FCOL", "FCOLO", "MCOL", "MPTR", "MICON", "PICN", "PICH", "UMCOL",
                                            "SOFT", "PICPOS", "NGREY", "FX", "HAND", "CHECK", "VALUE", "ImageIndex"};
    EXPECT_EQ(bag.Keys(), order);
    ASSERT_TRUE(std::holds_alternative<std::int16_t>(*bag.Find("MPTR")));
    ASSERT_TRUE(std::holds_alternative<std::int16_t>(*bag.Find("ImageIndex")));
    EXPECT_TRUE(bag.ReadBool("HAND", false));

    FakeButtonHost host2;
    RasterCanvas canvas2;
    KirelXPButton c(host2, canvas2);
    c.ReadProperties(bag);
    EXPECT_EQ(c.ButtonType(), 9);
    EXPECT_EQ(c.Caption(), "&Go now");
    EXPECT_EQ(c.accessKey(), 'g');
    EXPECT_FALSE(c.Enabled());
    EXPECT_FALSE(host2.windowEnabled);
    EXPECT_EQ(c.Font(), font);
    EXPECT_EQ(host2.windowFont, font);
    EXPECT_EQ(c.ColorScheme(), 2);
    EXPECT_FALSE(c.ShowFocusRect());
    EXPECT_EQ(c.BackColor(), 0x00FF00u);
    EXPECT_EQ(c.BackOver(), 0x0000FFu);
    EXPECT_EQ(c.ForeColor(), 0x111111u);
    EXPECT_EQ(c.ForeOver(), 0x222222u);
    EXPECT_EQ(c.MaskColor(), 0xFF00FFu);
    EXPECT_EQ(c.MousePointer(), 11);
    EXPECT_EQ(host2.pointer, 11);
    EXPECT_EQ(c.MouseIcon(), cursor);
    EXPECT_EQ(host2.mouseIcon, cursor);
    EXPECT_EQ(c.PictureNormal(), picture);
    EXPECT_EQ(c.PictureOver(), over);
    EXPECT_EQ(c.pictureRect().width, 2);
    EXPECT_FALSE(c.UseMaskColor());
    EXPECT_TRUE(c.SoftBevel());
    EXPECT_EQ(c.PicturePosition(), 3);
    EXPECT_TRUE(c.UseGreyscale());
    EXPECT_EQ(c.SpecialEffect(), 2);
    EXPECT_TRUE(c.CheckBoxBehaviour());
    EXPECT_TRUE(c.Value());
    EXPECT_EQ(c.ImageIndex(), 7);
    // Reading runs no setter.
    EXPECT_TRUE(host2.notified.empty());
    EXPECT_EQ(canvas2.clears, 0);

    // A control that was read writes HAND false; ImageIndex 0 is not written.
    c.SetImageIndex(0);
    PropertyBag again;
    c.WriteProperties(again);
    EXPECT_FALSE(again.ReadBool("HAND", true));
    EXPECT_FALSE(again.Contains("ImageIndex"));
}

TEST(XPButtonProperties, ReadDefaultsFromAnEmptyStore) {
    FakeButtonHost host;
    RasterCanvas canvas;
    KirelXPButton b(host, canvas);
    FontDesc windowFont{"Arial", 9, false, false, false, false};
    host.windowFont = windowFont;
    b.ReadProperties(PropertyBag{});
    EXPECT_EQ(b.ButtonType(), 2);  // a fresh control gets 3, a read one 2
    EXPECT_EQ(b.Caption(), "");
    EXPECT_TRUE(b.Enabled());
    EXPECT_EQ(b.ColorScheme(), 1);
    EXPECT_EQ(b.MaskColor(), 0xC0C0C0u);
    EXPECT_EQ(b.PictureNormal(), nullptr);
    EXPECT_EQ(b.ImageIndex(), 0);
    // Button face and button text system colours, and the over colours follow them.
    EXPECT_EQ(b.BackColor(), 0x80000000u | platform::kColorBtnFace);
    EXPECT_EQ(b.BackOver(), b.BackColor());
    EXPECT_EQ(b.ForeColor(), 0x80000000u | platform::kColorBtnText);
    EXPECT_EQ(b.ForeOver(), b.ForeColor());

    // A store with BCOL and FCOL but no over colours takes them as read.
    PropertyBag bag;
    bag.Write("BCOL", std::int32_t{0x0000FF});
    bag.Write("FCOL", std::int32_t{0x00FF00});
    KirelXPButton c(host, canvas);
    c.ReadProperties(bag);
    EXPECT_EQ(c.BackOver(), 0x0000FFu);
    EXPECT_EQ(c.ForeOver(), 0x00FF00u);
}

TEST(XPButtonProperties, SettersNotifyAndRepaintAsStated) {
    Fixture f;
    KirelXPButton& b = f.button;
    // Design mode: BackColor drags BackOver along; at run time it does not.
    f.host.designMode = true;
    b.SetBackColor(0x0000FF);
    EXPECT_EQ(b.BackOver(), 0x0000FFu);
    f.host.designMode = false;
    b.SetBackColor(0x00FF00);
    EXPECT_EQ(b.BackOver(), 0x0000FFu);
    EXPECT_EQ(f.host.notified, (std::vector<std::string>{"BCOL", "BCOL"}));

    // Value without CheckBoxBehaviour: stored and notified, not painted.
    f.canvas.clears = 0;
    f.host.notified.clear();
    b.SetValue(true);
    EXPECT_EQ(f.canvas.clears, 0);
    EXPECT_EQ(f.host.notified, std::vector<std::string>{"VALUE"});

    // PictureOver away from the pointer: no paint, notified as PICO.
    auto pic = std::make_shared<MemoryPicture>(platform::PictureKind::kBitmap, 1, 1, std::vector<Rgb>{0});
    f.host.notified.clear();
    b.SetPictureOver(pic);
    EXPECT_EQ(f.canvas.clears, 0);
    EXPECT_EQ(f.host.notified, std::vector<std::string>{"PICO"});

    // A refused pointer picture keeps the old one and raises nothing.
    f.host.refuseMouseIcon = true;
    b.SetMouseIcon(pic);
    EXPECT_EQ(b.MouseIcon(), nullptr);

    // Font pieces change the window font and repaint, without notification.
    f.host.notified.clear();
    b.SetFontBold(true);
    b.SetFontSize(12);
    EXPECT_TRUE(f.host.windowFont.bold);
    EXPECT_EQ(f.host.windowFont.size, 12.0);
    EXPECT_TRUE(f.host.notified.empty());
    EXPECT_GE(f.canvas.clears, 2);
    FontDesc half = b.Font();
    half.size = 10.5;
    b.SetFont(half);
    EXPECT_EQ(b.FontSize(), 10);  // halves to even
    half.size = 11.5;
    b.SetFont(half);
    EXPECT_EQ(b.FontSize(), 12);

    // ButtonType 5 in design mode makes the font bold; the type change reshapes and repaints.
    b.SetFontBold(false);
    f.host.designMode = true;
    int shapes = f.host.shapesSet;
    b.SetButtonType(5);
    EXPECT_TRUE(b.FontBold());
    EXPECT_EQ(f.host.shapesSet, shapes + 1);
    EXPECT_EQ(f.host.notified.back(), "BTYPE");

    // Enabled follows through to the window.
    b.SetEnabled(false);
    EXPECT_FALSE(f.host.windowEnabled);
}

TEST(XPButtonInput, MouseSequences) {
    Fixture f;
    // Right button: events only, no paint, no click.
    f.button.OnMouseDown(2, 0, 5, 6);
    f.button.OnMouseUp(2, 0, 5, 6);
    f.button.OnClick();
    EXPECT_EQ(f.log, (std::vector<std::string>{"MouseDown 2 0 5 6", "MouseUp 2 0 5 6"}));
    EXPECT_EQ(f.canvas.clears, 0);

    // Middle button: pressed then up, no click.
    f.log.clear();
    f.button.OnMouseDown(4, 0, 1, 1);
    EXPECT_EQ(f.button.lastState(), 2);
    f.button.OnMouseUp(4, 0, 1, 1);
    EXPECT_EQ(f.button.lastState(), 0);
    f.button.OnClick();
    EXPECT_EQ(f.canvas.clears, 2);
    EXPECT_EQ(f.log.size(), 2u);

    // Left click, then a double click: MouseDown, MouseUp, Click, MouseDown 1 0 0 0, MouseUp.
    f.log.clear();
    f.button.OnMouseDown(1, 0, 3, 4);
    f.button.OnMouseUp(1, 0, 3, 4);
    f.button.OnClick();
    f.button.OnDoubleClick();
    f.button.OnMouseUp(1, 0, 3, 4);
    EXPECT_EQ(f.log, (std::vector<std::string>{"MouseDown 1 0 3 4", "MouseUp 1 0 3 4", "Click",
                                               "MouseDown 1 0 0 0", "MouseUp 1 0 3 4"}));
    EXPECT_EQ(f.host.captures, 1);
    EXPECT_GE(f.host.presents, 1);

    // A MouseDown handler that turns the button into 2 stops the pressed paint.
    f.button.events.MouseDown = [](std::int16_t& b, std::int16_t&, float&, float&) { b = 2; };
    f.canvas.clears = 0;
    f.button.OnMouseDown(1, 0, 0, 0);
    EXPECT_EQ(f.canvas.clears, 0);
    EXPECT_EQ(f.button.lastState(), 0);
}

TEST(XPButtonInput, HoverAndDragging) {
    Fixture f;
    f.host.pointerOver = true;
    f.button.OnMouseMove(0, 0, 1, 1);
    EXPECT_TRUE(f.button.hovering());
    EXPECT_TRUE(f.host.timerRunning);
    EXPECT_EQ(f.host.timerPeriod, 3);
    f.button.OnMouseMove(0, 0, 2, 2);  // already hovering: nothing more
    EXPECT_EQ(std::count(f.log.begin(), f.log.end(), "MouseOver"), 1);
    // Timer tick with the pointer still over: nothing.
    f.button.OnOverTimer();
    EXPECT_TRUE(f.button.hovering());
    f.host.pointerOver = false;
    f.button.OnOverTimer();
    EXPECT_FALSE(f.button.hovering());
    EXPECT_FALSE(f.host.timerRunning);
    EXPECT_EQ(f.log.back(), "MOUSEOUT");

    // Leaving with the left button held paints up; coming back still holding paints pressed and
    // leaves the hover flag clear.
    f.host.pointerOver = true;
    f.button.OnMouseDown(1, 0, 1, 1);
    EXPECT_EQ(f.button.lastState(), 2);
    f.host.pointerOver = false;
    f.button.OnMouseMove(1, 0, 100, 1);
    EXPECT_EQ(f.button.lastState(), 0);
    f.host.pointerOver = true;
    f.button.OnMouseMove(1, 0, 1, 1);
    EXPECT_EQ(f.button.lastState(), 2);
    EXPECT_FALSE(f.button.hovering());
    // Moves with the right button (2 or more) stop after the event.
    int clears = static_cast<int>(f.canvas.clears);
    f.button.OnMouseMove(2, 0, 1, 1);
    EXPECT_EQ(f.canvas.clears, clears);
}

TEST(XPButtonInput, Keys) {
    Fixture f;
    // Space down, space up: one click.
    f.button.OnKeyDown(32, 0);
    EXPECT_EQ(f.button.lastState(), 2);
    f.button.OnKeyUp(32, 0);
    EXPECT_EQ(std::count(f.log.begin(), f.log.end(), "Click"), 1);
    // Space down, another key, space up: no click.
    f.log.clear();
    f.button.OnKeyDown(32, 0);
    f.button.OnKeyDown(65, 0);
    f.button.OnKeyUp(32, 0);
    EXPECT_EQ(std::count(f.log.begin(), f.log.end(), "Click"), 0);
    // Arrows raise KeyDown first, then move the focus.
    f.log.clear();
    f.button.OnKeyDown(37, 0);
    f.button.OnKeyDown(40, 0);
    f.button.OnKeyPress(13);
    EXPECT_EQ(f.log, (std::vector<std::string>{"KeyDown 37", "KeyDown 40", "KeyPress 13"}));
    EXPECT_EQ(f.host.sentKeys, (std::vector<std::string>{"+{Tab}", "{Tab}"}));
    // A KeyDown handler that zeroes KeyCode stops the control's handling.
    f.button.events.KeyDown = [](std::int16_t& k, std::int16_t&) { k = 0; };
    f.button.OnKeyDown(39, 0);
    EXPECT_EQ(f.host.sentKeys.size(), 2u);
    f.button.OnKeyDown(32, 0);
    f.log.clear();
    f.button.OnKeyUp(32, 0);
    EXPECT_EQ(std::count(f.log.begin(), f.log.end(), "Click"), 0);
}

TEST(XPButtonInput, CheckBoxDisabledAndAccessKey) {
    Fixture f;
    f.button.SetCheckBoxBehaviour(true);
    std::vector<bool> seen;
    f.button.events.Click = [&] { seen.push_back(f.button.Value()); };
    f.button.OnMouseDown(1, 0, 1, 1);
    f.button.OnMouseUp(1, 0, 1, 1);
    f.button.OnClick();
    f.button.OnKeyDown(32, 0);
    f.button.OnKeyUp(32, 0);
    EXPECT_EQ(seen, (std::vector<bool>{true, false}));  // the handler sees the new Value
    f.host.notified.clear();
    f.button.OnAccessKey();
    EXPECT_EQ(seen.back(), true);
    EXPECT_TRUE(f.host.notified.empty());  // a click's toggle is not a store change
    EXPECT_EQ(f.button.lastButton(), 1);
    // With Value true, every paint shows pressed.
    f.button.Paint(0, true);
    EXPECT_EQ(f.button.lastState(), 2);

    // A disabled control never clicks, whatever the platform reports.
    f.button.SetEnabled(false);
    seen.clear();
    f.button.OnMouseDown(1, 0, 1, 1);
    f.button.OnClick();
    f.button.OnAccessKey();
    EXPECT_TRUE(seen.empty());
}

TEST(XPButtonInput, FocusAndLifecycle) {
    Fixture f;
    f.button.SetButtonType(1);
    f.button.OnGotFocus();
    EXPECT_EQ(f.canvas.focusRects.size(), 1u);
    EXPECT_EQ(f.canvas.focusRects[0], (Box{4, 4, 71, 19}));
    f.button.OnLostFocus();
    EXPECT_TRUE(f.canvas.focusRects.empty());

    // Hidden: painting requests are dropped and leave the caches, so the next show paints fully.
    f.button.OnHide();
    f.canvas.clears = 0;
    f.button.SetCaption("Off");
    EXPECT_EQ(f.canvas.clears, 0);
    f.button.OnShow();
    EXPECT_EQ(f.canvas.clears, 1);
    // DisableRefresh batches changes until Refresh.
    f.button.DisableRefresh();
    f.button.SetBackColor(0x123456);
    f.button.SetCaption("On");
    EXPECT_EQ(f.canvas.clears, 1);
    f.button.Refresh();
    EXPECT_EQ(f.canvas.clears, 2);

    // Height 0 never paints, and its resize paints nothing.
    f.host.height = 0;
    f.canvas.clears = 0;
    f.button.OnResize();
    f.button.Paint(0, true);
    EXPECT_EQ(f.canvas.clears, 0);

    // Ambient change recomputes unless the scheme is custom.
    f.host.height = 23;
    f.button.OnResize();
    f.host.systemColours[platform::kColorBtnFace] = 0x0000AA;
    f.button.OnAmbientChanged();
    EXPECT_EQ(f.button.palette().FaceColor, 0x0000AAu);
    f.button.SetColorScheme(2);
    f.host.systemColours[platform::kColorBtnFace] = 0x00BB00;
    f.button.OnAmbientChanged();
    EXPECT_EQ(f.button.palette().FaceColor, 0x123456u);

    // Terminating releases the shape, stops the hover timer and stops painting.
    f.host.pointerOver = true;
    f.button.OnMouseMove(0, 0, 1, 1);
    ASSERT_TRUE(f.host.timerRunning);
    f.button.OnTerminate();
    EXPECT_EQ(f.host.shapesReleased, f.host.shapesSet);
    EXPECT_FALSE(f.host.timerRunning);
    EXPECT_FALSE(f.button.paintingEnabled());
}

TEST(XPButtonInput, AccessKeyParsing) {
    EXPECT_EQ(AccessKeyOf("&Save"), 's');
    EXPECT_EQ(AccessKeyOf("Save && Exit"), 0);
    EXPECT_EQ(AccessKeyOf("A&&B &Run"), 'r');
    EXPECT_EQ(AccessKeyOf("Go&"), 0);
    EXPECT_EQ(AccessKeyOf("&"), 0);
    EXPECT_EQ(AccessKeyOf("x"), 0);
    EXPECT_EQ(AccessKeyOf("A&&B &&C &D"), 0);  // only the first doubled pair is skipped
    EXPECT_EQ(AccessKeyOf("E&xit"), 'x');
}

}  // namespace
}  // namespace vantorel::xpbutton
