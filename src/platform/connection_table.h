// The system's table of IPv4 TCP connections, as the IP Helper calls see it: fetch the table into a
// caller's buffer, and hand one row back with a new state to ask for its teardown.
#pragma once

#include <cstdint>

namespace vantorel::platform {

// One row of the table: five 32-bit fields in this order. Addresses are in network byte order (so
// read on a little-endian machine, 1.2.3.4 is 0x04030201); ports are in network order in the low
// 16 bits. The state uses the system's numbering.
struct TcpRow {
    std::uint32_t state;
    std::uint32_t localAddr;
    std::uint32_t localPort;
    std::uint32_t remoteAddr;
    std::uint32_t remotePort;
};
static_assert(sizeof(TcpRow) == 20);

inline constexpr std::uint32_t kTcpStateClosed = 1;
inline constexpr std::uint32_t kTcpStateListen = 2;
inline constexpr std::uint32_t kTcpStateSynSent = 3;
inline constexpr std::uint32_t kTcpStateSynReceived = 4;
inline constexpr std::uint32_t kTcpStateEstablished = 5;
inline constexpr std::uint32_t kTcpStateFinWait1 = 6;
inline constexpr std::uint32_t kTcpStateFinWait2 = 7;
inline constexpr std::uint32_t kTcpStateCloseWait = 8;
inline constexpr std::uint32_t kTcpStateClosing = 9;
inline constexpr std::uint32_t kTcpStateLastAck = 10;
inline constexpr std::uint32_t kTcpStateTimeWait = 11;
inline constexpr std::uint32_t kTcpStateDeleteTcb = 12;  // handed to SetTcpEntry: tear the connection down

// Results of the calls, with the system's codes.
inline constexpr std::uint32_t kNoError = 0;
inline constexpr std::uint32_t kErrorInsufficientBuffer = 122;

// Bytes of a table with room for `rows` rows: the 32-bit entry count, then the rows.
inline constexpr std::uint32_t TcpTableBytes(std::uint32_t rows) { return 4 + rows * sizeof(TcpRow); }

class ConnectionTable {
public:
    ConnectionTable() = default;
    ConnectionTable(const ConnectionTable&) = delete;
    ConnectionTable& operator=(const ConnectionTable&) = delete;
    virtual ~ConnectionTable() = default;

    // GetTcpTable: fills the `size` bytes at `table` (4-byte aligned) with the entry count and the
    // rows, in the system's order unless `order` asks for a sorted table. Returns kNoError, or
    // kErrorInsufficientBuffer with `size` set to the bytes the table needs now, or another error.
    virtual std::uint32_t GetTcpTable(void* table, std::uint32_t& size, bool order) = 0;

    // SetTcpEntry: `row` as fetched with its state set to kTcpStateDeleteTcb asks the system to tear
    // the connection down. Returns kNoError when the system accepted the request.
    virtual std::uint32_t SetTcpEntry(const TcpRow& row) = 0;
};

}  // namespace vantorel::platform
