// The Win32 buttons, labels, frames and check boxes under Wine, in a real (hidden) window on the
// virtual display: clicks reach the callbacks, disabled buttons stay silent, a check box changes
// before its click, a frame shows and hides what is placed on it.
#include <windows.h>

#include <gtest/gtest.h>

#include "platform/win32/controls_win32.h"

namespace vantorel::win32 {
namespace {

LRESULT CALLBACK HostProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_COMMAND && RouteCommand(wParam, lParam)) return 0;
    return ::DefWindowProcA(hwnd, message, wParam, lParam);
}

class ControlsTest : public ::testing::Test {
protected:
    void SetUp() override {
        WNDCLASSA wc{};
        wc.lpfnWndProc = HostProc;
        wc.hInstance = ::GetModuleHandleA(nullptr);
        wc.lpszClassName = "VantorelControlsTestHost";
        ::RegisterClassA(&wc);
        host_ = ::CreateWindowExA(0, wc.lpszClassName, "host", WS_OVERLAPPEDWINDOW, 0, 0, 640, 400, nullptr, nullptr,
                                  wc.hInstance, nullptr);
        ASSERT_NE(host_, nullptr) << "no display? GetLastError " << ::GetLastError();
    }
    void TearDown() override { ::DestroyWindow(host_); }

    HWND host_ = nullptr;
};

TEST_F(ControlsTest, ButtonsClickOnlyWhileEnabled) {
    Win32Button button(host_, "&Tray", TwipsRect{2640, 3720, 2055, 495}, 96, nullptr);
    ASSERT_NE(button.hwnd(), nullptr);
    EXPECT_EQ(button.Caption(), "&Tray");
    RECT r;
    ::GetWindowRect(button.hwnd(), &r);
    EXPECT_EQ(r.right - r.left, 137) << "2055 twips at 96 DPI";
    EXPECT_EQ(r.bottom - r.top, 33);

    int clicks = 0;
    button.Click = [&] { ++clicks; };
    ::SendMessageA(button.hwnd(), BM_CLICK, 0, 0);
    EXPECT_EQ(clicks, 1);
    button.SetEnabled(false);
    EXPECT_FALSE(button.Enabled());
    ::SendMessageA(button.hwnd(), BM_CLICK, 0, 0);
    EXPECT_EQ(clicks, 1) << "a disabled button raises no click";
    button.SetEnabled(true);
    button.SetCaption("&Exit");
    EXPECT_EQ(button.Caption(), "&Exit");
    ::SendMessageA(button.hwnd(), BM_CLICK, 0, 0);
    EXPECT_EQ(clicks, 2);
}

TEST_F(ControlsTest, CheckBoxChangesBeforeItsClickAndCodeRaisesNone) {
    Win32CheckBox box(host_, "Boot when Windows boots", TwipsRect{240, 360, 4000, 255}, 96, nullptr);
    bool seenInClick = false;
    int clicks = 0;
    box.Click = [&] {
        ++clicks;
        seenInClick = box.Value();
    };
    box.SetValue(true);
    EXPECT_TRUE(box.Value());
    EXPECT_EQ(clicks, 0) << "setting the state from code raises no click";
    ::SendMessageA(box.hwnd(), BM_CLICK, 0, 0);
    EXPECT_EQ(clicks, 1);
    EXPECT_FALSE(seenInClick) << "the click sees the new state";
    EXPECT_FALSE(box.Value());
}

TEST_F(ControlsTest, FrameShowsAndHidesWhatIsPlacedOnIt) {
    ::ShowWindow(host_, SW_SHOWNA);
    Win32Frame frame(host_, "Update", TwipsRect{2640, 1920, 6375, 1695}, 96, nullptr, false);
    Win32Label label(frame.hwnd(), "Check for Vantorel updates...", TwipsRect{480, 360, 3330, 255}, 96, nullptr);
    Win32Button button(frame.hwnd(), "&Updates", TwipsRect{2400, 960, 3855, 495}, 96, nullptr);
    int clicks = 0;
    button.Click = [&] { ++clicks; };

    EXPECT_FALSE(frame.Visible());
    EXPECT_FALSE(::IsWindowVisible(label.hwnd()));
    frame.SetVisible(true);
    EXPECT_TRUE(frame.Visible());
    EXPECT_TRUE(::IsWindowVisible(label.hwnd()));
    EXPECT_TRUE(::IsWindowVisible(button.hwnd()));
    EXPECT_EQ(frame.Caption(), "Update");

    label.SetCaption("Definitions Updates: No Updates");
    EXPECT_EQ(label.Caption(), "Definitions Updates: No Updates");
    ::SendMessageA(button.hwnd(), BM_CLICK, 0, 0);
    EXPECT_EQ(clicks, 1) << "a click inside a frame reaches its callback";
    frame.SetVisible(false);
    EXPECT_FALSE(::IsWindowVisible(button.hwnd()));
}

TEST(Twips, ScaleWithTheDisplayDensity) {
    EXPECT_EQ(TwipsToPixels(9120, 96), 608);
    EXPECT_EQ(TwipsToPixels(9120, 144), 912);
    EXPECT_EQ(TwipsToPixels(9120, 192), 1216);
    RECT r = ToPixels(TwipsRect{120, 120, 2415, 4095}, 96);
    EXPECT_EQ(r.left, 8);
    EXPECT_EQ(r.right - r.left, 161);
    EXPECT_EQ(r.bottom - r.top, 273);
}

}  // namespace
}  // namespace vantorel::win32
