// The registry routines' contract on the real registry under Wine and, in the same run, on the
// in-memory fake, so the native tests and the fuzz target can trust the fake. Each test works below
// a scratch key of its own and removes it.
#include <windows.h>

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <memory>

#include "fakes/fake_registry.h"
#include "platform/win32/registry_win32.h"
#include "settings/registry_routines.h"

namespace vantorel::testing {

using platform::kHkeyCurrentUser;

class RegistryContract : public ::testing::TestWithParam<const char*> {
protected:
    void SetUp() override {
        if (GetParam() == std::string("Win32")) {
            ::SetEnvironmentVariableA("VTX_SHORT", "s");
            ::SetEnvironmentVariableA("VTX_LONG", "a rather long expansion");
            registry_ = std::make_unique<win32::Win32Registry>();
        } else {
            auto fake = std::make_unique<FakeRegistry>();
            fake->SetEnvironment("VTX_SHORT", "s");
            fake->SetEnvironment("VTX_LONG", "a rather long expansion");
            registry_ = std::move(fake);
        }
        static std::atomic<int> counter{0};
        auto stamp = std::chrono::steady_clock::now().time_since_epoch().count();
        scratch_ = "SOFTWARE\\VantorelTest-" + std::to_string(stamp) + "-" + std::to_string(counter++);
    }

    void TearDown() override {
        DeleteTree(scratch_);
        RegistryRoutines check(*registry_);
        check.hkey(kHkeyCurrentUser);
        check.KeyRoot(scratch_);
        EXPECT_FALSE(check.KeyExists()) << "scratch key left behind";
    }

    // Removes `path` below HKEY_CURRENT_USER with everything under it.
    void DeleteTree(const std::string& path) {
        platform::RegKey key = 0;
        if (registry_->OpenKey(platform::RootKey(kHkeyCurrentUser), path, platform::kKeyAllAccess, key) != 0) return;
        std::vector<std::string> children;
        std::string name;
        for (std::uint32_t i = 0; registry_->EnumKey(key, i, 260, name) == 0; ++i) children.push_back(name);
        registry_->CloseKey(key);
        for (const auto& child : children) DeleteTree(path + "\\" + child);
        registry_->DeleteKey(platform::RootKey(kHkeyCurrentUser), path);
    }

    std::unique_ptr<platform::Registry> registry_;
    std::string scratch_;  // "SOFTWARE\VantorelTest-<unique>", without a trailing backslash
};

INSTANTIATE_TEST_SUITE_P(RealAndFake, RegistryContract, ::testing::Values("Win32", "Fake"),
                         [](const ::testing::TestParamInfo<const char*>& info) { return std::string(info.param); });

namespace {

RegistryRoutines Routines(platform::Registry& registry, const std::string& keyRoot) {
    RegistryRoutines reg(registry);
    reg.hkey(kHkeyCurrentUser);
    reg.KeyRoot(keyRoot);
    return reg;
}

}  // namespace

TEST_P(RegistryContract, KeysWithTrailingBackslashNameTheSameKey) {
    RegistryRoutines reg = Routines(*registry_, scratch_ + "\\");  // path handed over ends in "\\"
    EXPECT_FALSE(reg.KeyExists());
    EXPECT_EQ(reg.CreateKey(), "0");
    EXPECT_TRUE(reg.KeyExists());
    EXPECT_EQ(reg.CreateKey(), "0") << "creating an existing key opens it";
    ASSERT_TRUE(reg.SetRegistryValue("State", std::string("1"), platform::kRegSz));

    RegistryRoutines plain = Routines(*registry_, scratch_);
    EXPECT_EQ(plain.GetRegistryValue("State"), Variant(std::string("1")));

    RegistryRoutines parent = Routines(*registry_, scratch_);
    EXPECT_EQ(parent.CreateKey(std::string("Child")), "0");
    RegistryRoutines child = Routines(*registry_, scratch_ + "\\Child");
    EXPECT_TRUE(child.KeyExists());
    EXPECT_EQ(parent.DeleteKey("Child"), 0);
    EXPECT_FALSE(child.KeyExists());
}

TEST_P(RegistryContract, MissingValuesAndKeysGiveTheDefault) {
    RegistryRoutines missingKey = Routines(*registry_, scratch_ + "\\Nowhere\\");
    EXPECT_EQ(missingKey.GetRegistryValue("State", std::string("0")), Variant(std::string("0")));
    EXPECT_TRUE(IsEmpty(missingKey.GetRegistryValue("State")));
    EXPECT_FALSE(missingKey.SetRegistryValue("State", std::string("1"), 5)) << "a key that does not open fails";
    EXPECT_EQ(missingKey.DeleteValue("State"), platform::kErrorFileNotFound);

    RegistryRoutines reg = Routines(*registry_, scratch_ + "\\");
    ASSERT_EQ(reg.CreateKey(), "0");
    EXPECT_EQ(reg.GetRegistryValue("Attempts", std::int32_t{7}), Variant(std::int32_t{7}));
    EXPECT_TRUE(IsEmpty(reg.GetRegistryValue("Attempts")));
    EXPECT_EQ(reg.DeleteValue("Attempts"), platform::kErrorFileNotFound);
}

TEST_P(RegistryContract, WritesReadBackByType) {
    RegistryRoutines reg = Routines(*registry_, scratch_ + "\\");
    ASSERT_EQ(reg.CreateKey(), "0");
    const std::string path = "C:\\Program Files\\Vantorel\\vantorel.exe";
    struct Case {
        const char* name;
        Variant written;
        std::int32_t type;
        bool ok;
        Variant read;  // empty: nothing stored
    };
    const Case cases[] = {
        {"Text", path, 1, true, path},
        {"Number", std::int32_t{42}, 1, true, std::string("42")},  // a number is stored as its text
        {"Negative", std::int32_t{-2147483647 - 1}, 1, true, std::string("-2147483648")},
        {"Dword", std::int32_t{-5}, 4, true, std::int32_t{-5}},
        {"DwordText", std::string(" 1234 "), 4, true, std::int32_t{1234}},
        {"DwordBad", std::string("abc"), 4, false, Variant()},  // not a number: nothing written
        {"Binary", Bytes{0x00, 0xA5, 0xFF}, 3, true, Bytes{0x00, 0xA5, 0xFF}},
        {"EmptyBinary", Bytes{}, 3, true, Bytes{}},
        {"BinaryText", std::string("ab"), 3, false, Variant()},                  // binary needs bytes
        {"Multi", std::string("a\0b\0\0", 5), 7, true, std::string("a\0b", 3)},  // separators and terminator
        {"MultiFirstEmpty", std::string("\0b\0\0", 4), 7, true, Variant()},
        {"Ignored", std::string("1"), 5, true, Variant()},  // a type not converted writes nothing
    };
    for (const Case& c : cases) {
        EXPECT_EQ(reg.SetRegistryValue(c.name, c.written, c.type), c.ok) << c.name;
        EXPECT_EQ(reg.GetRegistryValue(c.name), c.read) << c.name;
    }
    EXPECT_EQ(reg.DeleteValue("Text"), 0);
    EXPECT_TRUE(IsEmpty(reg.GetRegistryValue("Text")));
    EXPECT_EQ(reg.DeleteValue("Text"), platform::kErrorFileNotFound);
}

TEST_P(RegistryContract, ValuesLargerThanTheFirstBufferAreReadWhole) {
    RegistryRoutines reg = Routines(*registry_, scratch_ + "\\");
    ASSERT_EQ(reg.CreateKey(), "0");
    std::string big(5000, 'x');
    big[4999] = 'y';
    ASSERT_TRUE(reg.SetRegistryValue("Big", big, 1));
    EXPECT_EQ(reg.GetRegistryValue("Big"), Variant(big));
    Bytes blob(1024, 0x5A);
    blob.push_back(0x01);
    ASSERT_TRUE(reg.SetRegistryValue("Blob", blob, 3));
    EXPECT_EQ(reg.GetRegistryValue("Blob"), Variant(blob));

    auto values = reg.EnumRegistryValues(kHkeyCurrentUser, scratch_);
    ASSERT_NE(values.Find("big"), nullptr);
    EXPECT_EQ(values.Find("BIG")->value, Variant(big)) << "more than the 4096-byte enumeration buffer";
    ASSERT_NE(values.Find("Blob"), nullptr);
    EXPECT_EQ(std::get<std::string>(values.Find("Blob")->value).size(), 1025u * 3 - 1);
}

TEST_P(RegistryContract, ExpandableTextsExpandOnlyWhenTheyFitTheStoredLength) {
    RegistryRoutines reg = Routines(*registry_, scratch_ + "\\");
    ASSERT_EQ(reg.CreateKey(), "0");
    ASSERT_TRUE(reg.SetRegistryValue("Short", std::string("%VTX_SHORT%\\bin"), 2));
    ASSERT_TRUE(reg.SetRegistryValue("Long", std::string("%VTX_LONG%"), 2));
    EXPECT_EQ(reg.GetRegistryValue("Short"), Variant(std::string("s\\bin")));
    EXPECT_EQ(reg.GetRegistryValue("Long"), Variant(std::string("%VTX_LONG%"))) << "needs more room: unexpanded";

    auto values = reg.EnumRegistryValues(kHkeyCurrentUser, scratch_ + "\\");
    ASSERT_EQ(values.size(), 2u);
    EXPECT_EQ(values.Find("Short")->value, Variant(std::string("s\\bin")));
    EXPECT_EQ(values.Find("Long")->value, Variant(std::string("%VTX_LONG%")));
}

TEST_P(RegistryContract, EnumerationsConvertForDisplay) {
    RegistryRoutines reg = Routines(*registry_, scratch_ + "\\");
    ASSERT_EQ(reg.CreateKey(), "0");
    RegistryRoutines parent = Routines(*registry_, scratch_);
    ASSERT_EQ(parent.CreateKey(std::string("Alpha")), "0");
    ASSERT_EQ(parent.CreateKey(std::string("beta")), "0");
    ASSERT_TRUE(reg.SetRegistryValue("Multi", std::string("a\0b\0\0", 5), 7));
    ASSERT_TRUE(reg.SetRegistryValue("Binary", Bytes{0x00, 0xA5}, 3));
    ASSERT_TRUE(reg.SetRegistryValue("Dword", std::int32_t{-1}, 4));
    ASSERT_TRUE(reg.SetRegistryValue("Text", std::string("t"), 1));
    ASSERT_TRUE(reg.SetRegistryValue("Empty", std::string(), 1));

    auto keys = reg.EnumRegistryKeys(kHkeyCurrentUser, scratch_);
    ASSERT_EQ(keys.size(), 2u);
    ASSERT_NE(keys.Find("ALPHA"), nullptr);
    EXPECT_EQ(*keys.Find("ALPHA"), "Alpha");
    EXPECT_EQ(*keys.Find("Beta"), "beta");

    auto values = reg.EnumRegistryValues(kHkeyCurrentUser, scratch_);
    ASSERT_EQ(values.size(), 5u);
    EXPECT_EQ(values.Find("multi")->value, Variant(std::string("a,b")));
    EXPECT_EQ(values.Find("Binary")->value, Variant(std::string("00 A5")));
    EXPECT_EQ(values.Find("Dword")->value, Variant(std::int32_t{-1}));
    EXPECT_EQ(values.Find("Text")->value, Variant(std::string("t")));
    EXPECT_EQ(values.Find("Empty")->value, Variant(std::string()));
    EXPECT_TRUE(reg.EnumRegistryKeys(kHkeyCurrentUser, scratch_ + "\\Nowhere").empty());
    EXPECT_TRUE(reg.EnumRegistryValues(kHkeyCurrentUser, scratch_ + "\\Nowhere").empty());
}

TEST_P(RegistryContract, RemoteAccessReachesOnlyReachableComputers) {
    RegistryRoutines reg = Routines(*registry_, scratch_ + "\\");
    ASSERT_EQ(reg.CreateKey(), "0");
    ASSERT_TRUE(reg.SetRegistryValue("State", std::string("1"), 1));

    EXPECT_EQ(reg.ReadRemoteRegistryValue("\\\\vantorel-unreachable-host", kHkeyCurrentUser, "State"),
              Variant(std::string("Error!")));
    EXPECT_FALSE(
        reg.WriteRemoteRegistryValue("\\\\vantorel-unreachable-host", kHkeyCurrentUser, "State", std::string("0"), 1));
    EXPECT_EQ(reg.GetRegistryValue("State"), Variant(std::string("1"))) << "a failed write changes nothing";

    // The local computer through the remote path.
    EXPECT_EQ(reg.ReadRemoteRegistryValue("", kHkeyCurrentUser, "State"), Variant(std::string("1")));
    EXPECT_TRUE(reg.WriteRemoteRegistryValue("", kHkeyCurrentUser, "Other", std::int32_t{9}, 4, scratch_));
    EXPECT_EQ(reg.GetRegistryValue("Other"), Variant(std::int32_t{9}));
    EXPECT_TRUE(IsEmpty(reg.ReadRemoteRegistryValue("", kHkeyCurrentUser, "State", scratch_ + "\\Nowhere")));
}

}  // namespace vantorel::testing
