// The window thread's message pump for long work: runs what waits in the queue and returns.
//
// Long work calls the pump very often (a download once per 1024-byte chunk). Under Wine every look
// at the queue is a round trip to the wine server, about 20 µs on an idle machine and over 100 µs
// on a busy one, which at one look per chunk would cap a download near 10 MB/s. So the pump looks
// at the queue only when `minimumInterval` has passed since its last look (2 ms by default): a click
// or a timer waits at most that long, which no user can tell from looking every time.
#pragma once

#include <chrono>

#include "platform/message_pump.h"

namespace vantorel::win32 {

class Win32MessagePump final : public platform::MessagePump {
public:
    explicit Win32MessagePump(std::chrono::microseconds minimumInterval = std::chrono::milliseconds(2))
        : minimumInterval_(minimumInterval) {}

    // Dispatches every waiting message. A WM_QUIT is put back for the main loop and ends the pass.
    void PumpMessages() override;

private:
    std::chrono::microseconds minimumInterval_;
    std::chrono::steady_clock::time_point lastLook_{};
};

}  // namespace vantorel::win32
