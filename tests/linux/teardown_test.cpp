// The real sweep against real loopback connections through the Linux connection table, in a private
// network namespace: listed peers are aborted and counted once, unlisted ones keep working, and the
// table's rows are laid out like the Windows table. Needs root; without it every test here skips and
// says why.
#include <gtest/gtest.h>

#include <linux/capability.h>
#include <netinet/in.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <tuple>

#include "fakes/fake_guard_platform.h"
#include "fakes/fake_registry.h"
#include "guard/sweep.h"
#include "linux/loopback.h"
#include "platform/linux/connection_table_linux.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;
using linux_platform::LinuxConnectionTable;

// Each test enters a namespace of its own, so it sees only its own sockets.
class RealTeardown : public ::testing::Test {
protected:
    void SetUp() override {
        std::string reason = TeardownUnavailableReason();
        if (!reason.empty()) GTEST_SKIP() << reason;
        std::string failed = EnterPrivateNetwork();
        if (!failed.empty())
            GTEST_SKIP() << "no private network namespace (" << failed
                         << "); the sweep would touch other people's connections";
        table_ = std::make_unique<LinuxConnectionTable>();
        ASSERT_TRUE(table_->Ok());
    }

    std::vector<platform::TcpRow> Fetch() {
        std::vector<std::uint32_t> words(1 + 5 * 4096);
        auto size = static_cast<std::uint32_t>(words.size() * 4);
        EXPECT_EQ(table_->GetTcpTable(words.data(), size, false), platform::kNoError);
        std::vector<platform::TcpRow> rows(words[0]);
        std::memcpy(rows.data(), words.data() + 1, rows.size() * sizeof(platform::TcpRow));
        return rows;
    }

    std::unique_ptr<LinuxConnectionTable> table_;
    FakePump pump_;
    FakeRegistry registry_;
    FakeGuardView view_;
};

TEST_F(RealTeardown, RowsAreLaidOutLikeTheWindowsTable) {
    Listener listener = Listen("127.0.0.3");
    ASSERT_TRUE(listener.fd);
    Connection connection = Connect(listener);
    ASSERT_TRUE(connection.client && connection.server);

    std::vector<platform::TcpRow> rows = Fetch();
    ASSERT_EQ(rows.size(), 3u) << "the listener and both ends, nothing else in this namespace";
    auto find = [&](auto predicate) { return *std::find_if(rows.begin(), rows.end(), predicate); };
    auto listening = find([](const platform::TcpRow& r) { return r.state == platform::kTcpStateListen; });
    EXPECT_EQ(std::make_tuple(listening.remoteAddr, listening.localAddr, listening.localPort),
              std::make_tuple(0u, AddressField("127.0.0.3"), std::uint32_t{htons(listener.port)}))
        << "a listening row's key is 0";
    auto client = find([&](const platform::TcpRow& r) { return r.localPort == htons(connection.clientPort); });
    EXPECT_EQ(
        std::make_tuple(client.state, client.localAddr, client.remoteAddr, client.remotePort),
        std::make_tuple(platform::kTcpStateEstablished, 0x0100007Fu, 0x0300007Fu, std::uint32_t{htons(listener.port)}))
        << "127.0.0.3 in network order, read little-endian";

    // Too small a buffer: the size needed, nothing written.
    std::vector<std::uint32_t> words(1 + 5, 77);
    std::uint32_t small = 4 + 20;
    EXPECT_EQ(table_->GetTcpTable(words.data(), small, false), platform::kErrorInsufficientBuffer);
    EXPECT_EQ(small, 4u + 3 * 20);
    EXPECT_EQ(words[0], 77u);
}

TEST_F(RealTeardown, ListedPeersAreAbortedAndCountedOnceUnlistedPeersKeepWorking) {
    Listener listed = Listen("127.0.0.2");
    Listener unlisted = Listen("127.0.0.3");
    Listener high = Listen("127.0.0.200");  // last byte 200: a negative key
    ASSERT_TRUE(listed.fd && unlisted.fd && high.fd);
    ASSERT_LT(static_cast<std::int32_t>(AddressField("127.0.0.200")), 0);
    Connection toListed = Connect(listed);
    Connection toUnlisted = Connect(unlisted);
    Connection toHigh = Connect(high);
    ASSERT_TRUE(toListed.server && toUnlisted.server && toHigh.server);

    DefinitionList list = ListOf({AddressField("127.0.0.2"), AddressField("127.0.0.200"), AddressField("192.0.2.1")});
    std::int32_t count = 0;
    ConnectionSweep sweep(SweepServices{*table_, pump_, registry_, view_}, list, count);
    sweep.SweepConnections();
    EXPECT_EQ(std::make_tuple(sweep.LastSweep().rows, sweep.LastSweep().requested, sweep.LastSweep().intercepted),
              std::make_tuple(9u, 2u, 2u));
    EXPECT_EQ(view_.shown, (std::vector<std::int32_t>{1, 2}));

    EXPECT_EQ(ReadError(toListed.client.get()), ECONNABORTED) << "the listed connection was aborted";
    EXPECT_EQ(ReadError(toHigh.client.get()), ECONNABORTED) << "a negative key is torn down too";
    EXPECT_NE(ReadError(toListed.server.get()), EAGAIN) << "the peer saw the connection end";
    EXPECT_EQ(ReadError(toUnlisted.client.get()), EAGAIN) << "the unlisted connection is still open";
    EXPECT_TRUE(Exchange(toUnlisted.client.get(), toUnlisted.server.get(), "still here"));
    EXPECT_TRUE(Exchange(toUnlisted.server.get(), toUnlisted.client.get(), "and back"));

    // The aborted sockets are gone from the table: later sweeps count nothing more.
    sweep.SweepConnections();
    sweep.SweepConnections();
    EXPECT_EQ(sweep.LastSweep().requested, 0u);
    EXPECT_EQ(count, 2);
    EXPECT_TRUE(Exchange(toUnlisted.client.get(), toUnlisted.server.get(), "after three sweeps"));
}

TEST_F(RealTeardown, TablesBeyondTheFirstBufferAreSweptWhole) {
    ASSERT_TRUE(AllowOpenFiles(8192));
    Listener unlisted = Listen("127.0.0.3");
    Listener listed = Listen("127.0.0.2");
    std::vector<Connection> background;
    for (int i = 0; i < 1200; ++i) {
        background.push_back(Connect(unlisted));
        ASSERT_TRUE(background.back().server);
    }
    Connection last = Connect(listed);  // its row comes well after row 1001
    ASSERT_TRUE(last.server);

    DefinitionList list = ListOf({AddressField("127.0.0.2")});
    std::int32_t count = 0;
    ConnectionSweep sweep(SweepServices{*table_, pump_, registry_, view_}, list, count);
    sweep.SweepConnections();
    EXPECT_EQ(std::make_tuple(sweep.LastSweep().rows, sweep.LastSweep().fetchCalls, count),
              std::make_tuple(2u * 1201 + 2, 2, 1));
    EXPECT_EQ(ReadError(last.client.get()), ECONNABORTED);
    EXPECT_EQ(ReadError(background.front().client.get()), EAGAIN);
}

TEST_F(RealTeardown, SetTcpEntryAnswersLikeTheSystem) {
    Listener listed = Listen("127.0.0.2");
    Connection connection = Connect(listed);
    ASSERT_TRUE(connection.server);
    platform::TcpRow row{platform::kTcpStateDeleteTcb, AddressField("127.0.0.1"), htons(connection.clientPort),
                         AddressField("127.0.0.2"), htons(listed.port)};
    platform::TcpRow wrongState = row;
    wrongState.state = platform::kTcpStateEstablished;
    EXPECT_EQ(table_->SetTcpEntry(wrongState), 87u) << "only the delete state is accepted";
    platform::TcpRow nobody = row;
    nobody.remotePort = htons(1);
    EXPECT_EQ(table_->SetTcpEntry(nobody), 1168u) << "no such connection";
    EXPECT_EQ(ReadError(connection.client.get()), EAGAIN);
    // Found by its addresses alone, without a dump first.
    EXPECT_EQ(table_->SetTcpEntry(row), platform::kNoError);
    EXPECT_EQ(ReadError(connection.client.get()), ECONNABORTED);
}

// Drops CAP_NET_ADMIN from the calling process, as for a program run without administrator rights.
bool DropNetAdmin() {
    __user_cap_header_struct header{_LINUX_CAPABILITY_VERSION_3, 0};
    __user_cap_data_struct data[2] = {};
    if (::syscall(SYS_capget, &header, data) != 0) return false;
    data[0].effective &= ~(1u << CAP_NET_ADMIN);
    data[0].permitted &= ~(1u << CAP_NET_ADMIN);
    return ::syscall(SYS_capset, &header, data) == 0;
}

TEST_F(RealTeardown, WithoutTheRightToTearDownNothingIsCounted) {
    Listener listed = Listen("127.0.0.2");
    Connection connection = Connect(listed);
    ASSERT_TRUE(connection.server);
    DefinitionList list = ListOf({AddressField("127.0.0.2")});

    // In a child process without CAP_NET_ADMIN the kernel refuses every teardown; the child reports
    // through its exit code: 0 all as expected, else the first check that failed.
    pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        if (!DropNetAdmin()) ::_exit(10);
        LinuxConnectionTable table;
        FakePump pump;
        FakeRegistry registry;
        FakeGuardView view;
        std::int32_t count = 5;
        ConnectionSweep sweep(SweepServices{table, pump, registry, view}, list, count);
        for (int i = 0; i < 3; ++i) sweep.SweepConnections();
        ::_exit(sweep.LastSweep().requested != 1 ? 11 : count != 5 ? 12 : !view.shown.empty() ? 13 : 0);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status));
    EXPECT_EQ(WEXITSTATUS(status), 0) << "10 capset failed, 11 no request, 12 counted, 13 shown";
    EXPECT_EQ(ReadError(connection.client.get()), EAGAIN) << "the connection is untouched";
}

}  // namespace
}  // namespace vantorel
