// An HTTP transfer that answers from a script: the response header, the body and how it is cut
// into chunks, and failures of each call.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/http_header.h"
#include "platform/http_transfer.h"

namespace vantorel::testing {

class FakeHttpTransfer final : public platform::HttpTransfer {
public:
    std::string header = "HTTP/1.1 200 OK\r\n\r\n";
    std::string body;
    std::optional<platform::TransferError> executeFails, headerFails, lengthFails, chunkFails;
    std::size_t chunkFailsAt = 0;                 // GetChunk fails once this many bytes were handed out
    std::vector<std::size_t> chunkScript;         // at most these sizes from the first chunks on
    std::size_t deliverOnly = std::string::npos;  // the connection ends after this many body bytes

    // The body of every test download, as the loopback test server sends it too.
    static std::string Body(std::size_t size) {
        std::string data(size, '\0');
        for (std::size_t i = 0; i < size; ++i) data[i] = static_cast<char>((i * 7 + i / 251) & 0xFF);
        return data;
    }

    void SetURL(const std::string& value) override { url_ = value; }
    std::string URL() const override { return url_; }
    void SetUserName(const std::string&) override {}
    void SetPassword(const std::string&) override {}

    bool ExecuteGet(const std::string&, platform::TransferError& error) override {
        position_ = 0;
        scripted_ = 0;
        return Succeeds(executeFails, error);
    }
    bool StillExecuting() override { return false; }
    bool GetHeader(std::string& value, platform::TransferError& error) override {
        value = header;
        return Succeeds(headerFails, error);
    }
    bool GetHeader(const std::string& name, std::string& value, platform::TransferError& error) override {
        value = platform::HeaderField(header, name);
        return Succeeds(lengthFails, error);
    }
    bool GetChunk(std::size_t size, std::string& data, platform::TransferError& error) override {
        if (position_ >= chunkFailsAt && !Succeeds(chunkFails, error)) return false;
        std::size_t end = std::min(body.size(), deliverOnly);
        if (scripted_ < chunkScript.size()) size = std::min(size, chunkScript[scripted_++]);
        std::size_t take = position_ < end ? std::min(size, end - position_) : 0;
        data = body.substr(position_, take);
        position_ += take;
        return true;
    }
    void Cancel() override {}

private:
    static bool Succeeds(const std::optional<platform::TransferError>& failure, platform::TransferError& error) {
        if (failure) error = *failure;
        return !failure;
    }

    std::string url_;
    std::size_t position_ = 0;
    std::size_t scripted_ = 0;
};

}  // namespace vantorel::testing
