#include "platform/win32/http_transfer_win32.h"

#include <windows.h>
#include <wininet.h>

#include <functional>
#include <utility>

#include "platform/http_header.h"
#include "platform/win32/system_message.h"

namespace vantorel::win32 {
namespace {

constexpr std::size_t kBlocksAhead = 4;

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

WinInetTransfer::WinInetTransfer(platform::MessagePump& pump, std::size_t blockSize)
    : pump_(pump), blockSize_(blockSize), wake_(::CreateEventA(nullptr, FALSE, FALSE, nullptr)) {}

WinInetTransfer::~WinInetTransfer() { Cancel(); }

void WinInetTransfer::Publish(const std::function<void()>& change) {
    {
        std::lock_guard<std::mutex> lock(mutex_);
        change();
    }
    ::SetEvent(wake_.get());
}

template <typename Ready>
void WinInetTransfer::WaitPumping(Ready ready) {
    for (;;) {
        {
            std::lock_guard<std::mutex> lock(mutex_);
            if (ready()) return;
        }
        HANDLE wake = wake_.get();
        DWORD woke = ::MsgWaitForMultipleObjectsEx(1, &wake, INFINITE, QS_ALLINPUT, MWMO_INPUTAVAILABLE);
        if (woke == WAIT_OBJECT_0 + 1) pump_.PumpMessages();
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

    {
        std::lock_guard<std::mutex> lock(mutex_);
        stage_ = Stage::Requesting;
        stop_ = bodyEnded_ = bodyFailed_ = false;
        workerDone_ = false;
        error_ = bodyError_ = {};
        header_.clear();
        blocks_.clear();
    }
    current_.clear();
    offset_ = 0;
    worker_ = std::thread(&WinInetTransfer::Work, this, std::move(request));
    return true;
}

void WinInetTransfer::Work(Request request) {
    auto fail = [this](DWORD code) {
        platform::TransferError error = InternetError(code);
        Publish([&] {
            stage_ = Stage::Failed;
            error_ = error;
        });
    };
    UniqueHinternet session(::InternetOpenA("Vantorel", INTERNET_OPEN_TYPE_PRECONFIG, nullptr, nullptr, 0));
    UniqueHinternet connection;
    if (session) {
        connection.reset(::InternetConnectA(session.get(), request.host.c_str(), request.port,
                                            request.userName.empty() ? nullptr : request.userName.c_str(),
                                            request.password.empty() ? nullptr : request.password.c_str(),
                                            INTERNET_SERVICE_HTTP, 0, 0));
    }
    if (!connection) {
        fail(::GetLastError());
    } else {
        DWORD flags = INTERNET_FLAG_RELOAD | INTERNET_FLAG_NO_CACHE_WRITE | INTERNET_FLAG_NO_UI |
                      INTERNET_FLAG_NO_COOKIES | (request.secure ? INTERNET_FLAG_SECURE : 0);
        HINTERNET opened = ::HttpOpenRequestA(connection.get(), "GET", request.path.c_str(), nullptr, nullptr,
                                              nullptr, flags, 0);
        bool stopped = false;
        {
            std::lock_guard<std::mutex> lock(mutex_);
            request_ = opened;
            stopped = stop_;
        }
        if (opened == nullptr) {
            fail(::GetLastError());
        } else if (!stopped) {
            if (!::HttpSendRequestA(opened, request.headers.c_str(), static_cast<DWORD>(request.headers.size()),
                                    nullptr, 0)) {
                fail(::GetLastError());
            } else {
                std::string header(4096, '\0');
                DWORD length = static_cast<DWORD>(header.size());
                BOOL ok = ::HttpQueryInfoA(opened, HTTP_QUERY_RAW_HEADERS_CRLF, header.data(), &length, nullptr);
                if (!ok && ::GetLastError() == ERROR_INSUFFICIENT_BUFFER) {
                    header.resize(length + 1);
                    ok = ::HttpQueryInfoA(opened, HTTP_QUERY_RAW_HEADERS_CRLF, header.data(), &length, nullptr);
                }
                if (!ok) {
                    fail(::GetLastError());
                } else {
                    header.resize(length);
                    Publish([&] {
                        header_ = header;
                        stage_ = Stage::Answered;
                    });
                    // The body, in blocks, a few ahead of the window thread.
                    for (;;) {
                        {
                            std::unique_lock<std::mutex> lock(mutex_);
                            roomCv_.wait(lock, [this] { return stop_ || blocks_.size() < kBlocksAhead; });
                            if (stop_) break;
                        }
                        std::string block(blockSize_, '\0');
                        std::size_t filled = 0;
                        bool ended = false;
                        DWORD failure = 0;
                        while (filled < block.size()) {
                            DWORD read = 0;
                            if (!::InternetReadFile(opened, block.data() + filled,
                                                    static_cast<DWORD>(block.size() - filled), &read)) {
                                failure = ::GetLastError();
                                break;
                            }
                            if (read == 0) {
                                ended = true;
                                break;
                            }
                            filled += read;
                        }
                        block.resize(filled);
                        platform::TransferError error = failure != 0 ? InternetError(failure) : platform::TransferError{};
                        Publish([&] {
                            if (!block.empty()) blocks_.push_back(std::move(block));
                            if (failure != 0) {
                                bodyFailed_ = true;
                                bodyError_ = error;
                            }
                            bodyEnded_ = ended || failure != 0;
                        });
                        if (ended || failure != 0) break;
                    }
                }
            }
        }
    }
    Publish([&] {
        if (request_ != nullptr) ::InternetCloseHandle(static_cast<HINTERNET>(request_));
        request_ = nullptr;
        if (stage_ == Stage::Requesting) {
            stage_ = Stage::Failed;
            error_ = InternetError(ERROR_INTERNET_OPERATION_CANCELLED);
        }
        workerDone_ = true;
    });
}

bool WinInetTransfer::StillExecuting() {
    {
        std::lock_guard<std::mutex> lock(mutex_);
        if (stage_ != Stage::Requesting) return false;
    }
    // A short wait keeps the caller's poll loop from spinning; a waiting message ends it at once.
    HANDLE wake = wake_.get();
    ::MsgWaitForMultipleObjectsEx(1, &wake, 10, QS_ALLINPUT, MWMO_INPUTAVAILABLE);
    std::lock_guard<std::mutex> lock(mutex_);
    return stage_ == Stage::Requesting;
}

bool WinInetTransfer::GetHeader(std::string& header, platform::TransferError& error) {
    WaitPumping([this] { return stage_ != Stage::Requesting; });
    std::lock_guard<std::mutex> lock(mutex_);
    if (stage_ == Stage::Failed) {
        error = error_;
        return false;
    }
    header = header_;
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
    {
        std::lock_guard<std::mutex> lock(mutex_);
        if (stage_ == Stage::Failed) {
            error = error_;
            return false;
        }
        if (stage_ == Stage::Idle) return true;
    }
    while (data.size() < size) {
        if (offset_ < current_.size()) {
            std::size_t take = std::min(size - data.size(), current_.size() - offset_);
            data.append(current_, offset_, take);
            offset_ += take;
            continue;
        }
        bool failed = false;
        WaitPumping([this] { return !blocks_.empty() || bodyEnded_; });
        {
            std::lock_guard<std::mutex> lock(mutex_);
            if (!blocks_.empty()) {
                current_ = std::move(blocks_.front());
                blocks_.pop_front();
                offset_ = 0;
            } else {
                failed = bodyFailed_;
                if (failed && data.empty()) error = bodyError_;
            }
        }
        roomCv_.notify_one();
        if (offset_ >= current_.size()) {
            // The body has ended (or failed): what was gathered is the last chunk; a failure is
            // reported on its own call.
            if (failed && data.empty()) return false;
            break;
        }
    }
    return true;
}

void WinInetTransfer::Cancel() {
    if (!worker_.joinable()) return;
    void* request = nullptr;
    {
        std::lock_guard<std::mutex> lock(mutex_);
        stop_ = true;
        std::swap(request, request_);
    }
    roomCv_.notify_all();
    // Closing the request handle ends a blocking call on it in the worker.
    if (request != nullptr) ::InternetCloseHandle(static_cast<HINTERNET>(request));
    WaitPumping([this] { return workerDone_; });
    worker_.join();
    std::lock_guard<std::mutex> lock(mutex_);
    stage_ = Stage::Idle;
    blocks_.clear();
    current_.clear();
    offset_ = 0;
}

}  // namespace vantorel::win32
