// A picture box that paints into a grid of pixels, so painting code can be checked by what ends up
// on screen. Text is painted as a solid block the size the box measures for it (7 × 13 pixels per
// character); system colour references resolve through a small table.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <string>
#include <vector>

#include "platform/picture_box.h"

namespace vantorel::testing {

class FakePictureBox final : public platform::PictureBox {
public:
    static constexpr std::int32_t kTwips = 15;
    static constexpr int kCharWidth = 7, kCharHeight = 13;

    FakePictureBox(int width, int height) : width_(width), height_(height), pixels_(width * height, 0xFFFFFFu) {}

    bool autoRedraw = false;
    std::vector<std::string> printed;

    static std::uint32_t Resolve(std::uint32_t colour) {
        if ((colour & 0x80000000u) == 0) return colour & 0xFFFFFFu;
        switch (colour & 0xFF) {
            case 5: return 0xFFFFFFu;   // window background
            case 13: return 0x6A240Au;  // highlight
            default: return 0x808080u;
        }
    }
    std::uint32_t Pixel(int x, int y) const { return pixels_[y * width_ + x]; }
    int Width() const { return width_; }
    int Height() const { return height_; }

    void SetAutoRedraw(bool on) override { autoRedraw = on; }
    std::int32_t TwipsPerPixelX() override { return kTwips; }
    std::int32_t TwipsPerPixelY() override { return kTwips; }
    double ScaleWidth() override { return width_ * kTwips; }
    double ScaleHeight() override { return height_ * kTwips; }
    void SetBackColor(std::uint32_t colour) override { std::fill(pixels_.begin(), pixels_.end(), Resolve(colour)); }
    void SetForeColor(std::uint32_t colour) override { fore_ = Resolve(colour); }
    void SetDrawMode(platform::DrawMode mode) override { mode_ = mode; }
    double TextWidth(const std::string& text) override { return text.size() * kCharWidth * kTwips; }
    double TextHeight(const std::string&) override { return kCharHeight * kTwips; }
    void SetCurrentX(double x) override { x_ = x; }
    void SetCurrentY(double y) override { y_ = y; }
    void Print(const std::string& text) override {
        printed.push_back(text);
        Paint(x_, y_, x_ + TextWidth(text), y_ + TextHeight(text), fore_);
        x_ += TextWidth(text);
    }
    void FillBox(double x1, double y1, double x2, double y2, std::uint32_t colour) override {
        Paint(std::min(x1, x2), std::min(y1, y2), std::max(x1, x2), std::max(y1, y2), Resolve(colour));
    }

private:
    // Pixels whose left/top edge lies in [from, to) in twips.
    void Paint(double left, double top, double right, double bottom, std::uint32_t colour) {
        for (int y = 0; y < height_; ++y) {
            if (y * kTwips < top || y * kTwips >= bottom) continue;
            for (int x = 0; x < width_; ++x) {
                if (x * kTwips < left || x * kTwips >= right) continue;
                std::uint32_t& p = pixels_[y * width_ + x];
                p = mode_ == platform::DrawMode::XorPen ? (p ^ colour) : colour;
            }
        }
    }

    int width_, height_;
    std::vector<std::uint32_t> pixels_;
    std::uint32_t fore_ = 0;
    platform::DrawMode mode_ = platform::DrawMode::CopyPen;
    double x_ = 0, y_ = 0;
};

}  // namespace vantorel::testing
