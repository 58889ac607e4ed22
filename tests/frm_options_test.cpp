// What the options window's boxes show for stored texts that are not exactly "1" or "yes"; the real
// window on the real registry, with real clicks, is tests/win32/options_window_test.cpp.
#include "ui/options/frm_options.h"

#include <gtest/gtest.h>

#include "fakes/fake_registry.h"
#include "fakes/fake_widgets.h"
#include "settings/registry_routines.h"

namespace vantorel {
namespace {

using namespace vantorel::testing;

TEST(FrmOptions, OnlyExactStoredValuesCheckTheirBoxes) {
    FakeRegistry registry;
    RegistryRoutines vantorel(registry), ie(registry), run(registry);
    vantorel.hkey(platform::kHkeyLocalMachine);
    vantorel.KeyRoot(kVantorelKey);
    vantorel.CreateKey();
    ie.hkey(platform::kHkeyCurrentUser);
    ie.KeyRoot(kInternetExplorerMainKey);
    ie.CreateKey();
    run.hkey(platform::kHkeyLocalMachine);
    run.KeyRoot(std::string(kRunKey) + "\\");
    run.CreateKey();
    run.SetRegistryValue("Vantorel", std::string("C:\\vantorel.exe"), platform::kRegSz);
    const std::tuple<Variant, std::string, std::string, bool, bool, bool> cases[] = {
        {std::string("2"), "0", "Yes", false, false, false},
        {std::string("abc"), " 1 ", "no", false, true, false},
        {std::int32_t{1}, "1x", "yes", true, false, true},
    };
    for (const auto& [start, tray, debugger, expectStart, expectTray, expectDebugger] : cases) {
        vantorel.SetRegistryValue("Start", start, std::holds_alternative<std::int32_t>(start) ? 4 : 1);
        vantorel.SetRegistryValue("Tray", tray, 1);
        ie.SetRegistryValue("Disable Script Debugger", debugger, 1);
        FakeFrame f[2];
        FakeCheckBox box[3];
        FakeButton close, update;
        FakeLabel l[2];
        FrmOptions form(OptionsControls{{&f[0], &f[1]}, {&box[0], &box[1], &box[2]}, &close, &update, {&l[0], &l[1]}},
                        registry, "C:\\vantorel.exe", [] {});
        form.Form_Load();
        EXPECT_EQ(std::make_tuple(box[0].Value(), box[1].Value(), box[2].Value()),
                  std::make_tuple(expectStart, expectTray, expectDebugger))
            << VariantText(start) << " " << tray << " " << debugger;
    }
}

}  // namespace
}  // namespace vantorel
