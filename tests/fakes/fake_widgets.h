// Widgets for window logic tests: they hold their state, and the test plays the user.
#pragma once

#include "platform/widgets.h"

namespace vantorel::testing {

class FakeButton final : public platform::Button {
public:
    void SetCaption(const std::string& text) override { caption = text; }
    std::string Caption() const override { return caption; }
    void SetEnabled(bool value) override { enabled = value; }
    bool Enabled() const override { return enabled; }
    // The user clicks: nothing happens while disabled.
    void UserClick() {
        if (enabled && Click) Click();
    }
    std::string caption;
    bool enabled = true;
};

class FakeLabel final : public platform::Label {
public:
    void SetCaption(const std::string& text) override { caption = text; }
    std::string Caption() const override { return caption; }
    std::string caption;
};

class FakeFrame final : public platform::Frame {
public:
    void SetCaption(const std::string& text) override { caption = text; }
    std::string Caption() const override { return caption; }
    void SetVisible(bool value) override { visible = value; }
    bool Visible() const override { return visible; }
    std::string caption;
    bool visible = true;
};

class FakeCheckBox final : public platform::CheckBox {
public:
    void SetCaption(const std::string& text) override { caption = text; }
    std::string Caption() const override { return caption; }
    void SetValue(bool value) override { checked = value; }
    bool Value() const override { return checked; }
    // The user's click: the box toggles, then raises its click.
    void UserToggle() {
        checked = !checked;
        if (Click) Click();
    }
    std::string caption;
    bool checked = false;
};

}  // namespace vantorel::testing
