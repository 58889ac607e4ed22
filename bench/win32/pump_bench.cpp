// The cost of the sweep's per-row yield with nothing waiting, under Wine or Windows: the throttled
// yield against a look at the queue on every row. Run by hand (it is not a test):
//   wine build/windows/pump_bench.exe
#include <windows.h>

#include <cstdio>

#include "platform/win32/shell_win32.h"

namespace {

double MicrosecondsPerCall(bool (*call)(vantorel::win32::Win32MessagePump&), int calls) {
    vantorel::win32::Win32MessagePump pump;
    LARGE_INTEGER frequency, start, end;
    ::QueryPerformanceFrequency(&frequency);
    ::QueryPerformanceCounter(&start);
    for (int i = 0; i < calls; ++i) call(pump);
    ::QueryPerformanceCounter(&end);
    return static_cast<double>(end.QuadPart - start.QuadPart) * 1e6 / static_cast<double>(frequency.QuadPart) / calls;
}

}  // namespace

int main() {
    HWND window =
        ::CreateWindowExA(0, "STATIC", "pump", WS_OVERLAPPED, 0, 0, 10, 10, nullptr, nullptr, nullptr, nullptr);
    MSG message;
    while (::PeekMessageA(&message, nullptr, 0, 0, PM_REMOVE)) ::DispatchMessageA(&message);
    double every = MicrosecondsPerCall([](vantorel::win32::Win32MessagePump& p) { return p.PumpMessages(); }, 20000);
    double yield =
        MicrosecondsPerCall([](vantorel::win32::Win32MessagePump& p) { return p.YieldToMessages(); }, 2000000);
    std::printf("Looking at the queue on every row: %.3f us per row\n", every);
    std::printf("Yield (looks at most once per %lld us): %.3f us per row\n",
                vantorel::win32::Win32MessagePump::kYieldMicroseconds, yield);
    std::printf("For 2,500 rows: %.1f ms against %.2f ms\n", every * 2500 / 1000, yield * 2500 / 1000);
    if (window != nullptr) ::DestroyWindow(window);
    return 0;
}
