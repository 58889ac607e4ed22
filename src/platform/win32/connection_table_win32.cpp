#include "platform/win32/connection_table_win32.h"

#include <windows.h>
#include <iphlpapi.h>

#include <cstring>

namespace vantorel::win32 {

static_assert(sizeof(MIB_TCPROW) == sizeof(platform::TcpRow), "a row is five 32-bit fields");

std::uint32_t Win32ConnectionTable::GetTcpTable(void* table, std::uint32_t& size, bool order) {
    ULONG bytes = size;
    DWORD status = ::GetTcpTable(static_cast<PMIB_TCPTABLE>(table), &bytes, order ? TRUE : FALSE);
    size = bytes;
    return status;
}

std::uint32_t Win32ConnectionTable::SetTcpEntry(const platform::TcpRow& row) {
    MIB_TCPROW entry;
    std::memcpy(&entry, &row, sizeof entry);
    return ::SetTcpEntry(&entry);
}

}  // namespace vantorel::win32
