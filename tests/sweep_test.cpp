// The connection sweep against a scripted table, for what the real table (tests/linux/) cannot stage:
// rows already being deleted, a listed key 0, a quit mid-sweep, and fetches that fail, overstate
// their count or never fit.
#include "guard/sweep.h"

#include <gtest/gtest.h>

#include <tuple>

#include "fakes/fake_guard_platform.h"
#include "fakes/fake_registry.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;
using platform::kTcpStateDeleteTcb;
using platform::kTcpStateEstablished;

// 1.2.3.4 is listed.
struct SweepRig {
    FakeConnectionTable table;
    FakePump pump;
    FakeRegistry registry;
    FakeGuardView view;
    DefinitionList list = ListOf({Ipv4(1, 2, 3, 4)});
    std::int32_t count = 0;
    ConnectionSweep sweep{SweepServices{table, pump, registry, view}, list, count};
};

TEST(SweepConnections, RowsBeingDeletedAreSkippedAListedKeyZeroReachesListeningRowsAndAQuitStopsIt) {
    SweepRig rig;
    rig.list = ListOf({Ipv4(1, 2, 3, 4), 0});
    rig.table.rows = {
        Row(kTcpStateDeleteTcb, Ipv4(1, 2, 3, 4)),    // already being torn down: skipped
        Row(platform::kTcpStateListen, 0, 0),         // listening: key 0
        Row(kTcpStateEstablished, Ipv4(4, 3, 2, 1)),  // not listed
        Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4)),
    };
    rig.sweep.SweepConnections();
    ASSERT_EQ(rig.table.entries.size(), 2u);
    EXPECT_EQ(std::make_pair(rig.table.entries[0].remoteAddr, rig.table.entries[1].remoteAddr),
              std::make_pair(0u, Ipv4(1, 2, 3, 4)));

    rig.pump.onPump = [&] { rig.pump.quitting = true; };  // asked to quit while the first row waits
    rig.sweep.SweepConnections();
    EXPECT_EQ(rig.table.entries.size(), 2u);
}

TEST(SweepConnections, OverstatedFailedOrNeverFittingFetchesReadNothingBeyondTheBuffer) {
    SweepRig rig;
    const platform::TcpRow listed = Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4));
    rig.table.rows = {listed};
    rig.table.overstateCount = 1'000'000;  // only the buffer's rows are read
    rig.sweep.SweepConnections();
    const SweepResult& last = rig.sweep.LastSweep();
    EXPECT_EQ(std::make_pair(last.rows, rig.table.entries.size()), std::make_pair(1001u, std::size_t{1}));

    rig.table.failWith = 87;
    rig.sweep.SweepConnections();
    EXPECT_FALSE(last.fetched);

    // A table that doubles before every fetch: given up after four.
    rig.table.failWith = platform::kNoError;
    rig.table.rows.assign(1000, listed);
    rig.table.beforeFetch = [&] { rig.table.rows.resize(rig.table.rows.size() * 2, listed); };
    rig.sweep.SweepConnections();
    EXPECT_EQ(std::make_tuple(last.fetched, last.fetchCalls, rig.table.entries.size()),
              std::make_tuple(false, 4, std::size_t{1}));
}

}  // namespace
}  // namespace vantorel
