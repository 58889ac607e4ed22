// What the guard tells the window that shows it: the count of attempts intercepted. The main
// window's logic implements it (the caption and the tray tip), so the guard needs nothing of the
// user interface and runs the same against a test's recorder.
#pragma once

#include <cstdint>

namespace vantorel {

class GuardView {
public:
    GuardView() = default;
    GuardView(const GuardView&) = delete;
    GuardView& operator=(const GuardView&) = delete;
    virtual ~GuardView() = default;

    // Start-up read the stored count: show it and put the program's icon in the notification area.
    virtual void CountLoaded(std::int32_t count) = 0;
    // A teardown was accepted and the count is now `count`: show it at once.
    virtual void CountIntercepted(std::int32_t count) = 0;
};

}  // namespace vantorel
