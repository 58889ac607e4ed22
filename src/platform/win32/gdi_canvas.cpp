#include "platform/win32/gdi_canvas.h"

#include <algorithm>
#include <cmath>

namespace vantorel::win32 {

using platform::Rgb;

namespace {
// Packed 0x00BBGGRR is exactly a COLORREF.
COLORREF Colour(Rgb c) { return static_cast<COLORREF>(c & 0xFFFFFF); }

constexpr UINT kDrawFlags = DT_CENTER | DT_VCENTER | DT_WORDBREAK;  // 21
constexpr UINT kMeasureFlags = DT_CALCRECT | DT_WORDBREAK;          // 1040
}  // namespace

UniqueHfont MakeFont(const platform::FontDesc& font, int dpi) {
    if (dpi == 0) dpi = ScreenDpi();
    const LONG height = -static_cast<LONG>(std::lround(font.size * dpi / 72.0));
    return UniqueHfont(::CreateFontA(height, 0, 0, 0, font.bold ? FW_BOLD : FW_NORMAL, font.italic, font.underline,
                                     font.strikethrough, DEFAULT_CHARSET, OUT_DEFAULT_PRECIS, CLIP_DEFAULT_PRECIS,
                                     DEFAULT_QUALITY, DEFAULT_PITCH | FF_DONTCARE, font.name.c_str()));
}

GdiCanvas::GdiCanvas(HWND window) : window_(window), dc_(::CreateCompatibleDC(nullptr)) {}

GdiCanvas::~GdiCanvas() {
    if (dc_ && originalBitmap_) ::SelectObject(dc_.get(), originalBitmap_);
}

void GdiCanvas::Resize(std::int32_t w, std::int32_t h) {
    if (!dc_) return;
    if (originalBitmap_) {
        ::SelectObject(dc_.get(), originalBitmap_);
        originalBitmap_ = nullptr;
    }
    bitmap_.reset();
    bits_ = nullptr;
    w_ = std::max(w, 0);
    h_ = std::max(h, 0);
    void* bits = nullptr;
    bitmap_.reset(CreateDib(dc_.get(), std::max(w_, 1), -std::max(h_, 1), 32, &bits));
    if (!bitmap_) {
        w_ = h_ = 0;
        return;
    }
    bits_ = static_cast<std::uint32_t*>(bits);
    originalBitmap_ = ::SelectObject(dc_.get(), bitmap_.get());
}

void GdiCanvas::Clear() {
    if (bits_) {
        ::GdiFlush();
        std::fill(bits_, bits_ + static_cast<std::size_t>(w_) * h_, 0u);
    }
    if (window_) ::InvalidateRect(window_, nullptr, FALSE);
}

void GdiCanvas::FillBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb c) {
    UniqueHbrush brush(::CreateSolidBrush(Colour(c)));
    if (!brush || w <= 0 || h <= 0) return;
    RECT r{x, y, x + w, y + h};
    ::FillRect(dc_.get(), &r, brush.get());
}

void GdiCanvas::FrameBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb c) {
    UniqueHbrush brush(::CreateSolidBrush(Colour(c)));
    if (!brush || w <= 0 || h <= 0) return;
    RECT r{x, y, x + w, y + h};
    ::FrameRect(dc_.get(), &r, brush.get());
}

void GdiCanvas::DrawLine(std::int32_t x1, std::int32_t y1, std::int32_t x2, std::int32_t y2, Rgb c) {
    UniqueHpen pen(::CreatePen(PS_SOLID, 1, Colour(c)));
    if (!pen) return;
    SelectGuard select(dc_.get(), pen.get());
    ::MoveToEx(dc_.get(), x1, y1, nullptr);
    ::LineTo(dc_.get(), x2, y2);
}

void GdiCanvas::PutPixel(std::int32_t x, std::int32_t y, Rgb c) { ::SetPixelV(dc_.get(), x, y, Colour(c)); }

void GdiCanvas::DrawOval(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb penColour,
                         Rgb brushColour) {
    UniqueHpen pen(::CreatePen(PS_SOLID, 2, Colour(penColour)));
    UniqueHbrush brush(::CreateSolidBrush(Colour(brushColour)));
    if (!pen || !brush) return;
    SelectGuard selectPen(dc_.get(), pen.get());
    SelectGuard selectBrush(dc_.get(), brush.get());
    ::Ellipse(dc_.get(), x, y, x + w, y + h);
}

void GdiCanvas::DrawText(const std::string& text, const platform::Box& box, Rgb colour,
                         const platform::FontDesc& font) {
    UniqueHfont hfont = MakeFont(font, dpi_);
    SelectGuard select(dc_.get(), hfont.get());
    const int oldMode = ::SetBkMode(dc_.get(), TRANSPARENT);
    const COLORREF oldColour = ::SetTextColor(dc_.get(), Colour(colour));
    RECT r{box.left, box.top, box.right, box.bottom};
    ::DrawTextA(dc_.get(), text.c_str(), static_cast<int>(text.size()), &r, kDrawFlags);
    ::SetTextColor(dc_.get(), oldColour);
    ::SetBkMode(dc_.get(), oldMode);
}

platform::Box GdiCanvas::MeasureText(const std::string& text, const platform::Box& box,
                                     const platform::FontDesc& font) {
    UniqueHfont hfont = MakeFont(font, dpi_);
    SelectGuard select(dc_.get(), hfont.get());
    RECT r{box.left, box.top, box.right, box.bottom};
    ::DrawTextA(dc_.get(), text.c_str(), static_cast<int>(text.size()), &r, kMeasureFlags);
    return {r.left, r.top, r.right, r.bottom};
}

void GdiCanvas::DrawFocusRect(const platform::Box& box, Rgb textColour) {
    const COLORREF old = ::SetTextColor(dc_.get(), Colour(textColour));
    RECT r{box.left, box.top, box.right, box.bottom};
    ::DrawFocusRect(dc_.get(), &r);
    ::SetTextColor(dc_.get(), old);
}

void GdiCanvas::ReadPixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                           std::vector<std::uint8_t>& pixels) {
    const std::int32_t stride = platform::DibStride(w);
    pixels.assign(static_cast<std::size_t>(stride) * std::max(h, 0), 0);
    if (!bits_) return;
    ::GdiFlush();
    for (std::int32_t row = 0; row < h; ++row) {
        const std::int32_t sy = y + h - 1 - row;
        if (sy < 0 || sy >= h_) continue;
        for (std::int32_t col = 0; col < w; ++col) {
            const std::int32_t sx = x + col;
            if (sx < 0 || sx >= w_) continue;
            const std::uint32_t v = bits_[static_cast<std::size_t>(sy) * w_ + sx];
            std::uint8_t* p = pixels.data() + static_cast<std::size_t>(row) * stride + col * 3;
            p[0] = static_cast<std::uint8_t>(v);        // blue
            p[1] = static_cast<std::uint8_t>(v >> 8);   // green
            p[2] = static_cast<std::uint8_t>(v >> 16);  // red
        }
    }
}

void GdiCanvas::WritePixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                            const std::vector<std::uint8_t>& pixels) {
    const std::int32_t stride = platform::DibStride(w);
    if (!bits_ || h <= 0 || pixels.size() < static_cast<std::size_t>(stride) * h) return;
    ::GdiFlush();
    for (std::int32_t row = 0; row < h; ++row) {
        const std::int32_t sy = y + h - 1 - row;
        if (sy < 0 || sy >= h_) continue;
        for (std::int32_t col = 0; col < w; ++col) {
            const std::int32_t sx = x + col;
            if (sx < 0 || sx >= w_) continue;
            const std::uint8_t* p = pixels.data() + static_cast<std::size_t>(row) * stride + col * 3;
            bits_[static_cast<std::size_t>(sy) * w_ + sx] = p[0] | (p[1] << 8) | (p[2] << 16);
        }
    }
}

void GdiCanvas::PaintTo(HDC dc) const {
    if (dc_ && bits_) ::BitBlt(dc, 0, 0, w_, h_, dc_.get(), 0, 0, SRCCOPY);
}

Rgb GdiCanvas::At(std::int32_t x, std::int32_t y) const {
    if (!bits_ || x < 0 || y < 0 || x >= w_ || y >= h_) return 0;
    ::GdiFlush();
    const std::uint32_t v = bits_[static_cast<std::size_t>(y) * w_ + x];
    return ((v >> 16) & 0xFF) | (v & 0xFF00) | ((v & 0xFF) << 16);
}

}  // namespace vantorel::win32
