// The real sweep against real loopback connections through the Linux connection table, in a private
// network namespace: a listed peer is aborted and counted once (the count stored, shown and wrapping
// past its largest value), unlisted ones keep working, a table beyond the first buffer is swept whole
// in a buffer kept for later sweeps, and a refused teardown counts nothing. Needs root; without it
// every test here skips and says why.
#include <gtest/gtest.h>

#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <memory>
#include <tuple>

#include "fakes/fake_guard_platform.h"
#include "fakes/fake_message_pump.h"
#include "fakes/fake_registry.h"
#include "guard/sweep.h"
#include "linux/loopback.h"
#include "platform/linux/connection_table_linux.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;
using linux_platform::LinuxConnectionTable;

// Each test enters a namespace of its own, so it sees only its own sockets; 127.0.0.200 (last byte
// 200: a negative key) is listed.
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
        sweep_ = std::make_unique<ConnectionSweep>(SweepServices{*table_, pump_, registry_, view_}, list_, count_);
    }

    std::unique_ptr<LinuxConnectionTable> table_;
    FakePump pump_;
    FakeRegistry registry_;
    FakeGuardView view_;
    DefinitionList list_ =
        DefinitionList::FromText(std::to_string(static_cast<std::int32_t>(AddressField("127.0.0.200"))));
    std::int32_t count_ = 0;
    std::unique_ptr<ConnectionSweep> sweep_;
};

TEST_F(RealTeardown, AListedPeerInATableBeyondTheFirstBufferIsAbortedAndCountedOnce) {
    ASSERT_TRUE(AllowOpenFiles(8192));
    Listener unlisted = Listen("127.0.0.3");
    Listener listed = Listen("127.0.0.200");
    std::vector<Connection> background;
    for (int i = 0; i < 1200; ++i) {
        background.push_back(Connect(unlisted));
        ASSERT_TRUE(background.back().server);
    }
    Connection toListed = Connect(listed);
    ASSERT_TRUE(toListed.server);

    count_ = INT32_MAX;  // the count wraps past the largest value
    sweep_->SweepConnections();
    const SweepResult& last = sweep_->LastSweep();
    EXPECT_EQ(std::make_tuple(last.rows, last.fetchCalls, last.requested, last.intercepted),
              std::make_tuple(2u + 2 * 1201, 2, 1u, 1u));
    EXPECT_EQ(view_.shown, (std::vector<std::int32_t>{INT32_MIN}));
    EXPECT_EQ(StoredSetting(registry_, platform::kHkeyCurrentUser, "Attempts"), "-2147483648");
    EXPECT_EQ(ReadError(toListed.client.get()), ECONNABORTED) << "the listed connection was aborted";
    EXPECT_EQ(ReadError(background.back().client.get()), EAGAIN) << "an unlisted connection is still open";

    // The aborted socket is gone from the table: a later sweep, in the buffer it kept, counts nothing more.
    sweep_->SweepConnections();
    EXPECT_EQ(std::make_tuple(last.fetchCalls, last.requested, count_), std::make_tuple(1, 0u, INT32_MIN));
}

TEST_F(RealTeardown, WithoutTheRightToTearDownNothingIsCounted) {
    Listener listed = Listen("127.0.0.200");
    Connection connection = Connect(listed);
    ASSERT_TRUE(connection.server);

    // In a child process run as nobody, as the program run without administrator rights, the kernel
    // refuses every teardown; the child reports through its exit code: 0 all as expected, else the
    // first check that failed.
    pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        if (::setuid(65534) != 0) ::_exit(10);
        count_ = 5;
        for (int i = 0; i < 3; ++i) sweep_->SweepConnections();
        ::_exit(sweep_->LastSweep().requested != 1 ? 11 : count_ != 5 ? 12 : !view_.shown.empty() ? 13 : 0);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status));
    EXPECT_EQ(WEXITSTATUS(status), 0) << "10 setuid failed, 11 no request, 12 counted, 13 shown";
    EXPECT_EQ(ReadError(connection.client.get()), EAGAIN) << "the connection is untouched";
}

}  // namespace
}  // namespace vantorel
