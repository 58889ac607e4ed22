#include "download/open_url.h"

namespace vantorel {

bool OpenURL(platform::HttpTransfer& Inet, platform::MessagePump& pump, const std::string& url, std::string& text,
             platform::TransferError& error, std::size_t limit) {
    constexpr std::size_t kChunk = 1024;
    Inet.SetURL(url);
    Inet.SetUserName("");
    Inet.SetPassword("");
    std::string header, body, chunk;
    bool ok = Inet.ExecuteGet("", error);
    if (ok) {
        while (Inet.StillExecuting()) pump.YieldToMessages();
        ok = Inet.GetHeader(header, error);
    }
    while (ok && body.size() < limit) {
        ok = Inet.GetChunk(kChunk, chunk, error);
        body += chunk;
        if (chunk.size() < kChunk) break;
    }
    Inet.Cancel();
    if (!ok) return false;
    if (body.size() > limit) body.resize(limit);
    text.swap(body);
    return true;
}

}  // namespace vantorel
