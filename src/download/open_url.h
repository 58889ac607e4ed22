// OpenURL: the whole body of a small text file on a web server, through an HTTP transfer, letting
// window messages run while the request waits.
#pragma once

#include <cstddef>
#include <string>

#include "platform/http_transfer.h"
#include "platform/message_pump.h"

namespace vantorel {

// Reads the body at `url` into `text` whatever the status (an error page comes back as its text),
// keeping at most `limit` bytes. False with `error` when the request fails outright (no server, an
// unknown host, an address that does not parse).
bool OpenURL(platform::HttpTransfer& transfer, platform::MessagePump& pump, const std::string& url, std::string& text,
             platform::TransferError& error, std::size_t limit = 64 * 1024);

}  // namespace vantorel
