// The options window on Windows: the controls of FrmOptions laid out in twips, a modal loop that
// keeps the owner's timers running, and the window procedure that hands clicks to the controls.
#pragma once

#include <windows.h>

#include <memory>
#include <string>

#include "platform/registry.h"
#include "platform/win32/controls_win32.h"
#include "ui/options/frm_options.h"

namespace vantorel::win32 {

class OptionsWindow {
public:
    // Creates the window (hidden) owned by `owner`, with frame `frameIndex` (0 options, 1 updates)
    // visible; the updates frame also sets the caption "Updates". Runs the load step.
    OptionsWindow(HWND owner, int frameIndex, platform::Registry& registry, const std::string& executablePath);
    ~OptionsWindow();
    OptionsWindow(const OptionsWindow&) = delete;
    OptionsWindow& operator=(const OptionsWindow&) = delete;

    // Shows the window modally: the owner takes no input until the window closes. Messages of
    // every window, the owner's timers included, keep flowing. Returns when the window is closed.
    void ShowModal();

    HWND hwnd() const { return hwnd_; }
    const OptionsControls& controls() const { return controls_; }
    Win32Button& closeButton() { return *close_; }
    Win32CheckBox& box(int index) { return *boxes_[index]; }

private:
    static LRESULT CALLBACK Proc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam);

    HWND owner_;
    HWND hwnd_ = nullptr;
    HFONT font_ = nullptr;
    bool closed_ = false;
    std::unique_ptr<Win32Frame> frames_[2];
    std::unique_ptr<Win32CheckBox> boxes_[3];
    std::unique_ptr<Win32Button> close_, update_;
    std::unique_ptr<Win32Label> hint_, labels_[2];
    HWND progress_ = nullptr;  // pb: white, shown while a download runs
    OptionsControls controls_;
    std::unique_ptr<FrmOptions> form_;
};

// What the main window's "&Updates" and "&Options" buttons (and the missing-definitions start-up)
// call: loads the options window on frame `frameIndex` (0 options, 1 updates), shows it modally
// owned by `owner` and returns when it has closed.
void ShowOptionsModal(HWND owner, int frameIndex);

// The path written as the autostart entry: the program's folder + "\" + base name + ".exe".
std::string AutostartPath();

}  // namespace vantorel::win32
