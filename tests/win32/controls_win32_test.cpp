// The Win32 buttons and check boxes under Wine, in a real (hidden) window on the virtual display:
// disabled buttons and state set by code stay silent, a check box changes before its click. Their
// layout and clicks in the real windows are proved by the main and options window tests.
#include <windows.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

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

TEST_F(ControlsTest, DisabledButtonsAndCodeRaiseNoClickAndABoxChangesBeforeItsClick) {
    Win32Button button(host_, "&Tray", TwipsRect{2640, 3720, 2055, 495}, 96, nullptr);
    Win32CheckBox box(host_, "Boot when Windows boots", TwipsRect{240, 360, 4000, 255}, 96, nullptr);
    std::vector<std::string> clicks;
    button.Click = [&] { clicks.push_back("button"); };
    box.Click = [&] { clicks.push_back(box.Value() ? "box on" : "box off"); };
    button.SetEnabled(false);
    ::SendMessageA(button.hwnd(), BM_CLICK, 0, 0);
    button.SetEnabled(true);
    ::SendMessageA(button.hwnd(), BM_CLICK, 0, 0);
    box.SetValue(true);
    ::SendMessageA(box.hwnd(), BM_CLICK, 0, 0);
    EXPECT_EQ(clicks, (std::vector<std::string>{"button", "box off"}));
}

}  // namespace
}  // namespace vantorel::win32
