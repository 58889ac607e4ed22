// What the real teardown test and the sweep benchmark put around the sweep: the guard's view as a
// recorder, and a stored setting read back.
#pragma once

#include <string>
#include <vector>

#include "guard/guard_view.h"
#include "settings/settings.h"

namespace vantorel::testing {

// A value under the program's settings key as text, "<missing>" when there is none.
inline std::string StoredSetting(platform::Registry& registry, std::int32_t root, const std::string& name) {
    return VariantText(OpenSettings(registry, root).GetRegistryValue(name, std::string("<missing>")));
}

// The guard's view as a recorder of each count shown after a teardown.
class FakeGuardView final : public GuardView {
public:
    void CountLoaded(std::int32_t) override {}
    void CountIntercepted(std::int32_t count) override { shown.push_back(count); }
    std::vector<std::int32_t> shown;
};

}  // namespace vantorel::testing
