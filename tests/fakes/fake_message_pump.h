// A message pump that counts its calls and runs a scripted "user action" on each, as a click
// handled in the middle of long work would.
#pragma once

#include <functional>

#include "platform/message_pump.h"

namespace vantorel::testing {

class FakeMessagePump final : public platform::MessagePump {
public:
    int pumps = 0;
    std::function<void(int pump)> onPump;

    bool PumpMessages() override {
        ++pumps;
        if (onPump) onPump(pumps);
        return true;
    }
};

}  // namespace vantorel::testing
