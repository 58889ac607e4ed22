// The GDI canvas: the push button's persistent back buffer (a 32-bit DIB section in a memory DC)
// with the drawing primitives it paints with. Every pen, brush and font is created for one call
// and released before it returns. The window shows the buffer on WM_PAINT through PaintTo.
#pragma once

#include <windows.h>

#include "platform/canvas.h"
#include "platform/win32/gdi_objects.h"

namespace vantorel::win32 {

class GdiCanvas final : public platform::Canvas {
public:
    // `window` (may be null) is invalidated by Clear so that it repaints.
    explicit GdiCanvas(HWND window = nullptr);
    ~GdiCanvas() override;

    void SetWindow(HWND window) { window_ = window; }
    // Text is drawn and measured at `dpi` (0: the screen's), the DPI of the monitor the window is on.
    void SetDpi(int dpi) { dpi_ = dpi; }

    void Resize(std::int32_t w, std::int32_t h) override;
    void Clear() override;
    void FillBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, platform::Rgb c) override;
    void FrameBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, platform::Rgb c) override;
    void DrawLine(std::int32_t x1, std::int32_t y1, std::int32_t x2, std::int32_t y2, platform::Rgb c) override;
    void PutPixel(std::int32_t x, std::int32_t y, platform::Rgb c) override;
    void DrawOval(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, platform::Rgb pen,
                  platform::Rgb brush) override;
    void DrawText(const std::string& text, const platform::Box& box, platform::Rgb colour,
                  const platform::FontDesc& font) override;
    platform::Box MeasureText(const std::string& text, const platform::Box& box,
                              const platform::FontDesc& font) override;
    void DrawFocusRect(const platform::Box& box, platform::Rgb textColour) override;
    void ReadPixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                    std::vector<std::uint8_t>& pixels) override;
    void WritePixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                     const std::vector<std::uint8_t>& pixels) override;

    // Copies the buffer to `dc` at (0, 0).
    void PaintTo(HDC dc) const;
    // The pixel at (x, y) as packed RGB (for tests and screenshots).
    platform::Rgb At(std::int32_t x, std::int32_t y) const;
    std::int32_t width() const { return w_; }
    std::int32_t height() const { return h_; }
    HDC dc() const { return dc_.get(); }

private:
    HWND window_;
    UniqueHdc dc_;
    UniqueHbitmap bitmap_;
    HGDIOBJ originalBitmap_ = nullptr;
    std::uint32_t* bits_ = nullptr;  // top-down rows of 0x00RRGGBB
    std::int32_t w_ = 0;
    std::int32_t h_ = 0;
    int dpi_ = 0;
};

// A GDI font for a FontDesc at `dpi` pixels per inch (0: the screen's).
UniqueHfont MakeFont(const platform::FontDesc& font, int dpi = 0);

}  // namespace vantorel::win32
