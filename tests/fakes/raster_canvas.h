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

class RasterCanvas final : public platform::Canvas {
public:
    struct TextCall {
        std::string text;
        platform::Box box;
        platform::Rgb colour;
        platform::FontDesc font;
    };
    struct OvalCall {
        std::int32_t x, y, w, h;
        platform::Rgb pen, brush;
    };

    // Width of one character and height of one line of the fake text metrics.
    static constexpr std::int32_t kCharWidth = 7;
    static constexpr std::int32_t kLineHeight = 13;

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

    std::int32_t width() const { return w_; }
    std::int32_t height() const { return h_; }
    platform::Rgb At(std::int32_t x, std::int32_t y) const { return pixels_[static_cast<std::size_t>(y) * w_ + x]; }
    const std::vector<platform::Rgb>& pixels() const { return pixels_; }

    // Every call that changes the surface counts; the records are emptied by Clear.
    std::int64_t drawCalls = 0;
    std::int64_t clears = 0;
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

// The visible characters of a caption: a single "&" is dropped, "&&" shows one "&".
std::string VisibleText(const std::string& caption);

}  // namespace vantorel::testing
