// Paint cost of the push button on the raster canvas: one full paint of a 160 × 270 button of
// each look, and an unforced repaint with nothing changed (which must not touch the surface).
#include <benchmark/benchmark.h>

#include "controls/xpbutton/kirel_xp_button.h"
#include "fakes/fake_button_host.h"
#include "fakes/raster_canvas.h"

namespace {

using vantorel::testing::FakeButtonHost;
using vantorel::testing::RasterCanvas;
using vantorel::xpbutton::KirelXPButton;

struct Setup {
    FakeButtonHost host;
    RasterCanvas canvas;
    KirelXPButton button{host, canvas};
    explicit Setup(int type) {
        host.width = 160;
        host.height = 270;
        button.InitNewControl();
        button.OnResize();
        button.OnShow();
        button.SetButtonType(type);
    }
};

void BM_FullPaint(benchmark::State& state) {
    Setup s(static_cast<int>(state.range(0)));
    for (auto _ : state) {
        s.button.Paint(0, true);
        benchmark::DoNotOptimize(s.canvas.At(0, 0));
    }
}
BENCHMARK(BM_FullPaint)->DenseRange(1, 14);

void BM_UnforcedRepaint(benchmark::State& state) {
    Setup s(3);
    s.canvas.FillBox(0, 0, 160, 270, 0x123456);
    for (auto _ : state) s.button.Paint(0, false);
    if (s.canvas.At(80, 135) != 0x123456) state.SkipWithError("an unforced repaint touched the surface");
}
BENCHMARK(BM_UnforcedRepaint);

}  // namespace

BENCHMARK_MAIN();
