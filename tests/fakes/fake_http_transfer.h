// An HTTP transfer that answers from a script: the response header, the body and how it is cut
// into chunks, failures of each call, and a log of what the downloader asked.
#pragma once

#include <deque>
#include <map>
#include <utility>
#include <optional>
#include <string>
#include <vector>

#include "platform/http_header.h"
#include "platform/http_transfer.h"

namespace vantorel::testing {

// Files on a pretend web server, shared by every transfer that points at it: a full address maps
// to a whole response. Unknown addresses answer 404 with an error page; an unreachable server fails
// every request as a refused connection would.
struct FakeWebServer {
    std::map<std::string, std::pair<std::string, std::string>> responses;  // address -> header, body
    bool reachable = true;
    std::vector<std::string> requests;

    void PutFile(const std::string& address, const std::string& body) {
        responses[address] = {"HTTP/1.1 200 OK\r\nContent-Length: " + std::to_string(body.size()) + "\r\n\r\n", body};
    }
};

class FakeHttpTransfer final : public platform::HttpTransfer {
public:
    // Scripting.
    FakeWebServer* server = nullptr;  // when set, answers come from it
    std::string header = "HTTP/1.1 200 OK\r\n\r\n";
    std::string body;
    std::size_t deliverOnly = std::string::npos;    // the connection ends after this many body bytes
    int pollsUntilDone = 0;                          // StillExecuting answers true this often
    std::optional<platform::TransferError> executeFails, headerFails, lengthFails, chunkFails;
    std::size_t chunkFailsAt = 0;                    // GetChunk fails once this many bytes were handed out
    std::vector<std::size_t> chunkScript;            // at most these sizes from the first chunks on

    // What happened.
    std::string url, userName, password, requestHeader;
    int executes = 0, polls = 0, chunkCalls = 0, cancels = 0;
    std::vector<std::size_t> chunkSizesAsked;

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
        ++executes;
        requestHeader = headerToSend;
        position_ = 0;
        scripted_ = 0;
        pollsLeft_ = pollsUntilDone;
        if (server != nullptr) {
            server->requests.push_back(url);
            auto it = server->responses.find(url);
            header = it != server->responses.end() ? it->second.first
                                                   : "HTTP/1.1 404 Not Found\r\nContent-Length: 22\r\n\r\n";
            body = it != server->responses.end() ? it->second.second : "<html>Not Found</html>";
            if (!server->reachable) headerFails = platform::TransferError{12029, "The attempt to connect to the server failed."};
        }
        if (executeFails) {
            error = *executeFails;
            return false;
        }
        return true;
    }
    bool StillExecuting() override {
        ++polls;
        return pollsLeft_-- > 0;
    }
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
        ++chunkCalls;
        chunkSizesAsked.push_back(size);
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
    void Cancel() override { ++cancels; }

private:
    std::size_t position_ = 0;
    std::size_t scripted_ = 0;
    int pollsLeft_ = 0;
};

}  // namespace vantorel::testing
