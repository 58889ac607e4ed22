// Registry routines against the fake: what the real registry cannot be made to hold through the
// ANSI calls (odd stored data). Handle hygiene is checked by the fuzz target tests/fuzz/registry_values.cpp.
#include "settings/registry_routines.h"

#include <gtest/gtest.h>

#include "fakes/fake_registry.h"
#include "settings/settings.h"

namespace vantorel {
namespace {

using platform::kHkeyCurrentUser;
using testing::FakeRegistry;

TEST(RegistryRoutines, OddStoredDataNeverReadsOutOfBounds) {
    FakeRegistry registry;
    const std::string key = kSettingsKey;
    registry.PutRaw(kHkeyCurrentUser, key, "ShortDword", 4, {0x01, 0x02});
    registry.PutRaw(kHkeyCurrentUser, key, "EmptyDword", 4, {});
    registry.PutRaw(kHkeyCurrentUser, key, "EmptyText", 1, {});
    registry.PutRaw(kHkeyCurrentUser, key, "Unterminated", 1, {'a', 'b', 'c'});
    registry.PutRaw(kHkeyCurrentUser, key, "TinyMulti", 7, {'a'});
    registry.PutRaw(kHkeyCurrentUser, key, "EmptyMulti", 7, {});
    registry.PutRaw(kHkeyCurrentUser, key, "EmptyBinary", 3, {});
    registry.PutRaw(kHkeyCurrentUser, key, "None", 0, {1, 2});

    RegistryRoutines reg = OpenSettings(registry, kHkeyCurrentUser);
    const Variant fallback = std::string("default");
    EXPECT_EQ(reg.GetRegistryValue("ShortDword", fallback), Variant(std::int32_t{0x0201}));
    EXPECT_EQ(reg.GetRegistryValue("EmptyDword", fallback), Variant(std::int32_t{0}));
    EXPECT_EQ(reg.GetRegistryValue("EmptyText", fallback), fallback);
    EXPECT_EQ(reg.GetRegistryValue("Unterminated", fallback), Variant(std::string("abc")))
        << "a string stored without terminator keeps its last character";
    EXPECT_EQ(reg.GetRegistryValue("TinyMulti", fallback), fallback);
    EXPECT_EQ(reg.GetRegistryValue("EmptyMulti", fallback), fallback);
    EXPECT_EQ(reg.GetRegistryValue("EmptyBinary", fallback), Variant(Bytes{}));
    EXPECT_EQ(reg.GetRegistryValue("None", fallback), fallback);

    auto values = reg.EnumRegistryValues(kHkeyCurrentUser, key);
    ASSERT_EQ(values.size(), 8u);
    EXPECT_EQ(values.Find("Unterminated")->value, Variant(std::string("abc")));
    EXPECT_TRUE(IsEmpty(values.Find("None")->value));
}

}  // namespace
}  // namespace vantorel
