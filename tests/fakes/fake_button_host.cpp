#include "fakes/fake_button_host.h"

namespace vantorel::testing {

FakeButtonHost::FakeButtonHost() {
    // The classic Windows scheme.
    systemColours = {{platform::kColorHighlight, 0x6A240A}, {platform::kColorBtnFace, 0xC8D0D4},
                     {platform::kColorBtnShadow, 0x808080}, {platform::kColorBtnText, 0x000000},
                     {platform::kColorBtnHighlight, 0xFFFFFF}, {platform::kColor3dDkShadow, 0x404040},
                     {platform::kColor3dLight, 0xC8D0D4}};
}

platform::Rgb FakeButtonHost::SystemColour(int index) const {
    auto it = systemColours.find(index);
    return it == systemColours.end() ? 0 : it->second;
}

bool FakeButtonHost::CaptureParentPixels(std::int32_t w, std::int32_t h, std::vector<std::uint8_t>& pixels) {
    if (duringCapture) duringCapture();
    const std::int32_t stride = platform::DibStride(w);
    pixels.assign(static_cast<std::size_t>(stride) * h, 0);
    for (std::int32_t row = 0; row < h; ++row)
        for (std::int32_t col = 0; col < w; ++col) {
            std::uint8_t* p = pixels.data() + static_cast<std::size_t>(row) * stride + col * 3;
            p[0] = static_cast<std::uint8_t>(parentPixel >> 16);
            p[1] = static_cast<std::uint8_t>(parentPixel >> 8);
            p[2] = static_cast<std::uint8_t>(parentPixel);
        }
    return true;
}

MemoryPicture::MemoryPicture(platform::PictureKind kind, std::int32_t w, std::int32_t h,
                             std::vector<platform::Rgb> pixels, std::vector<bool> transparent)
    : kind_(kind), w_(w), h_(h), himetricW_(w * 2540 / 96), himetricH_(h * 2540 / 96),
      pixels_(std::move(pixels)), transparent_(std::move(transparent)) {}

bool MemoryPicture::Render(std::int32_t w, std::int32_t h, platform::Rgb fill, std::vector<std::uint8_t>& out) const {
    const std::int32_t stride = platform::DibStride(w);
    out.assign(static_cast<std::size_t>(stride) * h, 0);
    for (std::int32_t y = 0; y < h; ++y)
        for (std::int32_t x = 0; x < w; ++x) {
            platform::Rgb c = 0;
            const bool inside = x < w_ && y < h_;
            const std::size_t i = static_cast<std::size_t>(y) * w_ + x;
            if (kind_ != platform::PictureKind::kBitmap) {
                c = fill;
                if (inside && !(i < transparent_.size() && transparent_[i])) c = pixels_[i];
            } else if (inside) {
                c = pixels_[i];
            }
            std::uint8_t* p = out.data() + static_cast<std::size_t>(h - 1 - y) * stride + x * 3;
            p[0] = static_cast<std::uint8_t>(c >> 16);
            p[1] = static_cast<std::uint8_t>(c >> 8);
            p[2] = static_cast<std::uint8_t>(c);
        }
    return true;
}

}  // namespace vantorel::testing
