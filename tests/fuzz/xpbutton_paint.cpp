// The push button's property store and one paint on the raster canvas: any stored value of any
// kind under every key (colours, types, schemes, positions, effects, captions, fonts, pictures of
// any size), any control size and state. Reading, painting and storing never crash, and what a
// control stores reads back and stores the same again.
#include <fuzzer/FuzzedDataProvider.h>

#include <cstdlib>
#include <cstring>
#include <memory>

#include "controls/xpbutton/kirel_xp_button.h"
#include "fakes/fake_button_host.h"
#include "fakes/raster_canvas.h"

using namespace vantorel;
using namespace vantorel::xpbutton;

namespace {
const char* const kKeys[] = {"BTYPE", "TX",     "ENAB",  "FONT", "COLTYPE", "FOCUSR", "BCOL",       "BCOLO",
                             "FCOL",  "FCOLO",  "MCOL",  "MPTR", "MICON",   "PICN",   "PICH",       "UMCOL",
                             "SOFT",  "PICPOS", "NGREY", "FX",   "CHECK",   "VALUE",  "ImageIndex", "HAND"};

PropertyValue SomeValue(FuzzedDataProvider& in) {
    switch (in.ConsumeIntegralInRange(0, 5)) {
        case 0: return in.ConsumeBool();
        case 1: return in.ConsumeIntegral<std::int16_t>();
        case 2: return in.ConsumeIntegral<std::int32_t>();
        case 3: return in.ConsumeRandomLengthString(200);
        case 4: {
            platform::FontDesc font;
            font.name = in.ConsumeRandomLengthString(40);
            const auto bits = in.ConsumeIntegral<std::uint64_t>();  // any double: huge, NaN, infinite
            std::memcpy(&font.size, &bits, sizeof font.size);
            font.bold = in.ConsumeBool();
            font.italic = in.ConsumeBool();
            font.underline = in.ConsumeBool();
            return font;
        }
        default: {
            if (in.ConsumeBool()) return platform::PicturePtr();
            const auto kind = static_cast<platform::PictureKind>(in.ConsumeIntegralInRange(0, 2));
            const std::int32_t w = in.ConsumeIntegralInRange(0, 128), h = in.ConsumeIntegralInRange(0, 128);
            std::vector<platform::Rgb> pixels(static_cast<std::size_t>(w) * h);
            std::vector<bool> transparent(pixels.size());
            const auto seed = in.ConsumeIntegral<std::uint32_t>();
            for (std::size_t i = 0; i < pixels.size(); ++i) {
                pixels[i] = (seed * (i + 1)) >> (i % 9) & 0xFFFFFF;
                transparent[i] = (seed >> (i % 32)) & 1;
            }
            auto picture = std::make_shared<testing::MemoryPicture>(kind, w, h, pixels, transparent);
            if (in.ConsumeBool()) {  // a size that does not match the pixels held
                picture->himetricW = in.ConsumeIntegralInRange(-9000, 9000);
                picture->himetricH = in.ConsumeIntegralInRange(-9000, 9000);
            }
            return picture;
        }
    }
}

// Stored values compare bit for bit (a font size may be NaN) and pictures by identity.
bool Same(const PropertyBag& a, const PropertyBag& b) {
    if (a.Keys() != b.Keys()) return false;
    for (const std::string& key : a.Keys()) {
        PropertyValue x = *a.Find(key), y = *b.Find(key);
        auto *f = std::get_if<platform::FontDesc>(&x), *g = std::get_if<platform::FontDesc>(&y);
        if (f && g && std::memcmp(&f->size, &g->size, sizeof f->size) != 0) return false;
        if (f && g) f->size = g->size = 0;
        if (!(x == y)) return false;
    }
    return true;
}
}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    FuzzedDataProvider in(data, size);
    testing::FakeButtonHost host;
    testing::RasterCanvas canvas;
    host.width = in.ConsumeIntegralInRange(0, 256);
    host.height = in.ConsumeIntegralInRange(0, 256);
    host.dpi = in.ConsumeIntegralInRange(48, 480);
    in.ConsumeBool();  // once the design mode, which the run-time host never is
    host.isDefault = in.ConsumeBool();
    host.pointerOver = in.ConsumeBool();
    PropertyBag stored;
    for (const char* key : kKeys)
        if (in.ConsumeBool()) stored.Write(key, SomeValue(in));

    KirelXPButton button(host, canvas);
    button.ReadProperties(stored);
    button.OnResize();
    button.OnShow();
    if (in.ConsumeBool()) button.OnGotFocus();
    if (host.pointerOver) button.OnMouseMove(0, 0, 1, 1);
    button.Paint(in.ConsumeIntegralInRange(0, 3), true);
    button.FontSize();

    PropertyBag once, twice;
    button.WriteProperties(once);
    KirelXPButton copy(host, canvas);
    copy.ReadProperties(once);
    copy.WriteProperties(twice);
    if (!Same(once, twice)) std::abort();
    return 0;
}
