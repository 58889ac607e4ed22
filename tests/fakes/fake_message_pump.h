// The message pump of every native test: it runs a scripted "user action" each time the code under
// test lets messages run (a click or a tick handled in the middle of long work), and can be told
// that the program is quitting.
#pragma once

#include <functional>

#include "platform/message_pump.h"

namespace vantorel::testing {

class FakePump final : public platform::MessagePump {
public:
    bool PumpMessages() override {
        ++pumps;
        if (onPump) onPump();
        return !quitting;
    }
    // A tick the pump takes from the queue itself (a modal window's loop runs `tick` directly).
    void OwnTick(const std::function<void()>& tick) {
        bool was = ownTick;
        ownTick = true;
        tick();
        ownTick = was;
    }
    bool InOwnTimerTick() const override { return ownTick; }
    std::function<void()> onPump;
    bool quitting = false;
    bool ownTick = false;
    int pumps = 0;
};

}  // namespace vantorel::testing
