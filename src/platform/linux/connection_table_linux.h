// The connection table on Linux, laid out like the Windows table: a NETLINK_SOCK_DIAG dump of the
// IPv4 TCP sockets, and teardown with SOCK_DESTROY (which needs CAP_NET_ADMIN and a kernel built
// with INET_DIAG_DESTROY). It lets the real sweep tear real connections down in native tests and
// benchmarks; the product on Windows uses the IP Helper table.
//
// Rows carry the system's address and port fields as they are (network order), states mapped to
// the Windows numbering. The table is bound to the network namespace it was created in.
#pragma once

#include <linux/inet_diag.h>

#include <cstdint>
#include <vector>

#include "platform/connection_table.h"

namespace vantorel::linux_platform {

class LinuxConnectionTable final : public platform::ConnectionTable {
public:
    LinuxConnectionTable();
    ~LinuxConnectionTable() override;

    // False when the netlink socket could not be opened; every call then fails.
    bool Ok() const { return fd_ >= 0; }

    // Dumps the table. kErrorInsufficientBuffer with the bytes needed when it does not fit.
    std::uint32_t GetTcpTable(void* table, std::uint32_t& size, bool order) override;

    // Only state 12 (delete) is accepted; the socket is found among the last dump's rows (its
    // cookie included) or, failing that, by its addresses and ports. Returns 0 when the kernel
    // aborted the connection, 5 when it refused for want of rights, 1168 when no such socket
    // exists, 87 for another state, 31 for any other failure.
    std::uint32_t SetTcpEntry(const platform::TcpRow& row) override;

    // The Windows state number of a Linux TCP state.
    static std::uint32_t WindowsState(std::uint8_t linuxState);

private:
    bool Dump();

    int fd_ = -1;
    std::uint32_t sequence_ = 0;
    std::vector<char> receive_;
    std::vector<platform::TcpRow> rows_;  // the last dump
    std::vector<inet_diag_sockid> ids_;   // the sockets of those rows
    std::vector<std::uint32_t> order_;    // scratch for a sorted table
};

}  // namespace vantorel::linux_platform
