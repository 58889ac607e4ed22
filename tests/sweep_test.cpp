// The connection sweep against a scripted table: which rows are torn down and what a teardown shows
// and stores, the count's wrap, the table buffer, failed fetches and a quit mid-sweep. Real
// teardowns (and refused ones) are proved with the Linux table in tests/linux/.
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

// A sorted definitions text from address fields.
DefinitionList ListOf(std::vector<std::uint32_t> addresses) {
    std::vector<std::string> keys;
    for (auto a : addresses) keys.push_back(Key(a));
    std::sort(keys.begin(), keys.end());
    std::string text;
    for (const auto& k : keys) text += k + "\r\n";
    return DefinitionList::FromText(text);
}

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
        Row(kTcpStateDeleteTcb, Ipv4(1, 2, 3, 4)),        // already being torn down: skipped
        Row(kTcpStateEstablished, Ipv4(10, 0, 0, 200)),   // negative key, first line
        Row(platform::kTcpStateListen, 0, 0),             // listening: key 0, not listed
        Row(kTcpStateEstablished, Ipv4(4, 3, 2, 1)),      // not listed
        listed,
    };
    rig.sweep.SweepConnections();
    EXPECT_FALSE(rig.table.lastOrder) << "the table is asked for unsorted";
    ASSERT_EQ(rig.table.entries.size(), 2u);
    EXPECT_EQ(rig.table.entries[0].remoteAddr, Ipv4(10, 0, 0, 200));
    const platform::TcpRow& sent = rig.table.entries[1];
    EXPECT_EQ(std::make_tuple(sent.state, sent.localAddr, sent.localPort, sent.remoteAddr, sent.remotePort),
              std::make_tuple(kTcpStateDeleteTcb, listed.localAddr, listed.localPort, listed.remoteAddr,
                              listed.remotePort));
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

TEST(SweepConnections, CountWrapsPastTheLargestValue) {
    SweepRig rig;
    rig.list = ListOf({Ipv4(1, 2, 3, 4)});
    rig.table.rows = {Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4))};
    rig.count = INT32_MAX;
    rig.sweep.SweepConnections();
    EXPECT_EQ(rig.count, INT32_MIN);
    EXPECT_EQ(rig.view.shown, std::vector<std::int32_t>{INT32_MIN});
    EXPECT_EQ(StoredAttempts(rig.registry), "-2147483648");
}

TEST(SweepConnections, TablesLargerThanTheFirstBufferAreFetchedWhole) {
    SweepRig rig;
    rig.list = ListOf({Ipv4(1, 2, 3, 4)});
    for (std::uint32_t i = 0; i < 5000; ++i)
        rig.table.rows.push_back(Row(kTcpStateEstablished, Ipv4(127, 0, 1, 1) + i));
    rig.table.rows.push_back(Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4)));  // row 5001, beyond 1001
    EXPECT_EQ(rig.sweep.BufferBytes(), 20'024u);

    rig.sweep.SweepConnections();
    EXPECT_EQ(rig.sweep.LastSweep().rows, 5001u);
    const std::size_t grown = rig.sweep.BufferBytes();
    EXPECT_GE(grown, platform::TcpTableBytes(5001));

    // The buffer is kept: the next sweep fetches into the same room, even with a few more rows.
    for (int i = 0; i < 100; ++i) rig.table.rows.push_back(Row(kTcpStateEstablished, Ipv4(127, 0, 2, 1) + i));
    rig.sweep.SweepConnections();
    EXPECT_EQ(rig.sweep.BufferBytes(), grown);
    EXPECT_EQ(rig.sweep.LastSweep().rows, 5101u);

    // A table that outgrows every answer: the sweep gives up (it returns) examining nothing, and the
    // next sweep is normal again.
    rig.table.beforeFetch = [&] {
        std::size_t more = rig.table.rows.size();
        for (std::size_t i = 0; i < more; ++i) rig.table.rows.push_back(Row(kTcpStateEstablished, Ipv4(127, 0, 3, 1)));
    };
    rig.sweep.SweepConnections();
    EXPECT_FALSE(rig.sweep.LastSweep().fetched);
    EXPECT_EQ(rig.sweep.LastSweep().examined, 0u);
    rig.table.beforeFetch = nullptr;
    rig.sweep.SweepConnections();
    EXPECT_TRUE(rig.sweep.LastSweep().fetched);
}

TEST(SweepConnections, FailedFetchExaminesNothingAndCountsAreNeverTrustedBeyondTheBuffer) {
    SweepRig rig;
    rig.list = ListOf({Ipv4(1, 2, 3, 4)});
    rig.table.rows = {Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4))};
    rig.table.failWith = 87;
    rig.sweep.SweepConnections();
    EXPECT_FALSE(rig.sweep.LastSweep().fetched);
    EXPECT_TRUE(rig.table.entries.empty());

    // A table whose count claims more rows than the buffer holds: only the buffer's rows are read.
    rig.table.failWith = platform::kNoError;
    rig.table.overstateCount = 1'000'000;
    rig.sweep.SweepConnections();
    EXPECT_EQ(rig.sweep.LastSweep().rows, 1001u);
    EXPECT_EQ(rig.table.entries.size(), 1u);
}

TEST(SweepConnections, StopsWhenTheProgramQuitsMidSweep) {
    SweepRig rig;
    rig.list = ListOf({Ipv4(1, 2, 3, 4)});
    rig.table.rows = {Row(kTcpStateEstablished, Ipv4(5, 5, 5, 5)), Row(kTcpStateEstablished, Ipv4(1, 2, 3, 4))};
    rig.pump.onPump = [&] { rig.pump.quitting = true; };  // asked to quit while the first row waits
    rig.sweep.SweepConnections();

    EXPECT_TRUE(rig.table.entries.empty());
}

}  // namespace
}  // namespace vantorel
