// The IP Helper table under Wine with a real loopback connection: the row and its key, the size
// answer for a small buffer, and the sweep up to the teardown request. Under Wine SetTcpEntry is a
// stub: it answers success and closes nothing, so here the connection stays open after the sweep;
// the native tests prove the teardown itself with the Linux table.
#include <winsock2.h>
#include <ws2tcpip.h>
#include <windows.h>

#include <gtest/gtest.h>

#include <memory>
#include <vector>

#include "fakes/fake_guard_platform.h"
#include "fakes/fake_registry.h"
#include "guard/sweep.h"
#include "platform/win32/connection_table_win32.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;

struct Winsock {
    Winsock() {
        WSADATA data;
        ::WSAStartup(MAKEWORD(2, 2), &data);
    }
    ~Winsock() { ::WSACleanup(); }
};

struct Socket {
    SOCKET s = INVALID_SOCKET;
    Socket() = default;
    explicit Socket(SOCKET v) : s(v) {}
    ~Socket() {
        if (s != INVALID_SOCKET) ::closesocket(s);
    }
};

sockaddr_in Address(const char* dotted, u_short port) {
    sockaddr_in a{};
    a.sin_family = AF_INET;
    ::inet_pton(AF_INET, dotted, &a.sin_addr);
    a.sin_port = htons(port);
    return a;
}

// A connection from 127.0.0.1 to a listener on `peer`.
struct LoopbackConnection {
    Socket listener, client, server;
    u_short serverPort = 0, clientPort = 0;
    explicit LoopbackConnection(const char* peer) {
        listener.s = ::socket(AF_INET, SOCK_STREAM, IPPROTO_TCP);
        sockaddr_in local = Address(peer, 0);
        if (::bind(listener.s, reinterpret_cast<sockaddr*>(&local), sizeof local) != 0) return;
        ::listen(listener.s, 4);
        int length = sizeof local;
        ::getsockname(listener.s, reinterpret_cast<sockaddr*>(&local), &length);
        serverPort = ntohs(local.sin_port);
        client.s = ::socket(AF_INET, SOCK_STREAM, IPPROTO_TCP);
        sockaddr_in from = Address("127.0.0.1", 0);
        ::bind(client.s, reinterpret_cast<sockaddr*>(&from), sizeof from);
        if (::connect(client.s, reinterpret_cast<sockaddr*>(&local), sizeof local) != 0) return;
        server.s = ::accept(listener.s, nullptr, nullptr);
        length = sizeof from;
        ::getsockname(client.s, reinterpret_cast<sockaddr*>(&from), &length);
        clientPort = ntohs(from.sin_port);
    }
    bool Ok() const { return server.s != INVALID_SOCKET && clientPort != 0; }
};

std::vector<platform::TcpRow> FetchAll(platform::ConnectionTable& table) {
    std::uint32_t size = 4;
    std::vector<std::uint32_t> words(1);
    std::uint32_t status = table.GetTcpTable(words.data(), size, false);
    for (int i = 0; i < 4 && status == platform::kErrorInsufficientBuffer; ++i) {
        words.assign(size / 4 + 64, 0);
        size = static_cast<std::uint32_t>(words.size() * 4);
        status = table.GetTcpTable(words.data(), size, false);
    }
    EXPECT_EQ(status, platform::kNoError);
    std::vector<platform::TcpRow> rows(words[0]);
    std::memcpy(rows.data(), words.data() + 1, rows.size() * sizeof(platform::TcpRow));
    return rows;
}

TEST(Win32ConnectionTable, ListsALoopbackConnectionWithItsKey) {
    Winsock winsock;
    LoopbackConnection connection("127.0.0.2");
    ASSERT_TRUE(connection.Ok());
    win32::Win32ConnectionTable table;

    // A buffer too small for the table: the size it needs.
    std::uint32_t words[1 + 5] = {};
    std::uint32_t size = sizeof words;
    std::uint32_t status = table.GetTcpTable(words, size, false);
    if (status == platform::kErrorInsufficientBuffer) {
        EXPECT_GT(size, sizeof words);
    }

    std::vector<platform::TcpRow> rows = FetchAll(table);
    const platform::TcpRow* client = nullptr;
    for (const auto& row : rows)
        if (row.localPort == htons(connection.clientPort) && row.remotePort == htons(connection.serverPort)) client = &row;
    ASSERT_NE(client, nullptr) << "the client end of the connection is listed";
    EXPECT_EQ(client->state, platform::kTcpStateEstablished);
    EXPECT_EQ(client->localAddr, 0x0100007Fu);
    EXPECT_EQ(client->remoteAddr, 0x0200007Fu);
    EXPECT_EQ(static_cast<std::int32_t>(client->remoteAddr), 33554559) << "the key of 127.0.0.2";
}

TEST(Win32ConnectionTable, SweepRequestsTheTeardownOfAListedConnection) {
    Winsock winsock;
    LoopbackConnection connection("127.0.0.2");
    ASSERT_TRUE(connection.Ok());

    // The real table, noting what SetTcpEntry was asked and answered.
    class Noting final : public platform::ConnectionTable {
    public:
        std::uint32_t GetTcpTable(void* t, std::uint32_t& s, bool o) override { return real.GetTcpTable(t, s, o); }
        std::uint32_t SetTcpEntry(const platform::TcpRow& row) override {
            std::uint32_t status = real.SetTcpEntry(row);
            if (row.localPort == htons(port)) answers.push_back(status);
            return status;
        }
        win32::Win32ConnectionTable real;
        u_short port = 0;
        std::vector<std::uint32_t> answers;
    } table;
    table.port = connection.clientPort;

    FakePump pump;
    FakeRegistry registry;
    FakeGuardView view;
    DefinitionList list = DefinitionList::FromText("33554559");
    std::int32_t count = 0;
    ConnectionSweep sweep(SweepServices{table, pump, registry, view}, list, count);
    sweep.SweepConnections();
    ASSERT_EQ(table.answers.size(), 1u) << "one request for our connection";
    EXPECT_EQ(table.answers[0], 0u) << "Wine's SetTcpEntry answers success";
    EXPECT_GE(count, 1);
    EXPECT_EQ(view.shown.back(), count);
    // Wine closed nothing: the connection still carries data.
    EXPECT_EQ(::send(connection.client.s, "x", 1, 0), 1);
    char byte = 0;
    EXPECT_EQ(::recv(connection.server.s, &byte, 1, 0), 1);
}

TEST(Win32ConnectionTable, SweepGrowsItsBufferForMoreThan1001Rows) {
    Winsock winsock;
    // 600 connections to an unlisted peer give 1,200 rows or more, then one listed connection.
    std::vector<std::unique_ptr<LoopbackConnection>> background;
    for (int i = 0; i < 600; ++i) {
        background.push_back(std::make_unique<LoopbackConnection>("127.0.0.3"));
        ASSERT_TRUE(background.back()->Ok()) << i;
    }
    LoopbackConnection listed("127.0.0.2");
    ASSERT_TRUE(listed.Ok());

    win32::Win32ConnectionTable table;
    FakePump pump;
    FakeRegistry registry;
    FakeGuardView view;
    DefinitionList list = DefinitionList::FromText("33554559");
    std::int32_t count = 0;
    ConnectionSweep sweep(SweepServices{table, pump, registry, view}, list, count);
    sweep.SweepConnections();
    EXPECT_TRUE(sweep.LastSweep().fetched);
    EXPECT_GE(sweep.LastSweep().rows, 1200u);
    EXPECT_GE(sweep.LastSweep().fetchCalls, 2) << "the first buffer was too small and the system said so";
    EXPECT_GE(sweep.LastSweep().requested, 1u) << "the listed connection beyond row 1001 was reached";
    EXPECT_GT(sweep.BufferBytes(), 20'024u);
}

}  // namespace
}  // namespace vantorel
