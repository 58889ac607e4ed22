// What the push button needs of its own window and of the container that hosts it: the window's
// state and shape, the pointer and the hover timer, key injection, the container's ambient
// answers and notifications, and the system's colours. The Win32 window class implements it;
// tests use a scripted fake.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/canvas.h"

namespace vantorel::platform {

// Indexes of the system colour table used by the button.
inline constexpr int kColorHighlight = 13;
inline constexpr int kColorBtnFace = 15;
inline constexpr int kColorBtnShadow = 16;
inline constexpr int kColorBtnText = 18;
inline constexpr int kColorBtnHighlight = 20;
inline constexpr int kColor3dDkShadow = 21;
inline constexpr int kColor3dLight = 22;

class ButtonHost {
public:
    ButtonHost() = default;
    ButtonHost(const ButtonHost&) = delete;
    ButtonHost& operator=(const ButtonHost&) = delete;
    virtual ~ButtonHost() = default;

    // The control window's handle (0 without a window).
    virtual std::intptr_t Handle() const = 0;
    // The control window's client rectangle.
    virtual Box ClientRect() const = 0;
    virtual void SetEnabled(bool enabled) = 0;
    virtual void SetFont(const FontDesc& font) = 0;
    virtual void SetMousePointer(std::int32_t shape) = 0;
    // Sets the custom pointer picture; false (old pointer kept) when the window refuses it.
    virtual bool SetMouseIcon(const PicturePtr& picture) = 0;
    // Releases the old window shape and applies the new one, redrawn at once.
    virtual void SetShape(const WindowShape& shape) = 0;
    virtual void ReleaseShape() = 0;
    // Hover test: the window under the pointer's screen position is the control's own window.
    virtual bool PointerOverSelf() const = 0;
    virtual void StartOverTimer(std::int32_t milliseconds) = 0;
    virtual void StopOverTimer() = 0;
    // Queues key strokes to the application's input: "{Tab}" or "+{Tab}" (Shift+Tab).
    virtual void SendKeys(const std::string& keys) = 0;
    virtual void CaptureMouse() = 0;
    // Makes what was just painted visible now (the window's synchronous update).
    virtual void Present() = 0;
    // The access key of the caption, lower case; 0 clears it.
    virtual void SetAccessKey(char key) = 0;
    // Pixels per inch of the screen, for HIMETRIC sizes.
    virtual std::int32_t ScreenDpi() const = 0;

    // The container.
    virtual bool DesignMode() const = 0;
    virtual bool IsDefault() const = 0;
    virtual std::string ContainerName() const = 0;
    // The control's stored state changed; `key` names the stored value.
    virtual void PropertyChanged(const std::string& key) = 0;
    // Background and text colours of the parent window's drawing context.
    virtual Rgb ParentBackColour() const = 0;
    virtual Rgb ParentTextColour() const = 0;
    // Lets the parent paint itself where the control is (the control steps out of its way while
    // pending messages run), then copies w × h parent pixels under the control as 24-bit
    // bottom-up rows. False leaves `pixels` as it was.
    virtual bool CaptureParentPixels(std::int32_t w, std::int32_t h, std::vector<std::uint8_t>& pixels) = 0;

    // The platform's current user-interface colour of a system colour index.
    virtual Rgb SystemColour(int index) const = 0;
};

}  // namespace vantorel::platform
