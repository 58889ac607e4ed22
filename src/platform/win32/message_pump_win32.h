// The window thread's message pump for long work: runs what waits in the queue and returns.
#pragma once

#include "platform/message_pump.h"

namespace vantorel::win32 {

class Win32MessagePump final : public platform::MessagePump {
public:
    // Dispatches every waiting message. A WM_QUIT is put back for the main loop and ends the pass.
    void PumpMessages() override;
};

}  // namespace vantorel::win32
