// The HTTP transfer over WinINet (http and https addresses).
//
// A worker thread makes the request and reads the body with large reads (64 KiB by default: under
// Wine each InternetReadFile costs about the same whatever its size), handing over whatever each
// read brought as soon as it returns and keeping a few blocks' worth ahead; the window thread takes
// its small chunks from those pieces. Whenever the window thread has to wait for the worker it
// waits for window messages too and pumps them, so the window stays responsive however slowly the
// data arrives, and after the messages it asks the caller's stop test: a wait the caller no longer
// wants, or one in which the server has said nothing for the silence limit, abandons the request
// at once (the worker is never joined; it owns what it still touches). Nothing here raises events
// or touches windows from the worker.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <string>

#include "platform/http_transfer.h"
#include "platform/message_pump.h"
#include "platform/win32/unique_handle.h"

namespace vantorel::win32 {

class WinInetTransfer final : public platform::HttpTransfer {
public:
    static constexpr std::size_t kDefaultBlockSize = 64 * 1024;
    // A server that says nothing for this long (no answer to the request, no data of the body) is
    // given up: the call that waits fails with "The operation timed out".
    static constexpr unsigned kSilenceLimitMs = 30000;

    explicit WinInetTransfer(platform::MessagePump& pump, std::size_t blockSize = kDefaultBlockSize,
                             unsigned silenceLimitMs = kSilenceLimitMs);
    ~WinInetTransfer() override;

    void SetURL(const std::string& url) override { url_ = url; }
    std::string URL() const override { return url_; }
    void SetUserName(const std::string& userName) override { userName_ = userName; }
    void SetPassword(const std::string& password) override { password_ = password; }

    bool ExecuteGet(const std::string& requestHeader, platform::TransferError& error) override;
    bool StillExecuting() override;
    bool GetHeader(std::string& header, platform::TransferError& error) override;
    bool GetHeader(const std::string& name, std::string& value, platform::TransferError& error) override;
    bool GetChunk(std::size_t size, std::string& data, platform::TransferError& error) override;
    // Stops the request without waiting for it: a worker stuck on a server that does not answer
    // is left to finish on its own (it owns everything it still touches) and the window thread
    // goes on at once.
    void Cancel() override;
    void StopWaitingWhen(std::function<bool()> stop) override { stop_ = std::move(stop); }

private:
    struct Request {
        std::string host, path, userName, password, headers;
        unsigned short port = 0;
        bool secure = false;
    };
    struct Shared;  // what the window thread and one worker share; lives while either needs it

    static void Work(std::shared_ptr<Shared> shared, Request request, std::size_t blockSize, unsigned silenceMs);
    // Waits until `ready` holds (checked under the lock), pumping window messages meanwhile. False
    // when the wait was ended instead (the request abandoned or cancelled): `error` says why.
    template <typename Ready>
    bool WaitPumping(Ready ready, platform::TransferError& error);
    // After the messages of a wait: true, with the request abandoned, when the caller's stop test
    // says so, the program is quitting, or the server has been silent for the limit.
    bool GivesUp(bool quitting);
    void Abandon(unsigned long code);
    void Release();

    platform::MessagePump& pump_;
    const std::size_t blockSize_;
    const unsigned silenceLimitMs_;
    std::function<bool()> stop_;
    std::string url_, userName_, password_;
    std::shared_ptr<Shared> shared_;  // of the running request; none when idle
    bool abandoned_ = false;          // the last request was given up: its calls fail with `failure_`
    platform::TransferError failure_;
    std::uint64_t activitySeen_ = 0;  // the worker's activity count when last looked at, and when
    unsigned long long activityTick_ = 0;

    // Window thread only: the block chunks are being served from.
    std::string current_;
    std::size_t offset_ = 0;
};

}  // namespace vantorel::win32
