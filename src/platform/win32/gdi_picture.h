// Picture objects backed by GDI: an owned bitmap or icon with its size in HIMETRIC units.
#pragma once

#include <windows.h>

#include <memory>
#include <string>

#include "platform/canvas.h"
#include "platform/win32/gdi_objects.h"

namespace vantorel::win32 {

class GdiPicture final : public platform::Picture {
public:
    // Takes ownership of the bitmap or icon; null when the handle is null.
    static std::shared_ptr<GdiPicture> FromBitmap(HBITMAP bitmap);
    static std::shared_ptr<GdiPicture> FromIcon(HICON icon);
    // A .bmp or .ico file; null when it cannot be loaded.
    static std::shared_ptr<GdiPicture> FromFile(const std::string& path);

    platform::PictureKind Kind() const override { return kind_; }
    std::int32_t HimetricWidth() const override { return himetricW_; }
    std::int32_t HimetricHeight() const override { return himetricH_; }
    bool Render(std::int32_t w, std::int32_t h, platform::Rgb fill, std::vector<std::uint8_t>& pixels) const override;

    HBITMAP bitmap() const { return bitmap_.get(); }
    HICON icon() const { return icon_.get(); }

    GdiPicture(platform::PictureKind kind, std::int32_t pixelW, std::int32_t pixelH);

private:
    platform::PictureKind kind_;
    std::int32_t pixelW_ = 0;
    std::int32_t pixelH_ = 0;
    std::int32_t himetricW_ = 0;
    std::int32_t himetricH_ = 0;
    UniqueHbitmap bitmap_;
    UniqueHicon icon_;
};

}  // namespace vantorel::win32
