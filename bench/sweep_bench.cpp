// The sweep with the Linux connection table and real loopback connections, 1,000,000 definitions:
//  - BM_Sweep: one sweep's duration and its own work (everything but the table fetch), with 10,
//    1,000 and 10,000 open connections;
//  - BM_ExposureWindow: a guard sweeping every 55 ms while another thread opens listed connections
//    at random moments; the time from a connection being established to its teardown, and the CPU
//    the guard thread uses.
// Reported as counters in milliseconds: median (p50) and p99. Needs root (private network namespace,
// SOCK_DESTROY); without it the benchmark says so and does nothing.
#include <benchmark/benchmark.h>

#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <map>
#include <memory>
#include <mutex>
#include <random>
#include <thread>
#include <vector>

#include <netinet/in.h>

#include "fakes/fake_guard_platform.h"
#include "fakes/fake_registry.h"
#include "guard/sweep.h"
#include "linux/loopback.h"
#include "platform/linux/connection_table_linux.h"

namespace {

using namespace vantorel;
using namespace vantorel::testing;
using Clock = std::chrono::steady_clock;

constexpr std::size_t kDefinitions = 1'000'000;
const char* const kListed = "127.0.0.2";
const char* const kUnlisted = "127.0.0.3";

double Ms(Clock::duration d) { return std::chrono::duration<double, std::milli>(d).count(); }

double Percentile(std::vector<double> values, double p) {
    if (values.empty()) return 0;
    std::sort(values.begin(), values.end());
    auto index = static_cast<std::size_t>(p * static_cast<double>(values.size() - 1) + 0.5);
    return values[std::min(index, values.size() - 1)];
}

const DefinitionList& TheDefinitions() {
    static const DefinitionList list = [] {
        std::mt19937 random(2026);
        std::vector<std::int32_t> keys;
        keys.reserve(kDefinitions);
        auto listed = static_cast<std::int32_t>(AddressField(kListed));
        keys.push_back(listed);
        while (keys.size() < kDefinitions) {
            auto key = static_cast<std::int32_t>(random());
            if ((static_cast<std::uint32_t>(key) & 0xFF) == 127) continue;  // nothing on loopback but the listed one
            keys.push_back(key);
        }
        std::vector<std::string> lines;
        lines.reserve(keys.size());
        for (auto k : keys) lines.push_back(std::to_string(k));
        std::sort(lines.begin(), lines.end());
        lines.erase(std::unique(lines.begin(), lines.end()), lines.end());
        std::string text;
        for (const auto& l : lines) text += l + "\r\n";
        return DefinitionList::FromText(text);
    }();
    return list;
}

// The table, timing its fetches and noting accepted teardowns.
class TimedTable final : public platform::ConnectionTable {
public:
    explicit TimedTable(platform::ConnectionTable& inner) : inner_(inner) {}
    std::uint32_t GetTcpTable(void* table, std::uint32_t& size, bool order) override {
        auto start = Clock::now();
        std::uint32_t status = inner_.GetTcpTable(table, size, order);
        fetchTime += Clock::now() - start;
        return status;
    }
    std::uint32_t SetTcpEntry(const platform::TcpRow& row) override {
        std::uint32_t status = inner_.SetTcpEntry(row);
        if (status == platform::kNoError && onTornDown) onTornDown(row, Clock::now());
        return status;
    }
    Clock::duration fetchTime{};
    std::function<void(const platform::TcpRow&, Clock::time_point)> onTornDown;

private:
    platform::ConnectionTable& inner_;
};

// The common case of the per-row yield: nothing waiting, one flag read.
class IdlePump final : public platform::MessagePump {
public:
    bool PumpMessages() override { return !quit_.load(std::memory_order_relaxed); }
    bool YieldToMessages() override { return !quit_.load(std::memory_order_relaxed); }

private:
    std::atomic<bool> quit_{false};
};

// A client socket connected to `listener` from 127.0.0.1; someone else accepts.
FileDescriptor ConnectOnly(const Listener& listener) {
    FileDescriptor fd(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in remote{};
    remote.sin_family = AF_INET;
    remote.sin_addr.s_addr = listener.address;
    remote.sin_port = htons(listener.port);
    if (::connect(fd.get(), reinterpret_cast<sockaddr*>(&remote), sizeof remote) != 0) return FileDescriptor();
    return fd;
}

// `connections` idle connections to an unlisted peer in a fresh network namespace. The accepting
// ends live in a child process, so neither process needs more than about 10,000 open files.
struct World {
    explicit World(int connections) {
        listener = Listen(kUnlisted);
        listed = Listen(kListed);
        int stop[2];
        if (::pipe(stop) != 0) std::exit(1);
        child = ::fork();
        if (child == 0) {
            ::close(stop[1]);
            std::vector<int> accepted;
            for (int i = 0; i < connections; ++i) accepted.push_back(::accept(listener.fd.get(), nullptr, nullptr));
            char byte;
            while (::read(stop[0], &byte, 1) < 0) {}
            ::_exit(0);
        }
        ::close(stop[0]);
        stopChild = FileDescriptor(stop[1]);
        open.reserve(static_cast<std::size_t>(connections));
        for (int i = 0; i < connections; ++i) {
            open.push_back(ConnectOnly(listener));
            if (!open.back()) {
                std::fprintf(stderr, "connection %d failed\n", i);
                std::exit(1);
            }
        }
        table = std::make_unique<linux_platform::LinuxConnectionTable>();
    }
    ~World() {
        stopChild = FileDescriptor();  // the child sees end of file and leaves
        int status = 0;
        ::waitpid(child, &status, 0);
    }
    Listener listener, listed;
    pid_t child = -1;
    FileDescriptor stopChild;
    std::vector<FileDescriptor> open;
    std::unique_ptr<linux_platform::LinuxConnectionTable> table;
};

std::unique_ptr<World> world;
int worldSize = -1;

World& WorldOf(int connections) {
    if (worldSize != connections) {
        world.reset();
        std::string failed = EnterPrivateNetwork();
        if (!failed.empty()) {
            std::fprintf(stderr, "%s\n", failed.c_str());
            std::exit(1);
        }
        world = std::make_unique<World>(connections);
        worldSize = connections;
    }
    return *world;
}

struct Services {
    FakeRegistry registry;
    FakeGuardView view;
    IdlePump pump;
};

void BM_Sweep(benchmark::State& state) {
    World& w = WorldOf(static_cast<int>(state.range(0)));
    const DefinitionList& list = TheDefinitions();
    TimedTable table(*w.table);
    Services s;
    std::int32_t count = 0;
    ConnectionSweep sweep(SweepServices{table, s.pump, s.registry, s.view}, list, count);
    sweep.SweepConnections();  // the buffer grows once, as in the first sweep of a running guard
    std::vector<double> total, own, fetch;
    for (auto _ : state) {
        table.fetchTime = {};
        auto start = Clock::now();
        sweep.SweepConnections();
        auto took = Clock::now() - start;
        total.push_back(Ms(took));
        fetch.push_back(Ms(table.fetchTime));
        own.push_back(Ms(took - table.fetchTime));
    }
    state.counters["rows"] = sweep.LastSweep().rows;
    state.counters["sweep_p50_ms"] = Percentile(total, 0.5);
    state.counters["sweep_p99_ms"] = Percentile(total, 0.99);
    state.counters["fetch_p50_ms"] = Percentile(fetch, 0.5);
    state.counters["own_p50_ms"] = Percentile(own, 0.5);
    state.counters["own_p99_ms"] = Percentile(own, 0.99);
    state.counters["own_per_fetch"] = Percentile(own, 0.5) / std::max(Percentile(fetch, 0.5), 1e-9);
}
BENCHMARK(BM_Sweep)->Arg(10)->Iterations(400)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Sweep)->Arg(1000)->Iterations(200)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Sweep)->Arg(10000)->Iterations(60)->Unit(benchmark::kMillisecond);

double ThreadCpuMs() {
    rusage usage{};
    ::getrusage(RUSAGE_THREAD, &usage);
    return (usage.ru_utime.tv_sec + usage.ru_stime.tv_sec) * 1e3 +
           (usage.ru_utime.tv_usec + usage.ru_stime.tv_usec) / 1e3;
}

void BM_ExposureWindow(benchmark::State& state) {
    constexpr int kListedConnections = 100;
    World& w = WorldOf(static_cast<int>(state.range(0)));
    const DefinitionList& list = TheDefinitions();
    TimedTable table(*w.table);
    Services s;
    std::int32_t count = 0;
    ConnectionSweep sweep(SweepServices{table, s.pump, s.registry, s.view}, list, count);

    std::mutex lock;
    // Connections by client port (network order). An aborted connection frees its port at once, so a
    // port is matched only while its connection is open; a teardown can be noted a moment before the
    // connecting thread notes the connection (it then counts as no exposure at all).
    std::map<std::uint16_t, Clock::time_point> open, early;
    std::vector<double> windows;
    table.onTornDown = [&](const platform::TcpRow& row, Clock::time_point when) {
        std::lock_guard<std::mutex> hold(lock);
        auto port = static_cast<std::uint16_t>(row.localPort);
        auto it = open.find(port);
        if (it == open.end()) {
            early[port] = when;
            return;
        }
        windows.push_back(Ms(when - it->second));
        open.erase(it);
    };
    std::vector<double> sweepTimes;
    int abortedInHandshake = 0;

    for (auto _ : state) {
        std::atomic<bool> done{false};
        std::vector<Connection> listed;
        std::thread connector([&] {
            std::mt19937 random(7);
            std::uniform_int_distribution<int> pause(0, 110);
            for (int i = 0; i < kListedConnections; ++i) {
                std::this_thread::sleep_for(std::chrono::milliseconds(pause(random)));
                Connection c = Connect(w.listed);
                auto now = Clock::now();
                std::lock_guard<std::mutex> hold(lock);
                if (!c.client) {
                    ++abortedInHandshake;  // torn down while still connecting: never exposed
                    continue;
                }
                std::uint16_t port = htons(c.clientPort);
                if (early.erase(port) != 0) windows.push_back(0);
                else open[port] = now;
                listed.push_back(std::move(c));
            }
            std::this_thread::sleep_for(std::chrono::milliseconds(300));
            done = true;
        });
        // The guard: a tick every 55 ms; a tick that falls due during a sweep runs right after it.
        double cpuBefore = ThreadCpuMs();
        auto started = Clock::now();
        auto next = started;
        int sweeps = 0;
        while (!done.load()) {
            std::this_thread::sleep_until(next);
            next += std::chrono::milliseconds(55);
            auto start = Clock::now();
            sweep.SweepConnections();
            sweepTimes.push_back(Ms(Clock::now() - start));
            ++sweeps;
            if (Clock::now() > next) next = Clock::now();
        }
        double wall = Ms(Clock::now() - started);
        double cpu = ThreadCpuMs() - cpuBefore;
        connector.join();
        state.counters["cpu_percent"] = 100.0 * cpu / wall;
        state.counters["sweeps"] = sweeps;
    }
    state.counters["sweep_p50_ms"] = Percentile(sweepTimes, 0.5);
    state.counters["sweep_p99_ms"] = Percentile(sweepTimes, 0.99);
    state.counters["torn_down"] = static_cast<double>(windows.size());
    state.counters["aborted_connecting"] = abortedInHandshake;
    state.counters["never_torn_down"] = static_cast<double>(open.size());
    state.counters["exposure_p50_ms"] = Percentile(windows, 0.5);
    state.counters["exposure_p99_ms"] = Percentile(windows, 0.99);
    state.counters["exposure_max_ms"] = Percentile(windows, 1.0);
}
BENCHMARK(BM_ExposureWindow)->Arg(10)->Iterations(1)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_ExposureWindow)->Arg(1000)->Iterations(1)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_ExposureWindow)->Arg(10000)->Iterations(1)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
    std::string reason = TeardownUnavailableReason();
    if (!reason.empty()) {
        std::printf("sweep_bench: %s.\n", reason.c_str());
        return 0;
    }
    if (!AllowOpenFiles(12000)) {
        std::printf("sweep_bench: cannot raise the open-file limit to 12,000.\n");
        return 1;
    }
    TheDefinitions();
    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
