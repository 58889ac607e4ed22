// Widgets for window logic tests: they hold their state, and the test plays the user.
#pragma once

#include "platform/widgets.h"

namespace vantorel::testing {

class FakeButton final : public platform::Button {
public:
    explicit FakeButton(std::string caption = {}) : caption_(std::move(caption)) {}
    void SetCaption(const std::string& caption) override { caption_ = caption; }
    std::string Caption() const override { return caption_; }
    void SetEnabled(bool enabled) override { enabled_ = enabled; }
    bool Enabled() const override { return enabled_; }
    // The user clicks: nothing happens while disabled.
    void UserClick() {
        if (enabled_ && Click) Click();
    }

private:
    std::string caption_;
    bool enabled_ = true;
};

class FakeLabel final : public platform::Label {
public:
    explicit FakeLabel(std::string caption = {}) : caption_(std::move(caption)) {}
    void SetCaption(const std::string& caption) override { caption_ = caption; }
    std::string Caption() const override { return caption_; }

private:
    std::string caption_;
};

class FakeFrame final : public platform::Frame {
public:
    explicit FakeFrame(std::string caption = {}, bool visible = true)
        : caption_(std::move(caption)), visible_(visible) {}
    void SetCaption(const std::string& caption) override { caption_ = caption; }
    std::string Caption() const override { return caption_; }
    void SetVisible(bool visible) override { visible_ = visible; }
    bool Visible() const override { return visible_; }

private:
    std::string caption_;
    bool visible_;
};

class FakeCheckBox final : public platform::CheckBox {
public:
    explicit FakeCheckBox(std::string caption = {}) : caption_(std::move(caption)) {}
    void SetCaption(const std::string& caption) override { caption_ = caption; }
    std::string Caption() const override { return caption_; }
    void SetValue(bool checked) override { checked_ = checked; }
    bool Value() const override { return checked_; }
    // The user's click: the box toggles, then raises its click.
    void UserToggle() {
        checked_ = !checked_;
        if (Click) Click();
    }

private:
    std::string caption_;
    bool checked_ = false;
};

}  // namespace vantorel::testing
