#include "platform/win32/http_transfer_win32.h"

#include <windows.h>
#include <wininet.h>

#include <thread>
#include <utility>

#include "platform/http_header.h"
#include "platform/win32/system_message.h"

namespace vantorel::win32 {
namespace {

constexpr std::size_t kBlocksAhead = 4;
// Whole blocks are read while one arrives within this many milliseconds, judged over reads of at
// least kMeasureMs.
constexpr double kWholeBlockMs = 200, kMeasureMs = 5;

using UniqueHinternet = UniqueHandle<NullInvalid<HINTERNET, ::InternetCloseHandle>>;

platform::TransferError InternetError(DWORD code) {
    std::string text = SystemMessage(code, ::GetModuleHandleA("wininet.dll"));
    // Wine's wininet has no text for some certificate failures; say what they are.
    if (text == "Error " + std::to_string(code)) {
        switch (code) {
            case ERROR_INTERNET_INVALID_CA: text = "The certificate authority is invalid or incorrect."; break;
            case ERROR_INTERNET_SEC_CERT_DATE_INVALID: text = "The server's certificate has expired."; break;
            case ERROR_INTERNET_SEC_INVALID_CERT: text = "The server's certificate is invalid."; break;
            case ERROR_INTERNET_SECURITY_CHANNEL_ERROR: text = "The secure channel could not be set up."; break;
            default: text = "WinINet error " + std::to_string(code); break;
        }
    }
    return {static_cast<std::int32_t>(code), text};
}

}  // namespace

struct WinInetTransfer::Shared {
    enum class Stage { Requesting, Answered, Failed };

    // Set after a change while the window thread waits for one. (Setting it costs a round trip to
    // the wine server; a window thread busy with the blocks it has does not need it.)
    UniqueKernelHandle wake{::CreateEventA(nullptr, FALSE, FALSE, nullptr)};
    std::mutex mutex;
    bool waiting = false;          // the window thread waits, or is about to, for `wake`
    std::condition_variable room;  // the worker waits here for the window thread to take blocks
    Stage stage = Stage::Requesting;
    bool stop = false, bodyEnded = false, bodyFailed = false;
    platform::TransferError error, bodyError;
    std::string header;
    std::deque<std::string> blocks;  // what each read brought, in order
    std::size_t queued = 0;          // bytes in `blocks`
    std::uint64_t activity = 0;      // grows with every change the worker publishes

    template <typename Change>
    void Publish(Change change) {
        bool signal = false;
        {
            std::lock_guard<std::mutex> lock(mutex);
            change();
            ++activity;
            signal = waiting;
        }
        if (signal) ::SetEvent(wake.get());
    }
};

WinInetTransfer::WinInetTransfer(platform::MessagePump& pump, std::size_t blockSize, unsigned silenceLimitMs)
    : pump_(pump), blockSize_(blockSize), silenceLimitMs_(silenceLimitMs) {}

WinInetTransfer::~WinInetTransfer() { Cancel(); }

bool WinInetTransfer::GivesUp(bool quitting) {
    if (!shared_) return true;
    if (quitting || (stop_ && stop_())) {
        Abandon(ERROR_INTERNET_OPERATION_CANCELLED);
        return true;
    }
    std::uint64_t activity = 0;
    {
        std::lock_guard<std::mutex> lock(shared_->mutex);
        activity = shared_->activity;
    }
    unsigned long long now = ::GetTickCount64();
    if (activity != activitySeen_) {
        activitySeen_ = activity;
        activityTick_ = now;
    } else if (now - activityTick_ >= silenceLimitMs_) {
        Abandon(ERROR_INTERNET_TIMEOUT);
        return true;
    }
    return false;
}

template <typename Ready>
bool WinInetTransfer::WaitPumping(Ready ready, platform::TransferError& error) {
    for (;;) {
        std::shared_ptr<Shared> shared = shared_;
        if (shared) {
            std::lock_guard<std::mutex> lock(shared->mutex);
            shared->waiting = !ready(*shared);
            if (!shared->waiting) return true;
        }
        bool quitting = false;
        if (shared) {
            HANDLE wake = shared->wake.get();
            // A bounded wait, so the stop test and the silence limit are looked at even when
            // neither the worker nor the queue has anything to say.
            DWORD woke = ::MsgWaitForMultipleObjectsEx(1, &wake, 100, QS_ALLINPUT, MWMO_INPUTAVAILABLE);
            if (woke == WAIT_OBJECT_0 + 1) {
                quitting = !pump_.YieldToMessages();
                // The pump may hold messages back for a moment (it rate-limits its looks at the
                // queue); wait for the worker alone meanwhile instead of spinning on them.
                if (shared_ == shared) ::WaitForSingleObject(wake, 1);
            }
        }
        // A handler that ran meanwhile may have cancelled the request under this wait.
        if (shared_ != shared || GivesUp(quitting)) {
            error = abandoned_ ? failure_ : InternetError(ERROR_INTERNET_OPERATION_CANCELLED);
            return false;
        }
    }
}

bool WinInetTransfer::ExecuteGet(const std::string& requestHeader, platform::TransferError& error) {
    Cancel();  // one request at a time

    URL_COMPONENTSA parts{};
    parts.dwStructSize = sizeof parts;
    char host[INTERNET_MAX_HOST_NAME_LENGTH + 1] = {}, user[256] = {}, password[256] = {};
    std::string path(INTERNET_MAX_URL_LENGTH + 1, '\0'), extra(INTERNET_MAX_URL_LENGTH + 1, '\0');
    parts.lpszHostName = host;
    parts.dwHostNameLength = sizeof host;
    parts.lpszUserName = user;
    parts.dwUserNameLength = sizeof user;
    parts.lpszPassword = password;
    parts.dwPasswordLength = sizeof password;
    parts.lpszUrlPath = path.data();
    parts.dwUrlPathLength = static_cast<DWORD>(path.size());
    parts.lpszExtraInfo = extra.data();
    parts.dwExtraInfoLength = static_cast<DWORD>(extra.size());
    if (!::InternetCrackUrlA(url_.c_str(), static_cast<DWORD>(url_.size()), 0, &parts)) {
        error = InternetError(::GetLastError());
        return false;
    }
    if (parts.nScheme != INTERNET_SCHEME_HTTP && parts.nScheme != INTERNET_SCHEME_HTTPS) {
        error = InternetError(ERROR_INTERNET_UNRECOGNIZED_SCHEME);
        return false;
    }
    Request request;
    request.host.assign(host, parts.dwHostNameLength);
    request.port = parts.nPort;
    request.secure = parts.nScheme == INTERNET_SCHEME_HTTPS;
    request.path = path.substr(0, parts.dwUrlPathLength) + extra.substr(0, parts.dwExtraInfoLength);
    if (request.path.empty()) request.path.push_back('/');
    request.userName = userName_.empty() ? std::string(user, parts.dwUserNameLength) : userName_;
    request.password = password_.empty() ? std::string(password, parts.dwPasswordLength) : password_;
    request.headers = requestHeader;

    auto shared = std::make_shared<Shared>();
    if (!shared->wake) {
        error = InternetError(::GetLastError());
        return false;
    }
    try {
        std::thread(&WinInetTransfer::Work, shared, std::move(request), blockSize_, silenceLimitMs_).detach();
    } catch (const std::system_error&) {
        error = InternetError(ERROR_NOT_ENOUGH_MEMORY);
        return false;
    }
    shared_ = std::move(shared);
    current_.clear();
    offset_ = 0;
    activitySeen_ = 0;
    activityTick_ = ::GetTickCount64();
    return true;
}

// The worker: the request, the response header, then the body in blocks. It touches nothing but
// `shared`, which it keeps alive, so it may outlive the transfer that started it.
void WinInetTransfer::Work(std::shared_ptr<Shared> shared, Request request, std::size_t blockSize, unsigned silenceMs) {
    auto fail = [&shared](DWORD code) {
        platform::TransferError error = InternetError(code);
        shared->Publish([&] {
            shared->stage = Shared::Stage::Failed;
            shared->error = error;
        });
    };
    UniqueHinternet session(::InternetOpenA("Vantorel", INTERNET_OPEN_TYPE_PRECONFIG, nullptr, nullptr, 0));
    UniqueHinternet connection;
    if (session) {
        // WinINet's own time-outs end an abandoned worker that a silent server would hold forever.
        DWORD ms = silenceMs;
        for (DWORD option :
             {INTERNET_OPTION_CONNECT_TIMEOUT, INTERNET_OPTION_SEND_TIMEOUT, INTERNET_OPTION_RECEIVE_TIMEOUT})
            ::InternetSetOptionA(session.get(), option, &ms, sizeof ms);
        connection.reset(::InternetConnectA(session.get(), request.host.c_str(), request.port,
                                            request.userName.empty() ? nullptr : request.userName.c_str(),
                                            request.password.empty() ? nullptr : request.password.c_str(),
                                            INTERNET_SERVICE_HTTP, 0, 0));
    }
    // Sends the request and reads the answer's header; false when a call failed (its code in
    // `sendFailure`) or the transfer was cancelled first.
    HINTERNET opened = nullptr;
    std::string header;
    DWORD sendFailure = 0;
    auto send = [&] {
        if (opened != nullptr) ::InternetCloseHandle(opened);
        opened = nullptr;
        if (connection) {
            DWORD flags = INTERNET_FLAG_RELOAD | INTERNET_FLAG_NO_CACHE_WRITE | INTERNET_FLAG_NO_UI |
                          INTERNET_FLAG_NO_COOKIES | (request.secure ? INTERNET_FLAG_SECURE : 0);
            opened =
                ::HttpOpenRequestA(connection.get(), "GET", request.path.c_str(), nullptr, nullptr, nullptr, flags, 0);
        }
        if (opened == nullptr) {
            sendFailure = ::GetLastError();
            return false;
        }
        {
            std::lock_guard<std::mutex> lock(shared->mutex);
            if (shared->stop) return false;  // cancelled before the request went out
        }
        header.assign(4096, '\0');
        DWORD length = static_cast<DWORD>(header.size());
        BOOL ok = ::HttpSendRequestA(opened, request.headers.c_str(), static_cast<DWORD>(request.headers.size()),
                                     nullptr, 0) &&
                  ::HttpQueryInfoA(opened, HTTP_QUERY_RAW_HEADERS_CRLF, header.data(), &length, nullptr);
        if (!ok && ::GetLastError() == ERROR_INSUFFICIENT_BUFFER) {
            header.resize(length + 1);
            ok = ::HttpQueryInfoA(opened, HTTP_QUERY_RAW_HEADERS_CRLF, header.data(), &length, nullptr);
        }
        sendFailure = ok ? 0 : ::GetLastError();
        header.resize(ok ? length : 0);
        return ok != FALSE;
    };
    // A status line without a single field is what WinINet makes of bytes that an earlier answer left
    // unread on a kept-alive connection (it takes them for an answer of HTTP/0.9 and does not keep
    // that connection): the request goes once more, on another connection.
    const auto statusLineOnly = [&] { return header.find("\r\n") + 4 == header.size(); };
    bool sent = send();
    if (sent && statusLineOnly()) sent = send();

    if (!sent) {
        if (sendFailure != 0) fail(sendFailure);
    } else {
        shared->Publish([&] {
            shared->header = header;
            shared->stage = Shared::Stage::Answered;
        });
        // The body: whatever each read brings goes to the window thread at once, a few blocks'
        // worth ahead of it at most. A read returns only once its buffer is full or the body
        // has ended, so while the data comes slowly the worker asks for no more than has
        // arrived (waiting until something has): a slow server's bytes reach the window thread
        // as they come. Once a whole block arrives within kWholeBlockMs, whole blocks are read
        // (one call each, the fast path); a block that takes longer goes back to the careful way.
        LARGE_INTEGER frequency, now;
        ::QueryPerformanceFrequency(&frequency);
        auto Ms = [&] {
            ::QueryPerformanceCounter(&now);
            return static_cast<double>(now.QuadPart) * 1000.0 / static_cast<double>(frequency.QuadPart);
        };
        bool whole = false;
        double measureFrom = Ms();
        std::size_t measured = 0;
        for (;;) {
            {
                std::unique_lock<std::mutex> lock(shared->mutex);
                shared->room.wait(lock, [&] { return shared->stop || shared->queued < kBlocksAhead * blockSize; });
                if (shared->stop) break;
            }
            DWORD ask = static_cast<DWORD>(blockSize), available = 0, read = 0, failure = 0;
            if (!whole && ::InternetQueryDataAvailable(opened, &available, 0, 0) && available > 0 && available < ask)
                ask = available;
            std::string block(ask, '\0');
            double before = Ms();
            if (!::InternetReadFile(opened, block.data(), ask, &read)) {
                failure = ::GetLastError();
                read = 0;
            }
            block.resize(read);
            double after = Ms();
            if (whole) {
                whole = after - before <= kWholeBlockMs;
                measureFrom = after;
                measured = 0;
            } else if ((measured += read, after - measureFrom >= kMeasureMs)) {
                whole = static_cast<double>(measured) * kWholeBlockMs >=
                        static_cast<double>(blockSize) * (after - measureFrom);
                measureFrom = after;
                measured = 0;
            }
            const bool ended = failure != 0 || read == 0;
            platform::TransferError error = failure != 0 ? InternetError(failure) : platform::TransferError{};
            shared->Publish([&] {
                shared->queued += block.size();
                if (!block.empty()) shared->blocks.push_back(std::move(block));
                if (failure != 0) {
                    shared->bodyFailed = true;
                    shared->bodyError = error;
                }
                shared->bodyEnded = ended;
            });
            if (ended) break;
        }
    }
    if (opened != nullptr) ::InternetCloseHandle(opened);
    shared->Publish([&] {
        if (shared->stage == Shared::Stage::Requesting) {
            shared->stage = Shared::Stage::Failed;
            shared->error = InternetError(ERROR_INTERNET_OPERATION_CANCELLED);
        }
        shared->bodyEnded = true;
    });
}

bool WinInetTransfer::StillExecuting() {
    if (!shared_) return false;
    {
        std::lock_guard<std::mutex> lock(shared_->mutex);
        if (shared_->stage != Shared::Stage::Requesting) return false;
        shared_->waiting = true;
    }
    // A short wait keeps the caller's poll loop from spinning; a waiting message ends it at once.
    HANDLE wake = shared_->wake.get();
    ::MsgWaitForMultipleObjectsEx(1, &wake, 10, QS_ALLINPUT, MWMO_INPUTAVAILABLE);
    {
        std::lock_guard<std::mutex> lock(shared_->mutex);
        shared_->waiting = false;
        if (shared_->stage != Shared::Stage::Requesting) return false;
    }
    // The caller pumps between polls: its stop test and the silence limit are asked here.
    return !GivesUp(false);
}

bool WinInetTransfer::GetHeader(std::string& header, platform::TransferError& error) {
    if (abandoned_) {
        error = failure_;
        return false;
    }
    if (!shared_) {
        header.clear();
        return true;
    }
    if (!WaitPumping([](Shared& s) { return s.stage != Shared::Stage::Requesting; }, error)) return false;
    std::lock_guard<std::mutex> lock(shared_->mutex);
    if (shared_->stage == Shared::Stage::Failed) {
        error = shared_->error;
        return false;
    }
    header = shared_->header;
    return true;
}

bool WinInetTransfer::GetHeader(const std::string& name, std::string& value, platform::TransferError& error) {
    std::string header;
    if (!GetHeader(header, error)) return false;
    value = platform::HeaderField(header, name);
    return true;
}

bool WinInetTransfer::GetChunk(std::size_t size, std::string& data, platform::TransferError& error) {
    data.clear();
    if (abandoned_) {
        error = failure_;
        return false;
    }
    if (!shared_) return true;
    {
        std::lock_guard<std::mutex> lock(shared_->mutex);
        if (shared_->stage == Shared::Stage::Failed) {
            error = shared_->error;
            return false;
        }
    }
    while (data.size() < size) {
        if (offset_ < current_.size()) {
            std::size_t take = std::min(size - data.size(), current_.size() - offset_);
            data.append(current_, offset_, take);
            offset_ += take;
            continue;
        }
        if (!WaitPumping([](Shared& s) { return !s.blocks.empty() || s.bodyEnded; }, error)) {
            data.clear();
            return false;
        }
        bool failed = false;
        {
            std::lock_guard<std::mutex> lock(shared_->mutex);
            if (!shared_->blocks.empty()) {
                current_ = std::move(shared_->blocks.front());
                shared_->blocks.pop_front();
                shared_->queued -= current_.size();
                offset_ = 0;
            } else {
                failed = shared_->bodyFailed;
                if (failed && data.empty()) error = shared_->bodyError;
            }
        }
        shared_->room.notify_one();
        if (offset_ >= current_.size()) {
            // The body has ended (or failed): what was gathered is the last chunk; a failure is
            // reported on a call of its own.
            if (failed && data.empty()) return false;
            break;
        }
    }
    return true;
}

void WinInetTransfer::Abandon(unsigned long code) {
    Release();
    abandoned_ = true;
    failure_ = InternetError(code);
}

void WinInetTransfer::Cancel() {
    Release();
    abandoned_ = false;
}

void WinInetTransfer::Release() {
    if (!shared_) return;
    {
        std::lock_guard<std::mutex> lock(shared_->mutex);
        shared_->stop = true;
    }
    shared_->room.notify_all();
    // The worker closes its handles itself once its current call returns: a close from here could
    // read out the rest of the body on the window thread (WinINet drains a connection to keep it),
    // and a handle closed behind the worker's back could be reused under it.
    shared_.reset();
    current_.clear();
    offset_ = 0;
}

}  // namespace vantorel::win32
