// A software raster canvas: the solid primitives (fill, frame, one-pixel lines with the end point
// left out, pixels, bulk pixel read and write) drawn exactly into a 32-bit pixel array; text,
// ovals and focus rectangles are recorded rather than rasterised. It lives with the fakes because
// only tests and the native benchmark draw on it: the product draws through GDI.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/canvas.h"

namespace vantorel::testing {

// Stores `c` at (col, row) of a bottom-up 24-bit DIB with the given stride.
inline void PutDibPixel(std::vector<std::uint8_t>& dib, std::int32_t stride, std::int32_t row, std::int32_t col,
                        platform::Rgb c) {
    std::uint8_t* p = dib.data() + static_cast<std::size_t>(row) * stride + col * 3;
    p[0] = static_cast<std::uint8_t>(c >> 16);
    p[1] = static_cast<std::uint8_t>(c >> 8);
    p[2] = static_cast<std::uint8_t>(c);
}

class RasterCanvas final : public platform::Canvas {
public:
    struct TextCall {
        platform::Box box;
        platform::Rgb colour;
        platform::FontDesc font;
    };
    struct OvalCall {
        platform::Rgb pen, brush;
    };

    void Resize(std::int32_t w, std::int32_t h) override;
    void Clear() override;
    void FillBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, platform::Rgb c) override;
    void FrameBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, platform::Rgb c) override;
    void DrawLine(std::int32_t x1, std::int32_t y1, std::int32_t x2, std::int32_t y2, platform::Rgb c) override;
    void PutPixel(std::int32_t x, std::int32_t y, platform::Rgb c) override { Set(x, y, c); }
    void DrawOval(std::int32_t, std::int32_t, std::int32_t, std::int32_t, platform::Rgb pen,
                  platform::Rgb brush) override {
        ovals.push_back({pen, brush});
    }
    void DrawText(const std::string&, const platform::Box& box, platform::Rgb colour,
                  const platform::FontDesc& font) override {
        texts.push_back({box, colour, font});
    }
    // One line of 7 × 13 pixels per visible character ("&" marks the access key, "&&" shows one).
    platform::Box MeasureText(const std::string& text, const platform::Box& box,
                              const platform::FontDesc& font) override;
    void DrawFocusRect(const platform::Box& box, platform::Rgb) override { focusRects.push_back(box); }
    void ReadPixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                    std::vector<std::uint8_t>& pixels) override;
    void WritePixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                     const std::vector<std::uint8_t>& pixels) override;

    platform::Rgb At(std::int32_t x, std::int32_t y) const { return pixels_[static_cast<std::size_t>(y) * w_ + x]; }

    // The records are emptied by Clear.
    std::vector<TextCall> texts;
    std::vector<OvalCall> ovals;
    std::vector<platform::Box> focusRects;

private:
    void Set(std::int32_t x, std::int32_t y, platform::Rgb c) {
        if (x >= 0 && y >= 0 && x < w_ && y < h_) pixels_[static_cast<std::size_t>(y) * w_ + x] = c;
    }

    std::int32_t w_ = 0;
    std::int32_t h_ = 0;
    std::vector<platform::Rgb> pixels_;
};

}  // namespace vantorel::testing
