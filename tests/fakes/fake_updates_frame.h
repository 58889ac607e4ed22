// An updates panel that records what the update check does to it, in order, and paints its
// progress box into pixels.
#pragma once

#include <string>
#include <vector>

#include "fakes/fake_picture_box.h"
#include "ui/options/update_check.h"

namespace vantorel::testing {

class FakeUpdatesFrame final : public UpdatesFrame {
public:
    std::vector<std::string> log;
    std::string L[2] = {"Definitions Updates:", "Program Updates:"};
    bool enabled = true, pbVisible = false;
    FakePictureBox box{393, 17};

    void SetBtnUpdateEnabled(bool on) override {
        enabled = on;
        log.push_back(on ? "enable" : "disable");
    }
    void SetLCaption(int index, const std::string& caption) override {
        L[index] = caption;
        std::string entry = "L";
        entry += std::to_string(index);
        entry += ":";
        log.push_back(entry + caption);
    }
    void ShowPb() override { pbVisible = true; }
    platform::PictureBox& pb() override { return box; }
    void MsgBoxExclamation(const std::string& prompt, const std::string& title) override {
        log.push_back("msgbox[" + title + "]:" + prompt);
    }
};

}  // namespace vantorel::testing
