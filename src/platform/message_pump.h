// Lets pending window messages run in the middle of long work on the window thread.
#pragma once

namespace vantorel::platform {

class MessagePump {
public:
    MessagePump() = default;
    MessagePump(const MessagePump&) = delete;
    MessagePump& operator=(const MessagePump&) = delete;
    virtual ~MessagePump() = default;

    // Handles the window messages waiting in the thread's queue, then returns. Handlers may call
    // back into the code that pumps (a cancel button, a timer).
    virtual void PumpMessages() = 0;
};

}  // namespace vantorel::platform
