#include "contract/registry_contract.h"

namespace vantorel::testing {

INSTANTIATE_TEST_SUITE_P(Fake, RegistryContract, ::testing::Values(RegistryMaker{"Fake", MakeContractFake}),
                         PrintMakerName);

}  // namespace vantorel::testing
