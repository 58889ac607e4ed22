// Properties, the property store, lifecycle and input of the push button. Rendering is in
// render.cpp, pictures in pictures.cpp.
#include "controls/xpbutton/kirel_xp_button.h"

#include <algorithm>

namespace vantorel::xpbutton {

char AccessKeyOf(const std::string& caption) {
    if (caption.size() < 2) return 0;
    auto lower = [](char c) { return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c; };
    std::size_t amp = caption.find('&');
    if (amp == std::string::npos || amp + 1 >= caption.size()) return 0;
    if (caption[amp + 1] != '&') return lower(caption[amp + 1]);
    // Only the first doubled pair is skipped.
    std::size_t next = caption.find('&', amp + 2);
    if (next == std::string::npos || next + 1 >= caption.size() || caption[next + 1] == '&') return 0;
    return lower(caption[next + 1]);
}

KirelXPButton::KirelXPButton(platform::ButtonHost& host, platform::Canvas& canvas) : host_(host), canvas_(canvas) {
    paintingEnabled_ = true;
}

Rgb KirelXPButton::Translate(Rgb value) const {
    if (value & 0x80000000u) return host_.SystemColour(static_cast<int>(value & 0xFF));
    return value & 0xFFFFFF;
}

void KirelXPButton::UpdateAccessKey() {
    accessKey_ = AccessKeyOf(caption_);
    host_.SetAccessKey(0);
    if (accessKey_ != 0) host_.SetAccessKey(accessKey_);
}

// --- Store -----------------------------------------------------------------------------------

void KirelXPButton::InitNewControl() {
    enabled_ = true;
    showFocusRect_ = true;
    useMaskColor_ = true;
    colorScheme_ = 1;
    caption_ = host_.ContainerName();
    font_.name = "Verdana";
    host_.SetFont(font_);
    buttonType_ = 3;
    ComputePalette();
    backColor_ = 0xFFFFFF;
    backOver_ = 0xFFFFFF;
    foreColor_ = palette_.TextColor;
    foreOver_ = 0xFF0000;
    maskColor_ = 0xC0C0C0;
    LayoutCaption();
    handFlag_ = true;
    imageIndex_ = 0;
}

void KirelXPButton::ReadProperties(const PropertyBag& bag) {
    buttonType_ = bag.ReadInt32("BTYPE", 2);
    caption_ = bag.ReadText("TX", "");
    enabled_ = bag.ReadBool("ENAB", true);
    font_ = bag.ReadFont("FONT", font_);
    host_.SetFont(font_);
    colorScheme_ = bag.ReadInt32("COLTYPE", 1);
    showFocusRect_ = bag.ReadBool("FOCUSR", true);
    backColor_ =
        static_cast<Rgb>(bag.ReadInt32("BCOL", static_cast<std::int32_t>(0x80000000u | platform::kColorBtnFace)));
    backOver_ = static_cast<Rgb>(bag.ReadInt32("BCOLO", static_cast<std::int32_t>(backColor_)));
    foreColor_ =
        static_cast<Rgb>(bag.ReadInt32("FCOL", static_cast<std::int32_t>(0x80000000u | platform::kColorBtnText)));
    foreOver_ = static_cast<Rgb>(bag.ReadInt32("FCOLO", static_cast<std::int32_t>(foreColor_)));
    maskColor_ = static_cast<Rgb>(bag.ReadInt32("MCOL", 0xC0C0C0));
    mousePointer_ = bag.ReadInt16("MPTR", 0);
    host_.SetMousePointer(mousePointer_);
    mouseIcon_ = bag.ReadPicture("MICON", nullptr);
    if (mouseIcon_) host_.SetMouseIcon(mouseIcon_);
    pictureNormal_ = bag.ReadPicture("PICN", nullptr);
    pictureOver_ = bag.ReadPicture("PICH", nullptr);
    useMaskColor_ = bag.ReadBool("UMCOL", true);
    softBevel_ = bag.ReadBool("SOFT", false);
    picturePosition_ = bag.ReadInt32("PICPOS", 0);
    useGreyscale_ = bag.ReadBool("NGREY", false);
    specialEffect_ = bag.ReadInt32("FX", 0);
    checkBoxBehaviour_ = bag.ReadBool("CHECK", false);
    value_ = bag.ReadBool("VALUE", false);
    host_.SetEnabled(enabled_);
    MeasurePicture();
    LayoutCaption();
    UpdateAccessKey();
    imageIndex_ = bag.ReadInt16("ImageIndex", 0);
    handFlag_ = false;
}

void KirelXPButton::WriteProperties(PropertyBag& bag) const {
    auto colour = [](Rgb c) { return static_cast<std::int32_t>(c); };
    bag.Write("BTYPE", buttonType_);
    bag.Write("TX", caption_);
    bag.Write("ENAB", enabled_);
    bag.Write("FONT", font_);
    bag.Write("COLTYPE", colorScheme_);
    bag.Write("FOCUSR", showFocusRect_);
    bag.Write("BCOL", colour(backColor_));
    bag.Write("BCOLO", colour(backOver_));
    bag.Write("FCOL", colour(foreColor_));
    bag.Write("FCOLO", colour(foreOver_));
    bag.Write("MCOL", colour(maskColor_));
    bag.Write("MPTR", static_cast<std::int16_t>(mousePointer_));
    bag.Write("MICON", mouseIcon_);
    bag.Write("PICN", pictureNormal_);
    bag.Write("PICH", pictureOver_);
    bag.Write("UMCOL", useMaskColor_);
    bag.Write("SOFT", softBevel_);
    bag.Write("PICPOS", picturePosition_);
    bag.Write("NGREY", useGreyscale_);
    bag.Write("FX", specialEffect_);
    bag.Write("HAND", handFlag_);
    bag.Write("CHECK", checkBoxBehaviour_);
    bag.Write("VALUE", value_);
    if (imageIndex_ != 0) bag.Write("ImageIndex", imageIndex_);
}

// --- Setters ---------------------------------------------------------------------------------

void KirelXPButton::SetBackColor(Rgb value) {
    backColor_ = value;
    if (host_.DesignMode()) backOver_ = value;
    ComputePalette();
    Paint(lastState_, true);
    Notify("BCOL");
}

void KirelXPButton::SetBackOver(Rgb value) {
    backOver_ = value;
    ComputePalette();
    Paint(lastState_, true);
    Notify("BCOLO");
}

void KirelXPButton::SetForeColor(Rgb value) {
    foreColor_ = value;
    if (host_.DesignMode()) foreOver_ = value;
    ComputePalette();
    Paint(lastState_, true);
    Notify("FCOL");
}

void KirelXPButton::SetForeOver(Rgb value) {
    foreOver_ = value;
    ComputePalette();
    Paint(lastState_, true);
    Notify("FCOLO");
}

void KirelXPButton::SetMaskColor(Rgb value) {
    maskColor_ = value;
    ComputePalette();
    Paint(lastState_, true);
    Notify("MCOL");
}

void KirelXPButton::SetButtonType(std::int32_t value) {
    buttonType_ = value;
    if (value == 5 && host_.DesignMode()) {
        SetFontBold(true);
    } else if (value == 11 && paintingEnabled_) {
        CaptureBackground();
    }
    OnResize();
    Notify("BTYPE");
}

void KirelXPButton::SetCaption(const std::string& value) {
    caption_ = value;
    UpdateAccessKey();
    LayoutCaption();
    Paint(0, true);
    Notify("TX");
}

void KirelXPButton::SetEnabled(bool value) {
    enabled_ = value;
    Paint(0, true);
    host_.SetEnabled(value);
    Notify("ENAB");
}

void KirelXPButton::SetFont(const FontDesc& value) {
    font_ = value;
    host_.SetFont(font_);
    LayoutCaption();
    Paint(0, true);
    Notify("FONT");
}

void KirelXPButton::SetFontBold(bool value) {
    font_.bold = value;
    host_.SetFont(font_);
    LayoutCaption();
    Paint(0, true);
}

void KirelXPButton::SetFontItalic(bool value) {
    font_.italic = value;
    host_.SetFont(font_);
    LayoutCaption();
    Paint(0, true);
}

void KirelXPButton::SetFontUnderline(bool value) {
    font_.underline = value;
    host_.SetFont(font_);
    LayoutCaption();
    Paint(0, true);
}

// A stored size beyond the 16-bit range reads as the nearest size that fits, not a wrapped one.
std::int16_t KirelXPButton::FontSize() const {
    return static_cast<std::int16_t>(std::clamp<std::int32_t>(RoundHalfEven(font_.size), INT16_MIN, INT16_MAX));
}

void KirelXPButton::SetFontSize(std::int16_t value) {
    font_.size = value;
    host_.SetFont(font_);
    LayoutCaption();
    Paint(0, true);
}

void KirelXPButton::SetFontName(const std::string& value) {
    font_.name = value;
    host_.SetFont(font_);
    LayoutCaption();
    Paint(0, true);
}

void KirelXPButton::SetColorScheme(std::int32_t value) {
    colorScheme_ = value;
    ComputePalette();
    Paint(0, true);
    Notify("COLTYPE");
}

void KirelXPButton::SetShowFocusRect(bool value) {
    showFocusRect_ = value;
    Paint(lastState_, true);
    Notify("FOCUSR");
}

void KirelXPButton::SetMousePointer(std::int32_t value) {
    mousePointer_ = value;
    host_.SetMousePointer(value);
    Notify("MPTR");
}

void KirelXPButton::SetMouseIcon(const PicturePtr& value) {
    if (host_.SetMouseIcon(value)) mouseIcon_ = value;
    Notify("MICON");
}

void KirelXPButton::SetSoftBevel(bool value) {
    softBevel_ = value;
    ComputePalette();
    Paint(lastState_, true);
    Notify("SOFT");
}

void KirelXPButton::SetPictureNormal(const PicturePtr& value) {
    pictureNormal_ = value;
    MeasurePicture();
    LayoutCaption();
    Paint(lastState_, true);
    Notify("PICN");
}

void KirelXPButton::SetPictureOver(const PicturePtr& value) {
    pictureOver_ = value;
    if (hover_) Paint(lastState_, true);
    Notify("PICO");
}

void KirelXPButton::SetPicturePosition(std::int32_t value) {
    picturePosition_ = value;
    Notify("PICPOS");
    LayoutCaption();
    Paint(lastState_, true);
}

void KirelXPButton::SetUseMaskColor(bool value) {
    useMaskColor_ = value;
    if (pictureNormal_) Paint(lastState_, true);
    Notify("UMCOL");
}

void KirelXPButton::SetUseGreyscale(bool value) {
    useGreyscale_ = value;
    if (pictureNormal_) Paint(lastState_, true);
    Notify("NGREY");
}

void KirelXPButton::SetSpecialEffect(std::int32_t value) {
    specialEffect_ = value;
    Paint(lastState_, true);
    Notify("FX");
}

void KirelXPButton::SetCheckBoxBehaviour(bool value) {
    checkBoxBehaviour_ = value;
    Paint(lastState_, true);
    Notify("CHECK");
}

void KirelXPButton::SetValue(bool value) {
    value_ = value;
    if (checkBoxBehaviour_) Paint(0, true);
    Notify("VALUE");
}

void KirelXPButton::SetImageIndex(std::int16_t value) {
    imageIndex_ = value;
    Notify("ImageIndex");
}

// --- Lifecycle -------------------------------------------------------------------------------

void KirelXPButton::OnShow() {
    if (buttonType_ == 11) CaptureBackground();
    paintingEnabled_ = true;
    ComputePalette();
    Paint(0, true);
}

void KirelXPButton::OnHide() { paintingEnabled_ = false; }

void KirelXPButton::OnResize() {
    if (capturing_) return;
    Box client = host_.ClientRect();
    w_ = client.right;
    h_ = client.bottom;
    canvas_.Resize(w_, h_);
    if (buttonType_ >= 7 && buttonType_ <= 13) {
        focusRect_ = {client.left + 3, client.top + 3, client.right - 3, client.bottom - 3};
    } else if (buttonType_ == 14) {
        focusRect_ = {client.left + 6, client.top + 6, client.right - 4, client.bottom - 4};
    } else {
        focusRect_ = {client.left + 4, client.top + 4, client.right - 4, client.bottom - 4};
    }
    LayoutCaption();
    if (hasShape_) host_.ReleaseShape();
    host_.SetShape(BuildRegion());
    hasShape_ = true;
    if (h_ != 0) Paint(0, true);
}

void KirelXPButton::OnAmbientChanged() {
    if (colorScheme_ != 2) {
        ComputePalette();
        Paint(lastState_, true);
    }
}

void KirelXPButton::OnTerminate() {
    paintingEnabled_ = false;
    if (hasShape_) host_.ReleaseShape();
    hasShape_ = false;
    if (hover_) host_.StopOverTimer();
    hover_ = false;
    background_.clear();
    hasBackground_ = false;
}

void KirelXPButton::DisableRefresh() { paintingEnabled_ = false; }

void KirelXPButton::Refresh() {
    if (buttonType_ == 11) CaptureBackground();
    ComputePalette();
    LayoutCaption();
    paintingEnabled_ = true;
    Paint(lastState_, true);
}

void KirelXPButton::CaptureBackground() {
    capturing_ = true;
    if (host_.CaptureParentPixels(w_, h_, background_)) {
        hasBackground_ = true;
        backgroundW_ = w_;
        backgroundH_ = h_;
    }
    capturing_ = false;
}

// --- Input -----------------------------------------------------------------------------------

void KirelXPButton::OnMouseDown(std::int16_t button, std::int16_t shift, float x, float y) {
    if (events.MouseDown) events.MouseDown(button, shift, x, y);
    lastButton_ = static_cast<std::uint8_t>(button & 0xFF);
    if (button != 2) Paint(2, false);
}

void KirelXPButton::OnMouseMove(std::int16_t button, std::int16_t shift, float x, float y) {
    if (events.MouseMove) events.MouseMove(button, shift, x, y);
    if (button >= 2) return;
    if (!host_.PointerOverSelf()) {
        Paint(0, false);
        return;
    }
    if (button == 0 && !hover_) {
        host_.StartOverTimer(kOverTimerPeriod);
        hover_ = true;
        Paint(0, true);
        if (events.MouseOver) events.MouseOver();
        return;
    }
    if (button == 1) {
        hover_ = true;
        Paint(2, false);
        hover_ = false;
    }
}

void KirelXPButton::OnMouseUp(std::int16_t button, std::int16_t shift, float x, float y) {
    if (events.MouseUp) events.MouseUp(button, shift, x, y);
    if (button != 2) Paint(0, false);
}

void KirelXPButton::ClickSteps() {
    if (lastButton_ != 1 || !enabled_) return;
    if (checkBoxBehaviour_) value_ = !value_;
    Paint(0, true);
    host_.Present();
    if (events.Click) events.Click();
}

void KirelXPButton::OnClick() { ClickSteps(); }

void KirelXPButton::OnDoubleClick() {
    if (lastButton_ != 1) return;
    OnMouseDown(1, 0, 0.0f, 0.0f);
    host_.CaptureMouse();
}

void KirelXPButton::OnOverTimer() {
    if (host_.PointerOverSelf()) return;
    host_.StopOverTimer();
    hover_ = false;
    Paint(0, true);
    if (events.MOUSEOUT) events.MOUSEOUT();
}

void KirelXPButton::OnKeyDown(std::int16_t keyCode, std::int16_t shift) {
    if (events.KeyDown) events.KeyDown(keyCode, shift);
    lastKey_ = static_cast<std::uint8_t>(keyCode & 0xFF);
    switch (keyCode) {
        case 32: Paint(2, false); break;
        case 37:
        case 38: host_.SendKeys("+{Tab}"); break;
        case 39:
        case 40: host_.SendKeys("{Tab}"); break;
        default: break;
    }
}

void KirelXPButton::OnKeyPress(std::int16_t keyAscii) {
    if (events.KeyPress) events.KeyPress(keyAscii);
}

void KirelXPButton::OnKeyUp(std::int16_t keyCode, std::int16_t shift) {
    if (events.KeyUp) events.KeyUp(keyCode, shift);
    if (keyCode != 32 || lastKey_ != 32) return;
    if (checkBoxBehaviour_) value_ = !value_;
    Paint(0, false);
    host_.Present();
    if (events.Click) events.Click();
}

void KirelXPButton::OnAccessKey() {
    lastButton_ = 1;
    ClickSteps();
}

void KirelXPButton::OnGotFocus() {
    hasFocus_ = true;
    Paint(lastState_, true);
}

void KirelXPButton::OnLostFocus() {
    hasFocus_ = false;
    Paint(lastState_, true);
}

}  // namespace vantorel::xpbutton
