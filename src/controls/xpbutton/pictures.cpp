// The picture side of the push button: measuring and placing `PictureNormal`, choosing the
// picture per state, compositing pixel by pixel (mask colour, silhouettes, greyscale, see-through
// blend) and the `SpecialEffect` copies.
#include <algorithm>

#include "controls/xpbutton/kirel_xp_button.h"

namespace vantorel::xpbutton {

namespace {
constexpr std::int64_t kNone = -1;

std::string Trimmed(const std::string& text) {
    std::size_t first = text.find_first_not_of(' ');
    if (first == std::string::npos) return {};
    std::size_t last = text.find_last_not_of(' ');
    return text.substr(first, last - first + 1);
}
}  // namespace

void KirelXPButton::MeasurePicture() {
    if (!pictureNormal_) {
        pictureRect_.width = 0;
        pictureRect_.height = 0;
        return;
    }
    const double dpi = host_.ScreenDpi();
    pictureRect_.width = RoundHalfEven(pictureNormal_->HimetricWidth() * dpi / 2540.0);
    pictureRect_.height = RoundHalfEven(pictureNormal_->HimetricHeight() * dpi / 2540.0);
}

void KirelXPButton::LayoutPicture() {
    if (!pictureNormal_ && !pictureOver_) return;
    const std::int32_t pw = pictureRect_.width;
    const std::int32_t ph = pictureRect_.height;
    if (picturePosition_ == 4 || Trimmed(caption_).empty()) {
        pictureRect_.x = (w_ - pw) / 2;
        pictureRect_.y = (h_ - ph) / 2;
        return;
    }
    switch (picturePosition_) {
        case 0:
            pictureRect_.x = captionRect_.left - pw - 4;
            pictureRect_.y = (h_ - ph) / 2;
            break;
        case 1:
            pictureRect_.x = captionRect_.right + 4;
            pictureRect_.y = (h_ - ph) / 2;
            break;
        case 2:
            pictureRect_.x = (w_ - pw) / 2;
            pictureRect_.y = captionRect_.top - ph - 2;
            break;
        case 3:
            pictureRect_.x = (w_ - pw) / 2;
            pictureRect_.y = captionRect_.bottom + 2;
            break;
        default: break;
    }
}

void KirelXPButton::BlitPicture(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                                const platform::Picture& picture, std::int64_t keyColour, std::int64_t silhouette,
                                bool darkOnly, bool greyscale, bool blend) {
    if (w == 0 || h == 0) return;
    const double dpi = host_.ScreenDpi();
    if (w < 0) w = RoundHalfEven(picture.HimetricWidth() * dpi / 2540.0);
    if (h < 0) h = RoundHalfEven(picture.HimetricHeight() * dpi / 2540.0);
    if (w <= 0 || h <= 0) return;
    std::vector<std::uint8_t> source;
    if (!picture.Render(w, h, Translate(maskColor_), source)) return;
    std::vector<std::uint8_t> dest;
    canvas_.ReadPixels(x, y, w, h, dest);
    const std::size_t stride = static_cast<std::size_t>(platform::DibStride(w));
    if (source.size() < stride * h || dest.size() < stride * h) return;
    if (!useMaskColor_) keyColour = kNone;
    const std::uint8_t sb = static_cast<std::uint8_t>(Blue(static_cast<Rgb>(silhouette)));
    const std::uint8_t sg = static_cast<std::uint8_t>(Green(static_cast<Rgb>(silhouette)));
    const std::uint8_t sr = static_cast<std::uint8_t>(Red(static_cast<Rgb>(silhouette)));
    for (std::int32_t row = 0; row < h; ++row) {
        std::uint8_t* d = dest.data() + row * stride;
        const std::uint8_t* s = source.data() + row * stride;
        for (std::int32_t col = 0; col < w; ++col, d += 3, s += 3) {
            const std::int64_t packed = s[0] * 65536 + s[1] * 256 + s[2];
            if (packed == keyColour) continue;
            if (silhouette >= 0) {
                if (!darkOnly || s[0] + s[1] + s[2] < 385) {
                    d[0] = sb;
                    d[1] = sg;
                    d[2] = sr;
                }
            } else if (greyscale) {
                const std::int32_t g = RoundHalfEven(RoundHalfEven(s[2] * 0.3) + s[1] * 0.59 + s[0] * 0.11);
                const auto gb = static_cast<std::uint8_t>(std::clamp(g, 0, 255));
                d[0] = d[1] = d[2] = gb;
            } else if (blend) {
                for (int k = 0; k < 3; ++k) d[k] = static_cast<std::uint8_t>((2 * s[k] + d[k]) / 3);
            } else {
                d[0] = s[0];
                d[1] = s[1];
                d[2] = s[2];
            }
        }
    }
    canvas_.WritePixels(x, y, w, h, dest);
}

void KirelXPButton::DrawPictureEffect(std::int32_t offset, const platform::Picture& picture) {
    if (specialEffect_ <= 0) return;
    Rgb base;
    if (buttonType_ == 3) {
        base = palette_.BaseColor;
    } else if (offset == -1 && colorScheme_ != 2) {
        base = palette_.AccentLightColor;
    } else {
        base = palette_.FaceColor;
    }
    const std::int32_t s = specialEffect_ == 2 ? 1 : -1;
    const auto& r = pictureRect_;
    const std::int64_t key = palette_.MaskKeyColor;
    BlitPicture(r.x + offset + 1, r.y + offset + 1, r.width, r.height, picture, key, S(base, 40 * s), false, false,
                false);
    if (specialEffect_ < 3) {
        BlitPicture(r.x + offset - 1, r.y + offset - 1, r.width, r.height, picture, key, S(base, -40 * s), false, false,
                    false);
    }
}

void KirelXPButton::DrawPicture(std::int32_t mode) {
    if (!pictureNormal_) return;
    const platform::Picture& normal = *pictureNormal_;
    const std::int64_t key = palette_.MaskKeyColor;
    const auto& r = pictureRect_;
    auto plain = [&](const platform::Picture& picture, std::int32_t x, std::int32_t y) {
        BlitPicture(x, y, r.width, r.height, picture, key, kNone, false, false, false);
    };
    auto silhouette = [&](std::int32_t x, std::int32_t y, Rgb colour, bool darkOnly) {
        BlitPicture(x, y, r.width, r.height, normal, key, colour, darkOnly, false, false);
    };
    switch (mode) {
        case 0:
            if (hover_ && buttonType_ == 9) {
                DrawPictureEffect(-1, normal);
                silhouette(r.x + 1, r.y + 1, palette_.ShadowColor, false);
                plain(normal, r.x - 1, r.y - 1);
            } else if (hover_ && pictureOver_) {
                DrawPictureEffect(0, *pictureOver_);
                plain(*pictureOver_, r.x, r.y);
            } else if (hover_) {
                DrawPictureEffect(0, normal);
                plain(normal, r.x, r.y);
            } else {
                DrawPictureEffect(0, normal);
                BlitPicture(r.x, r.y, r.width, r.height, normal, key, kNone, false, useGreyscale_, buttonType_ == 9);
            }
            break;
        case 1:
            if (pictureOver_ && buttonType_ != 9) {
                const std::int32_t d = buttonType_ == 5 ? 0 : 1;
                plain(*pictureOver_, r.x + d, r.y + d);
            } else if (buttonType_ == 5 || buttonType_ == 9) {
                DrawPictureEffect(0, normal);
                plain(normal, r.x, r.y);
            } else {
                DrawPictureEffect(1, normal);
                plain(normal, r.x + 1, r.y + 1);
            }
            break;
        case 2:
            if (buttonType_ == 3) {
                BlitPicture(r.x + 1, r.y + 1, r.width, r.height, normal, key, kNone, false, true, false);
            } else if (buttonType_ == 5 || buttonType_ == 6) {
                silhouette(r.x, r.y, palette_.ShadowColor, true);
            } else if (buttonType_ == 9) {
                silhouette(r.x, r.y, S(palette_.ShadowColor, 13), true);
            } else {
                silhouette(r.x + 1, r.y + 1, palette_.HighlightColor, true);
                silhouette(r.x, r.y, palette_.ShadowColor, true);
            }
            break;
        default: break;
    }
    if (picturePosition_ == 4) DrawCaption(captionMode_);
}

}  // namespace vantorel::xpbutton
