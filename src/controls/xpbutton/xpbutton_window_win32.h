// The Win32 window class "KirelXPButton": a child window that hosts the portable push button.
// It owns the GDI back buffer and the control, turns window messages into the control's input
// and lifecycle calls, and answers what the control asks of its window and container.
//
// Hosting it:
//     XPButtonWindow onOff;
//     onOff.Create(parent, kIdOnOff, x, y, 160, 40, "BtnOnOff");   // a new control (or pass a store)
//     onOff.button().SetCheckBoxBehaviour(true);
//     onOff.events().Click = [&] { Toggle(onOff.button().Value()); };
//     onOff.Show();
// A message loop that calls IsDialogMessage gives Tab, the arrows and the caption's access key.
#pragma once

#include <windows.h>

#include <functional>
#include <memory>
#include <string>

#include "controls/xpbutton/kirel_xp_button.h"
#include "platform/button_host.h"
#include "platform/win32/gdi_canvas.h"
#include "platform/win32/message_window.h"

namespace vantorel::win32 {

class XPButtonWindow final : public platform::ButtonHost, public MessageWindow<XPButtonWindow> {
public:
    static constexpr const char* kClassName = "KirelXPButton";

    XPButtonWindow();
    ~XPButtonWindow() override;

    // Registers the window class once per process.
    static bool RegisterWindowClass(HINSTANCE instance);

    // Creates the control hidden as a child of `parent`. Without `store` it is a newly placed
    // control (its caption becomes `name`); with one its properties are read from it. False when
    // the window cannot be made (no display).
    bool Create(HWND parent, int id, int x, int y, int w, int h, const std::string& name,
                const xpbutton::PropertyBag* store = nullptr);
    void Show();
    void Hide();
    void Destroy();

    xpbutton::KirelXPButton& button() { return *button_; }
    xpbutton::XPButtonEvents& events() { return button_->events; }
    GdiCanvas& canvas() { return canvas_; }
    // The window moved to a monitor of `dpi`: the caption's font is made for it and the control
    // lays its caption out and paints again.
    void SetDpi(UINT dpi);
    // The container reports this control as its default button.
    void SetDefault(bool isDefault);
    // The container's ambient properties (system colours) changed.
    void AmbientChanged() { button_->OnAmbientChanged(); }
    // Told when the control's stored state changes (the stored key's name).
    std::function<void(const std::string&)> onPropertyChanged;

    // platform::ButtonHost
    std::intptr_t Handle() const override { return reinterpret_cast<std::intptr_t>(hwnd_); }
    platform::Box ClientRect() const override;
    void SetEnabled(bool enabled) override;
    void SetFont(const platform::FontDesc& font) override;
    void SetMousePointer(std::int32_t shape) override { pointer_ = shape; }
    bool SetMouseIcon(const platform::PicturePtr& picture) override;
    void SetShape(const platform::WindowShape& shape) override;
    void ReleaseShape() override;
    bool PointerOverSelf() const override;
    void StartOverTimer(std::int32_t milliseconds) override;
    void StopOverTimer() override;
    void SendKeys(const std::string& keys) override;
    void CaptureMouse() override;
    void Present() override;
    void SetAccessKey(char key) override;
    std::int32_t ScreenDpi() const override;
    bool DesignMode() const override { return false; }
    bool IsDefault() const override { return default_; }
    std::string ContainerName() const override { return name_; }
    void PropertyChanged(const std::string& key) override;
    platform::Rgb ParentBackColour() const override;
    platform::Rgb ParentTextColour() const override;
    bool CaptureParentPixels(std::int32_t w, std::int32_t h, std::vector<std::uint8_t>& pixels) override;
    platform::Rgb SystemColour(int index) const override;

private:
    friend class MessageWindow<XPButtonWindow>;
    LRESULT HandleMessage(UINT message, WPARAM wParam, LPARAM lParam);
    static std::int16_t ShiftState();

    HWND parent_ = nullptr;
    std::string name_;
    GdiCanvas canvas_;
    std::unique_ptr<xpbutton::KirelXPButton> button_;
    UniqueHfont font_;
    UINT dpi_ = 0;  // 0: the screen's
    bool default_ = false;
    bool doubleClicked_ = false;
    bool leftPressed_ = false;  // a left press on the control, the mouse captured since
    std::int32_t pointer_ = 0;
    platform::PicturePtr mouseIcon_;
};

}  // namespace vantorel::win32
