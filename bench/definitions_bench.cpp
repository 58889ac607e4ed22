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

// Resident memory is measured in a fresh process (this program started again with
// --resident-check), so memory that other benchmarks freed cannot hide the cost: resident size
// after loading, with the file text released, minus before.
int ResidentCheck(const char* path) {
    vantorel::platform::StdFiles files;
    long before = ResidentBytes();
    vantorel::DefinitionList list;
    {
        std::string text;
        files.ReadAll(path, text);
        list = vantorel::DefinitionList::FromText(text);
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
                else if (order == 0) { at = mid; break; }
                else hi = mid - 1;
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
    if (argc == 3 && std::string(argv[1]) == "--resident-check") return ResidentCheck(argv[2]);
    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
