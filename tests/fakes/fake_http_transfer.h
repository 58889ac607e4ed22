// An HTTP transfer that answers from a script: the response header, the body and how it is cut
// into chunks, failures of each call, and a log of what the downloader asked.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/http_header.h"
#include "platform/http_transfer.h"

namespace vantorel::testing {

class FakeHttpTransfer final : public platform::HttpTransfer {
public:
    // Scripting.
    std::string header = "HTTP/1.1 200 OK\r\n\r\n";
    std::string body;
    std::optional<platform::TransferError> executeFails, headerFails, lengthFails, chunkFails;
    std::size_t chunkFailsAt = 0;                 // GetChunk fails once this many bytes were handed out
    std::vector<std::size_t> chunkScript;         // at most these sizes from the first chunks on
    std::size_t deliverOnly = std::string::npos;  // the connection ends after this many body bytes

    // What happened.
    std::string url, userName, password, requestHeader;

    // A response with the given status line and fields, and a body of `size` bytes.
    void Respond(const std::string& statusLine, const std::string& fields, std::size_t size) {
        header = statusLine + "\r\n" + fields + "\r\n";
        body = Body(size);
    }
    static std::string Body(std::size_t size) {
        std::string data(size, '\0');
        for (std::size_t i = 0; i < size; ++i) data[i] = static_cast<char>((i * 7 + i / 251) & 0xFF);
        return data;
    }

    void SetURL(const std::string& value) override { url = value; }
    std::string URL() const override { return url; }
    void SetUserName(const std::string& value) override { userName = value; }
    void SetPassword(const std::string& value) override { password = value; }

    bool ExecuteGet(const std::string& headerToSend, platform::TransferError& error) override {
        requestHeader = headerToSend;
        position_ = 0;
        scripted_ = 0;
        if (executeFails) {
            error = *executeFails;
            return false;
        }
        return true;
    }
    bool StillExecuting() override { return false; }
    bool GetHeader(std::string& value, platform::TransferError& error) override {
        if (headerFails) {
            error = *headerFails;
            return false;
        }
        value = header;
        return true;
    }
    bool GetHeader(const std::string& name, std::string& value, platform::TransferError& error) override {
        if (lengthFails) {
            error = *lengthFails;
            return false;
        }
        value = platform::HeaderField(header, name);
        return true;
    }
    bool GetChunk(std::size_t size, std::string& data, platform::TransferError& error) override {
        if (chunkFails && position_ >= chunkFailsAt) {
            error = *chunkFails;
            return false;
        }
        std::size_t end = std::min(body.size(), deliverOnly);
        if (scripted_ < chunkScript.size()) size = std::min(size, chunkScript[scripted_++]);
        std::size_t take = position_ < end ? std::min(size, end - position_) : 0;
        data = body.substr(position_, take);
        position_ += take;
        return true;
    }
    void Cancel() override {}

private:
    std::size_t position_ = 0;
    std::size_t scripted_ = 0;
};

}  // namespace vantorel::testing
