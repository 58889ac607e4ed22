// The downloader's own cost per byte, natively: 50 MB through FileDownloader from an in-memory
// transfer into a file system that keeps nothing, against the bare baseline of copying the same
// body in 64 KiB blocks, in the same run. (The download over WinINet under Wine, with real files
// and messages, is bench/download_bench_win32.cpp.)
#include <benchmark/benchmark.h>

#include <cstring>
#include <string>

#include "download/file_downloader.h"

namespace {

constexpr std::size_t kSize = 50u << 20;

const std::string& Body() {
    static const std::string body(kSize, 'v');
    return body;
}

class MemoryTransfer final : public vantorel::platform::HttpTransfer {
public:
    void SetURL(const std::string& url) override { url_ = url; }
    std::string URL() const override { return url_; }
    void SetUserName(const std::string&) override {}
    void SetPassword(const std::string&) override {}
    bool ExecuteGet(const std::string&, vantorel::platform::TransferError&) override {
        position_ = 0;
        return true;
    }
    bool StillExecuting() override { return false; }
    bool GetHeader(std::string& header, vantorel::platform::TransferError&) override {
        header = "HTTP/1.1 200 OK\r\nContent-Length: " + std::to_string(kSize) + "\r\n\r\n";
        return true;
    }
    bool GetHeader(const std::string&, std::string& value, vantorel::platform::TransferError&) override {
        value = std::to_string(kSize);
        return true;
    }
    bool GetChunk(std::size_t size, std::string& data, vantorel::platform::TransferError&) override {
        std::size_t take = std::min(size, kSize - position_);
        data.assign(Body(), position_, take);
        position_ += take;
        return true;
    }
    void Cancel() override {}

private:
    std::string url_;
    std::size_t position_ = 0;
};

class CountingDisk final : public vantorel::platform::FileSystem {
public:
    std::size_t written = 0;
    class Writer final : public vantorel::platform::FileWriter {
    public:
        explicit Writer(CountingDisk& disk) : disk_(disk) {}
        bool Write(const std::string& data, vantorel::platform::FileError&) override {
            disk_.written += data.size();
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
        return std::make_unique<Writer>(*this);
    }
    bool Replace(const std::string&, const std::string&, vantorel::platform::FileError&) override { return true; }
    bool Delete(const std::string&) override { return true; }
    bool QueryDiskFreeSpace(const std::string&, std::uint32_t& a, std::uint32_t& b, std::uint32_t& c) override {
        a = b = c = 0xFFFF;
        return true;
    }
};

class NoPump final : public vantorel::platform::MessagePump {
public:
    bool PumpMessages() override { return true; }
};

void BM_FileDownloader50MB(benchmark::State& state) {
    MemoryTransfer transfer;
    CountingDisk disk;
    NoPump pump;
    vantorel::FileDownloader fd(transfer, disk, pump);
    std::size_t events = 0;
    fd.DownloadProgress = [&](const std::string&) { ++events; };
    for (auto _ : state) {
        bool ok = fd.DownloadFile("http://127.0.0.1/vt/sw2.def", "C:\\Vantorel\\sw2.def");
        benchmark::DoNotOptimize(ok);
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * kSize));
    state.counters["events"] = static_cast<double>(events) / static_cast<double>(state.iterations());
}
BENCHMARK(BM_FileDownloader50MB)->Unit(benchmark::kMillisecond);

void BM_BareCopy64KiB50MB(benchmark::State& state) {
    std::string block;
    for (auto _ : state) {
        std::size_t total = 0;
        for (std::size_t at = 0; at < kSize; at += 64 * 1024) {
            block.assign(Body(), at, std::min<std::size_t>(64 * 1024, kSize - at));
            total += block.size();
            benchmark::DoNotOptimize(block.data());
        }
        benchmark::DoNotOptimize(total);
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * kSize));
}
BENCHMARK(BM_BareCopy64KiB50MB)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
