// The IP Helper table under Wine with a real loopback connection: the row, its key and the size
// answer for a small buffer. Under Wine SetTcpEntry is a stub that answers success and closes
// nothing, so the teardown itself is proved natively with the Linux table (tests/linux/) and the
// count of the real program in tests/e2e/.
#include <winsock2.h>
#include <ws2tcpip.h>
#include <windows.h>

#include <gtest/gtest.h>

#include <cstring>
#include <tuple>
#include <vector>

#include "platform/win32/connection_table_win32.h"

namespace vantorel {
namespace {

sockaddr_in Address(const char* dotted) {
    sockaddr_in a{};
    a.sin_family = AF_INET;
    ::inet_pton(AF_INET, dotted, &a.sin_addr);
    return a;
}

TEST(Win32ConnectionTable, ListsALoopbackConnectionWithItsKeyAndTheStubClosesNothing) {
    WSADATA wsa;
    ::WSAStartup(MAKEWORD(2, 2), &wsa);
    SOCKET listener = ::socket(AF_INET, SOCK_STREAM, IPPROTO_TCP), client = ::socket(AF_INET, SOCK_STREAM, IPPROTO_TCP);
    sockaddr_in peer = Address("127.0.0.2"), from = Address("127.0.0.1");
    int length = sizeof peer;
    ASSERT_EQ(::bind(listener, reinterpret_cast<sockaddr*>(&peer), sizeof peer), 0);
    ::listen(listener, 4);
    ::getsockname(listener, reinterpret_cast<sockaddr*>(&peer), &length);
    ::bind(client, reinterpret_cast<sockaddr*>(&from), sizeof from);
    ASSERT_EQ(::connect(client, reinterpret_cast<sockaddr*>(&peer), sizeof peer), 0);
    SOCKET server = ::accept(listener, nullptr, nullptr);
    ::getsockname(client, reinterpret_cast<sockaddr*>(&from), &length);

    win32::Win32ConnectionTable table;
    std::vector<std::uint32_t> words(1 + 5);
    auto size = static_cast<std::uint32_t>(words.size() * 4);
    std::uint32_t status = table.GetTcpTable(words.data(), size, false);
    ASSERT_EQ(status, platform::kErrorInsufficientBuffer) << "three rows at least do not fit in one";
    words.assign(size / 4 + 64, 0);
    size = static_cast<std::uint32_t>(words.size() * 4);
    ASSERT_EQ(table.GetTcpTable(words.data(), size, false), platform::kNoError);
    std::vector<platform::TcpRow> rows(words[0]);
    std::memcpy(rows.data(), words.data() + 1, rows.size() * sizeof(platform::TcpRow));
    const platform::TcpRow* row = nullptr;
    for (const auto& r : rows)
        if (r.localPort == from.sin_port && r.remotePort == peer.sin_port) row = &r;
    ASSERT_NE(row, nullptr) << "the client end of the connection is listed";
    EXPECT_EQ(std::make_tuple(row->state, row->localAddr, row->remoteAddr),
              std::make_tuple(platform::kTcpStateEstablished, 0x0100007Fu, 0x0200007Fu));
    EXPECT_EQ(static_cast<std::int32_t>(row->remoteAddr), 33554559) << "the key of 127.0.0.2";

    platform::TcpRow teardown = *row;
    teardown.state = platform::kTcpStateDeleteTcb;
    EXPECT_EQ(table.SetTcpEntry(teardown), platform::kNoError);
    char byte = 0;
    EXPECT_EQ(::send(client, "x", 1, 0), 1) << "the connection still carries data";
    EXPECT_EQ(::recv(server, &byte, 1, 0), 1);
    for (SOCKET s : {client, server, listener}) ::closesocket(s);
    ::WSACleanup();
}

}  // namespace
}  // namespace vantorel
