// The connection sweep: the guard's working step, run on every tick of the sweep timer.
//
// A sweep fetches the system's TCP connection table, looks every row's remote address up in the
// definitions, and asks the system to tear down each listed connection that is not already being
// torn down. A teardown the system accepts counts as one attempt intercepted: the count is stored
// ("Attempts") and shown at once through the guard's view. The sweep lets pending
// window messages run before every row, so the window stays responsive while it works.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "guard/definitions.h"
#include "guard/guard_view.h"
#include "platform/connection_table.h"
#include "platform/message_pump.h"
#include "platform/registry.h"

namespace vantorel {

// Room for this many rows from the start; the buffer grows when the system asks for more.
inline constexpr std::uint32_t kInitialTableRows = 1001;
// Fetches per sweep: a table that grows between the size answer and the next fetch gets a few more
// tries, never an endless loop.
inline constexpr int kFetchAttempts = 4;
// The largest table the sweep will make room for (far beyond any real machine).
inline constexpr std::uint32_t kMaxTableRows = 4'000'000;

struct SweepServices {
    platform::ConnectionTable& table;
    platform::MessagePump& pump;
    platform::Registry& registry;
    GuardView& view;
};

// What one sweep did.
struct SweepResult {
    bool fetched = false;           // the table was read
    int fetchCalls = 0;             // GetTcpTable calls made
    std::uint32_t rows = 0;         // rows in the table
    std::uint32_t examined = 0;     // rows looked at (fewer when the program quits mid-sweep)
    std::uint32_t requested = 0;    // teardowns asked for
    std::uint32_t intercepted = 0;  // teardowns the system accepted (each one counted)
};

class ConnectionSweep {
public:
    // `definitions` is the list looked up; `count` the count of attempts intercepted, owned by the
    // caller and grown here.
    ConnectionSweep(SweepServices services, const DefinitionList& definitions, std::int32_t& count);

    // One run over the table. A run started while an earlier one is held in its yield (a modal
    // window or message box opened by a message the yield let through, and still open) takes over:
    // the earlier run stops where it stands when its yield returns and never looks at another row,
    // so at most one run is ever at work.
    void SweepConnections();

    // A run is under way and has not been taken over.
    bool Running() const { return running_; }

    // The last sweep that ran to its end (a sweep under way is not reported until it ends).
    const SweepResult& LastSweep() const { return last_; }

    // Bytes of the table buffer kept between sweeps.
    std::size_t BufferBytes() const { return buffer_.size() * sizeof(std::uint32_t); }

private:
    // Fetches the table into the buffer, growing it when the system asks for more room. The rows in
    // the buffer, 0 when the fetch failed.
    std::uint32_t FetchTable();
    void Intercepted();

    SweepServices services_;
    const DefinitionList& definitions_;
    std::int32_t& count_;
    std::vector<std::uint32_t> buffer_;  // 32-bit words: the entry count, then the rows
    std::uint64_t runs_ = 0;             // runs started: a run that finds it changed after a yield was taken over
    bool running_ = false;
    SweepResult current_;  // the sweep under way
    SweepResult last_;
};

}  // namespace vantorel
