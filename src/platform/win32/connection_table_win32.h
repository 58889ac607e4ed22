// The IP Helper connection table: GetTcpTable and SetTcpEntry as they are.
#pragma once

#include "platform/connection_table.h"

namespace vantorel::win32 {

class Win32ConnectionTable final : public platform::ConnectionTable {
public:
    std::uint32_t GetTcpTable(void* table, std::uint32_t& size, bool order) override;
    std::uint32_t SetTcpEntry(const platform::TcpRow& row) override;
};

}  // namespace vantorel::win32
