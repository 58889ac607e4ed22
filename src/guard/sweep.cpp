#include "guard/sweep.h"

#include <algorithm>
#include <cstring>

#include "guard/attempts.h"
#include "settings/settings.h"

namespace vantorel {

namespace {

constexpr std::size_t kWordsPerRow = sizeof(platform::TcpRow) / sizeof(std::uint32_t);

std::size_t WordsFor(std::uint32_t rows) { return 1 + static_cast<std::size_t>(rows) * kWordsPerRow; }

}  // namespace

ConnectionSweep::ConnectionSweep(SweepServices services, const DefinitionList& definitions, std::int32_t& count)
    : services_(services), definitions_(definitions), count_(count), buffer_(WordsFor(kInitialTableRows), 0) {}

std::uint32_t ConnectionSweep::FetchTable() {
    for (int attempt = 0; attempt < kFetchAttempts; ++attempt) {
        buffer_[0] = 0;
        auto size = static_cast<std::uint32_t>(BufferBytes());
        std::uint32_t status = services_.table.GetTcpTable(buffer_.data(), size, false);
        ++current_.fetchCalls;
        if (status == platform::kNoError) {
            // Never trust the count beyond the rows the buffer holds.
            auto capacity = static_cast<std::uint32_t>((buffer_.size() - 1) / kWordsPerRow);
            current_.fetched = true;
            return std::min(buffer_[0], capacity);
        }
        if (status != platform::kErrorInsufficientBuffer || size <= BufferBytes()) return 0;
        // Room for what the system asks, and an eighth more so a table still growing between the
        // two calls fits the next fetch; the buffer is kept for later sweeps.
        std::uint32_t needed = (size - 4 + sizeof(platform::TcpRow) - 1) / sizeof(platform::TcpRow);
        if (needed > kMaxTableRows) return 0;
        std::uint32_t rows = std::min(kMaxTableRows, needed + needed / 8 + 16);
        buffer_.assign(WordsFor(rows), 0);
    }
    return 0;
}

void ConnectionSweep::Intercepted() {
    count_ = NextCount(count_);
    OpenSettings(services_.registry, platform::kHkeyCurrentUser)
        .SetRegistryValue(kAttemptsValue, count_, platform::kRegSz);
    services_.view.CountIntercepted(count_);
}

void ConnectionSweep::SweepConnections() {
    const std::uint64_t run = ++runs_;
    running_ = true;
    current_ = SweepResult();
    std::uint32_t rows = FetchTable();
    current_.rows = rows;
    const auto* words = reinterpret_cast<const unsigned char*>(buffer_.data() + 1);
    for (std::uint32_t i = 0; i < rows; ++i) {
        bool carryOn = services_.pump.YieldToMessages();
        // Taken over by a newer run: the buffer and the result are that run's now.
        if (runs_ != run) return;
        if (!carryOn) break;  // the program is quitting
        ++current_.examined;
        platform::TcpRow row;
        std::memcpy(&row, words + static_cast<std::size_t>(i) * sizeof row, sizeof row);
        auto key = static_cast<std::int32_t>(row.remoteAddr);
        if (row.state == platform::kTcpStateDeleteTcb || FindDefinition(definitions_, key) == kNoDefinition) continue;
        row.state = platform::kTcpStateDeleteTcb;
        ++current_.requested;
        // Only a teardown the system accepted is an attempt intercepted: without the rights to tear
        // connections down, every sweep would otherwise count every listed row again.
        if (services_.table.SetTcpEntry(row) != platform::kNoError) continue;
        ++current_.intercepted;
        Intercepted();
    }
    last_ = current_;
    running_ = false;
}

}  // namespace vantorel
