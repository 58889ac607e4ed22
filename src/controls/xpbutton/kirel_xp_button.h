// `KirelXPButton`: the program's own custom-drawn push button (the main window's ON/OFF switch is
// one). This class is the whole control without the system: properties and their store, the
// pointer/keyboard/focus state machine and its events, the palette, the caption and window-shape
// geometry, the fourteen looks and the picture compositing. It draws on a platform::Canvas and
// asks its window and container for the rest through platform::ButtonHost; the Win32 window class
// (xpbutton_window_win32) feeds it messages.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "controls/xpbutton/colour.h"
#include "controls/xpbutton/property_bag.h"
#include "platform/button_host.h"
#include "platform/canvas.h"

namespace vantorel::xpbutton {

using platform::Box;
using platform::Canvas;
using platform::FontDesc;
using platform::PicturePtr;

// The eleven palette colours, recomputed by ComputePalette.
struct Palette {
    Rgb FaceColor = 0;
    Rgb LightColor = 0;
    Rgb HighlightColor = 0;
    Rgb ShadowColor = 0;
    Rgb DarkShadowColor = 0;
    Rgb TextColor = 0;
    Rgb TextOverColor = 0;
    Rgb MaskKeyColor = 0;
    Rgb BaseColor = 0;
    Rgb AccentColor = 0;
    Rgb AccentLightColor = 0;
};

struct PictureRectangle {
    std::int32_t x = 0;
    std::int32_t y = 0;
    std::int32_t width = 0;
    std::int32_t height = 0;
};

// The events raised to the container. Arguments are by reference: the control reads them again
// after the handler returns, so a handler's changes take effect.
struct XPButtonEvents {
    std::function<void()> Click;
    std::function<void(std::int16_t& button, std::int16_t& shift, float& x, float& y)> MouseDown;
    std::function<void(std::int16_t& button, std::int16_t& shift, float& x, float& y)> MouseMove;
    std::function<void(std::int16_t& button, std::int16_t& shift, float& x, float& y)> MouseUp;
    std::function<void(std::int16_t& keyAscii)> KeyPress;
    std::function<void(std::int16_t& keyCode, std::int16_t& shift)> KeyDown;
    std::function<void(std::int16_t& keyCode, std::int16_t& shift)> KeyUp;
    std::function<void()> MouseOver;
    std::function<void()> MOUSEOUT;
};

// The access key of a caption, lower case, or 0 for none.
char AccessKeyOf(const std::string& caption);

class KirelXPButton {
public:
    static constexpr std::int32_t kOverTimerPeriod = 3;
    static constexpr const char* kVersion = "2.0.6";

    // The container's initialise notification: painting is enabled.
    KirelXPButton(platform::ButtonHost& host, platform::Canvas& canvas);
    KirelXPButton(const KirelXPButton&) = delete;
    KirelXPButton& operator=(const KirelXPButton&) = delete;

    XPButtonEvents events;

    // Lifecycle hooks from the container.
    void InitNewControl();
    void ReadProperties(const PropertyBag& bag);
    void WriteProperties(PropertyBag& bag) const;
    void OnShow();
    void OnHide();
    void OnResize();
    void OnAmbientChanged();
    void OnTerminate();

    // Input from the platform.
    void OnMouseDown(std::int16_t button, std::int16_t shift, float x, float y);
    void OnMouseMove(std::int16_t button, std::int16_t shift, float x, float y);
    void OnMouseUp(std::int16_t button, std::int16_t shift, float x, float y);
    void OnClick();
    void OnDoubleClick();
    void OnOverTimer();
    void OnKeyDown(std::int16_t keyCode, std::int16_t shift);
    void OnKeyPress(std::int16_t keyAscii);
    void OnKeyUp(std::int16_t keyCode, std::int16_t shift);
    void OnAccessKey();
    void OnGotFocus();
    void OnLostFocus();

    void DisableRefresh();
    void Refresh();

    // Properties.
    Rgb BackColor() const { return backColor_; }
    void SetBackColor(Rgb value);
    Rgb BackOver() const { return backOver_; }
    void SetBackOver(Rgb value);
    Rgb ForeColor() const { return foreColor_; }
    void SetForeColor(Rgb value);
    Rgb ForeOver() const { return foreOver_; }
    void SetForeOver(Rgb value);
    Rgb MaskColor() const { return maskColor_; }
    void SetMaskColor(Rgb value);
    std::int32_t ButtonType() const { return buttonType_; }
    void SetButtonType(std::int32_t value);
    const std::string& Caption() const { return caption_; }
    void SetCaption(const std::string& value);
    bool Enabled() const { return enabled_; }
    void SetEnabled(bool value);
    const FontDesc& Font() const { return font_; }
    void SetFont(const FontDesc& value);
    bool FontBold() const { return font_.bold; }
    void SetFontBold(bool value);
    bool FontItalic() const { return font_.italic; }
    void SetFontItalic(bool value);
    bool FontUnderline() const { return font_.underline; }
    void SetFontUnderline(bool value);
    std::int16_t FontSize() const;
    void SetFontSize(std::int16_t value);
    const std::string& FontName() const { return font_.name; }
    void SetFontName(const std::string& value);
    std::int32_t ColorScheme() const { return colorScheme_; }
    void SetColorScheme(std::int32_t value);
    bool ShowFocusRect() const { return showFocusRect_; }
    void SetShowFocusRect(bool value);
    std::int32_t MousePointer() const { return mousePointer_; }
    void SetMousePointer(std::int32_t value);
    const PicturePtr& MouseIcon() const { return mouseIcon_; }
    void SetMouseIcon(const PicturePtr& value);
    std::intptr_t hWnd() const { return host_.Handle(); }
    bool SoftBevel() const { return softBevel_; }
    void SetSoftBevel(bool value);
    const PicturePtr& PictureNormal() const { return pictureNormal_; }
    void SetPictureNormal(const PicturePtr& value);
    const PicturePtr& PictureOver() const { return pictureOver_; }
    void SetPictureOver(const PicturePtr& value);
    std::int32_t PicturePosition() const { return picturePosition_; }
    void SetPicturePosition(std::int32_t value);
    bool UseMaskColor() const { return useMaskColor_; }
    void SetUseMaskColor(bool value);
    bool UseGreyscale() const { return useGreyscale_; }
    void SetUseGreyscale(bool value);
    std::int32_t SpecialEffect() const { return specialEffect_; }
    void SetSpecialEffect(std::int32_t value);
    bool CheckBoxBehaviour() const { return checkBoxBehaviour_; }
    void SetCheckBoxBehaviour(bool value);
    bool Value() const { return value_; }
    void SetValue(bool value);
    std::string Version() const { return kVersion; }
    std::int16_t ImageIndex() const { return imageIndex_; }
    void SetImageIndex(std::int16_t value);

    // Rendering (public so the looks can be driven and checked directly).
    void Paint(std::int32_t state, bool force);
    void ComputePalette();
    void LayoutCaption();
    platform::WindowShape BuildRegion() const;
    void MeasurePicture();
    void LayoutPicture();
    void BlitPicture(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, const platform::Picture& picture,
                     std::int64_t keyColour, std::int64_t silhouette, bool darkOnly, bool greyscale, bool blend);

    // Derived state, for hosts and tests.
    const Palette& palette() const { return palette_; }
    const Box& captionRect() const { return captionRect_; }
    const Box& captionRectDown() const { return captionRectDown_; }
    const Box& focusRect() const { return focusRect_; }
    const PictureRectangle& pictureRect() const { return pictureRect_; }
    std::int32_t width() const { return w_; }
    std::int32_t height() const { return h_; }
    bool hovering() const { return hover_; }
    bool hasFocus() const { return hasFocus_; }
    bool paintingEnabled() const { return paintingEnabled_; }
    std::int32_t lastState() const { return lastState_; }
    std::uint8_t lastButton() const { return lastButton_; }
    std::uint8_t lastKey() const { return lastKey_; }
    char accessKey() const { return accessKey_; }

private:
    Rgb Translate(Rgb value) const;
    Rgb S(Rgb c, std::int32_t n) const { return ShiftColor(c, n, false, softBevel_); }
    Rgb SB(Rgb c, std::int32_t n) const { return ShiftColor(c, n, true, softBevel_); }
    void Notify(const std::string& key) { host_.PropertyChanged(key); }
    void UpdateAccessKey();
    void CaptureBackground();
    void ClickSteps();

    // Paint pieces.
    void Gradient(Rgb c, std::int32_t k, bool up, bool scaleBlue);
    void Corners(Rgb c);
    void DrawBevel(Rgb tlOuter, Rgb brOuter, Rgb tlInner, Rgb brInner, std::int32_t offset, bool outerOnly);
    void DrawCaption(std::int32_t mode);
    void DrawCaptionEffect(const Box& box);
    void DrawFocus();
    // The three faces of a look: up (hovered or not), pressed, disabled.
    enum class Face { Up, Pressed, Disabled };
    void DrawFace(Face face);
    void DrawPicture(std::int32_t mode);
    void DrawPictureEffect(std::int32_t offset, const platform::Picture& picture);
    void Text(const Box& box, Rgb colour) { canvas_.DrawText(caption_, box, colour, font_); }
    bool IsDefault() const { return host_.IsDefault() && showFocusRect_; }

    platform::ButtonHost& host_;
    platform::Canvas& canvas_;

    // Properties.
    Rgb backColor_ = 0xFFFFFF;
    Rgb backOver_ = 0xFFFFFF;
    Rgb foreColor_ = 0;
    Rgb foreOver_ = 0xFF0000;
    Rgb maskColor_ = 0xC0C0C0;
    std::int32_t buttonType_ = 3;
    std::string caption_;
    bool enabled_ = true;
    FontDesc font_;
    std::int32_t colorScheme_ = 1;
    bool showFocusRect_ = true;
    std::int32_t mousePointer_ = 0;
    PicturePtr mouseIcon_;
    bool softBevel_ = false;
    PicturePtr pictureNormal_;
    PicturePtr pictureOver_;
    std::int32_t picturePosition_ = 0;
    bool useMaskColor_ = true;
    bool useGreyscale_ = false;
    std::int32_t specialEffect_ = 0;
    bool checkBoxBehaviour_ = false;
    bool value_ = false;
    std::int16_t imageIndex_ = 0;
    bool handFlag_ = false;

    // Input state.
    bool hover_ = false;
    std::uint8_t lastButton_ = 0;
    std::uint8_t lastKey_ = 0;
    bool hasFocus_ = false;
    char accessKey_ = 0;

    // Rendering state.
    Palette palette_;
    std::int32_t w_ = 0;
    std::int32_t h_ = 0;
    Box captionRect_;
    Box captionRectDown_;
    std::int32_t textWidth_ = 0;
    std::int32_t textHeight_ = 0;
    Box focusRect_;
    PictureRectangle pictureRect_;
    bool hasShape_ = false;
    std::vector<std::uint8_t> background_;
    bool hasBackground_ = false;
    std::int32_t backgroundW_ = 0;
    std::int32_t backgroundH_ = 0;
    bool capturing_ = false;
    std::int32_t lastState_ = 0;
    std::string lastCaption_;
    std::int32_t captionMode_ = 0;
    bool paintingEnabled_ = true;
};

}  // namespace vantorel::xpbutton
