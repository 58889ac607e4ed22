// The push button on real GDI and in a real window, under Wine on a private Xvfb.
// - The GDI canvas and the raster canvas draw the same pixels for every look's solid parts in
//   every state and two colour schemes (the captions are empty so no text is drawn; of the oval
//   look only the corners outside the ellipse, whose pixels are the platform's).
// - The window class turns real mouse and key messages into the control's events.
#include <windows.h>

#include <gtest/gtest.h>

#include <map>
#include <sstream>
#include <string>
#include <tuple>
#include <vector>

#include "controls/xpbutton/xpbutton_window_win32.h"
#include "fakes/fake_button_host.h"
#include "platform/win32/gdi_canvas.h"
#include "platform/win32/shell_win32.h"

namespace vantorel {
namespace {

using Log = std::vector<std::string>;

// The first pixels that differ when the raster canvas and GDI draw one look after the same steps.
std::string Compare(int type, int scheme, const std::string& steps) {
    testing::Look<testing::RasterCanvas> raster(type, 37, 23, scheme);
    testing::Look<win32::GdiCanvas> gdi(type, 37, 23, scheme);
    raster.Play("n" + steps);
    gdi.Play("n" + steps);
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
    for (int scheme : {2, 3})
        for (int type = 1; type <= 14; ++type)
            for (const char* steps : {"", "h", "p", "d", "D", "P1", "P1h", "P1p", "P1d", "P1D"})
                EXPECT_EQ(Compare(type, scheme, steps), "") << type << " " << scheme << " \"" << steps << "\"";
}

// A top-level window holding one button, on the private display.
struct Hosted {
    HWND parent = nullptr;
    win32::XPButtonWindow button;
    Log log;

    Hosted() {
        WNDCLASSA wc{};
        wc.lpfnWndProc = ::DefWindowProcA;
        wc.hInstance = ::GetModuleHandleA(nullptr);
        wc.lpszClassName = "XPButtonTestParent";
        wc.hbrBackground = reinterpret_cast<HBRUSH>(COLOR_BTNFACE + 1);
        ::RegisterClassA(&wc);
        parent = ::CreateWindowA(wc.lpszClassName, "XPButton test", WS_OVERLAPPEDWINDOW | WS_VISIBLE, 10, 10, 300, 200,
                                 nullptr, nullptr, wc.hInstance, nullptr);
        ::UpdateWindow(parent);
        if (!parent || !button.Create(parent, 1, 20, 20, 120, 40, "BtnOnOff")) return;
        auto& e = button.events();
        auto note = [this](const std::string& what, int a) { log.push_back(what + std::to_string(a)); };
        e.Click = [this] { log.push_back(button.button().Value() ? "Click on" : "Click"); };
        e.MouseDown = [note](std::int16_t& b, auto&...) { note("MouseDown ", b); };
        e.MouseUp = [note](std::int16_t& b, auto&...) { note("MouseUp ", b); };
        e.KeyDown = [note](std::int16_t& k, std::int16_t& shift) { note("KeyDown " + std::to_string(k) + " ", shift); };
        e.KeyUp = [note](std::int16_t& k, std::int16_t& shift) { note("KeyUp " + std::to_string(k) + " ", shift); };
        e.MouseOver = [this] { log.push_back("MouseOver"); };
        e.MOUSEOUT = [this] { log.push_back("MOUSEOUT"); };
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
    // Posts a message per letter, then handles them: L/l left press/release at (10, 10), o a left
    // release outside, 2 a left double click; M/m/N middle press/release/double click; S/s space
    // down/up, A the A key down, Q/q Alt+Q down/up; B the access key's BM_CLICK; C/D Alt+C/Alt+D
    // to the parent.
    void Post(const std::string& letters) {
        const LPARAM in = MAKELPARAM(10, 10), alt = 1 << 29;
        const std::map<char, std::tuple<UINT, WPARAM, LPARAM>> messages = {
            {'L', {WM_LBUTTONDOWN, MK_LBUTTON, in}},
            {'l', {WM_LBUTTONUP, 0, in}},
            {'o', {WM_LBUTTONUP, 0, MAKELPARAM(500, 10)}},
            {'2', {WM_LBUTTONDBLCLK, MK_LBUTTON, in}},
            {'M', {WM_MBUTTONDOWN, MK_MBUTTON, in}},
            {'m', {WM_MBUTTONUP, 0, in}},
            {'N', {WM_MBUTTONDBLCLK, MK_MBUTTON, in}},
            {'S', {WM_KEYDOWN, VK_SPACE, 0}},
            {'s', {WM_KEYUP, VK_SPACE, 0}},
            {'A', {WM_KEYDOWN, 'A', 0}},
            {'Q', {WM_SYSKEYDOWN, 'Q', alt}},
            {'q', {WM_SYSKEYUP, 'Q', alt}},
            {'B', {BM_CLICK, 0, 0}},
            {'C', {WM_SYSCHAR, 'c', alt}},
            {'D', {WM_SYSCHAR, 'd', alt}}};
        log.clear();
        for (char letter : letters) {
            const auto [message, wParam, lParam] = messages.at(letter);
            ::PostMessageA(message == WM_SYSCHAR ? parent : button.hwnd(), message, wParam, lParam);
        }
        Pump();
        ::ReleaseCapture();
    }
};

// Only a press and a release on the control click, a double click clicks once, a quick second
// middle press is a press, Alt reaches the key events, and the access key follows the control's
// rule (only the first "&&" is skipped).
TEST(XPButtonWindow, PostedInputClicksOnlyAsTheControlSays) {
    Hosted h;
    ASSERT_NE(h.button.hwnd(), nullptr) << "no display";
    const std::tuple<const char*, const char*, Log> cases[] = {
        {"OFF", "Lo", {"MouseDown 1", "MouseUp 1"}},
        {"OFF", "Ll2l", {"MouseDown 1", "MouseUp 1", "Click", "MouseDown 1", "MouseUp 1"}},
        {"OFF", "l", {"MouseUp 1"}},                                     // pressed on the form, released here
        {"OFF", "SAs", {"KeyDown 32 0", "KeyDown 65 0", "KeyUp 32 0"}},  // another key between: no click
        {"OFF", "Qq", {"KeyDown 81 4", "KeyUp 81 4"}},
        {"A&&B &C", "C", {"Click"}},
        {"A&&B &&C &D", "D", {}},
    };
    for (const auto& [caption, letters, log] : cases) {
        h.button.button().SetCaption(caption);
        h.Post(letters);
        EXPECT_EQ(h.log, log) << caption << " " << letters;
    }
    h.Post("MmN");  // the second middle press is a press, drawn pressed
    EXPECT_EQ(std::make_pair(h.log, h.button.button().lastState()),
              std::make_pair(Log{"MouseDown 4", "MouseUp 4", "MouseDown 4"}, 2));

    // The two-state switch: space toggles Value before Click; so does the access key's path.
    h.button.button().SetCheckBoxBehaviour(true);
    h.Post("SsB");
    EXPECT_EQ(h.log, (Log{"KeyDown 32 0", "KeyUp 32 0", "Click on", "Click"}));
    // Disabled: the window is disabled and a press and release or the access key click nothing.
    h.button.button().SetEnabled(false);
    EXPECT_FALSE(::IsWindowEnabled(h.button.hwnd()));
    h.Post("LlB");
    EXPECT_EQ(h.log, (Log{"MouseDown 1", "MouseUp 1"}));
}

TEST(XPButtonWindow, ShapeOfEveryLook) {
    Hosted h;
    ASSERT_NE(h.button.hwnd(), nullptr);
    // Per look: a pixel the window's region leaves out and one beside it that stays.
    const std::tuple<int, POINT, POINT> corners[] = {
        {1, {119, 39}, {118, 39}}, {14, {0, 39}, {1, 39}}, {3, {1, 0}, {2, 0}},  {4, {0, 38}, {0, 37}},
        {5, {119, 0}, {0, 0}},     {13, {0, 0}, {60, 20}}, {2, {120, 0}, {0, 0}}};
    for (const auto& [type, out, in] : corners) {
        h.button.button().SetButtonType(type);
        HRGN region = ::CreateRectRgn(0, 0, 0, 0);
        ASSERT_NE(::GetWindowRgn(h.button.hwnd(), region), ERROR);
        EXPECT_EQ(std::make_pair(::PtInRegion(region, out.x, out.y), ::PtInRegion(region, in.x, in.y)),
                  std::make_pair(FALSE, TRUE))
            << type;
        ::DeleteObject(region);
    }
}

TEST(XPButtonWindow, HoverFollowsTheRealPointer) {
    Hosted h;
    ASSERT_NE(h.button.hwnd(), nullptr);
    RECT r;
    ::GetWindowRect(h.button.hwnd(), &r);
    ::SetCursorPos(r.left + 30, r.top + 20);
    ::SendMessageA(h.button.hwnd(), WM_MOUSEMOVE, 0, MAKELPARAM(30, 20));
    ::SendMessageA(h.button.hwnd(), WM_MOUSEMOVE, 0, MAKELPARAM(31, 20));  // already hovering: nothing more
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
    // Right arrow: a Tab is queued and moves the focus to the next control.
    ::SendMessageA(h.button.hwnd(), WM_KEYDOWN, VK_RIGHT, 0);
    Hosted::Pump(50);
    EXPECT_EQ(::GetFocus(), second.hwnd());
}

}  // namespace
}  // namespace vantorel
