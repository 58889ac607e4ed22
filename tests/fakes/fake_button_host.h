// A scripted window and container for the push button: it answers from settable fields and
// ignores what the control asks of the window; a picture held in memory; and a control on the
// fake host, played through states by letters.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "controls/xpbutton/kirel_xp_button.h"
#include "fakes/raster_canvas.h"
#include "platform/button_host.h"

namespace vantorel::testing {

class FakeButtonHost final : public platform::ButtonHost {
public:
    std::intptr_t Handle() const override { return 0x1234; }
    Box ClientRect() const override { return {0, 0, width, height}; }
    void SetEnabled(bool) override {}
    void SetFont(const platform::FontDesc&) override {}
    void SetMousePointer(int) override {}
    bool SetMouseIcon(const platform::PicturePtr&) override { return true; }
    void SetShape(const platform::WindowShape&) override {}
    void ReleaseShape() override {}
    bool PointerOverSelf() const override { return pointerOver; }
    void StartOverTimer(int) override {}
    void StopOverTimer() override {}
    void SendKeys(const std::string&) override {}
    void CaptureMouse() override {}
    void Present() override {}
    void SetAccessKey(char) override {}
    int ScreenDpi() const override { return dpi; }
    bool DesignMode() const override { return false; }
    bool IsDefault() const override { return isDefault; }
    std::string ContainerName() const override { return "KirelXPButton1"; }
    void PropertyChanged(const std::string&) override {}
    Rgb ParentBackColour() const override { return 0x00FFEEDD; }
    Rgb ParentTextColour() const override { return 0x00112233; }
    bool CaptureParentPixels(int w, int h, std::vector<std::uint8_t>& pixels) override {
        pixels.assign(static_cast<std::size_t>(platform::DibStride(w)) * h, 0x80);  // a mid-grey parent
        return true;
    }
    Rgb SystemColour(int index) const override {
        const auto it = systemColours.find(index);
        return it == systemColours.end() ? 0 : it->second;
    }

    int width = 75;
    int height = 23;
    bool pointerOver = false;
    int dpi = 96;
    bool isDefault = false;
    // The classic Windows scheme, but for a 3D light distinct from the face so that the looks tell them apart.
    std::map<int, Rgb> systemColours = {
        {platform::kColorHighlight, 0x6A240A},    {platform::kColorBtnFace, 0xC8D0D4},
        {platform::kColorBtnShadow, 0x808080},    {platform::kColorBtnText, 0x000000},
        {platform::kColorBtnHighlight, 0xFFFFFF}, {platform::kColor3dDkShadow, 0x404040},
        {platform::kColor3dLight, 0xDCE4E8}};
};

// A picture held in memory: a bitmap, or an icon whose transparent pixels take the fill colour.
struct MemoryPicture final : platform::Picture {
    // `pixels` row-major, top row first; `transparent` (icons) marks pixels left unpainted.
    MemoryPicture(platform::PictureKind kind, int w, int h, std::vector<Rgb> pixels, std::vector<bool> transparent = {})
        : kind(kind), w(w), h(h), pixels(std::move(pixels)), transparent(std::move(transparent)) {}
    platform::PictureKind Kind() const override { return kind; }
    int HimetricWidth() const override { return himetricW; }
    int HimetricHeight() const override { return himetricH; }
    bool Render(int outW, int outH, Rgb fill, std::vector<std::uint8_t>& out) const override {
        out.assign(static_cast<std::size_t>(platform::DibStride(outW)) * outH, 0);
        for (int y = 0; y < outH; ++y)
            for (int x = 0; x < outW; ++x) {
                const std::size_t i = static_cast<std::size_t>(y) * w + x;
                const bool clear = x >= w || y >= h || (i < transparent.size() && transparent[i]);
                const Rgb blank = kind == platform::PictureKind::kBitmap ? 0 : fill;
                PutDibPixel(out, platform::DibStride(outW), outH - 1 - y, x, clear ? blank : pixels[i]);
            }
        return true;
    }

    platform::PictureKind kind;
    int w, h;
    std::vector<Rgb> pixels;
    std::vector<bool> transparent;
    int himetricW = w * 2540 / 96;  // the pixel size at 96 dpi unless set
    int himetricH = h * 2540 / 96;
};

// The mask colour, and a row of four pixels: the mask colour, a mid-grey of sum 385, a grey of sum
// 384 and pure red.
constexpr Rgb kKey = 0xC0C0C0;
inline const std::vector<Rgb> kRow = {kKey, 0x808081, 0x808080, 0x0000FF};

// A new control of ButtonType `type` on a w × h fake host, captioned "Go", drawing on a `C`.
template <class C>
struct Look {
    FakeButtonHost host;
    C canvas;
    xpbutton::KirelXPButton button{host, canvas};

    explicit Look(int type, int w = 40, int h = 20, int scheme = 1) {
        host.width = w;
        host.height = h;
        host.pointerOver = true;  // for the moves that hover
        button.InitNewControl();
        button.OnResize();
        button.SetColorScheme(scheme);
        button.SetBackColor(0x3080C0);  // for the custom scheme
        button.SetBackOver(0x30C080);
        button.SetCaption("Go");
        button.OnShow();
        button.SetButtonType(type);
    }
    const xpbutton::Palette& p() const { return button.palette(); }
    Rgb At(int x, int y) const { return canvas.At(x, y); }
    // Plays the steps in order: f focus, h hover, p press, d disable, D paint as the default button,
    // c two states, v Value on, s SoftBevel, n no caption; P the row above as PictureNormal, I a 2 × 1
    // icon with its left pixel transparent instead, O a blue PictureOver, g greyscale, m no mask
    // colour, 1 to 3 that special effect, R/V/X the picture right of, below or behind the caption.
    void Play(const std::string& steps) {
        using platform::PictureKind;
        for (char step : steps) {
            if (step == 'f') button.OnGotFocus();
            if (step == 'h') button.OnMouseMove(0, 0, 1, 1);
            if (step == 'p') button.Paint(2, true);
            if (step == 'd') button.SetEnabled(false);
            if (step == 'D') {
                host.isDefault = true;
                button.Paint(0, true);
            }
            if (step == 'c') button.SetCheckBoxBehaviour(true);
            if (step == 'v') button.SetValue(true);
            if (step == 's') button.SetSoftBevel(true);
            if (step == 'n') button.SetCaption("");
            if (step == 'P') button.SetPictureNormal(std::make_shared<MemoryPicture>(PictureKind::kBitmap, 4, 1, kRow));
            if (step == 'I')
                button.SetPictureNormal(std::make_shared<MemoryPicture>(
                    PictureKind::kIcon, 2, 1, std::vector<Rgb>{0x0000FF, 0x00FF00}, std::vector<bool>{true, false}));
            if (step == 'O')
                button.SetPictureOver(
                    std::make_shared<MemoryPicture>(PictureKind::kBitmap, 4, 1, std::vector<Rgb>(4, 0xFF0000)));
            if (step == 'g') button.SetUseGreyscale(true);
            if (step == 'm') button.SetUseMaskColor(false);
            if (step >= '1' && step <= '3') button.SetSpecialEffect(step - '0');
            if (step == 'R') button.SetPicturePosition(1);
            if (step == 'V') button.SetPicturePosition(3);
            if (step == 'X') button.SetPicturePosition(4);
        }
    }
};

}  // namespace vantorel::testing
