#include "fakes/raster_canvas.h"

#include <algorithm>
#include <cstdlib>

namespace vantorel::testing {

using platform::Rgb;

void RasterCanvas::Resize(std::int32_t w, std::int32_t h) {
    w_ = std::max(w, 0);
    h_ = std::max(h, 0);
    pixels_.assign(static_cast<std::size_t>(w_) * h_, 0);
}

void RasterCanvas::Clear() {
    std::fill(pixels_.begin(), pixels_.end(), 0);
    texts.clear();
    ovals.clear();
    focusRects.clear();
}

void RasterCanvas::FillBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb c) {
    for (std::int32_t j = std::max(y, 0); j < std::min(y + h, h_); ++j)
        for (std::int32_t i = std::max(x, 0); i < std::min(x + w, w_); ++i) Set(i, j, c);
}

void RasterCanvas::FrameBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb c) {
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
    // a runs along the major axis (y when steep), b along the minor one.
    const bool steep = std::abs(y2 - y1) > std::abs(x2 - x1);
    std::int32_t a = steep ? y1 : x1, b = steep ? x1 : y1;
    const std::int32_t da = std::abs(steep ? y2 - y1 : x2 - x1), db = std::abs(steep ? x2 - x1 : y2 - y1);
    const std::int32_t sa = (steep ? y2 >= y1 : x2 >= x1) ? 1 : -1, sb = (steep ? x2 >= x1 : y2 >= y1) ? 1 : -1;
    for (std::int32_t n = 0, err = 2 * db - da; n < da; ++n, a += sa) {
        Set(steep ? b : a, steep ? a : b, c);
        if (err > 0 || (err == 0 && sb < 0)) {
            b += sb;
            err -= 2 * da;
        }
        err += 2 * db;
    }
}

platform::Box RasterCanvas::MeasureText(const std::string& text, const platform::Box& box, const platform::FontDesc&) {
    std::int32_t n = 0;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] != '&') {
            ++n;
        } else if (i + 1 < text.size() && text[i + 1] == '&') {
            ++n;
            ++i;
        }
    }
    return {box.left, box.top, box.left + n * 7, box.top + (n > 0 ? 13 : 0)};
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
            PutDibPixel(pixels, stride, row, col, At(sx, sy));
        }
    }
}

void RasterCanvas::WritePixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                               const std::vector<std::uint8_t>& pixels) {
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
