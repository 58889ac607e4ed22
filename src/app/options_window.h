// The options window on Windows: the controls of FrmOptions laid out in twips, a modal loop that
// keeps the owner's timers running, and the window procedure that hands clicks to the controls.
// The window is the view of FrmOptions: its update check and downloaders FD1 to FD3 run on the
// WinINet transfers made here, painting progress into the picture box pb.
// Closing the window while a check runs stops the check at its next step. Moved to a monitor of
// another DPI, the window lays itself out again in twips at that DPI.
#pragma once

#include <windows.h>

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "download/file_downloader.h"
#include "platform/registry.h"
#include "platform/win32/controls_win32.h"
#include "platform/win32/file_system_win32.h"
#include "platform/win32/files_win32.h"
#include "platform/win32/http_transfer_win32.h"
#include "platform/win32/gdi_objects.h"
#include "platform/win32/message_window.h"
#include "platform/win32/picture_box_win32.h"
#include "platform/win32/shell_win32.h"
#include "platform/win32/task_scheduler_win32.h"
#include "ui/options/frm_options.h"
#include "ui/options/update_check.h"

namespace vantorel::win32 {

// The running program's folder and version.
UpdateTarget InstalledProgram();

class OptionsWindow final : public UpdatesFrame, public MessageWindow<OptionsWindow> {
public:
    // Creates the window (hidden) owned by `owner`, with frame `frameIndex` (0 options, 1 updates)
    // visible; the updates frame also sets the caption "Updates". Runs the load step.
    OptionsWindow(HWND owner, int frameIndex, platform::Registry& registry, const std::string& executablePath,
                  const UpdateTarget& target = InstalledProgram());
    ~OptionsWindow() override;
    OptionsWindow(const OptionsWindow&) = delete;
    OptionsWindow& operator=(const OptionsWindow&) = delete;

    // Shows the window modally: the owner takes no input until the window closes. Messages of
    // every window, the owner's timers included, keep flowing. Returns when the window is closed.
    void ShowModal();

    // Puts a newly installed definitions list in force at once (see UpdateCheck::ReloadDefinitions).
    void SetReloadDefinitions(std::function<std::optional<std::size_t>()> reload) {
        form_->Updates().ReloadDefinitions = std::move(reload);
    }

    const OptionsControls& controls() const { return controls_; }
    Win32Button& closeButton() { return *close_; }
    Win32CheckBox& box(int index) { return *boxes_[index]; }
    Win32Button& updateButton() { return *update_; }
    Win32Label& label(int index) { return *labels_[index]; }
    HWND pbWindow() const { return pbWindow_; }
    GdiPictureBox& picture() { return *pb_; }

    // UpdatesFrame: what the update check does to the window.
    void SetBtnUpdateEnabled(bool enabled) override;
    void SetLCaption(int index, const std::string& caption) override;
    void ShowPb() override;
    platform::PictureBox& pb() override { return *pb_; }
    void MsgBoxExclamation(const std::string& prompt, const std::string& title) override;

private:
    friend class MessageWindow<OptionsWindow>;
    LRESULT HandleMessage(UINT message, WPARAM wParam, LPARAM lParam);
    // The window while it is not being destroyed.
    HWND live() const { return closed_ ? nullptr : hwnd_; }
    static LRESULT CALLBACK PictureProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam);
    // Lays the window out for `dpi`: controls in twips, the design font, pb at its new size.
    void ApplyDpi(UINT dpi);

    HWND owner_;
    UniqueHfont font_;
    UINT dpi_ = 96;
    bool closed_ = false;
    std::unique_ptr<Win32Frame> frames_[2];
    std::unique_ptr<Win32CheckBox> boxes_[3];
    std::unique_ptr<Win32Button> close_, update_;
    std::unique_ptr<Win32Label> hint_, labels_[2];
    HWND pbWindow_ = nullptr;  // pb's window: hidden until a download starts
    std::unique_ptr<GdiPictureBox> pb_;
    OptionsControls controls_;

    // The system under the logic; made before it and gone after it.
    Win32TaskScheduler scheduler_;
    Win32MessagePump pump_;
    Win32FileSystem disk_;
    Win32Files files_;
    WinInetTransfer inet_{pump_}, transfer1_{pump_}, transfer2_{pump_}, transfer3_{pump_};
    std::unique_ptr<FrmOptions> form_;
};

// What the main window's "&Updates" and "&Options" buttons (and the missing-definitions start-up)
// call: loads the options window on frame `frameIndex` (0 options, 1 updates), shows it modally
// owned by `owner` and returns when it has closed. `reloadDefinitions` puts a list the update check
// installed in force at once.
void ShowOptionsModal(HWND owner, int frameIndex,
                      std::function<std::optional<std::size_t>()> reloadDefinitions = nullptr);

// The path written as the autostart entry: the program's folder + "\" + base name + ".exe".
std::string AutostartPath();

}  // namespace vantorel::win32
