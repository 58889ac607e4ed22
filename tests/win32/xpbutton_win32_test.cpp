// The push button on real GDI and in a real window, under Wine on a private Xvfb.
// - The GDI canvas and the raster canvas draw the same pixels for every look's solid parts in
//   every state and two colour schemes (the captions are empty so no text is drawn; of the oval
//   look only the corners outside the ellipse, whose pixels are the platform's).
// - The window class turns real mouse and key messages into the control's events.
#include <windows.h>

#include <gtest/gtest.h>

#include <memory>
#include <sstream>
#include <string>
#include <tuple>
#include <vector>

#include "controls/xpbutton/kirel_xp_button.h"
#include "fakes/fake_button_host.h"
#include "fakes/raster_canvas.h"
#include "platform/win32/gdi_canvas.h"
#include "platform/win32/gdi_picture.h"
#include "controls/xpbutton/xpbutton_window_win32.h"
#include "platform/win32/shell_win32.h"

namespace vantorel {
namespace {

using testing::FakeButtonHost;
using testing::MemoryPicture;
using testing::RasterCanvas;
using xpbutton::KirelXPButton;
using xpbutton::Rgb;
using Log = std::vector<std::string>;

// Draws the same button on the raster canvas and on GDI in one state (0 up, 1 hovered, 2 pressed,
// 3 disabled, 4 default) and describes the first differing pixels; for the oval look only the
// corners outside the ellipse (the ellipse's pixels are the platform's).
std::string Compare(int type, int scheme, int state, const platform::PicturePtr& picture) {
    FakeButtonHost hosts[2];
    RasterCanvas raster;
    win32::GdiCanvas gdi;
    KirelXPButton buttons[2] = {{hosts[0], raster}, {hosts[1], gdi}};
    for (int i = 0; i < 2; ++i) {
        FakeButtonHost& host = hosts[i];
        KirelXPButton& k = buttons[i];
        host.width = 37;
        host.height = 23;
        host.name = "";
        host.isDefault = state == 4;
        host.pointerOver = state == 1;
        k.InitNewControl();
        k.OnResize();
        k.SetColorScheme(scheme);
        k.SetBackColor(0x3080C0);
        k.SetBackOver(0x30C080);
        k.OnShow();
        k.SetButtonType(type);
        if (picture) k.SetPictureNormal(picture);
        if (picture) k.SetSpecialEffect(1);
        if (state == 1) k.OnMouseMove(0, 0, 1, 1);
        if (state == 2) k.OnMouseDown(1, 0, 1, 1);
        if (state == 3) k.SetEnabled(false);
        if (state == 0 || state == 4) k.Paint(0, true);
    }
    std::ostringstream out;
    for (int y = 0; y < 23; ++y)
        for (int x = 0; x < 37; ++x)
            if ((type != 13 || ((x == 0 || x == 36) && (y == 0 || y == 22))) && raster.At(x, y) != gdi.At(x, y) &&
                out.tellp() < 200)
                out << "(" << x << "," << y << ") raster " << std::hex << raster.At(x, y) << " gdi " << gdi.At(x, y)
                    << std::dec << "; ";
    return out.str();
}

TEST(XPButtonGdi, GdiAndRasterDrawTheSameSolidParts) {
    auto picture = std::make_shared<MemoryPicture>(
        platform::PictureKind::kBitmap, 3, 3,
        std::vector<Rgb>{0xC0C0C0, 0x000000, 0x0000FF, 0x404040, 0xFFFFFF, 0x00FF00, 0x808081, 0x123456, 0xC0C0C0});
    for (int scheme : {2, 3})
        for (int type = 1; type <= 14; ++type)
            for (int state = 0; state < 5; ++state)
                for (const platform::PicturePtr& p : {platform::PicturePtr(), platform::PicturePtr(picture)})
                    EXPECT_EQ(Compare(type, scheme, state, p), "")
                        << "type " << type << " scheme " << scheme << " state " << state << (p ? " with picture" : "");
}

// A parent that paints vertical stripes whose red channel is the column number, so copied pixels
// tell where they were copied from.
LRESULT CALLBACK StripesProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_ERASEBKGND) return 1;
    if (message != WM_PAINT) return ::DefWindowProcA(hwnd, message, wParam, lParam);
    PAINTSTRUCT ps;
    HDC dc = ::BeginPaint(hwnd, &ps);
    for (int x = 0; x < 256; ++x) {
        HBRUSH brush = ::CreateSolidBrush(RGB(x, 0x40, 0x80));
        RECT column{x, 0, x + 1, 200};
        ::FillRect(dc, &column, brush);
        ::DeleteObject(brush);
    }
    ::EndPaint(hwnd, &ps);
    return 0;
}

// A top-level window holding one button, on the private display; plain or painted by `proc`.
struct Hosted {
    HWND parent = nullptr;
    win32::XPButtonWindow button;
    Log log;

    explicit Hosted(WNDPROC proc = ::DefWindowProcA) {
        WNDCLASSA wc{};
        wc.lpfnWndProc = proc;
        wc.hInstance = ::GetModuleHandleA(nullptr);
        wc.lpszClassName = proc == ::DefWindowProcA ? "XPButtonTestParent" : "XPButtonStripes";
        wc.hbrBackground = reinterpret_cast<HBRUSH>(COLOR_BTNFACE + 1);
        ::RegisterClassA(&wc);
        parent = ::CreateWindowA(wc.lpszClassName, "XPButton test", WS_OVERLAPPEDWINDOW | WS_VISIBLE, 10, 10, 300, 200,
                                 nullptr, nullptr, wc.hInstance, nullptr);
        ::UpdateWindow(parent);
        if (!parent || !button.Create(parent, 1, 20, 20, 120, 40, "BtnOnOff")) return;
        button.events().Click = [this] { log.push_back(button.button().Value() ? "Click on" : "Click"); };
        auto mouse = [this](const char* name) {
            return [this, name](std::int16_t& b, std::int16_t&, float&, float&) {
                log.push_back(name + std::to_string(b));
            };
        };
        button.events().MouseDown = mouse("MouseDown ");
        button.events().MouseUp = mouse("MouseUp ");
        auto key = [this](const char* name) {
            return [this, name](std::int16_t& code, std::int16_t& shift) {
                log.push_back(name + std::to_string(code) + " " + std::to_string(shift));
            };
        };
        button.events().KeyDown = key("KeyDown ");
        button.events().KeyUp = key("KeyUp ");
        button.events().MouseOver = [this] { log.push_back("MouseOver"); };
        button.events().MOUSEOUT = [this] { log.push_back("MOUSEOUT"); };
        button.Show();
        Pump();
    }
    ~Hosted() {
        button.Destroy();
        if (parent) ::DestroyWindow(parent);
    }
    // Handles the queued messages as the program's loop does, `rounds` times 5 ms apart.
    static void Pump(int rounds = 1) {
        MSG msg;
        for (int i = 0; i < rounds; ++i) {
            if (i > 0) ::Sleep(5);
            while (::PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) win32::DispatchQueuedMessage(msg);
        }
    }
    void Send(UINT message, WPARAM wParam = 0, LPARAM lParam = MAKELPARAM(10, 10)) {
        ::SendMessageA(button.hwnd(), message, wParam, lParam);
    }
};

// Posted mouse and key messages through the program's own message handling: only a press and a
// release on the control click, a double click clicks once, a quick second right or middle press
// is a press, Alt reaches the key events, and the access key follows the control's rule (only the
// first "&&" is skipped).
TEST(XPButtonWindow, PostedInputClicksOnlyAsTheControlSays) {
    Hosted h;
    ASSERT_NE(h.button.hwnd(), nullptr) << "no display";
    HRGN region = ::CreateRectRgn(0, 0, 0, 0);  // the new control's rounded corners: (0, 0) out, (2, 0) in
    ASSERT_NE(::GetWindowRgn(h.button.hwnd(), region), ERROR);
    EXPECT_EQ(std::make_pair(::PtInRegion(region, 0, 0), ::PtInRegion(region, 2, 0)), std::make_pair(FALSE, TRUE));
    ::DeleteObject(region);
    using Posted = std::vector<std::tuple<UINT, WPARAM, LPARAM>>;
    const LPARAM in = MAKELPARAM(10, 10), out = MAKELPARAM(500, 10), alt = 1 << 29;
    struct Case {
        const char* caption;
        bool toParent;
        Posted posted;
        Log log;
    } cases[] = {
        {"OFF", false, {{WM_LBUTTONDOWN, MK_LBUTTON, in}, {WM_LBUTTONUP, 0, out}}, {"MouseDown 1", "MouseUp 1"}},
        {"OFF",
         false,
         {{WM_LBUTTONDOWN, MK_LBUTTON, in},
          {WM_LBUTTONUP, 0, in},
          {WM_LBUTTONDBLCLK, MK_LBUTTON, in},
          {WM_LBUTTONUP, 0, in}},
         {"MouseDown 1", "MouseUp 1", "Click", "MouseDown 1", "MouseUp 1"}},
        {"OFF", false, {{WM_LBUTTONUP, 0, in}}, {"MouseUp 1"}},  // pressed on the form, released here
        {"OFF",
         false,
         {{WM_RBUTTONDOWN, MK_RBUTTON, in},
          {WM_RBUTTONUP, 0, in},
          {WM_RBUTTONDBLCLK, MK_RBUTTON, in},
          {WM_RBUTTONUP, 0, in}},
         {"MouseDown 2", "MouseUp 2", "MouseDown 2", "MouseUp 2"}},
        {"OFF",
         false,
         {{WM_MBUTTONDOWN, MK_MBUTTON, in}, {WM_MBUTTONUP, 0, in}, {WM_MBUTTONDBLCLK, MK_MBUTTON, in}},
         {"MouseDown 4", "MouseUp 4", "MouseDown 4"}},
        {"OFF",
         false,
         {{WM_KEYDOWN, VK_SPACE, 0}, {WM_KEYDOWN, 'A', 0}, {WM_KEYUP, VK_SPACE, 0}},  // no click
         {"KeyDown 32 0", "KeyDown 65 0", "KeyUp 32 0"}},
        {"OFF", false, {{WM_SYSKEYDOWN, 'Q', alt}, {WM_SYSKEYUP, 'Q', alt}}, {"KeyDown 81 4", "KeyUp 81 4"}},
        {"A&&B &C", true, {{WM_SYSCHAR, 'c', alt}}, {"Click"}},
        {"A&&B &&C &D", true, {{WM_SYSCHAR, 'd', alt}}, {}},
    };
    for (const Case& c : cases) {
        h.button.button().SetCaption(c.caption);
        h.log.clear();
        for (const auto& [message, wParam, lParam] : c.posted)
            ::PostMessageA(c.toParent ? h.parent : h.button.hwnd(), message, wParam, lParam);
        Hosted::Pump();
        EXPECT_EQ(h.log, c.log) << c.caption << " " << std::get<0>(c.posted[0]);
        if (std::get<0>(c.posted.back()) == WM_MBUTTONDBLCLK) {
            EXPECT_EQ(h.button.button().lastState(), 2) << "the second middle press looks pressed";
        }
        ::ReleaseCapture();
    }

    // The two-state switch: space toggles Value before Click; BM_CLICK is the access key path.
    h.button.button().SetCheckBoxBehaviour(true);
    h.log.clear();
    h.Send(WM_KEYDOWN, VK_SPACE);
    h.Send(WM_KEYUP, VK_SPACE);
    h.Send(BM_CLICK);
    EXPECT_EQ(h.log, (Log{"KeyDown 32 0", "KeyUp 32 0", "Click on", "Click"}));
    h.button.button().SetCaption("&On");  // the caption becomes the window text (for IsDialogMessage)
    char text[32] = {};
    ::GetWindowTextA(h.button.hwnd(), text, sizeof text);
    EXPECT_STREQ(text, "&On");
    // Disabled: the window is disabled and a press and release or the access key click nothing.
    h.button.button().SetEnabled(false);
    EXPECT_FALSE(::IsWindowEnabled(h.button.hwnd()));
    h.log.clear();
    h.Send(WM_LBUTTONDOWN, MK_LBUTTON);
    h.Send(WM_LBUTTONUP);
    h.Send(BM_CLICK);
    EXPECT_EQ(h.log, (Log{"MouseDown 1", "MouseUp 1"}));
}

TEST(XPButtonWindow, HoverFollowsTheRealPointer) {
    Hosted h;
    ASSERT_NE(h.button.hwnd(), nullptr);
    RECT r;
    ::GetWindowRect(h.button.hwnd(), &r);
    ::SetCursorPos(r.left + 30, r.top + 20);
    h.Send(WM_MOUSEMOVE, 0, MAKELPARAM(30, 20));
    h.Send(WM_MOUSEMOVE, 0, MAKELPARAM(31, 20));  // already hovering: nothing more
    EXPECT_TRUE(h.button.button().hovering());
    // Pointer elsewhere: the hover timer (3 ms) notices without any message from the platform.
    ::SetCursorPos(r.right + 200, r.bottom + 100);
    for (int i = 0; i < 100 && h.button.button().hovering(); ++i) Hosted::Pump(2);
    EXPECT_FALSE(h.button.button().hovering());
    EXPECT_EQ(h.log, (Log{"MouseOver", "MOUSEOUT"}));
}

TEST(XPButtonWindow, ArrowKeysMoveTheFocusThroughInjectedTabs) {
    Hosted h;
    ASSERT_NE(h.button.hwnd(), nullptr);
    win32::XPButtonWindow second;
    ASSERT_TRUE(second.Create(h.parent, 2, 20, 80, 120, 40, "Second"));
    second.Show();
    ::SetForegroundWindow(h.parent);
    ::SetFocus(h.button.hwnd());
    ASSERT_EQ(::GetFocus(), h.button.hwnd());
    // Right arrow: KeyDown first, then Tab is queued and moves the focus to the next control.
    h.log.clear();
    h.Send(WM_KEYDOWN, VK_RIGHT);
    EXPECT_EQ(h.log, Log{"KeyDown 39 0"});
    EXPECT_EQ(::GetFocus(), h.button.hwnd());  // the injected keys wait in the queue
    Hosted::Pump(50);
    EXPECT_EQ(::GetFocus(), second.hwnd());
    EXPECT_FALSE(h.button.button().hasFocus());
    EXPECT_TRUE(second.button().hasFocus());
    ::SendMessageA(second.hwnd(), WM_KEYDOWN, VK_UP, 0);  // up arrow on the second: Shift+Tab back
    Hosted::Pump(50);
    EXPECT_EQ(::GetFocus(), h.button.hwnd());
    second.Destroy();
}

TEST(XPButtonWindow, TransparentLookCopiesTheParentAtTheControlsPixelPosition) {
    Hosted h(StripesProc);
    ASSERT_NE(h.button.hwnd(), nullptr);
    h.button.button().SetButtonType(11);
    Hosted::Pump();
    // The copy starts at the control's left edge in pixels, whatever the container's units, and
    // the control has its height back after the capture.
    EXPECT_EQ(h.button.canvas().At(0, 15), static_cast<Rgb>(RGB(20, 0x40, 0x80)));
    EXPECT_EQ(h.button.canvas().At(119, 15), static_cast<Rgb>(RGB(139, 0x40, 0x80)));
    EXPECT_EQ(h.button.button().height(), 40);
}

TEST(XPButtonGdiPicture, BitmapsAndIconsRenderOnTheMaskColour) {
    // A 2 × 1 bitmap: red, then green.
    HDC screen = ::GetDC(nullptr);
    HBITMAP bitmap = ::CreateCompatibleBitmap(screen, 2, 1);
    HDC dc = ::CreateCompatibleDC(screen);
    HGDIOBJ old = ::SelectObject(dc, bitmap);
    ::SetPixelV(dc, 0, 0, RGB(255, 0, 0));
    ::SetPixelV(dc, 1, 0, RGB(0, 255, 0));
    ::SelectObject(dc, old);
    ::DeleteDC(dc);
    ::ReleaseDC(nullptr, screen);
    auto picture = win32::GdiPicture::FromBitmap(bitmap);
    ASSERT_NE(picture, nullptr);
    EXPECT_EQ(picture->Kind(), platform::PictureKind::kBitmap);
    std::vector<std::uint8_t> px;
    ASSERT_TRUE(picture->Render(2, 1, 0xC0C0C0, px));
    EXPECT_EQ(px, (std::vector<std::uint8_t>{0, 0, 255, 0, 255, 0, 0, 0}));

    // A 32 × 32 icon whose mask leaves the left half transparent: those pixels take the fill.
    std::vector<std::uint8_t> andMask(32 * 4, 0), xorMask(32 * 4, 0);
    for (int row = 0; row < 32; ++row) andMask[row * 4] = andMask[row * 4 + 1] = 0xFF;
    HICON icon = ::CreateIcon(::GetModuleHandleA(nullptr), 32, 32, 1, 1, andMask.data(), xorMask.data());
    auto iconPicture = win32::GdiPicture::FromIcon(icon);
    ASSERT_NE(iconPicture, nullptr);
    EXPECT_EQ(iconPicture->Kind(), platform::PictureKind::kIcon);
    EXPECT_EQ(iconPicture->HimetricWidth(), 847);  // 32 pixels at 96 dpi
    ASSERT_TRUE(iconPicture->Render(32, 32, 0x00FF00FF, px));
    const std::size_t stride = platform::DibStride(32);
    EXPECT_EQ((std::vector<int>{px[0], px[1], px[2]}), (std::vector<int>{0xFF, 0x00, 0xFF}));  // transparent
    const std::uint8_t* right = px.data() + 5 * stride + 20 * 3;
    EXPECT_EQ((std::vector<int>{right[0], right[1], right[2]}), (std::vector<int>{0, 0, 0}));  // black
}

}  // namespace
}  // namespace vantorel
