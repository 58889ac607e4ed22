// A picture box to paint into: the members the progress painter uses. Coordinates and sizes are
// in twips; colours are packed 0x00BBGGRR values or, with the high bit set, references to a system
// colour (its index in the low byte), which the box resolves when it paints.
#pragma once

#include <cstdint>
#include <string>

namespace vantorel::platform {

enum class DrawMode { CopyPen = 13, XorPen = 7 };

class PictureBox {
public:
    PictureBox() = default;
    PictureBox(const PictureBox&) = delete;
    PictureBox& operator=(const PictureBox&) = delete;
    virtual ~PictureBox() = default;

    // Keeps what is drawn when the box is repainted.
    virtual void SetAutoRedraw(bool on) = 0;
    // The screen's twips per pixel, horizontally and vertically.
    virtual std::int32_t TwipsPerPixelX() = 0;
    virtual std::int32_t TwipsPerPixelY() = 0;
    // The inner size of the box.
    virtual double ScaleWidth() = 0;
    virtual double ScaleHeight() = 0;
    // Sets the background colour and clears the box to it.
    virtual void SetBackColor(std::uint32_t colour) = 0;
    // The colour of text.
    virtual void SetForeColor(std::uint32_t colour) = 0;
    virtual void SetDrawMode(DrawMode mode) = 0;
    virtual double TextWidth(const std::string& text) = 0;
    virtual double TextHeight(const std::string& text) = 0;
    virtual void SetCurrentX(double x) = 0;
    virtual void SetCurrentY(double y) = 0;
    // Draws `text` at the current position in the fore colour, in the current drawing mode.
    virtual void Print(const std::string& text) = 0;
    // A filled box between the two corners (in either order) in `colour`, in the current drawing mode.
    virtual void FillBox(double x1, double y1, double x2, double y2, std::uint32_t colour) = 0;
};

}  // namespace vantorel::platform
