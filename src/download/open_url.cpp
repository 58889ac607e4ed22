#include "download/open_url.h"

namespace vantorel {

bool OpenURL(platform::HttpTransfer& transfer, platform::MessagePump& pump, const std::string& url, std::string& text,
             platform::TransferError& error, std::size_t limit) {
    constexpr std::size_t kChunk = 1024;
    transfer.SetURL(url);
    transfer.SetUserName("");
    transfer.SetPassword("");
    std::string header, body, chunk;
    bool ok = transfer.ExecuteGet("", error);
    if (ok) {
        while (transfer.StillExecuting()) pump.YieldToMessages();
        ok = transfer.GetHeader(header, error);
    }
    while (ok && body.size() < limit) {
        ok = transfer.GetChunk(kChunk, chunk, error);
        body += chunk;
        if (chunk.size() < kChunk) break;
    }
    transfer.Cancel();
    if (!ok) return false;
    if (body.size() > limit) body.resize(limit);
    text.swap(body);
    return true;
}

}  // namespace vantorel
