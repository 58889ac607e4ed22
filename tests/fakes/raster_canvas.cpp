#include "fakes/raster_canvas.h"

#include <algorithm>
#include <cstdlib>

namespace vantorel::testing {

using platform::Rgb;

std::string VisibleText(const std::string& caption) {
    std::string out;
    for (std::size_t i = 0; i < caption.size(); ++i) {
        if (caption[i] == '&') {
            if (i + 1 < caption.size() && caption[i + 1] == '&') {
                out += '&';
                ++i;
            }
            continue;
        }
        out += caption[i];
    }
    return out;
}

void RasterCanvas::Resize(std::int32_t w, std::int32_t h) {
    w_ = std::max(w, 0);
    h_ = std::max(h, 0);
    pixels_.assign(static_cast<std::size_t>(w_) * h_, 0);
}

void RasterCanvas::Clear() {
    ++clears;
    ++drawCalls;
    std::fill(pixels_.begin(), pixels_.end(), 0);
    texts.clear();
    ovals.clear();
    focusRects.clear();
}

void RasterCanvas::FillBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb c) {
    ++drawCalls;
    for (std::int32_t j = std::max(y, 0); j < std::min(y + h, h_); ++j)
        for (std::int32_t i = std::max(x, 0); i < std::min(x + w, w_); ++i) Set(i, j, c);
}

void RasterCanvas::FrameBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb c) {
    ++drawCalls;
    if (w <= 0 || h <= 0) return;
    for (std::int32_t i = x; i < x + w; ++i) {
        Set(i, y, c);
        Set(i, y + h - 1, c);
    }
    for (std::int32_t j = y; j < y + h; ++j) {
        Set(x, j, c);
        Set(x + w - 1, j, c);
    }
}

// Bresenham's line as GDI draws it with a one-pixel cosmetic pen: the major axis steps every
// pixel, the minor axis steps when the error passes the half, and at exactly the half only when
// the minor axis runs toward negative coordinates; the last point is left out.
void RasterCanvas::DrawLine(std::int32_t x1, std::int32_t y1, std::int32_t x2, std::int32_t y2, Rgb c) {
    ++drawCalls;
    const std::int32_t dx = std::abs(x2 - x1);
    const std::int32_t dy = std::abs(y2 - y1);
    const std::int32_t sx = x2 >= x1 ? 1 : -1;
    const std::int32_t sy = y2 >= y1 ? 1 : -1;
    if (dx >= dy) {
        std::int32_t err = 2 * dy - dx;
        std::int32_t y = y1;
        for (std::int32_t x = x1, n = 0; n < dx; ++n, x += sx) {
            Set(x, y, c);
            if (err > 0 || (err == 0 && sy < 0)) {
                y += sy;
                err -= 2 * dx;
            }
            err += 2 * dy;
        }
    } else {
        std::int32_t err = 2 * dx - dy;
        std::int32_t x = x1;
        for (std::int32_t y = y1, n = 0; n < dy; ++n, y += sy) {
            Set(x, y, c);
            if (err > 0 || (err == 0 && sx < 0)) {
                x += sx;
                err -= 2 * dy;
            }
            err += 2 * dx;
        }
    }
}

void RasterCanvas::PutPixel(std::int32_t x, std::int32_t y, Rgb c) {
    ++drawCalls;
    Set(x, y, c);
}

void RasterCanvas::DrawOval(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb pen, Rgb brush) {
    ++drawCalls;
    ovals.push_back({x, y, w, h, pen, brush});
}

void RasterCanvas::DrawText(const std::string& text, const platform::Box& box, Rgb colour,
                            const platform::FontDesc& font) {
    ++drawCalls;
    texts.push_back({text, box, colour, font});
}

platform::Box RasterCanvas::MeasureText(const std::string& text, const platform::Box& box,
                                        const platform::FontDesc&) {
    // Greedy word wrap of the visible characters at kCharWidth per character.
    const std::string visible = VisibleText(text);
    const std::int32_t available = std::max(box.right - box.left, kCharWidth);
    std::int32_t lines = 0;
    std::int32_t widest = 0;
    std::int32_t line = 0;
    std::size_t pos = 0;
    while (pos <= visible.size() && !visible.empty()) {
        std::size_t end = visible.find(' ', pos);
        if (end == std::string::npos) end = visible.size();
        const std::int32_t word = static_cast<std::int32_t>(end - pos) * kCharWidth;
        const std::int32_t withWord = line == 0 ? word : line + kCharWidth + word;
        if (line != 0 && withWord > available) {
            widest = std::max(widest, line);
            ++lines;
            line = word;
        } else {
            line = withWord;
        }
        pos = end + 1;
    }
    if (!visible.empty()) {
        widest = std::max(widest, line);
        ++lines;
    }
    return {box.left, box.top, box.left + widest, box.top + lines * kLineHeight};
}

void RasterCanvas::DrawFocusRect(const platform::Box& box, Rgb) {
    ++drawCalls;
    focusRects.push_back(box);
}

void RasterCanvas::ReadPixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                              std::vector<std::uint8_t>& pixels) {
    const std::int32_t stride = platform::DibStride(w);
    pixels.assign(static_cast<std::size_t>(stride) * h, 0);
    for (std::int32_t row = 0; row < h; ++row) {
        const std::int32_t sy = y + h - 1 - row;
        for (std::int32_t col = 0; col < w; ++col) {
            const std::int32_t sx = x + col;
            if (sx < 0 || sy < 0 || sx >= w_ || sy >= h_) continue;
            const Rgb c = At(sx, sy);
            std::uint8_t* p = pixels.data() + static_cast<std::size_t>(row) * stride + col * 3;
            p[0] = static_cast<std::uint8_t>(c >> 16);
            p[1] = static_cast<std::uint8_t>(c >> 8);
            p[2] = static_cast<std::uint8_t>(c);
        }
    }
}

void RasterCanvas::WritePixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                               const std::vector<std::uint8_t>& pixels) {
    ++drawCalls;
    const std::int32_t stride = platform::DibStride(w);
    if (pixels.size() < static_cast<std::size_t>(stride) * h) return;
    for (std::int32_t row = 0; row < h; ++row) {
        for (std::int32_t col = 0; col < w; ++col) {
            const std::uint8_t* p = pixels.data() + static_cast<std::size_t>(row) * stride + col * 3;
            Set(x + col, y + h - 1 - row, p[2] | (p[1] << 8) | (p[0] << 16));
        }
    }
}

}  // namespace vantorel::testing
