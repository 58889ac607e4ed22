// xpbutton-gallery.exe: the push button's visual test bench. The top row holds live controls
// (the ON/OFF switch as the main window uses it, and one button of several looks) to hover,
// press and tab through; below, every look (rows, with and without a picture and special effect)
// in every state (up, hover, pressed, disabled, focused) for the system colour scheme and a
// custom one, each drawn by a real control on its own GDI back buffer.
//
//   xpbutton-gallery.exe                 shows the gallery
//   xpbutton-gallery.exe --bench         prints GDI paint times of every look and exits
//   xpbutton-gallery.exe --save FILE [--hold MS]
//                                        also writes the gallery as a 24-bit .bmp, then stays up
//                                        MS milliseconds (for a screenshot) and exits
#include <windows.h>

#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

#include "controls/xpbutton/kirel_xp_button.h"
#include "platform/win32/gdi_canvas.h"
#include "platform/win32/gdi_picture.h"
#include "controls/xpbutton/xpbutton_window_win32.h"

namespace {

using vantorel::platform::Box;
using vantorel::platform::Rgb;
using vantorel::win32::GdiCanvas;
using vantorel::win32::GdiPicture;
using vantorel::win32::XPButtonWindow;
using vantorel::xpbutton::KirelXPButton;

constexpr int kCellW = 86;
constexpr int kCellH = 24;
constexpr int kColumnStep = 92;
constexpr int kRowStep = 28;
constexpr int kGridLeft = 56;
constexpr int kGridTop = 100;
constexpr int kStates = 5;
constexpr const char* kStateNames[kStates] = {"up", "hover", "pressed", "disabled", "focus"};
constexpr Rgb kOnColour = 0x00A000;   // green "ON"
constexpr Rgb kOffColour = 0x000080;  // dark red "OFF"

// A host that stands for a window with the pointer over it or not, for cells drawn off-screen.
class CellHost final : public vantorel::platform::ButtonHost {
public:
    std::intptr_t Handle() const override { return 0; }
    Box ClientRect() const override { return {0, 0, width, height}; }
    void SetEnabled(bool) override {}
    void SetFont(const vantorel::platform::FontDesc&) override {}
    void SetMousePointer(std::int32_t) override {}
    bool SetMouseIcon(const vantorel::platform::PicturePtr&) override { return true; }
    void SetShape(const vantorel::platform::WindowShape& s) override { shape = s; }
    void ReleaseShape() override {}
    bool PointerOverSelf() const override { return pointerOver; }
    void StartOverTimer(std::int32_t) override {}
    void StopOverTimer() override {}
    void SendKeys(const std::string&) override {}
    void CaptureMouse() override {}
    void Present() override {}
    void SetAccessKey(char) override {}
    std::int32_t ScreenDpi() const override { return 96; }
    bool DesignMode() const override { return false; }
    bool IsDefault() const override { return false; }
    std::string ContainerName() const override { return "Cell"; }
    void PropertyChanged(const std::string&) override {}
    Rgb ParentBackColour() const override { return ::GetSysColor(COLOR_BTNFACE); }
    Rgb ParentTextColour() const override { return ::GetSysColor(COLOR_BTNTEXT); }
    bool CaptureParentPixels(std::int32_t w, std::int32_t h, std::vector<std::uint8_t>& pixels) override {
        // The gallery's background under a cell: a checker, so the transparent look shows.
        const std::int32_t stride = vantorel::platform::DibStride(w);
        pixels.assign(static_cast<std::size_t>(stride) * h, 0);
        for (int row = 0; row < h; ++row)
            for (int col = 0; col < w; ++col) {
                const std::uint8_t v = ((row / 4 + col / 4) % 2) ? 0xE0 : 0xA0;
                std::uint8_t* p = pixels.data() + static_cast<std::size_t>(row) * stride + col * 3;
                p[0] = p[1] = p[2] = v;
            }
        return true;
    }
    Rgb SystemColour(int index) const override { return ::GetSysColor(index); }

    bool pointerOver = false;
    int width = kCellW;
    int height = kCellH;
    vantorel::platform::WindowShape shape;
};

// Times painting on the GDI back buffer: one full (forced) paint of a 160 × 270 button of each
// look, and an unforced repaint with nothing changed.
void RunPaintBenchmark() {
    LARGE_INTEGER frequency;
    ::QueryPerformanceFrequency(&frequency);
    auto now = [] {
        LARGE_INTEGER t;
        ::QueryPerformanceCounter(&t);
        return t.QuadPart;
    };
    for (int type = 1; type <= 15; ++type) {
        CellHost host;
        host.width = 160;
        host.height = 270;
        GdiCanvas canvas;
        KirelXPButton button(host, canvas);
        button.InitNewControl();
        button.OnResize();
        button.OnShow();
        button.SetButtonType(type == 15 ? 3 : type);
        const int rounds = type == 15 ? 1000000 : 200;
        const auto start = now();
        for (int i = 0; i < rounds; ++i) button.Paint(0, type != 15);
        const double us = static_cast<double>(now() - start) * 1e6 / static_cast<double>(frequency.QuadPart) / rounds;
        if (type == 15) {
            std::printf("unforced repaint, nothing changed: %.4f us\n", us);
        } else {
            std::printf("ButtonType %2d full paint 160 x 270: %8.1f us\n", type, us);
        }
    }
    std::fflush(stdout);
}

struct Cell {
    int x = 0;
    int y = 0;
    CellHost host;
    GdiCanvas canvas;
    std::unique_ptr<KirelXPButton> button;
};

// A 16 × 16 bitmap on the mask colour: a dark padlock-like shape with a coloured body.
std::shared_ptr<GdiPicture> MakePadlock() {
    HDC screen = ::GetDC(nullptr);
    HBITMAP bitmap = ::CreateCompatibleBitmap(screen, 16, 16);
    HDC dc = ::CreateCompatibleDC(screen);
    HGDIOBJ old = ::SelectObject(dc, bitmap);
    RECT all{0, 0, 16, 16};
    HBRUSH mask = ::CreateSolidBrush(0xC0C0C0);
    ::FillRect(dc, &all, mask);
    ::DeleteObject(mask);
    HBRUSH dark = ::CreateSolidBrush(0x202020);
    RECT shackle{4, 1, 12, 9};
    ::FrameRect(dc, &shackle, dark);
    RECT body{2, 7, 14, 15};
    ::FillRect(dc, &body, dark);
    ::DeleteObject(dark);
    HBRUSH gold = ::CreateSolidBrush(0x30B0E0);
    RECT face{3, 8, 13, 14};
    ::FillRect(dc, &face, gold);
    ::DeleteObject(gold);
    ::SetPixelV(dc, 7, 10, 0);
    ::SetPixelV(dc, 8, 10, 0);
    ::SetPixelV(dc, 7, 11, 0);
    ::SetPixelV(dc, 8, 11, 0);
    ::SelectObject(dc, old);
    ::DeleteDC(dc);
    ::ReleaseDC(nullptr, screen);
    return GdiPicture::FromBitmap(bitmap);
}

class Gallery {
public:
    bool Create(HINSTANCE instance) {
        WNDCLASSA wc{};
        wc.lpfnWndProc = WindowProc;
        wc.hInstance = instance;
        wc.hCursor = ::LoadCursorA(nullptr, IDC_ARROW);
        wc.hbrBackground = reinterpret_cast<HBRUSH>(COLOR_BTNFACE + 1);
        wc.lpszClassName = "XPButtonGallery";
        if (!::RegisterClassA(&wc)) return false;
        RECT r{0, 0, kGridLeft + 2 * kStates * kColumnStep + 8, kGridTop + 28 * kRowStep + 8};
        ::AdjustWindowRect(&r, WS_OVERLAPPEDWINDOW, FALSE);
        hwnd_ = ::CreateWindowA("XPButtonGallery", "KirelXPButton gallery", WS_OVERLAPPEDWINDOW | WS_CLIPCHILDREN, 0, 0,
                                r.right - r.left, r.bottom - r.top, nullptr, nullptr, instance, this);
        if (!hwnd_) return false;
        padlock_ = MakePadlock();
        MakeLiveControls();
        MakeCells();
        return true;
    }

    void Show() {
        ::ShowWindow(hwnd_, SW_SHOW);
        for (auto& live : live_) live->Show();
        ::UpdateWindow(hwnd_);
    }

    HWND hwnd() const { return hwnd_; }

    // Draws the whole gallery (background, labels, cells and the live controls' buffers) into dc.
    void PaintAll(HDC dc) const {
        RECT client;
        ::GetClientRect(hwnd_, &client);
        HBRUSH face = ::CreateSolidBrush(::GetSysColor(COLOR_BTNFACE));
        ::FillRect(dc, &client, face);
        ::DeleteObject(face);
        ::SetBkMode(dc, TRANSPARENT);
        ::SetTextColor(dc, ::GetSysColor(COLOR_BTNTEXT));
        for (int scheme = 0; scheme < 2; ++scheme) {
            const std::string group = scheme ? "ColorScheme 2 (custom, as the ON switch)" : "ColorScheme 1 (system)";
            ::TextOutA(dc, kGridLeft + scheme * kStates * kColumnStep, kGridTop - 36, group.c_str(),
                       static_cast<int>(group.size()));
            for (int s = 0; s < kStates; ++s) {
                const int x = kGridLeft + (scheme * kStates + s) * kColumnStep;
                ::TextOutA(dc, x, kGridTop - 18, kStateNames[s], static_cast<int>(std::string(kStateNames[s]).size()));
            }
        }
        for (int type = 1; type <= 14; ++type) {
            for (int pic = 0; pic < 2; ++pic) {
                const std::string label = std::to_string(type) + (pic ? " pic" : "");
                ::TextOutA(dc, 4, kGridTop + ((type - 1) * 2 + pic) * kRowStep + 4, label.c_str(),
                           static_cast<int>(label.size()));
            }
        }
        for (const auto& cell : cells_) {
            // Honour each cell's window shape, as the window region would.
            HRGN clip = MakeRegion(cell->host.shape, cell->x, cell->y);
            ::SelectClipRgn(dc, clip);
            ::BitBlt(dc, cell->x, cell->y, kCellW, kCellH, cell->canvas.dc(), 0, 0, SRCCOPY);
            ::SelectClipRgn(dc, nullptr);
            ::DeleteObject(clip);
        }
    }

    void PaintLiveInto(HDC dc) {
        for (auto& live : live_) {
            RECT r;
            ::GetWindowRect(live->hwnd(), &r);
            POINT at{r.left, r.top};
            ::ScreenToClient(hwnd_, &at);
            ::BitBlt(dc, at.x, at.y, r.right - r.left, r.bottom - r.top, live->canvas().dc(), 0, 0, SRCCOPY);
        }
    }

    bool Save(const std::string& path) {
        RECT client;
        ::GetClientRect(hwnd_, &client);
        const int w = client.right;
        const int h = client.bottom;
        HDC screen = ::GetDC(hwnd_);
        HDC dc = ::CreateCompatibleDC(screen);
        BITMAPINFO info{};
        info.bmiHeader.biSize = sizeof(BITMAPINFOHEADER);
        info.bmiHeader.biWidth = w;
        info.bmiHeader.biHeight = h;
        info.bmiHeader.biPlanes = 1;
        info.bmiHeader.biBitCount = 24;
        info.bmiHeader.biCompression = BI_RGB;
        void* bits = nullptr;
        HBITMAP bitmap = ::CreateDIBSection(dc, &info, DIB_RGB_COLORS, &bits, nullptr, 0);
        bool saved = false;
        if (bitmap) {
            HGDIOBJ old = ::SelectObject(dc, bitmap);
            PaintAll(dc);
            PaintLiveInto(dc);
            ::GdiFlush();
            const DWORD size = static_cast<DWORD>(vantorel::platform::DibStride(w)) * h;
            BITMAPFILEHEADER file{};
            file.bfType = 0x4D42;
            file.bfOffBits = sizeof(BITMAPFILEHEADER) + sizeof(BITMAPINFOHEADER);
            file.bfSize = file.bfOffBits + size;
            if (FILE* out = std::fopen(path.c_str(), "wb")) {
                saved = std::fwrite(&file, sizeof file, 1, out) == 1 &&
                        std::fwrite(&info.bmiHeader, sizeof info.bmiHeader, 1, out) == 1 &&
                        std::fwrite(bits, 1, size, out) == size;
                saved = (std::fclose(out) == 0) && saved;
            }
            ::SelectObject(dc, old);
            ::DeleteObject(bitmap);
        }
        ::DeleteDC(dc);
        ::ReleaseDC(hwnd_, screen);
        return saved;
    }

private:
    static HRGN MakeRegion(const vantorel::platform::WindowShape& shape, int x, int y) {
        HRGN region = shape.ellipse ? ::CreateEllipticRgn(x, y, x + shape.width + 1, y + shape.height + 1)
                                    : ::CreateRectRgn(x, y, x + shape.width, y + shape.height);
        for (const auto& [px, py] : shape.removed) {
            HRGN pixel = ::CreateRectRgn(x + px, y + py, x + px + 1, y + py + 1);
            ::CombineRgn(region, region, pixel, RGN_DIFF);
            ::DeleteObject(pixel);
        }
        return region;
    }

    void MakeLiveControls() {
        // The ON/OFF switch as the main window hosts it.
        auto onOff = std::make_unique<XPButtonWindow>();
        if (onOff->Create(hwnd_, 100, 8, 8, 160, 40, "BtnOnOff")) {
            KirelXPButton& b = onOff->button();
            b.DisableRefresh();
            b.SetColorScheme(2);
            b.SetCheckBoxBehaviour(true);
            b.SetValue(true);
            b.SetButtonType(3);
            b.SetFontBold(true);
            b.SetFontSize(12);
            b.SetBackColor(kOnColour);
            b.SetBackOver(0x00C000);
            b.SetForeColor(0xFFFFFF);
            b.SetForeOver(0xFFFFFF);
            b.SetCaption("ON");
            KirelXPButton* button = &b;
            onOff->events().Click = [button] {
                const bool on = button->Value();
                button->DisableRefresh();
                button->SetBackColor(on ? kOnColour : kOffColour);
                button->SetBackOver(on ? 0x00C000 : 0x0000B0);
                button->SetCaption(on ? "ON" : "OFF");
                button->Refresh();
            };
            b.Refresh();
            live_.push_back(std::move(onOff));
        }
        const int types[] = {1, 2, 5, 9, 12, 13, 14};
        int x = 180;
        for (int type : types) {
            auto live = std::make_unique<XPButtonWindow>();
            const std::string name = "&Look " + std::to_string(type);
            if (live->Create(hwnd_, 100 + type, x, 14, 100, 28, name)) {
                live->button().SetButtonType(type);
                live->button().SetCaption(name);
                live_.push_back(std::move(live));
            }
            x += 108;
        }
    }

    void MakeCells() {
        for (int type = 1; type <= 14; ++type) {
            for (int pic = 0; pic < 2; ++pic) {
                for (int scheme = 0; scheme < 2; ++scheme) {
                    for (int s = 0; s < kStates; ++s) {
                        auto cell = std::make_unique<Cell>();
                        cell->x = kGridLeft + (scheme * kStates + s) * kColumnStep;
                        cell->y = kGridTop + ((type - 1) * 2 + pic) * kRowStep;
                        cell->button = std::make_unique<KirelXPButton>(cell->host, cell->canvas);
                        KirelXPButton& b = *cell->button;
                        b.InitNewControl();
                        b.OnResize();
                        b.DisableRefresh();
                        if (scheme == 1) {
                            b.SetColorScheme(2);
                            b.SetBackColor(kOnColour);
                            b.SetBackOver(0x00C000);
                            b.SetForeColor(0xFFFFFF);
                            b.SetForeOver(0xE0FFE0);
                        }
                        b.SetCaption(pic ? "Pic" : "Look " + std::to_string(type));
                        if (pic) {
                            b.SetPictureNormal(padlock_);
                            b.SetSpecialEffect(1);
                        }
                        b.SetButtonType(type);
                        b.OnShow();
                        switch (s) {
                            case 1:
                                cell->host.pointerOver = true;
                                b.OnMouseMove(0, 0, 1, 1);
                                break;
                            case 2: b.OnMouseDown(1, 0, 1, 1); break;
                            case 3: b.SetEnabled(false); break;
                            case 4: b.OnGotFocus(); break;
                            default: break;
                        }
                        cells_.push_back(std::move(cell));
                    }
                }
            }
        }
    }

    static LRESULT CALLBACK WindowProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
        if (message == WM_NCCREATE) {
            auto* create = reinterpret_cast<CREATESTRUCTA*>(lParam);
            ::SetWindowLongPtrA(hwnd, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(create->lpCreateParams));
        }
        auto* self = reinterpret_cast<Gallery*>(::GetWindowLongPtrA(hwnd, GWLP_USERDATA));
        switch (message) {
            case WM_PAINT: {
                PAINTSTRUCT ps;
                HDC dc = ::BeginPaint(hwnd, &ps);
                if (self && dc) self->PaintAll(dc);
                ::EndPaint(hwnd, &ps);
                return 0;
            }
            case WM_ERASEBKGND: return 1;
            case WM_DESTROY: ::PostQuitMessage(0); return 0;
            default: break;
        }
        return ::DefWindowProcA(hwnd, message, wParam, lParam);
    }

    HWND hwnd_ = nullptr;
    std::shared_ptr<GdiPicture> padlock_;
    std::vector<std::unique_ptr<XPButtonWindow>> live_;
    std::vector<std::unique_ptr<Cell>> cells_;
};

}  // namespace

int main(int argc, char** argv) {
    for (int i = 1; i < argc; ++i) {
        if (std::string(argv[i]) == "--bench") {
            RunPaintBenchmark();
            return 0;
        }
    }
    std::string savePath;
    DWORD holdMs = 0;
    for (int i = 1; i + 1 < argc; ++i) {
        if (std::string(argv[i]) == "--save") savePath = argv[i + 1];
        if (std::string(argv[i]) == "--hold") holdMs = static_cast<DWORD>(std::strtoul(argv[i + 1], nullptr, 10));
    }
    Gallery gallery;
    if (!gallery.Create(::GetModuleHandleA(nullptr))) {
        std::fprintf(stderr, "xpbutton-gallery: CreateWindow failed (%lu)\n", ::GetLastError());
        return 1;
    }
    gallery.Show();
    MSG msg;
    if (!savePath.empty()) {
        while (::PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) {
            ::TranslateMessage(&msg);
            ::DispatchMessageA(&msg);
        }
        const bool saved = gallery.Save(savePath);
        std::printf("xpbutton-gallery: %s %s\n", saved ? "saved" : "could not save", savePath.c_str());
        std::fflush(stdout);
        const DWORD until = ::GetTickCount() + holdMs;
        while (saved && static_cast<LONG>(until - ::GetTickCount()) > 0) {
            ::MsgWaitForMultipleObjects(0, nullptr, FALSE, until - ::GetTickCount(), QS_ALLINPUT);
            while (::PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) {
                ::TranslateMessage(&msg);
                ::DispatchMessageA(&msg);
            }
        }
        ::DestroyWindow(gallery.hwnd());
        return saved ? 0 : 1;
    }
    while (::GetMessageA(&msg, nullptr, 0, 0) > 0) {
        if (!::IsDialogMessageA(gallery.hwnd(), &msg)) {
            ::TranslateMessage(&msg);
            ::DispatchMessageA(&msg);
        }
    }
    return 0;
}
