// The registry routines' contract on the real registry under Wine, and the same contract on the
// fake in the same run, so the two answer alike.
#include <windows.h>

#include "contract/registry_contract.h"
#include "platform/win32/registry_win32.h"

namespace vantorel::testing {

INSTANTIATE_TEST_SUITE_P(RealAndFake, RegistryContract,
                         ::testing::Values(RegistryMaker{"Win32",
                                                         [] {
                                                             ::SetEnvironmentVariableA("VTX_SHORT", "s");
                                                             ::SetEnvironmentVariableA("VTX_LONG",
                                                                                       "a rather long expansion");
                                                             return std::unique_ptr<platform::Registry>(
                                                                 std::make_unique<win32::Win32Registry>());
                                                         }},
                                           RegistryMaker{"Fake", MakeContractFake}),
                         PrintMakerName);

}  // namespace vantorel::testing
