// Lets pending window messages run in the middle of long work on the window thread (a sweep, a
// download): clicks, timer ticks and the tray's notifications are handled between its steps.
#pragma once

namespace vantorel::platform {

// Lets pending window messages run on the window thread (timer ticks and clicks included).
class MessagePump {
public:
    MessagePump() = default;
    MessagePump(const MessagePump&) = delete;
    MessagePump& operator=(const MessagePump&) = delete;
    virtual ~MessagePump() = default;

    // Runs every message waiting now and returns. False when the program has been asked to quit:
    // long work then stops at once.
    virtual bool PumpMessages() = 0;

    // The yield of a long loop, called once per step: lets waiting messages run, but may look at the
    // queue less often than it is called (a message then waits a moment, never longer than a
    // millisecond or so). Same result as PumpMessages.
    virtual bool YieldToMessages() { return PumpMessages(); }

    // True while the message being handled is a timer tick that this pump took from the queue
    // itself. False for a tick taken by any other loop, including one running below a handler this
    // pump called: a modal window or message box opened by a click let through in the middle of a
    // sweep runs its own loop, and its ticks are not the pump's.
    virtual bool InOwnTimerTick() const { return false; }
};

}  // namespace vantorel::platform
