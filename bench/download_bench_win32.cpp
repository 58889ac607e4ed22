// A 50 MB download from the loopback test server: the whole downloader (1024-byte chunks, a
// progress event, a message pump and a file write per chunk, the final flush and replace) against a
// bare WinINet loop reading 64 KiB blocks into memory, from the same server in the same run.
//
// Google Benchmark is not built for the Windows target, so this program times the runs itself and
// prints one line per run and a summary. While the downloader runs, a window timer (10 ms) counts
// its ticks and the longest gap between two of them: the window stays responsive when the ticks
// keep coming. A third line per run is the same download into a disk that only counts, which
// shows what the file writes and the flush before the replace cost. Usage (bench/run-download-bench does all of it):
//   download_bench_win32.exe http://127.0.0.1:PORT/body/52428800 [runs]
#include <windows.h>
#include <wininet.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <string>
#include <vector>

#include "download/file_downloader.h"
#include "platform/win32/file_system_win32.h"
#include "platform/win32/http_transfer_win32.h"
#include "platform/win32/shell_win32.h"

namespace {

using Clock = std::chrono::steady_clock;

double Seconds(Clock::time_point since) { return std::chrono::duration<double>(Clock::now() - since).count(); }

// The bare loop: one request, 64 KiB reads, nothing else.
long long BareLoop(const std::string& url) {
    HINTERNET session = ::InternetOpenA("bench", INTERNET_OPEN_TYPE_PRECONFIG, nullptr, nullptr, 0);
    HINTERNET request = ::InternetOpenUrlA(
        session, url.c_str(), nullptr, 0, INTERNET_FLAG_RELOAD | INTERNET_FLAG_NO_CACHE_WRITE | INTERNET_FLAG_NO_UI, 0);
    long long total = 0;
    if (request != nullptr) {
        std::vector<char> block(64 * 1024);
        DWORD read = 0;
        while (::InternetReadFile(request, block.data(), static_cast<DWORD>(block.size()), &read) && read > 0)
            total += read;
        ::InternetCloseHandle(request);
    }
    ::InternetCloseHandle(session);
    return total;
}

struct Ticks {
    int count = 0;
    Clock::time_point last;
    double longestGapMs = 0;
};
Ticks gTicks;

LRESULT CALLBACK BenchWindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_TIMER) {
        Clock::time_point now = Clock::now();
        if (gTicks.count > 0)
            gTicks.longestGapMs =
                std::max(gTicks.longestGapMs, std::chrono::duration<double, std::milli>(now - gTicks.last).count());
        gTicks.last = now;
        ++gTicks.count;
        return 0;
    }
    return ::DefWindowProcA(window, message, wParam, lParam);
}

// A disk that only counts: the same download without the file writes and the flush.
class CountingDisk final : public vantorel::platform::FileSystem {
public:
    long long written = 0;
    class Writer final : public vantorel::platform::FileWriter {
    public:
        explicit Writer(CountingDisk& disk) : disk_(disk) {}
        bool Write(const std::string& data, vantorel::platform::FileError&) override {
            disk_.written += static_cast<long long>(data.size());
            return true;
        }
        bool Close(vantorel::platform::FileError&) override { return true; }

    private:
        CountingDisk& disk_;
    };
    bool FileExists(const std::string&) override { return false; }
    bool FolderExists(const std::string&) override { return true; }
    bool CreateFolder(const std::string&, vantorel::platform::FileError&) override { return true; }
    std::unique_ptr<vantorel::platform::FileWriter> CreateNew(const std::string&,
                                                              vantorel::platform::FileError&) override {
        written = 0;
        return std::make_unique<Writer>(*this);
    }
    bool Replace(const std::string&, const std::string&, vantorel::platform::FileError&) override { return true; }
    bool Delete(const std::string&) override { return true; }
    bool QueryDiskFreeSpace(const std::string&, std::uint32_t& a, std::uint32_t& b, std::uint32_t& c) override {
        a = b = c = 0xFFFF;
        return true;
    }
};

}  // namespace

int main(int argc, char** argv) {
    if (argc < 2) {
        std::fprintf(stderr, "usage: %s URL [runs]\n", argv[0]);
        return 2;
    }
    const std::string url = argv[1];
    const int runs = argc > 2 ? std::atoi(argv[2]) : 3;

    WNDCLASSA windowClass{};
    windowClass.lpfnWndProc = BenchWindowProc;
    windowClass.hInstance = ::GetModuleHandleA(nullptr);
    windowClass.lpszClassName = "VantorelDownloadBench";
    ::RegisterClassA(&windowClass);
    HWND window = ::CreateWindowA("VantorelDownloadBench", "bench", 0, 0, 0, 10, 10, HWND_MESSAGE, nullptr,
                                  windowClass.hInstance, nullptr);

    char temp[MAX_PATH];
    ::GetTempPathA(MAX_PATH, temp);
    const std::string dest = std::string(temp) + "vantorel-bench-" + std::to_string(::GetCurrentProcessId()) + ".bin";

    struct NullPump final : vantorel::platform::MessagePump {
        bool PumpMessages() override { return true; }
    } nullPump;
    vantorel::win32::Win32MessagePump realPump;
    vantorel::platform::MessagePump& pump = std::getenv("VT_NULL_PUMP") && *std::getenv("VT_NULL_PUMP")
                                                ? static_cast<vantorel::platform::MessagePump&>(nullPump)
                                                : realPump;
    vantorel::win32::WinInetTransfer inet(pump);
    vantorel::win32::Win32FileSystem disk;
    vantorel::FileDownloader fd(inet, disk, pump);
    long long progressEvents = 0;
    fd.DownloadProgress = [&](const std::string&) { ++progressEvents; };
    std::string lastError;
    fd.DownloadErrors = [&](const std::string& e) { lastError = e; };

    {
        // What one chunk's platform calls cost here, measured alone.
        const int n = 20000;
        MSG msg;
        Clock::time_point start = Clock::now();
        for (int i = 0; i < n; ++i) ::PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE);
        double peek = Seconds(start) / n * 1e6;
        start = Clock::now();
        for (int i = 0; i < n; ++i) ::GetQueueStatus(QS_ALLINPUT);
        double status = Seconds(start) / n * 1e6;
        HANDLE file = ::CreateFileA(dest.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, 0, nullptr);
        std::string chunk(1024, 'x');
        DWORD written = 0;
        start = Clock::now();
        for (int i = 0; i < n; ++i) ::WriteFile(file, chunk.data(), 1024, &written, nullptr);
        double write = Seconds(start) / n * 1e6;
        std::string block(64 * 1024, 'y');
        start = Clock::now();
        for (int i = 0; i < 800; ++i) ::WriteFile(file, block.data(), 64 * 1024, &written, nullptr);
        double write50 = Seconds(start) * 1e3;
        start = Clock::now();
        ::FlushFileBuffers(file);
        double flush = Seconds(start) * 1e3;
        ::CloseHandle(file);
        ::DeleteFileA(dest.c_str());
        std::printf("per call: PeekMessage %.2f us, GetQueueStatus %.2f us, WriteFile(1024) %.2f us\n", peek, status,
                    write);
        std::printf("50 MB in 64 KiB writes: %.1f ms, then FlushFileBuffers %.1f ms\n", write50, flush);
    }
    CountingDisk countingDisk;
    vantorel::FileDownloader noDisk(inet, countingDisk, pump);
    noDisk.DownloadProgress = [&](const std::string&) { ++progressEvents; };

    std::vector<double> bare, full, withoutDisk;
    std::printf("%-28s %10s %10s %12s %10s %12s\n", "run", "bytes", "seconds", "MB/s", "ticks", "max gap ms");
    for (int run = 0; run < runs; ++run) {
        Clock::time_point start = Clock::now();
        long long bytes = BareLoop(url);
        double seconds = Seconds(start);
        bare.push_back(bytes / seconds / 1e6);
        std::printf("%-28s %10lld %10.3f %12.1f\n", "bare WinINet 64 KiB reads", bytes, seconds, bare.back());

        gTicks = Ticks{};
        ::SetTimer(window, 1, 10, nullptr);
        progressEvents = 0;
        start = Clock::now();
        bool ok = fd.DownloadFile(url, dest);
        seconds = Seconds(start);
        ::KillTimer(window, 1);
        WIN32_FILE_ATTRIBUTE_DATA data{};
        ::GetFileAttributesExA(dest.c_str(), GetFileExInfoStandard, &data);
        long long size = (static_cast<long long>(data.nFileSizeHigh) << 32) | data.nFileSizeLow;
        if (!ok) std::printf("download failed: %s\n", lastError.c_str());
        full.push_back(size / seconds / 1e6);
        std::printf("%-28s %10lld %10.3f %12.1f %10d %12.1f  (%lld progress events)\n", "FileDownloader", size, seconds,
                    full.back(), gTicks.count, gTicks.longestGapMs, progressEvents);
        ::DeleteFileA(dest.c_str());

        start = Clock::now();
        ok = noDisk.DownloadFile(url, dest);
        seconds = Seconds(start);
        withoutDisk.push_back(countingDisk.written / seconds / 1e6);
        std::printf("%-28s %10lld %10.3f %12.1f\n", "FileDownloader, no disk", countingDisk.written, seconds,
                    withoutDisk.back());
    }
    std::sort(bare.begin(), bare.end());
    std::sort(full.begin(), full.end());
    std::sort(withoutDisk.begin(), withoutDisk.end());
    double bareMedian = bare[bare.size() / 2], fullMedian = full[full.size() / 2];
    double noDiskMedian = withoutDisk[withoutDisk.size() / 2];
    std::printf("median: bare %.1f MB/s, downloader %.1f MB/s, ratio %.2f; without the disk %.1f MB/s, ratio %.2f\n",
                bareMedian, fullMedian, fullMedian / bareMedian, noDiskMedian, noDiskMedian / bareMedian);
    ::DestroyWindow(window);
    return 0;
}
