#include "contract/file_system_contract.h"

namespace vantorel::testing {

INSTANTIATE_TEST_SUITE_P(Fake, FileSystemContract, ::testing::Values(FileSystemMaker{"Fake", MakeFakeFileSystem}),
                         [](const auto& info) { return info.param.name; });

}  // namespace vantorel::testing
