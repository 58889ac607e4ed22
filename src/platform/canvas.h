// The drawing surface the push button paints on, and the picture objects it composites. The GDI
// canvas (a persistent back buffer, platform/win32/) is the product; a software raster canvas
// (tests/fakes/) lets the looks be checked pixel by pixel natively. Every call takes the colour it
// draws with; no pen, brush or text colour survives a call.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace vantorel::platform {

// A packed colour 0x00BBGGRR, red in the low byte.
using Rgb = std::uint32_t;

// Left, top, right, bottom; right and bottom exclusive.
struct Box {
    std::int32_t left = 0;
    std::int32_t top = 0;
    std::int32_t right = 0;
    std::int32_t bottom = 0;
    bool operator==(const Box&) const = default;
};

inline Box Offset(const Box& b, std::int32_t dx, std::int32_t dy) {
    return {b.left + dx, b.top + dy, b.right + dx, b.bottom + dy};
}

// A font as the control keeps it: face name, size in points and the style flags.
struct FontDesc {
    std::string name = "MS Sans Serif";
    double size = 8.25;
    bool bold = false;
    bool italic = false;
    bool underline = false;
    bool strikethrough = false;
    bool operator==(const FontDesc&) const = default;
};

// Bytes per row of a 24-bit device-independent bitmap of width `w` (rows padded to 4 bytes).
inline std::int32_t DibStride(std::int32_t w) { return (w * 3 + 3) & ~3; }

enum class PictureKind { kBitmap, kIcon, kOther };

// A picture object: a bitmap, an icon or another kind, with its size in HIMETRIC units (0.01 mm).
class Picture {
public:
    Picture() = default;
    Picture(const Picture&) = delete;
    Picture& operator=(const Picture&) = delete;
    virtual ~Picture() = default;

    virtual PictureKind Kind() const = 0;
    virtual std::int32_t HimetricWidth() const = 0;
    virtual std::int32_t HimetricHeight() const = 0;
    // Puts the picture on a w × h surface and returns its pixels as 24-bit bottom-up rows (blue,
    // green, red; DibStride(w) bytes per row). A bitmap is used directly (pixels beyond its size
    // are black); any other kind is drawn at (0, 0) in its own size onto a surface first filled
    // with `fill`, so its transparent parts take that colour. False when nothing could be made.
    virtual bool Render(std::int32_t w, std::int32_t h, Rgb fill, std::vector<std::uint8_t>& pixels) const = 0;
};

using PicturePtr = std::shared_ptr<const Picture>;

// The shape of a control window: the rectangle (0, 0, w, h) less single pixels, or the ellipse
// inscribed in it.
struct WindowShape {
    bool ellipse = false;
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::vector<std::pair<std::int32_t, std::int32_t>> removed;
    bool operator==(const WindowShape&) const = default;
};

class Canvas {
public:
    Canvas() = default;
    Canvas(const Canvas&) = delete;
    Canvas& operator=(const Canvas&) = delete;
    virtual ~Canvas() = default;

    // Makes the surface w × h pixels; its content is then undefined until painted.
    virtual void Resize(std::int32_t w, std::int32_t h) = 0;
    // The surface's own clear operation; also marks the window for repainting.
    virtual void Clear() = 0;
    // Fills [x, x + w) × [y, y + h).
    virtual void FillBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb c) = 0;
    // One-pixel border on the inside edge of [x, x + w) × [y, y + h).
    virtual void FrameBox(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb c) = 0;
    // One-pixel solid line from (x1, y1) toward (x2, y2); the end point is not drawn.
    virtual void DrawLine(std::int32_t x1, std::int32_t y1, std::int32_t x2, std::int32_t y2, Rgb c) = 0;
    virtual void PutPixel(std::int32_t x, std::int32_t y, Rgb c) = 0;
    // Ellipse inscribed in [x, x + w) × [y, y + h), filled with `brush`, outlined with a 2-pixel pen.
    virtual void DrawOval(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h, Rgb pen, Rgb brush) = 0;
    // Multi-line text centred horizontally and vertically in `box`, word-wrapped, transparent
    // background; a single "&" underlines the next character and "&&" shows one "&".
    virtual void DrawText(const std::string& text, const Box& box, Rgb colour, const FontDesc& font) = 0;
    // The bounding box of the text word-wrapped in `box`, at the box's top-left (nothing drawn).
    virtual Box MeasureText(const std::string& text, const Box& box, const FontDesc& font) = 0;
    // The platform's dotted XOR focus rectangle.
    virtual void DrawFocusRect(const Box& box, Rgb textColour) = 0;
    // Bulk pixel access as 24-bit bottom-up rows (DibStride(w) bytes per row). Pixels outside the
    // surface read as black and are not written.
    virtual void ReadPixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                            std::vector<std::uint8_t>& pixels) = 0;
    virtual void WritePixels(std::int32_t x, std::int32_t y, std::int32_t w, std::int32_t h,
                             const std::vector<std::uint8_t>& pixels) = 0;
};

}  // namespace vantorel::platform
