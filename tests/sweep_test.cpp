// The connection sweep against a scripted table, for what the real table (tests/linux/) cannot stage:
// rows already being deleted, the count's wrap, a table that outgrows every answer, failed fetches
// and a quit mid-sweep.
#include "guard/sweep.h"

#include <gtest/gtest.h>

#include <climits>
#include <tuple>

#include "fakes/fake_guard_platform.h"
#include "fakes/fake_registry.h"
#include "guard/attempts.h"
#include "settings/registry_routines.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;
using platform::kTcpStateDeleteTcb;
using platform::kTcpStateEstablished;

std::string Key(std::uint32_t address) { return std::to_string(static_cast<std::int32_t>(address)); }

std::string StoredAttempts(FakeRegistry& registry) {
    RegistryRoutines reg(registry);
    reg.hkey(platform::kHkeyCurrentUser);
    reg.KeyRoot("SOFTWARE\\Vantorel\\");
    return VariantText(reg.GetRegistryValue("Attempts", std::string("<missing>")));
}

struct SweepRig {
    FakeConnectionTable table;
    FakePump pump;
    FakeRegistry registry;
    FakeGuardView view;
    DefinitionList list;
    std::int32_t count = 0;
    ConnectionSweep sweep{SweepServices{table, pump, registry, view}, list, count};
};

TEST(SweepConnections, WhichRowsAreListedAndWhatOneTeardownLeaves) {
    SweepRig rig;
    // The first line of the file is a listed address like any other; 10.0.0.200 has a negative key.
    rig.list = DefinitionList::FromText(Key(Ipv4(10, 0, 0, 200)) + "\n" + Key(Ipv4(1, 2, 3, 4)) + "\n" +
                                        Key(Ipv4(8, 8, 4, 4)));
    ASSERT_EQ(Key(Ipv4(10, 0, 0, 200)), "-939524086");
    platform::TcpRow listed = Row(platform::kTcpStateSynSent, Ipv4(8, 8, 4, 4), 0xBB01);
    rig.table.rows = {
        Row(kTcpStateDeleteTcb, Ipv4(1, 2, 3, 4)),       // already being torn down: skipped
        Row(kTcpStateEstablished, Ipv4(10, 0, 0, 200)),  // negative key, first line
        Row(platform::kTcpStateListen, 0, 0),            // listening: key 0, not listed
        Row(kTcpStateEstablished, Ipv4(4, 3, 2, 1)),     // not listed
        listed,
    };
    rig.sweep.SweepConnections();
    ASSERT_EQ(rig.table.entries.size(), 2u);
    EXPECT_EQ(rig.table.entries[0].remoteAddr, Ipv4(10, 0, 0, 200));
    const platform::TcpRow& sent = rig.table.entries[1];
    EXPECT_EQ(
        std::make_tuple(sent.state, sent.localAddr, sent.localPort, sent.remoteAddr, sent.remotePort),
        std::make_tuple(kTcpStateDeleteTcb, listed.localAddr, listed.localPort, listed.remoteAddr, listed.remotePort));
    EXPECT_EQ(rig.count, 2);
    EXPECT_EQ(rig.view.shown, (std::vector<std::int32_t>{1, 2})) << "each teardown is shown at once";
    EXPECT_EQ(StoredAttempts(rig.registry), "2") << "the key is created when missing";

    // A listening row's key is 0: only a list holding "0" reaches it.
    SweepRig zero;
    zero.list = DefinitionList::FromText("0\n5");
    zero.table.rows = {Row(platform::kTcpStateListen, 0, 0)};
    zero.sweep.SweepConnections();
    EXPECT_EQ(zero.table.entries.size(), 1u);
}

TEST(SweepConnections, CountWrapsPastTheLargestValueAndAQuitMidSweepStopsIt) {
    SweepRig rig;
    rig.list = ListOf({Ipv4(1, 2, 3, 4)});
    rig.table.rows = {Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4))};
    rig.count = INT32_MAX;
    rig.sweep.SweepConnections();
    EXPECT_EQ(rig.view.shown, std::vector<std::int32_t>{INT32_MIN});
    EXPECT_EQ(StoredAttempts(rig.registry), "-2147483648");

    rig.table.rows.insert(rig.table.rows.begin(), Row(kTcpStateEstablished, Ipv4(5, 5, 5, 5)));
    rig.pump.onPump = [&] { rig.pump.quitting = true; };  // asked to quit while the first row waits
    rig.sweep.SweepConnections();
    EXPECT_EQ(rig.table.entries.size(), 1u);
}

TEST(SweepConnections, TheGrownBufferIsKeptAndFailedOrOverstatedFetchesReadNothingBeyondIt) {
    SweepRig rig;
    rig.list = ListOf({Ipv4(1, 2, 3, 4)});
    for (std::uint32_t i = 0; i < 5000; ++i)
        rig.table.rows.push_back(Row(kTcpStateEstablished, Ipv4(127, 0, 1, 1) + i));
    EXPECT_EQ(rig.sweep.BufferBytes(), 20'024u);
    rig.sweep.SweepConnections();
    const std::size_t grown = rig.sweep.BufferBytes();
    for (int i = 0; i < 100; ++i) rig.table.rows.push_back(Row(kTcpStateEstablished, Ipv4(127, 0, 2, 1) + i));
    rig.sweep.SweepConnections();
    EXPECT_EQ(std::make_pair(rig.sweep.BufferBytes(), rig.sweep.LastSweep().rows), std::make_pair(grown, 5100u));

    // A table that outgrows every answer, or a failed fetch: nothing examined; the next sweep is normal.
    rig.table.beforeFetch = [&] { rig.table.rows.resize(rig.table.rows.size() * 2, rig.table.rows[0]); };
    rig.sweep.SweepConnections();
    EXPECT_EQ(std::make_pair(rig.sweep.LastSweep().fetched, rig.sweep.LastSweep().examined), std::make_pair(false, 0u));
    rig.table.beforeFetch = nullptr;
    rig.table.rows = {Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4))};
    rig.table.failWith = 87;
    rig.sweep.SweepConnections();
    EXPECT_FALSE(rig.sweep.LastSweep().fetched);
    EXPECT_TRUE(rig.table.entries.empty());

    // A count that claims more rows than the buffer holds: only the buffer's rows are read.
    SweepRig overstated;
    overstated.list = ListOf({Ipv4(1, 2, 3, 4)});
    overstated.table.rows = {Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4))};
    overstated.table.overstateCount = 1'000'000;
    overstated.sweep.SweepConnections();
    EXPECT_EQ(overstated.sweep.LastSweep().rows, 1001u);
    EXPECT_EQ(overstated.table.entries.size(), 1u);
}

}  // namespace
}  // namespace vantorel
