// The few members the windows use of their buttons, labels, frames and check boxes. Any widget set
// that honours these can stand behind them: the Win32 controls in the program, fakes in the tests.
// Events are callbacks that the owning window sets; a widget raises them on the window thread.
#pragma once

#include <functional>
#include <string>

namespace vantorel::platform {

class Widget {
public:
    Widget() = default;
    Widget(const Widget&) = delete;
    Widget& operator=(const Widget&) = delete;
    virtual ~Widget() = default;

    // The caption; an "&" marks the access-key letter where the widget has one.
    virtual void SetCaption(const std::string& caption) = 0;
    virtual std::string Caption() const = 0;
};

class Button : public Widget {
public:
    // A disabled button raises no click.
    virtual void SetEnabled(bool enabled) = 0;
    virtual bool Enabled() const = 0;

    // Raised once per completed click (mouse press and release, access key, Space/Enter).
    std::function<void()> Click;
};

class Label : public Widget {};

class Frame : public Widget {
public:
    // Showing a frame shows the controls placed on it; hiding it hides them.
    virtual void SetVisible(bool visible) = 0;
    virtual bool Visible() const = 0;
};

class CheckBox : public Widget {
public:
    // Setting the state from code raises no click.
    virtual void SetValue(bool checked) = 0;
    virtual bool Value() const = 0;

    // Raised when the user toggles the box, after the state has changed.
    std::function<void()> Click;
};

}  // namespace vantorel::platform
