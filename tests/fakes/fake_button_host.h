// A scripted window and container for the push button: it records what the control asks of it
// (notifications, shapes, timers, keys, presents) and answers from settable fields.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "platform/button_host.h"

namespace vantorel::testing {

class FakeButtonHost final : public platform::ButtonHost {
public:
    FakeButtonHost();

    std::intptr_t Handle() const override { return 0x1234; }
    platform::Box ClientRect() const override { return {0, 0, width, height}; }
    void SetEnabled(bool value) override { windowEnabled = value; }
    void SetFont(const platform::FontDesc& font) override { windowFont = font; }
    void SetMousePointer(std::int32_t shape) override { pointer = shape; }
    bool SetMouseIcon(const platform::PicturePtr& picture) override {
        if (refuseMouseIcon) return false;
        mouseIcon = picture;
        return true;
    }
    void SetShape(const platform::WindowShape& value) override {
        shape = value;
        shapeHeld = true;
    }
    void ReleaseShape() override { shapeHeld = false; }
    bool PointerOverSelf() const override { return pointerOver; }
    void StartOverTimer(std::int32_t) override { timerRunning = true; }
    void StopOverTimer() override { timerRunning = false; }
    void SendKeys(const std::string& keys) override { sentKeys.push_back(keys); }
    void CaptureMouse() override {}
    void Present() override {}
    void SetAccessKey(char) override {}
    std::int32_t ScreenDpi() const override { return dpi; }
    bool DesignMode() const override { return designMode; }
    bool IsDefault() const override { return isDefault; }
    std::string ContainerName() const override { return name; }
    void PropertyChanged(const std::string& key) override { notified.push_back(key); }
    platform::Rgb ParentBackColour() const override { return parentBack; }
    platform::Rgb ParentTextColour() const override { return parentText; }
    bool CaptureParentPixels(std::int32_t w, std::int32_t h, std::vector<std::uint8_t>& pixels) override;
    platform::Rgb SystemColour(int index) const override;

    std::int32_t width = 75;
    std::int32_t height = 23;
    bool windowEnabled = true;
    platform::FontDesc windowFont;
    std::int32_t pointer = 0;
    bool refuseMouseIcon = false;
    platform::PicturePtr mouseIcon;
    platform::WindowShape shape;
    bool shapeHeld = false;
    bool pointerOver = false;
    bool timerRunning = false;
    std::vector<std::string> sentKeys;
    std::int32_t dpi = 96;
    bool designMode = false;
    bool isDefault = false;
    std::string name = "KirelXPButton1";
    std::vector<std::string> notified;
    platform::Rgb parentBack = 0x00FFEEDD;
    platform::Rgb parentText = 0x00112233;
    platform::Rgb parentPixel = 0x00336699;
    std::map<int, platform::Rgb> systemColours;
};

// A picture held in memory: a bitmap, or an icon whose transparent pixels take the fill colour.
class MemoryPicture final : public platform::Picture {
public:
    // `pixels` row-major, top row first; `transparent` (icons) marks pixels left unpainted.
    MemoryPicture(platform::PictureKind kind, std::int32_t w, std::int32_t h, std::vector<platform::Rgb> pixels,
                  std::vector<bool> transparent = {});
    platform::PictureKind Kind() const override { return kind_; }
    std::int32_t HimetricWidth() const override { return himetricW_; }
    std::int32_t HimetricHeight() const override { return himetricH_; }
    bool Render(std::int32_t w, std::int32_t h, platform::Rgb fill, std::vector<std::uint8_t>& pixels) const override;
    void SetHimetric(std::int32_t w, std::int32_t h) {
        himetricW_ = w;
        himetricH_ = h;
    }

private:
    platform::PictureKind kind_;
    std::int32_t w_, h_, himetricW_, himetricH_;
    std::vector<platform::Rgb> pixels_;
    std::vector<bool> transparent_;
};

}  // namespace vantorel::testing
