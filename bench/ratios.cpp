#include "ratios.hpp"

#include <algorithm>
#include <cstdio>
#include <map>
#include <string>
#include <vector>

namespace wavkit::bench {
namespace {

std::vector<std::string> cases, libraries;  // in the order of their first mention

void remember(std::vector<std::string>& names, const std::string& name) {
    if (std::find(names.begin(), names.end(), name) == names.end()) names.push_back(name);
}

/// Keeps the best time of every library in every case.
class Collector : public benchmark::BenchmarkReporter {
  public:
    bool ReportContext(const Context&) override { return true; }

    void ReportRuns(const std::vector<Run>& runs) override {
        for (const Run& run : runs) {
            if (run.error_occurred || run.run_type != Run::RT_Iteration) continue;
            const double time = run.GetAdjustedCPUTime();
            double& best = times_.try_emplace(run.run_name.function_name, time).first->second;
            best = std::min(best, time);
        }
    }

    void print() const {
        std::printf("%-24s %12s", "", "wavkit, ns");
        for (const auto& library : libraries) {
            if (library != "wavkit") std::printf("  %10s", library.c_str());
        }
        std::printf("   (time as a multiple of wavkit's)\n");
        for (const auto& what : cases) {
            const auto own = times_.find(what + "/wavkit");
            if (own == times_.end()) continue;
            std::printf("%-24s %12.1f", what.c_str(), own->second);
            for (const auto& library : libraries) {
                const auto peer = times_.find(what + "/" + library);
                if (library == "wavkit") continue;
                if (peer == times_.end()) {
                    std::printf("  %10s", "-");
                } else {
                    std::printf("  %9.2fx", peer->second / own->second);
                }
            }
            std::printf("\n");
        }
    }

  private:
    std::map<std::string, double> times_;
};

}  // namespace

void add(const std::string& what, const std::string& library,
         std::function<void(benchmark::State&)> run) {
    remember(cases, what);
    remember(libraries, library);
    benchmark::RegisterBenchmark((what + "/" + library).c_str(), std::move(run));
}

int run_and_compare(int argc, char** argv) {
    // Repetitions of all cases in random order, so that a slow moment of the machine hits
    // everybody.
    std::vector<std::string> words = {argv[0], "--benchmark_enable_random_interleaving=true",
                                      "--benchmark_repetitions=5", "--benchmark_min_time=0.02"};
    words.insert(words.end(), argv + 1, argv + argc);
    std::vector<char*> arguments;
    for (auto& word : words) arguments.push_back(word.data());
    int count = int(arguments.size());
    benchmark::Initialize(&count, arguments.data());
    if (benchmark::ReportUnrecognizedArguments(count, arguments.data())) return 1;
    Collector collector;
    benchmark::RunSpecifiedBenchmarks(&collector);
    collector.print();
    return 0;
}

}  // namespace wavkit::bench
