// The registry routines' contract, run against any platform registry: the in-memory fake natively,
// the real registry under Wine. Each test works below a scratch key of its own and removes it.
#pragma once

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>

#include "platform/registry.h"

namespace vantorel::testing {

struct RegistryMaker {
    std::string name;
    // Makes the registry; also sets the environment variables VTX_SHORT = "s" and
    // VTX_LONG = "a rather long expansion" for the expansion checks.
    std::function<std::unique_ptr<platform::Registry>()> make;
};

inline void PrintTo(const RegistryMaker& maker, std::ostream* out) { *out << maker.name; }

class RegistryContract : public ::testing::TestWithParam<RegistryMaker> {
protected:
    void SetUp() override;
    void TearDown() override;
    // Removes `path` below HKEY_CURRENT_USER with everything under it.
    void DeleteTree(const std::string& path);

    std::unique_ptr<platform::Registry> registry_;
    std::string scratch_;  // "SOFTWARE\VantorelTest-<unique>", without a trailing backslash
};

// The fake, with the contract's environment variables set.
std::unique_ptr<platform::Registry> MakeContractFake();

std::string PrintMakerName(const ::testing::TestParamInfo<RegistryMaker>& info);

}  // namespace vantorel::testing
