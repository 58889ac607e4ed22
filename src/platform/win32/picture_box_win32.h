// A picture box's persistent image (what the box shows with AutoRedraw on): a device-independent
// bitmap in a memory device context, painted with GDI. The window that shows the box copies it to
// the screen when painting (`Show`); drawing marks that window for repainting.
#pragma once

#include <windows.h>

#include <cstdint>
#include <string>

#include "platform/picture_box.h"
#include "platform/win32/unique_handle.h"

namespace vantorel::win32 {

class GdiPictureBox final : public platform::PictureBox {
public:
    // `width` × `height` pixels inside the border; `window` (optional) is repainted after drawing.
    GdiPictureBox(int width, int height, HWND window = nullptr);
    ~GdiPictureBox() override;

    void SetAutoRedraw(bool on) override { autoRedraw_ = on; }
    std::int32_t TwipsPerPixelX() override { return twipsX_; }
    std::int32_t TwipsPerPixelY() override { return twipsY_; }
    double ScaleWidth() override { return static_cast<double>(width_) * twipsX_; }
    double ScaleHeight() override { return static_cast<double>(height_) * twipsY_; }
    void SetBackColor(std::uint32_t colour) override;
    void SetForeColor(std::uint32_t colour) override { fore_ = Resolve(colour); }
    void SetDrawMode(platform::DrawMode mode) override { mode_ = mode; }
    double TextWidth(const std::string& text) override;
    double TextHeight(const std::string& text) override;
    void SetCurrentX(double x) override { x_ = x; }
    void SetCurrentY(double y) override { y_ = y; }
    void Print(const std::string& text) override;
    void FillBox(double x1, double y1, double x2, double y2, std::uint32_t colour) override;

    // Copies the image to `target` at (x, y).
    void Show(HDC target, int x, int y) const;
    COLORREF Pixel(int x, int y) const { return ::GetPixel(dc_, x, y); }

    // A packed colour, or the system colour a reference (high bit set) names.
    static COLORREF Resolve(std::uint32_t colour);

private:
    SIZE Measure(const std::string& text) const;
    void Changed() const;

    int width_, height_;
    HWND window_;
    std::int32_t twipsX_ = 15, twipsY_ = 15;
    HDC dc_ = nullptr;
    HBITMAP bitmap_ = nullptr;
    HGDIOBJ oldBitmap_ = nullptr, oldFont_ = nullptr;
    bool autoRedraw_ = false;
    COLORREF fore_ = 0;
    platform::DrawMode mode_ = platform::DrawMode::CopyPen;
    double x_ = 0, y_ = 0;
};

}  // namespace vantorel::win32
