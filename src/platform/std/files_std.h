// Files through the C++ standard library: the native build's implementation.
#pragma once

#include "platform/files.h"

namespace vantorel::platform {

class StdFiles final : public Files {
public:
    bool Exists(const std::string& path) override;
    bool ReadAll(const std::string& path, std::string& content) override;
};

}  // namespace vantorel::platform
