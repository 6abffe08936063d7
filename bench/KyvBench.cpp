// kyv_bench: times kernels, image operations and effects and prints one table of ratios.
#include <algorithm>
#include <cstdio>
#include <cstring>
#include <map>
#include <random>
#include <utility>

#include "bench/Bench.h"

namespace kyvbench {
namespace {

constexpr const char* kMemcpy = "memcpy";

// A picture like a clouded evening: wide gradients with fine noise and some highlights.
std::vector<uint8_t> MakePicture(uint32_t seed) {
    std::mt19937 random(seed);
    std::vector<uint8_t> bytes(kFrameBytes);
    size_t i = 0;
    for (int y = 0; y < kHeight; ++y) {
        for (int x = 0; x < kWidth; ++x) {
            const int noise = static_cast<int>(random() % 16);
            const int level[4] = {60 + y / 8, 30 + (x + y) / 16, 20 + x / 9, 240};
            for (const int channel : level) {
                bytes[i++] = static_cast<uint8_t>(std::min(channel + noise, 255));
            }
        }
    }
    return bytes;
}

// Gathers the repetitions of every benchmark and prints their medians, in the order in which the
// benchmarks were listed.
class CTableReporter : public benchmark::BenchmarkReporter {
public:
    bool ReportContext(const Context&) override { return true; }

    void ReportRuns(const std::vector<Run>& runs) override {
        for (const Run& run : runs) {
            Row& row = m_rows[run.family_index];
            row.name = run.run_name.function_name;
            row.failed = row.failed || run.error_occurred;
            if (run.run_type == Run::RT_Iteration && !run.error_occurred) {
                // The thread's own time: what other programs take does not count. Work on several
                // threads can only be timed by the wall clock.
                const double seconds = run.run_name.time_type.empty() ? run.cpu_accumulated_time
                                                                      : run.real_accumulated_time;
                row.ns.push_back(seconds * 1e9 / static_cast<double>(run.iterations));
            }
        }
    }

    void Finalize() override {
        std::map<std::string, double> first; // of each operation, in ns a frame
        std::printf("%-34s %-8s %9s %9s %9s %9s\n", "operation", "form", "ms/frame", "ns/pixel",
                    "x memcpy", "speed-up");
        for (auto& [index, row] : m_rows) {
            const size_t slash = row.name.find('/');
            const std::string operation = row.name.substr(0, slash);
            const std::string form = slash == std::string::npos ? "" : row.name.substr(slash + 1);
            if (row.failed || row.ns.empty()) {
                std::printf("%-34s %-8s failed\n", operation.c_str(), form.c_str());
                continue;
            }
            const auto middle = row.ns.begin() + static_cast<ptrdiff_t>(row.ns.size() / 2);
            std::nth_element(row.ns.begin(), middle, row.ns.end());
            const double ns = *middle;
            const double base = first.emplace(operation, ns).first->second;
            const auto copy = first.find(kMemcpy);
            const double ratio = copy == first.end() ? 0 : ns / copy->second;
            std::printf("%-34s %-8s %9.3f %9.3f %9.2f %9.1f\n", operation.c_str(), form.c_str(),
                        ns * 1e-6, ns / static_cast<double>(kPixels), ratio, base / ns);
        }
    }

private:
    struct Row {
        std::string name;
        std::vector<double> ns; // a frame, of each repetition
        bool failed = false;
    };

    std::map<int64_t, Row> m_rows;
};

} // namespace

Frames& SharedFrames() {
    static Frames frames = {{MakePicture(1), MakePicture(2), MakePicture(4)}, MakePicture(3)};
    return frames;
}

void AddPrepared(const std::string& operation, const std::string& form,
                 std::function<std::function<void()>()> make, Clock clock) {
    auto* added = benchmark::RegisterBenchmark((operation + "/" + form).c_str(),
                                               [make = std::move(make)](benchmark::State& state) {
                                                   const std::function<void()> run = make();
                                                   if (!run) {
                                                       state.SkipWithError("cannot be prepared");
                                                       return;
                                                   }
                                                   for ([[maybe_unused]] auto _ : state) {
                                                       run();
                                                       benchmark::ClobberMemory();
                                                   }
                                               });
    if (clock == Clock::Wall) {
        added->UseRealTime();
    }
}

void Add(const std::string& operation, const std::string& form, std::function<void()> run) {
    AddPrepared(operation, form, [run = std::move(run)] { return run; });
}

} // namespace kyvbench

// Takes Google Benchmark's options. A filter keeps the memcpy, which every row is set against.
int main(int argc, char** argv) {
    using namespace kyvbench;
    // Repetitions of all take turns, so that a busy spell of the machine strikes all alike.
    std::vector<std::string> options = {argv[0], "--benchmark_repetitions=9",
                                        "--benchmark_min_time=0.02",
                                        "--benchmark_enable_random_interleaving=true"};
    constexpr const char* kFilter = "--benchmark_filter=";
    for (int i = 1; i < argc; ++i) {
        std::string option = argv[i];
        if (option.rfind(kFilter, 0) == 0) {
            option.insert(std::strlen(kFilter), "memcpy|");
        }
        options.push_back(option);
    }
    std::vector<char*> arguments;
    for (std::string& option : options) {
        arguments.push_back(option.data());
    }
    int count = static_cast<int>(arguments.size());
    arguments.push_back(nullptr);
    benchmark::Initialize(&count, arguments.data());
    if (benchmark::ReportUnrecognizedArguments(count, arguments.data())) {
        return 2;
    }
    Add(kMemcpy, "", [] {
        std::memcpy(SharedFrames().target.data(), SharedFrames().source[0].data(), kFrameBytes);
    });
    AddKernels();
    AddImageOperations();
    AddEffects();
    CTableReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    return 0;
}
