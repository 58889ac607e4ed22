// Loading and searching 1,000,000 definitions: the list against the plain baseline, a vector of
// texts searched by halving with text comparison, in the same run.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <random>
#include <string>
#include <unistd.h>
#include <vector>

#include "guard/definitions.h"
#include "platform/std/files_std.h"

namespace {

constexpr std::size_t kKeys = 1'000'000;

struct Data {
    std::string path;
    std::vector<std::string> sortedLines;
    std::vector<std::int32_t> present;  // keys in the file, random order
    std::vector<std::int32_t> absent;   // keys not in the file
};

const Data& TheData() {
    static const Data data = [] {
        Data d;
        std::mt19937 random(2026);
        std::vector<std::int32_t> keys;
        keys.reserve(kKeys * 2);
        while (keys.size() < kKeys * 2) keys.push_back(static_cast<std::int32_t>(random()));
        std::sort(keys.begin(), keys.end());
        keys.erase(std::unique(keys.begin(), keys.end()), keys.end());
        std::shuffle(keys.begin(), keys.end(), random);
        d.present.assign(keys.begin(), keys.begin() + kKeys);
        d.absent.assign(keys.begin() + kKeys, keys.end());
        for (std::int32_t k : d.present) d.sortedLines.push_back(std::to_string(k));
        std::sort(d.sortedLines.begin(), d.sortedLines.end());
        d.path = "/tmp/vantorel-bench-sw2.def";
        std::ofstream out(d.path, std::ios::binary);
        for (const auto& line : d.sortedLines) out << line << "\r\n";
        return d;
    }();
    return data;
}

long ResidentBytes() {
    long pages = 0, resident = 0;
    std::FILE* statm = std::fopen("/proc/self/statm", "r");
    if (statm == nullptr) return 0;
    if (std::fscanf(statm, "%ld %ld", &pages, &resident) != 2) resident = 0;
    std::fclose(statm);
    return resident * sysconf(_SC_PAGESIZE);
}

void BM_LoadDefinitions(benchmark::State& state) {
    const Data& data = TheData();
    vantorel::platform::StdFiles files;
    std::size_t keys = 0;
    for (auto _ : state) {
        std::string text;
        files.ReadAll(data.path, text);
        vantorel::DefinitionList list = vantorel::DefinitionList::FromText(text);
        keys = list.size();
        benchmark::DoNotOptimize(list);
    }
    state.counters["keys"] = static_cast<double>(keys);
}
BENCHMARK(BM_LoadDefinitions)->Unit(benchmark::kMillisecond)->Iterations(10);

// Files that are not lists: 20 MB of bare line feeds, and 20 MB of short lines that are not keys.
// Load time, and memory held per byte of file (heap bytes of the list; resident growth in a fresh
// process below).
const std::string& JunkFile(int kind) {
    static std::string paths[2];
    std::string& path = paths[kind];
    if (path.empty()) {
        path = "/tmp/vantorel-bench-junk" + std::to_string(kind) + ".def";
        std::ofstream out(path, std::ios::binary);
        const std::string line = kind == 0 ? "\n" : "x\n";
        for (std::size_t bytes = 0; bytes < (20u << 20); bytes += line.size()) out << line;
    }
    return path;
}

void BM_LoadJunk(benchmark::State& state) {
    const std::string& path = JunkFile(static_cast<int>(state.range(0)));
    vantorel::platform::StdFiles files;
    std::string text;
    files.ReadAll(path, text);
    std::size_t bytes = 0;
    for (auto _ : state) {
        vantorel::DefinitionList list = vantorel::DefinitionList::FromText(text);
        bytes = list.MemoryBytes();
        benchmark::DoNotOptimize(list);
    }
    state.counters["heap_bytes_per_file_byte"] = static_cast<double>(bytes) / static_cast<double>(text.size());
    state.SetLabel(state.range(0) == 0 ? "bare line feeds" : "lines that are not keys");
}
BENCHMARK(BM_LoadJunk)->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond)->Iterations(3);

// Resident memory is measured in a fresh process (this program started again with
// --resident-check), so memory that other benchmarks freed cannot hide the cost: resident size
// after loading, with the file text released, minus before.
int ResidentCheck(const char* path, bool perFileByte) {
    vantorel::platform::StdFiles files;
    long before = ResidentBytes();
    vantorel::DefinitionList list;
    double fileBytes = 0, peak = 0;
    {
        std::string text;
        files.ReadAll(path, text);
        fileBytes = static_cast<double>(text.size());
        list = vantorel::DefinitionList::FromText(text);
        peak = static_cast<double>(ResidentBytes() - before);
    }
    if (perFileByte) {
        std::printf("%f %f\n", peak / fileBytes, static_cast<double>(ResidentBytes() - before) / fileBytes);
        return 0;
    }
    std::printf("%f %f\n", static_cast<double>(ResidentBytes() - before) / list.size(),
                static_cast<double>(list.MemoryBytes()) / list.size());
    return 0;
}

void BM_ResidentBytesPerKey(benchmark::State& state) {
    const Data& data = TheData();
    for (auto _ : state) {
        char self[4096] = {0};
        if (readlink("/proc/self/exe", self, sizeof self - 1) <= 0) state.SkipWithError("readlink");
        std::string command = std::string(self) + " --resident-check " + data.path;
        std::FILE* child = popen(command.c_str(), "r");
        double resident = 0, heap = 0;
        if (child == nullptr || std::fscanf(child, "%lf %lf", &resident, &heap) != 2) state.SkipWithError("child");
        if (child != nullptr) pclose(child);
        state.counters["resident_bytes_per_key"] = resident;
        state.counters["heap_bytes_per_key"] = heap;
    }
}
BENCHMARK(BM_ResidentBytesPerKey)->Iterations(1)->Unit(benchmark::kMillisecond);

// The same for 20 MB of bare line feeds, per byte of file: peak (the file text included) and held.
void BM_ResidentBytesPerJunkByte(benchmark::State& state) {
    const std::string& path = JunkFile(0);
    for (auto _ : state) {
        char self[4096] = {0};
        if (readlink("/proc/self/exe", self, sizeof self - 1) <= 0) state.SkipWithError("readlink");
        std::string command = std::string(self) + " --resident-check " + path + " bytes";
        std::FILE* child = popen(command.c_str(), "r");
        double peak = 0, held = 0;
        if (child == nullptr || std::fscanf(child, "%lf %lf", &peak, &held) != 2) state.SkipWithError("child");
        if (child != nullptr) pclose(child);
        state.counters["peak_bytes_per_file_byte"] = peak;
        state.counters["held_bytes_per_file_byte"] = held;
    }
}
BENCHMARK(BM_ResidentBytesPerJunkByte)->Iterations(1)->Unit(benchmark::kMillisecond);

// Lookups of row keys: half listed, half not, in random order.
template <bool kBaseline>
void BM_Lookup(benchmark::State& state) {
    const Data& data = TheData();
    static vantorel::DefinitionList list = [&] {
        vantorel::platform::StdFiles files;
        std::string text;
        files.ReadAll(data.path, text);
        return vantorel::DefinitionList::FromText(text);
    }();
    // state.range(0): share of listed keys among the probes, in percent.
    std::vector<std::int32_t> probes;
    for (std::size_t i = 0; i < 1 << 16; ++i)
        probes.push_back(static_cast<std::int64_t>(i % 100) < state.range(0) ? data.present[i] : data.absent[i]);
    std::size_t i = 0, found = 0;
    for (auto _ : state) {
        std::int32_t key = probes[i++ & (probes.size() - 1)];
        if constexpr (kBaseline) {
            // The row key written as text, then halving over texts.
            std::string text = std::to_string(key);
            const auto& lines = data.sortedLines;
            std::int64_t lo = 0, hi = static_cast<std::int64_t>(lines.size()) - 1, at = -1;
            while (lo <= hi) {
                std::int64_t mid = (lo + hi) / 2;
                int order = lines[static_cast<std::size_t>(mid)].compare(text);
                if (order < 0) lo = mid + 1;
                else if (order == 0) {
                    at = mid;
                    break;
                } else hi = mid - 1;
            }
            found += at >= 0;
        } else {
            found += vantorel::FindDefinition(list, key) != vantorel::kNoDefinition;
        }
    }
    benchmark::DoNotOptimize(found);
    state.counters["found_share"] = static_cast<double>(found) / state.iterations();
}
BENCHMARK(BM_Lookup<false>)->Name("BM_Lookup/index")->Arg(0)->Arg(50)->Arg(100);
BENCHMARK(BM_Lookup<true>)->Name("BM_Lookup/text_baseline")->Arg(0)->Arg(50)->Arg(100);

}  // namespace

int main(int argc, char** argv) {
    if (argc >= 3 && std::string(argv[1]) == "--resident-check") return ResidentCheck(argv[2], argc == 4);
    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
