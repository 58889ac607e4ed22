// Rendering of the push button: the palette, the caption and shape geometry, and the recipes of
// the fourteen looks in the up, hover, pressed and disabled states.
#include <cmath>

#include "controls/xpbutton/kirel_xp_button.h"

namespace vantorel::xpbutton {

namespace {
constexpr Rgb kXpBorder = 0x733C00;
constexpr Rgb kXpCorner = 0x7B4D10;
}  // namespace

void KirelXPButton::ComputePalette() {
    Palette& p = palette_;
    auto sys = [this](int index) { return host_.SystemColour(index); };
    switch (colorScheme_) {
        case 2:
            p.FaceColor = Translate(backColor_);
            p.TextColor = Translate(foreColor_);
            p.TextOverColor = Translate(foreOver_);
            p.ShadowColor = S(p.FaceColor, -64);
            p.LightColor = S(p.FaceColor, 31);
            p.HighlightColor = S(p.FaceColor, 47);
            p.DarkShadowColor = S(p.FaceColor, -192);
            p.AccentColor = S(p.FaceColor, -128);
            p.AccentLightColor = p.FaceColor;
            break;
        case 3:
            p.FaceColor = 0xC0C0C0;
            p.TextColor = 0x000000;
            p.TextOverColor = 0x000000;
            p.ShadowColor = 0x808080;
            p.LightColor = 0xDFDFDF;
            p.HighlightColor = 0xFFFFFF;
            p.DarkShadowColor = 0x000000;
            p.AccentColor = 0x800000;
            p.AccentLightColor = 0xD1ADAD;
            break;
        case 4:
            p.FaceColor = host_.ParentBackColour() & 0xFFFFFF;
            p.TextColor = host_.ParentTextColour() & 0xFFFFFF;
            p.TextOverColor = p.TextColor;
            p.ShadowColor = S(p.FaceColor, -64);
            p.LightColor = S(p.FaceColor, 31);
            p.HighlightColor = S(p.FaceColor, 47);
            p.DarkShadowColor = S(p.FaceColor, -192);
            p.AccentColor = sys(platform::kColorHighlight);
            p.AccentLightColor = BlendToWhite(p.AccentColor, 176);
            break;
        default:
            p.FaceColor = sys(platform::kColorBtnFace);
            p.TextColor = sys(platform::kColorBtnText);
            p.TextOverColor = sys(platform::kColorBtnText);
            p.ShadowColor = sys(platform::kColorBtnShadow);
            p.LightColor = sys(platform::kColor3dLight);
            p.HighlightColor = sys(platform::kColorBtnHighlight);
            p.DarkShadowColor = sys(platform::kColor3dDkShadow);
            p.AccentColor = sys(platform::kColorHighlight);
            p.AccentLightColor = BlendToWhite(p.AccentColor, 176);
            break;
    }
    p.MaskKeyColor = Translate(maskColor_);
    p.BaseColor = ShiftColor(p.FaceColor, 48, buttonType_ == 3, softBevel_);
}

void KirelXPButton::LayoutCaption() {
    const std::int32_t pw = pictureRect_.width;
    const std::int32_t ph = pictureRect_.height;
    Box box;
    switch (picturePosition_) {
        case 0: box = {pw + 1, 1, w_ - 2, h_ - 2}; break;
        case 1: box = {1, 1, w_ - pw - 2, h_ - 2}; break;
        case 2: box = {1, ph + 1, w_ - 2, h_ - 2}; break;
        case 3: box = {1, 1, w_ - 2, h_ - ph - 2}; break;
        default: box = {1, 1, w_ - 2, h_ - 2}; break;
    }
    Box measured = canvas_.MeasureText(caption_, box, font_);
    textWidth_ = measured.right - measured.left;
    textHeight_ = measured.bottom - measured.top;
    const std::int32_t r = measured.right;
    const std::int32_t b = measured.bottom;
    switch (picturePosition_) {
        case 0:
        case 2:
        case 4: measured = Offset(measured, (w_ - r) / 2, (h_ - b) / 2); break;
        case 1: measured = Offset(measured, (w_ - pw - r - 4) / 2, (h_ - b) / 2); break;
        case 3: measured = Offset(measured, (w_ - r) / 2, (h_ - ph - b - 4) / 2); break;
        default: break;
    }
    captionRect_ = measured;
    captionRectDown_ = Offset(measured, 1, 1);
    LayoutPicture();
}

platform::WindowShape KirelXPButton::BuildRegion() const {
    platform::WindowShape shape;
    shape.width = w_;
    shape.height = h_;
    const std::int32_t r = w_ - 1;
    const std::int32_t b = h_ - 1;
    switch (buttonType_) {
        case 1:
        case 14: shape.removed = {{0, 0}, {r, 0}, {0, b}, {r, b}}; break;
        case 5: shape.removed = {{0, b}, {r, 0}}; break;
        case 3:
        case 4:
            shape.removed = {{0, 0}, {1, 0}, {0, 1},     {r, 0}, {r - 1, 0}, {r, 1},
                             {0, b}, {1, b}, {0, b - 1}, {r, b}, {r - 1, b}, {r, b - 1}};
            break;
        case 13: shape.ellipse = true; break;
        default: break;
    }
    return shape;
}

void KirelXPButton::Gradient(Rgb c, std::int32_t k, bool up, bool scaleBlue) {
    const float step = static_cast<float>(k) / static_cast<float>(h_);
    for (std::int32_t i = 1; i <= h_; ++i) {
        const float amount = -step * static_cast<float>(i);
        const Rgb colour = ShiftColor(c, RoundHalfEven(amount), scaleBlue, softBevel_);
        if (up) {
            canvas_.DrawLine(0, i, w_, i, colour);
        } else {
            canvas_.DrawLine(0, h_ - i, w_, h_ - i, colour);
        }
    }
}

void KirelXPButton::Corners(Rgb c) {
    canvas_.PutPixel(1, 1, c);
    canvas_.PutPixel(1, h_ - 2, c);
    canvas_.PutPixel(w_ - 2, 1, c);
    canvas_.PutPixel(w_ - 2, h_ - 2, c);
}

void KirelXPButton::DrawBevel(Rgb tlOuter, Rgb brOuter, Rgb tlInner, Rgb brInner, std::int32_t offset, bool outerOnly) {
    const std::int32_t d = offset < 0 ? -offset : offset;
    const std::int32_t r = w_ + offset - 1;
    const std::int32_t b = h_ + offset - 1;
    canvas_.DrawLine(d, b, d, d, tlOuter);
    canvas_.DrawLine(d, d, r, d, tlOuter);
    canvas_.DrawLine(r, d, r, b, brOuter);
    canvas_.DrawLine(r, b, d - 1, b, brOuter);
    if (outerOnly) return;
    canvas_.DrawLine(d + 1, b - 1, d + 1, d + 1, tlInner);
    canvas_.DrawLine(d + 1, d + 1, r - 1, d + 1, tlInner);
    canvas_.DrawLine(r - 1, d + 1, r - 1, b - 1, brInner);
    canvas_.DrawLine(r - 1, b - 1, d, b - 1, brInner);
}

void KirelXPButton::DrawCaptionEffect(const Box& box) {
    if (specialEffect_ <= 0) return;
    Rgb base;
    if (buttonType_ == 3 || buttonType_ == 4 || buttonType_ == 14) {
        base = palette_.BaseColor;
    } else if (buttonType_ == 9 && lastState_ == 0 && hover_ && colorScheme_ != 2) {
        base = palette_.AccentLightColor;
    } else {
        base = palette_.FaceColor;
    }
    Text(Offset(box, 1, 1), S(base, specialEffect_ == 2 ? 40 : -40));
    if (specialEffect_ < 3) Text(Offset(box, -1, -1), S(base, specialEffect_ == 2 ? -40 : 40));
}

void KirelXPButton::DrawCaption(std::int32_t mode) {
    captionMode_ = mode;
    const Palette& p = palette_;
    switch (mode) {
        case 0:
            DrawCaptionEffect(captionRect_);
            Text(captionRect_, p.TextColor);
            break;
        case 1:
            DrawCaptionEffect(captionRect_);
            Text(captionRect_, p.TextOverColor);
            break;
        case 2:
            DrawCaptionEffect(captionRectDown_);
            Text(captionRectDown_, buttonType_ == 4 ? p.LightColor : p.TextOverColor);
            break;
        case 3:
            Text(captionRectDown_, p.HighlightColor);
            Text(captionRect_, p.ShadowColor);
            break;
        case 4: Text(captionRect_, p.ShadowColor); break;
        case 5: Text(captionRect_, SB(p.BaseColor, -104)); break;
        case 6:
            Text(captionRectDown_, p.HighlightColor);
            Text(captionRect_, p.FaceColor);
            break;
        case 7:
            Text(captionRectDown_, S(p.ShadowColor, -50));
            Text(captionRect_, p.HighlightColor);
            break;
        default: break;
    }
}

void KirelXPButton::DrawFocus() {
    if (showFocusRect_ && hasFocus_) canvas_.DrawFocusRect(focusRect_, palette_.TextColor);
}

void KirelXPButton::Paint(std::int32_t state, bool force) {
    if (checkBoxBehaviour_ && value_) state = 2;
    if (!force && caption_ == lastCaption_ && state == lastState_) return;
    if (h_ == 0 || !paintingEnabled_) return;
    lastState_ = state;
    lastCaption_ = caption_;
    canvas_.Clear();
    const bool swapColours = hover_ && colorScheme_ == 2;
    Rgb keptBackColor = backColor_;
    if (swapColours) {
        backColor_ = backOver_;
        ComputePalette();
    }
    canvas_.FillBox(0, 0, w_, h_, palette_.FaceColor);
    if (buttonType_ == 11 && hasBackground_) canvas_.WritePixels(0, 0, backgroundW_, backgroundH_, background_);
    if (!enabled_) {
        DrawFace(Face::Disabled);
        DrawPicture(2);
    } else if (state == 0) {
        DrawFace(Face::Up);
        DrawPicture(0);
    } else if (state == 2) {
        DrawFace(Face::Pressed);
        DrawPicture(1);
    }
    if (swapColours) {
        backColor_ = keptBackColor;
        ComputePalette();
    }
}

void KirelXPButton::DrawFace(Face face) {
    const Palette& p = palette_;
    const std::int32_t W = w_;
    const std::int32_t H = h_;
    const std::int32_t h = hover_ ? 1 : 0;
    Canvas& c = canvas_;
    switch (buttonType_) {
        case 1:
            if (face == Face::Up) {
                DrawCaption(h);
                DrawBevel(p.HighlightColor, p.ShadowColor, p.HighlightColor, p.ShadowColor, -1, false);
                c.FrameBox(0, 0, W, H, p.DarkShadowColor);
                DrawFocus();
            } else if (face == Face::Pressed) {
                DrawCaption(2);
                DrawBevel(p.ShadowColor, p.HighlightColor, p.ShadowColor, p.HighlightColor, -1, false);
                c.FrameBox(0, 0, W, H, p.DarkShadowColor);
                DrawFocus();
            } else {
                DrawCaption(3);
                DrawBevel(p.HighlightColor, p.ShadowColor, p.HighlightColor, p.ShadowColor, -1, false);
                c.FrameBox(0, 0, W, H, p.DarkShadowColor);
            }
            break;
        case 2:
            if (face == Face::Up) {
                DrawCaption(h);
                if (IsDefault()) {
                    DrawBevel(p.HighlightColor, p.DarkShadowColor, p.LightColor, p.ShadowColor, -1, false);
                    DrawFocus();
                    c.FrameBox(0, 0, W, H, p.DarkShadowColor);
                } else {
                    DrawBevel(p.HighlightColor, p.DarkShadowColor, p.LightColor, p.ShadowColor, 0, false);
                }
            } else if (face == Face::Pressed) {
                DrawCaption(2);
                if (IsDefault()) {
                    c.FrameBox(0, 0, W, H, p.DarkShadowColor);
                    c.FrameBox(1, 1, W - 2, H - 2, p.ShadowColor);
                    DrawFocus();
                } else {
                    DrawBevel(p.DarkShadowColor, p.HighlightColor, p.ShadowColor, p.LightColor, 0, false);
                }
            } else {
                DrawCaption(3);
                DrawBevel(p.HighlightColor, p.DarkShadowColor, p.LightColor, p.ShadowColor, 0, false);
            }
            break;
        case 3:
            if (face == Face::Up) {
                const Rgb b = p.BaseColor;
                Gradient(b, 25, true, true);
                DrawCaption(h);
                c.FrameBox(0, 0, W, H, kXpBorder);
                Corners(kXpCorner);
                // The coloured rim of a hovered (orange) or focused (blue) XP button.
                auto rim = [&](Rgb frame, Rgb bottom, Rgb top, Rgb second, Rgb sides) {
                    c.FrameBox(1, 2, W - 2, H - 4, frame);
                    c.DrawLine(2, H - 2, W - 2, H - 2, bottom);
                    c.DrawLine(2, 1, W - 2, 1, top);
                    c.DrawLine(1, 2, W - 1, 2, second);
                    c.DrawLine(2, 3, 2, H - 3, sides);
                    c.DrawLine(W - 3, 3, W - 3, H - 3, sides);
                };
                if (hover_) {
                    rim(0x31B2FF, 0x0096E7, 0xCEF3FF, 0x8CDBFF, 0x6BCBFF);
                } else if ((hasFocus_ || host_.IsDefault()) && showFocusRect_) {
                    rim(0xE7AE8C, 0xEF826B, 0xFFE7CE, 0xF7D7BD, 0xF0D1B5);
                } else {
                    c.DrawLine(2, H - 2, W - 2, H - 2, SB(b, -48));
                    c.DrawLine(1, H - 3, W - 2, H - 3, SB(b, -32));
                    c.DrawLine(W - 2, 2, W - 2, H - 2, SB(b, -36));
                    c.DrawLine(W - 3, 3, W - 3, H - 3, SB(b, -24));
                    c.DrawLine(2, 1, W - 2, 1, SB(b, 16));
                    c.DrawLine(1, 2, W - 2, 2, SB(b, 10));
                    c.DrawLine(1, 2, 1, H - 2, SB(b, -5));
                    c.DrawLine(2, 3, 2, H - 3, SB(b, -10));
                }
            } else if (face == Face::Pressed) {
                const Rgb q = SB(p.BaseColor, -32);
                Gradient(q, 25, false, true);
                DrawCaption(2);
                c.FrameBox(0, 0, W, H, kXpBorder);
                Corners(kXpCorner);
                c.DrawLine(2, H - 2, W - 2, H - 2, SB(q, 16));
                c.DrawLine(1, H - 3, W - 2, H - 3, SB(q, 10));
                c.DrawLine(W - 2, 2, W - 2, H - 2, SB(q, 5));
                c.DrawLine(W - 3, 3, W - 3, H - 3, p.BaseColor);
                c.DrawLine(2, 1, W - 2, 1, SB(q, -32));
                c.DrawLine(1, 2, W - 2, 2, SB(q, -24));
                c.DrawLine(1, 2, 1, H - 2, SB(q, -32));
                c.DrawLine(2, 2, 2, H - 2, SB(q, -22));
            } else {
                c.FillBox(0, 0, W, H, SB(p.BaseColor, -24));
                DrawCaption(5);
                c.FrameBox(0, 0, W, H, SB(p.BaseColor, -84));
                Corners(SB(p.BaseColor, -72));
            }
            break;
        case 4:
            if (face == Face::Pressed) {
                const Rgb f = S(p.ShadowColor, -16);
                c.FillBox(1, 1, W - 2, H - 2, f);
                palette_.BaseColor = f;
                DrawCaption(2);
                palette_.BaseColor = S(p.FaceColor, 48);
                c.FrameBox(0, 0, W, H, p.DarkShadowColor);
                c.FrameBox(1, 1, W - 2, H - 2, S(p.ShadowColor, -64));
                c.FrameBox(2, 2, W - 4, H - 4, S(p.ShadowColor, -32));
                c.PutPixel(2, 2, S(p.ShadowColor, -64));
                c.PutPixel(3, 3, S(p.ShadowColor, -32));
                Corners(p.DarkShadowColor);
                c.DrawLine(W - 3, 1, W - 3, H - 3, p.ShadowColor);
                c.DrawLine(1, H - 3, W - 2, H - 3, p.ShadowColor);
                c.PutPixel(W - 4, H - 4, p.ShadowColor);
                c.DrawLine(W - 2, 3, W - 2, H - 2, f);
                c.DrawLine(3, H - 2, W - 2, H - 2, f);
                c.DrawLine(W - 2, H - 3, W - 4, H - 1, S(p.ShadowColor, -32));
                c.PutPixel(2, H - 2, S(p.ShadowColor, -32));
                c.PutPixel(W - 2, 2, S(p.ShadowColor, -32));
            } else {  // disabled: as up, with the engraved caption
                c.FillBox(1, 1, W - 2, H - 2, p.LightColor);
                DrawCaption(face == Face::Up ? h : 3);
                c.FrameBox(0, 0, W, H, p.DarkShadowColor);
                Corners(p.DarkShadowColor);
                c.DrawLine(1, 2, 2, 0, p.FaceColor);
                c.DrawLine(3, 2, W - 3, 2, p.HighlightColor);
                c.DrawLine(2, 2, 2, H - 3, p.HighlightColor);
                c.PutPixel(3, 3, p.HighlightColor);
                c.DrawLine(W - 3, 1, W - 3, H - 3, p.FaceColor);
                c.DrawLine(1, H - 3, W - 3, H - 3, p.FaceColor);
                c.PutPixel(W - 4, H - 4, p.FaceColor);
                c.DrawLine(W - 2, 2, W - 2, H - 2, p.ShadowColor);
                c.DrawLine(2, H - 2, W - 2, H - 2, p.ShadowColor);
                c.PutPixel(W - 3, H - 3, p.ShadowColor);
            }
            break;
        case 5:
            if (face == Face::Up) {
                c.FillBox(1, 1, W - 1, H - 1, S(p.FaceColor, 12));
                DrawCaption(h);
                c.FrameBox(1, 1, W - 1, H - 1, p.HighlightColor);
                c.FrameBox(0, 0, W - 1, H - 1, S(p.ShadowColor, -26));
                c.PutPixel(1, H - 2, S(p.ShadowColor, 26));
                c.PutPixel(W - 2, 1, S(p.ShadowColor, 26));
                if (hasFocus_ && showFocusRect_) {
                    c.FrameBox(captionRect_.left - 2, captionRect_.top - 1, textWidth_ + 4, textHeight_ + 2, 0xCC9999);
                }
            } else if (face == Face::Pressed) {
                c.FillBox(1, 1, W - 2, H - 2, S(p.ShadowColor, 16));
                c.FrameBox(0, 0, W - 1, H - 1, S(p.ShadowColor, -26));
                c.DrawLine(W - 1, 1, W - 1, H, p.HighlightColor);
                c.DrawLine(1, H - 1, W - 1, H - 1, p.HighlightColor);
                Text(captionRect_, p.TextOverColor);
                if (hasFocus_ && showFocusRect_) {
                    c.FrameBox(captionRect_.left - 2, captionRect_.top - 1, textWidth_ + 4, textHeight_ + 2, 0xCC9999);
                }
            } else {
                DrawCaption(4);
                c.FrameBox(0, 0, W, H, p.ShadowColor);
            }
            break;
        case 6:
            if (face == Face::Up) {
                DrawCaption(h);
                const Rgb a = S(p.LightColor, 8);
                DrawBevel(a, p.ShadowColor, a, p.ShadowColor, 0, false);
                DrawFocus();
            } else if (face == Face::Pressed) {
                DrawCaption(2);
                const Rgb a = S(p.LightColor, 8);
                DrawBevel(p.ShadowColor, a, p.ShadowColor, a, 0, false);
                DrawFocus();
            } else {
                DrawCaption(4);
                const Rgb a = S(p.LightColor, 8);
                DrawBevel(a, p.ShadowColor, a, p.ShadowColor, 0, false);
            }
            break;
        case 7:
        case 8:
        case 12:
            if (face == Face::Up) {
                DrawCaption(h);
                if (buttonType_ == 7 || (buttonType_ == 8 && hover_)) {
                    DrawBevel(p.HighlightColor, p.ShadowColor, 0, 0, 0, true);
                } else if (buttonType_ == 12 && hover_) {
                    DrawBevel(p.HighlightColor, p.DarkShadowColor, p.LightColor, p.ShadowColor, 0, false);
                }
                DrawFocus();
            } else if (face == Face::Pressed) {
                DrawCaption(2);
                if (buttonType_ == 12) {
                    DrawBevel(p.DarkShadowColor, p.HighlightColor, p.ShadowColor, p.LightColor, 0, false);
                } else {
                    DrawBevel(p.ShadowColor, p.HighlightColor, 0, 0, 0, true);
                }
                DrawFocus();
            } else {
                DrawCaption(3);
                if (buttonType_ == 7) DrawBevel(p.HighlightColor, p.ShadowColor, 0, 0, 0, true);
            }
            break;
        case 9:
            if (face == Face::Up) {
                if (hover_) c.FillBox(1, 1, W, H, p.AccentLightColor);
                DrawCaption(h);
                if (hover_) c.FrameBox(0, 0, W, H, p.AccentColor);
                DrawFocus();
            } else if (face == Face::Pressed) {
                if (hover_) {
                    c.FillBox(0, 0, W, H,
                              colorScheme_ == 2 ? S(p.AccentLightColor, -32) : BlendToWhite(p.AccentColor, 128));
                }
                DrawCaption(2);
                c.FrameBox(0, 0, W, H, p.AccentColor);
                DrawFocus();
            } else {
                DrawCaption(4);
            }
            break;
        case 11:
            if (face == Face::Up) {
                DrawCaption(h);
                DrawFocus();
            } else if (face == Face::Pressed) {
                DrawCaption(2);
                DrawFocus();
            } else {
                DrawCaption(3);
            }
            break;
        case 13:
            if (face == Face::Up) {
                c.DrawOval(0, 0, W, H, hover_ ? p.ShadowColor : p.FaceColor, p.FaceColor);
                DrawCaption(h);
            } else if (face == Face::Pressed) {
                c.DrawOval(0, 0, W, H, p.DarkShadowColor, S(p.FaceColor, -32));
                DrawCaption(2);
            } else {
                DrawCaption(3);
            }
            break;
        case 14:
            if (face == Face::Up) {
                if (hover_) {
                    c.FillBox(0, 0, W, H, p.LightColor);
                } else {
                    Gradient(p.HighlightColor, 58, true, false);
                }
                if (host_.IsDefault()) {
                    // The default button's caption is bold; the font changes must not repaint.
                    paintingEnabled_ = false;
                    const bool keptBold = FontBold();
                    SetFontBold(true);
                    DrawCaption(h);
                    SetFontBold(keptBold);
                    paintingEnabled_ = true;
                } else {
                    DrawCaption(h);
                }
                c.FrameBox(0, 0, W, H, S(p.ShadowColor, -50));
                c.FrameBox(1, 1, W - 2, H - 2, S(p.FaceColor, -9));
                c.FillBox(2, 2, W - 4, 2, p.HighlightColor);
                c.FillBox(2, 4, 2, H - 6, p.HighlightColor);
                DrawFocus();
            } else if (face == Face::Pressed) {
                c.FillBox(1, 1, W, H, S(p.FaceColor, -9));
                c.FrameBox(0, 0, W, H, S(p.ShadowColor, -48));
                c.DrawLine(2, H - 2, W - 2, H - 2, p.HighlightColor);
                c.DrawLine(W - 2, 2, W - 2, H - 1, p.HighlightColor);
                DrawCaption(7);
                DrawFocus();
            } else {
                Gradient(p.HighlightColor, 58, true, false);
                c.FrameBox(0, 0, W, H, S(p.ShadowColor, -50));
                c.FrameBox(1, 1, W - 2, H - 2, S(p.FaceColor, -9));
                c.FillBox(2, 2, W - 4, 2, p.HighlightColor);
                c.FillBox(2, 4, 2, H - 6, p.HighlightColor);
                DrawCaption(6);
            }
            break;
        default: break;
    }
}

}  // namespace vantorel::xpbutton
