// The HTTP transfer over WinINet (http and https addresses).
//
// A worker thread makes the request and reads the body in large blocks (64 KiB by default: under
// Wine each InternetReadFile costs about the same whatever its size), keeping a few blocks ahead;
// the window thread takes its small chunks from those blocks. Whenever the window thread has to
// wait for the worker it waits for window messages too and pumps them, so the window stays
// responsive however slowly the data arrives. Nothing here raises events or touches windows from
// the worker.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>
#include <string>
#include <thread>

#include "platform/http_transfer.h"
#include "platform/message_pump.h"
#include "platform/win32/unique_handle.h"

namespace vantorel::win32 {

class WinInetTransfer final : public platform::HttpTransfer {
public:
    static constexpr std::size_t kDefaultBlockSize = 64 * 1024;

    explicit WinInetTransfer(platform::MessagePump& pump, std::size_t blockSize = kDefaultBlockSize);
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
    void Cancel() override;

private:
    enum class Stage { Idle, Requesting, Answered, Failed };
    struct Request {
        std::string host, path, userName, password, headers;
        unsigned short port = 0;
        bool secure = false;
    };

    void Work(Request request);
    // Waits until `ready` holds (checked under the lock), pumping window messages meanwhile.
    template <typename Ready>
    void WaitPumping(Ready ready);
    void Publish(const std::function<void()>& change);

    platform::MessagePump& pump_;
    const std::size_t blockSize_;
    std::string url_, userName_, password_;

    UniqueKernelHandle wake_;  // set by the worker after every change the window thread may wait for
    std::thread worker_;

    // Shared with the worker, under `mutex_`.
    std::mutex mutex_;
    std::condition_variable roomCv_;
    Stage stage_ = Stage::Idle;
    bool stop_ = false, bodyEnded_ = false, workerDone_ = true;
    platform::TransferError error_, bodyError_;
    bool bodyFailed_ = false;
    std::string header_;
    std::deque<std::string> blocks_;
    void* request_ = nullptr;  // HINTERNET of the running request, closed by whoever takes it

    // Window thread only: the block chunks are being served from.
    std::string current_;
    std::size_t offset_ = 0;
};

}  // namespace vantorel::win32
