// The registry conversions over the in-memory registry: values of every type with any data and
// size are read, enumerated and read "remotely" without a crash; reads give the kind of value the
// type stands for; what is written reads back the same; no handle stays open.
#include <fuzzer/FuzzedDataProvider.h>

#include <cstdlib>
#include <string>

#include "fakes/fake_registry.h"
#include "settings/registry_routines.h"

using namespace vantorel;

namespace {
const char* const kPath = "SOFTWARE\\Vantorel\\";

Bytes SomeBytes(FuzzedDataProvider& in) {
    // Sizes past the 1024- and 4096-byte buffers come from repeating a short pattern.
    Bytes pattern = in.ConsumeBytes<std::uint8_t>(in.ConsumeIntegralInRange<std::size_t>(0, 16));
    std::size_t size = in.ConsumeBool() ? in.ConsumeIntegralInRange<std::size_t>(0, 9000) : pattern.size();
    Bytes bytes(size, 0);
    for (std::size_t i = 0; i < size && !pattern.empty(); ++i) bytes[i] = pattern[i % pattern.size()];
    return bytes;
}

Variant SomeVariant(FuzzedDataProvider& in) {
    switch (in.ConsumeIntegralInRange(0, 3)) {
        case 0: return Variant();
        case 1: return in.ConsumeRandomLengthString(300);
        case 2: return in.ConsumeIntegral<std::int32_t>();
        default: return SomeBytes(in);
    }
}

bool HasKindOf(const Variant& value, std::int32_t type, const Variant& fallback) {
    if (value == fallback) return true;
    switch (type) {
        case 1:
        case 2:
        case 7: return std::holds_alternative<std::string>(value);
        case 3: return std::holds_alternative<Bytes>(value);
        case 4: return std::holds_alternative<std::int32_t>(value);
        default: return false;
    }
}
}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    FuzzedDataProvider in(data, size);
    testing::FakeRegistry registry;
    registry.SetEnvironment(in.ConsumeRandomLengthString(8), in.ConsumeRandomLengthString(2000));
    RegistryRoutines reg(registry);
    reg.hkey(platform::kHkeyCurrentUser);
    reg.KeyRoot(kPath);
    if (reg.CreateKey() != "0") std::abort();

    while (in.remaining_bytes() > 0) {
        const std::string name = in.ConsumeRandomLengthString(300);
        const Variant fallback = SomeVariant(in);
        if (in.ConsumeBool()) {  // a value as some other program may have stored it
            const auto type =
                in.ConsumeBool() ? in.ConsumeIntegralInRange<std::int32_t>(0, 11) : in.ConsumeIntegral<std::int32_t>();
            registry.PutRaw(platform::kHkeyCurrentUser, kPath, name, type, SomeBytes(in));
            const Variant value = reg.GetRegistryValue(name, fallback);
            if (!HasKindOf(value, type, fallback)) std::abort();
            if (reg.ReadRemoteRegistryValue("", platform::kHkeyCurrentUser, name) != reg.GetRegistryValue(name))
                std::abort();
        } else {  // written by the program, read back
            const Variant value = SomeVariant(in);
            const auto type = in.ConsumeIntegralInRange<std::int32_t>(0, 8);
            const bool written = reg.SetRegistryValue(name, value, type);
            const Variant back = reg.GetRegistryValue(name);
            const auto* text = std::get_if<std::string>(&value);
            const bool plainText = text && !text->empty() && text->find('\0') == std::string::npos;
            if (written && type == 1 && plainText && back != value) std::abort();
            const auto* number = std::get_if<std::int32_t>(&value);
            if (written && type == 1 && number && back != Variant(std::to_string(*number))) std::abort();
            if (written && type == 3 && back != value) std::abort();
            if (written && type == 4 && number && back != value) std::abort();
            if (type == 3 && written != std::holds_alternative<Bytes>(value)) std::abort();
        }
        if (in.ConsumeBool() && reg.DeleteValue(name) == 0 && !IsEmpty(reg.GetRegistryValue(name))) std::abort();
    }
    const auto items = reg.EnumRegistryValues(platform::kHkeyCurrentUser, kPath);
    for (std::size_t i = 0; i < items.size(); ++i)
        if (std::holds_alternative<Bytes>(items[i].value)) std::abort();  // binary data is listed as hex text
    reg.EnumRegistryKeys(platform::kHkeyCurrentUser, kPath);
    reg.EnumRegistryKeys(platform::kHkeyCurrentUser, "");
    if (reg.ReadRemoteRegistryValue("\\\\far", platform::kHkeyCurrentUser, "State") != Variant(std::string("Error!")) ||
        !reg.WriteRemoteRegistryValue("", platform::kHkeyCurrentUser, "State", std::string("0"), 1))
        std::abort();  // an unreachable computer is an error; the local one through the remote path is written
    if (registry.OpenHandles() != 0) std::abort();
    return 0;
}
