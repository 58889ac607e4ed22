// A software raster canvas: the solid primitives (fill, frame, one-pixel lines with the end point
// left out, pixels, bulk pixel read and write) drawn exactly into a 32-bit pixel array; text,
// ovals and focus rectangles are recorded rather than rasterised. It lives with the fakes because
// only tests and the native benchmark draw on it: the product draws through GDI.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

#include "platform/canvas.h"

namespace vantorel::testing {

using platform::Box;
using platform::Rgb;

// Stores `c` at (col, row) of a bottom-up 24-bit DIB with the given stride.
inline void PutDibPixel(std::vector<std::uint8_t>& dib, int stride, int row, int col, Rgb c) {
    std::uint8_t* p = dib.data() + static_cast<std::size_t>(row) * stride + col * 3;
    p[0] = static_cast<std::uint8_t>(c >> 16);
    p[1] = static_cast<std::uint8_t>(c >> 8);
    p[2] = static_cast<std::uint8_t>(c);
}

class RasterCanvas final : public platform::Canvas {
public:
    void Resize(int w, int h) override {
        w_ = std::max(w, 0);
        h_ = std::max(h, 0);
        pixels_.assign(static_cast<std::size_t>(w_) * h_, 0);
    }
    // Empties the records (every paint fills the whole surface first).
    void Clear() override {
        texts.clear();
        ovals.clear();
        focusRects.clear();
    }
    void FillBox(int x, int y, int w, int h, Rgb c) override {
        for (int j = y; j < y + h; ++j)
            for (int i = x; i < x + w; ++i) Set(i, j, c);
    }
    void FrameBox(int x, int y, int w, int h, Rgb c) override {
        if (w <= 0 || h <= 0) return;
        FillBox(x, y, w, 1, c);
        FillBox(x, y + h - 1, w, 1, c);
        FillBox(x, y, 1, h, c);
        FillBox(x + w - 1, y, 1, h, c);
    }
    // Bresenham's line as GDI draws it with a one-pixel cosmetic pen: the major axis steps every
    // pixel, the minor axis steps when the error passes the half, and at exactly the half only when
    // the minor axis runs toward negative coordinates; the last point is left out.
    void DrawLine(int x1, int y1, int x2, int y2, Rgb c) override {
        // a runs along the major axis (y when steep), b along the minor one.
        const bool steep = std::abs(y2 - y1) > std::abs(x2 - x1);
        int a = steep ? y1 : x1, b = steep ? x1 : y1;
        const int da = std::abs(steep ? y2 - y1 : x2 - x1), db = std::abs(steep ? x2 - x1 : y2 - y1);
        const int sa = (steep ? y2 >= y1 : x2 >= x1) ? 1 : -1, sb = (steep ? x2 >= x1 : y2 >= y1) ? 1 : -1;
        for (int n = 0, err = 2 * db - da; n < da; ++n, a += sa) {
            Set(steep ? b : a, steep ? a : b, c);
            if (err > 0 || (err == 0 && sb < 0)) {
                b += sb;
                err -= 2 * da;
            }
            err += 2 * db;
        }
    }
    void PutPixel(int x, int y, Rgb c) override { Set(x, y, c); }
    void DrawOval(int, int, int, int, Rgb pen, Rgb brush) override { ovals.push_back({pen, brush}); }
    void DrawText(const std::string&, const Box&, Rgb colour, const platform::FontDesc&) override {
        texts.push_back(colour);
    }
    // One line of 7 × 13 pixels per character; "&" marks take no room.
    Box MeasureText(const std::string& text, const Box& box, const platform::FontDesc&) override {
        const int n = static_cast<int>(std::count_if(text.begin(), text.end(), [](char c) { return c != '&'; }));
        return {box.left, box.top, box.left + n * 7, box.top + (n > 0 ? 13 : 0)};
    }
    void DrawFocusRect(const Box& box, Rgb) override { focusRects.push_back(box); }
    void ReadPixels(int x, int y, int w, int h, std::vector<std::uint8_t>& pixels) override {
        pixels.assign(static_cast<std::size_t>(platform::DibStride(w)) * h, 0);
        for (int row = 0; row < h; ++row)
            for (int col = 0; col < w; ++col)
                PutDibPixel(pixels, platform::DibStride(w), row, col, At(x + col, y + h - 1 - row));
    }
    void WritePixels(int x, int y, int w, int h, const std::vector<std::uint8_t>& pixels) override {
        const std::size_t stride = platform::DibStride(w);
        if (pixels.size() < stride * h) return;
        for (int row = 0; row < h; ++row)
            for (int col = 0; col < w; ++col) {
                const std::uint8_t* p = &pixels[row * stride + col * 3];
                Set(x + col, y + h - 1 - row, p[2] | (p[1] << 8) | (p[0] << 16));
            }
    }

    // 0 outside the surface.
    Rgb At(int x, int y) const { return Inside(x, y) ? pixels_[static_cast<std::size_t>(y) * w_ + x] : 0; }

    std::vector<Rgb> texts;                  // the colour of each caption drawn
    std::vector<std::pair<Rgb, Rgb>> ovals;  // pen, brush
    std::vector<Box> focusRects;

private:
    bool Inside(int x, int y) const { return x >= 0 && y >= 0 && x < w_ && y < h_; }
    void Set(int x, int y, Rgb c) {
        if (Inside(x, y)) pixels_[static_cast<std::size_t>(y) * w_ + x] = c;
    }

    int w_ = 0;
    int h_ = 0;
    std::vector<Rgb> pixels_;
};

}  // namespace vantorel::testing
