// Fakes of the platform pieces the guard, the sweep and the tray routines use: a scripted
// connection table, a notification area and window manager that record their calls, a window, the
// switch, timers and the instance test.
#pragma once

#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include "fakes/fake_message_pump.h"
#include "guard/definitions.h"
#include "guard/guard_view.h"
#include "platform/connection_table.h"
#include "platform/notify_area.h"
#include "platform/window.h"
#include "settings/settings.h"

namespace vantorel::testing {

// 1.2.3.4 -> the row's address field (network order read little-endian).
constexpr std::uint32_t Ipv4(std::uint8_t a, std::uint8_t b, std::uint8_t c, std::uint8_t d) {
    return a | b << 8 | c << 16 | static_cast<std::uint32_t>(d) << 24;  // d << 24 would overflow an int
}

inline platform::TcpRow Row(std::uint32_t state, std::uint32_t remote, std::uint32_t remotePort = 0x5000) {
    return platform::TcpRow{state, Ipv4(10, 0, 0, 1), 0x3930, remote, remotePort};
}

// A value under the program's settings key as text, "<missing>" when there is none.
inline std::string StoredSetting(platform::Registry& registry, std::int32_t root, const std::string& name) {
    return VariantText(OpenSettings(registry, root).GetRegistryValue(name, std::string("<missing>")));
}

// The guard's view as a recorder of each count shown after a teardown.
class FakeGuardView final : public GuardView {
public:
    void CountLoaded(std::int32_t) override {}
    void CountIntercepted(std::int32_t count) override { shown.push_back(count); }
    std::vector<std::int32_t> shown;
};

class FakeConnectionTable final : public platform::ConnectionTable {
public:
    std::uint32_t GetTcpTable(void* table, std::uint32_t& size, bool) override {
        if (beforeFetch) beforeFetch();
        if (failWith != platform::kNoError) return failWith;
        std::uint32_t needed = platform::TcpTableBytes(static_cast<std::uint32_t>(rows.size()));
        if (size < needed) {
            size = needed;
            return platform::kErrorInsufficientBuffer;
        }
        auto count = static_cast<std::uint32_t>(rows.size()) + overstateCount;
        std::memcpy(table, &count, 4);
        if (!rows.empty()) std::memcpy(static_cast<char*>(table) + 4, rows.data(), rows.size() * sizeof(rows[0]));
        return platform::kNoError;
    }

    std::uint32_t SetTcpEntry(const platform::TcpRow& row) override {
        entries.push_back(row);
        return platform::kNoError;
    }

    std::vector<platform::TcpRow> rows;
    std::uint32_t failWith = platform::kNoError;
    std::uint32_t overstateCount = 0;  // a count larger than the rows written
    std::function<void()> beforeFetch;
    std::vector<platform::TcpRow> entries;  // every SetTcpEntry call
};

class FakeNotifyArea final : public platform::NotifyArea {
public:
    bool ShellNotifyIcon(std::uint32_t message, const platform::NotifyIconData& data) override {
        calls.push_back(data);
        if (events != nullptr) events->push_back("Tray " + std::to_string(message));
        return true;
    }
    std::vector<platform::NotifyIconData> calls;
    std::vector<std::string>* events = nullptr;  // when set, each call is noted there too
};

class FakeWindow final : public platform::Window {
public:
    platform::WindowHandle Handle() const override { return handle; }
    platform::IconHandle Icon() const override { return icon; }
    void SetIcon(platform::IconHandle i) override { icon = i; }
    std::string Caption() const override { return caption; }
    void SetCaption(const std::string& text) override { caption = text; }
    bool Visible() const override { return visible; }
    void SetVisible(bool v) override { visible = v; }
    platform::WindowState State() const override { return state; }
    void SetState(platform::WindowState s) override { state = s; }
    std::int32_t Width() const override { return 616; }
    std::int32_t Height() const override { return 320; }
    void Move(std::int32_t, std::int32_t) override {}

    platform::WindowHandle handle = 0x1234;
    platform::IconHandle icon = 0x777;
    std::string caption = "FrmMain";
    bool visible = false;
    platform::WindowState state = platform::WindowState::Normal;
};

class FakeSwitch final : public platform::Switch {
public:
    bool Value() const override { return value; }
    void SetValue(bool v) override { value = v; }
    std::string Caption() const override { return caption; }
    void SetCaption(const std::string& c) override { caption = c; }
    std::uint32_t BackColor() const override { return backColor; }
    void SetBackColor(std::uint32_t c) override { backColor = c; }
    std::uint32_t BackOver() const override { return backOver; }
    void SetBackOver(std::uint32_t c) override { backOver = c; }

    bool value = false;
    std::string caption = "KirelXPButton1";
    std::uint32_t backColor = 0x8000000F, backOver = 0x8000000F;
};

class FakeTimer final : public platform::Timer {
public:
    std::uint32_t Interval() const override { return interval; }
    void SetInterval(std::uint32_t ms) override { interval = ms; }
    bool Enabled() const override { return enabled; }
    void SetEnabled(bool e) override { enabled = e; }
    std::uint32_t interval = 0;
    bool enabled = false;
};

class FakeWindowManager final : public platform::WindowManager {
public:
    bool SetWindowPos(platform::WindowHandle, platform::WindowHandle, std::int32_t, std::int32_t, std::int32_t,
                      std::int32_t, std::uint32_t) override {
        return true;
    }
    std::int32_t ScreenWidth() const override { return 1024; }
    std::int32_t ScreenHeight() const override { return 768; }
    bool DeleteSystemMenuCommand(platform::WindowHandle, std::uint32_t command) override {
        deletedCommand = command;
        return true;
    }
    std::uint32_t deletedCommand = 0;
};

class FakeInstance final : public platform::Instance {
public:
    bool PreviousInstance() override { return false; }
    void CreateNamedMutex(const std::string&) override {}
};

}  // namespace vantorel::testing
