// The HTTP transfer a downloader drives: one GET at a time, polled from the window thread.
//
// The calls mirror what the downloader asks of its transfer control: set the address and the
// credentials, start a GET with a request header, poll whether the request still runs, read the
// response header (whole or one field), take the body in chunks, and cancel. A transfer raises no
// events; an implementation may do its blocking work on a worker thread, but every call here is
// made and answered on the window thread.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>

namespace vantorel::platform {

// What went wrong in a transfer call: a system error number and its description.
struct TransferError {
    std::int32_t number = 0;
    std::string description;
};

class HttpTransfer {
public:
    HttpTransfer() = default;
    HttpTransfer(const HttpTransfer&) = delete;
    HttpTransfer& operator=(const HttpTransfer&) = delete;
    virtual ~HttpTransfer() = default;

    virtual void SetURL(const std::string& url) = 0;
    virtual std::string URL() const = 0;
    virtual void SetUserName(const std::string& userName) = 0;
    virtual void SetPassword(const std::string& password) = 0;

    // Starts a GET of URL() with `requestHeader` (lines ending in CR LF) added to the request.
    // False with `error` when the request cannot even be started (an address that does not parse).
    virtual bool ExecuteGet(const std::string& requestHeader, TransferError& error) = 0;

    // True while the request has not yet got its response header (or failed). May wait briefly for
    // progress, but returns at once when a window message is waiting.
    virtual bool StillExecuting() = 0;

    // The whole response header, status line first, lines ending in CR LF. False with `error`
    // when the request failed (no connection, unknown host, refused).
    virtual bool GetHeader(std::string& header, TransferError& error) = 0;

    // The value of the first header field named `name` (case-insensitive), empty when there is none.
    virtual bool GetHeader(const std::string& name, std::string& value, TransferError& error) = 0;

    // The next piece of the body into `data`: exactly `size` bytes while the body lasts, fewer only
    // at its end, none once it has ended. Waits as long as the data takes to arrive, unless the
    // stop test (StopWaitingWhen) ends the wait. False with `error` when reading fails or the wait
    // was ended.
    virtual bool GetChunk(std::size_t size, std::string& data, TransferError& error) = 0;

    // Ends the request (running or finished) and frees what it holds. Harmless when idle.
    virtual void Cancel() = 0;

    // Every wait of the transfer (StillExecuting, GetHeader, GetChunk) also ends as soon as `stop`
    // answers true, asked after the window messages that ran meanwhile (a click on "Close" sets
    // the caller's cancel flag there): the request is then abandoned and the call fails as
    // cancelled. A transfer that never waits may ignore it.
    virtual void StopWaitingWhen(std::function<bool()> stop) { (void)stop; }
};

}  // namespace vantorel::platform
