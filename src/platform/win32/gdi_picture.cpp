#include "platform/win32/gdi_picture.h"

#include <cmath>

namespace vantorel::win32 {

namespace {
std::int32_t ToHimetric(std::int32_t pixels) {
    return static_cast<std::int32_t>(std::lround(pixels * 2540.0 / ScreenDpi(LOGPIXELSX)));
}
}  // namespace

GdiPicture::GdiPicture(platform::PictureKind kind, std::int32_t pixelW, std::int32_t pixelH)
    : kind_(kind), pixelW_(pixelW), pixelH_(pixelH), himetricW_(ToHimetric(pixelW)), himetricH_(ToHimetric(pixelH)) {}

std::shared_ptr<GdiPicture> GdiPicture::FromBitmap(HBITMAP bitmap) {
    if (!bitmap) return nullptr;
    BITMAP info{};
    if (!::GetObjectA(bitmap, sizeof info, &info)) {
        ::DeleteObject(bitmap);
        return nullptr;
    }
    auto picture = std::make_shared<GdiPicture>(platform::PictureKind::kBitmap, info.bmWidth, info.bmHeight);
    picture->bitmap_.reset(bitmap);
    return picture;
}

std::shared_ptr<GdiPicture> GdiPicture::FromIcon(HICON icon) {
    if (!icon) return nullptr;
    ICONINFO info{};
    std::int32_t w = ::GetSystemMetrics(SM_CXICON);
    std::int32_t h = ::GetSystemMetrics(SM_CYICON);
    if (::GetIconInfo(icon, &info)) {
        BITMAP mask{};
        if (::GetObjectA(info.hbmMask, sizeof mask, &mask)) {
            w = mask.bmWidth;
            h = info.hbmColor ? mask.bmHeight : mask.bmHeight / 2;
        }
        if (info.hbmMask) ::DeleteObject(info.hbmMask);
        if (info.hbmColor) ::DeleteObject(info.hbmColor);
    }
    auto picture = std::make_shared<GdiPicture>(platform::PictureKind::kIcon, w, h);
    picture->icon_.reset(icon);
    return picture;
}

std::shared_ptr<GdiPicture> GdiPicture::FromFile(const std::string& path) {
    const bool isIcon = path.size() > 4 && (path.compare(path.size() - 4, 4, ".ico") == 0);
    HANDLE handle = ::LoadImageA(nullptr, path.c_str(), isIcon ? IMAGE_ICON : IMAGE_BITMAP, 0, 0,
                                 LR_LOADFROMFILE | (isIcon ? LR_DEFAULTSIZE : LR_CREATEDIBSECTION));
    if (!handle) return nullptr;
    return isIcon ? FromIcon(static_cast<HICON>(handle)) : FromBitmap(static_cast<HBITMAP>(handle));
}

bool GdiPicture::Render(std::int32_t w, std::int32_t h, platform::Rgb fill, std::vector<std::uint8_t>& pixels) const {
    if (w <= 0 || h <= 0) return false;
    UniqueHdc dc(::CreateCompatibleDC(nullptr));
    if (!dc) return false;
    void* bits = nullptr;
    UniqueHbitmap surface(CreateDib(dc.get(), w, h, 24, &bits));
    if (!surface) return false;
    {
        SelectGuard select(dc.get(), surface.get());
        if (kind_ == platform::PictureKind::kBitmap && bitmap_) {
            UniqueHdc source(::CreateCompatibleDC(nullptr));
            if (!source) return false;
            SelectGuard selectSource(source.get(), bitmap_.get());
            ::BitBlt(dc.get(), 0, 0, w, h, source.get(), 0, 0, SRCCOPY);
        } else {
            // Icons (and anything else) go on a surface filled with the mask colour, so that their
            // transparent parts take the key colour.
            UniqueHbrush brush(::CreateSolidBrush(static_cast<COLORREF>(fill & 0xFFFFFF)));
            RECT r{0, 0, w, h};
            if (brush) ::FillRect(dc.get(), &r, brush.get());
            if (icon_) ::DrawIconEx(dc.get(), 0, 0, icon_.get(), pixelW_, pixelH_, 0, nullptr, DI_NORMAL);
        }
        ::GdiFlush();
    }
    const std::size_t size = static_cast<std::size_t>(platform::DibStride(w)) * h;
    const auto* begin = static_cast<const std::uint8_t*>(bits);
    pixels.assign(begin, begin + size);
    return true;
}

}  // namespace vantorel::win32
