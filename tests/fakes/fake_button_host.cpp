#include "fakes/fake_button_host.h"

#include "fakes/raster_canvas.h"

namespace vantorel::testing {

FakeButtonHost::FakeButtonHost() {
    // The classic Windows scheme, but for a 3D light distinct from the face so that the looks tell them apart.
    systemColours = {{platform::kColorHighlight, 0x6A240A},    {platform::kColorBtnFace, 0xC8D0D4},
                     {platform::kColorBtnShadow, 0x808080},    {platform::kColorBtnText, 0x000000},
                     {platform::kColorBtnHighlight, 0xFFFFFF}, {platform::kColor3dDkShadow, 0x404040},
                     {platform::kColor3dLight, 0xDCE4E8}};
}

platform::Rgb FakeButtonHost::SystemColour(int index) const {
    auto it = systemColours.find(index);
    return it == systemColours.end() ? 0 : it->second;
}

bool FakeButtonHost::CaptureParentPixels(std::int32_t w, std::int32_t h, std::vector<std::uint8_t>& pixels) {
    const std::int32_t stride = platform::DibStride(w);
    pixels.assign(static_cast<std::size_t>(stride) * h, 0);
    for (std::int32_t row = 0; row < h; ++row)
        for (std::int32_t col = 0; col < w; ++col) PutDibPixel(pixels, stride, row, col, parentPixel);
    return true;
}

MemoryPicture::MemoryPicture(platform::PictureKind kind, std::int32_t w, std::int32_t h,
                             std::vector<platform::Rgb> pixels, std::vector<bool> transparent)
    : kind_(kind),
      w_(w),
      h_(h),
      himetricW_(w * 2540 / 96),
      himetricH_(h * 2540 / 96),
      pixels_(std::move(pixels)),
      transparent_(std::move(transparent)) {}

bool MemoryPicture::Render(std::int32_t w, std::int32_t h, platform::Rgb fill, std::vector<std::uint8_t>& out) const {
    const std::int32_t stride = platform::DibStride(w);
    out.assign(static_cast<std::size_t>(stride) * h, 0);
    for (std::int32_t y = 0; y < h; ++y)
        for (std::int32_t x = 0; x < w; ++x) {
            const std::size_t i = static_cast<std::size_t>(y) * w_ + x;
            const bool clear = x >= w_ || y >= h_ || (i < transparent_.size() && transparent_[i]);
            const platform::Rgb blank = kind_ == platform::PictureKind::kBitmap ? 0 : fill;
            PutDibPixel(out, stride, h - 1 - y, x, clear ? blank : pixels_[i]);
        }
    return true;
}

}  // namespace vantorel::testing
