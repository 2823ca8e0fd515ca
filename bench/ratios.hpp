// Benchmarks of wavkit beside its peers: every peer's time as a multiple of wavkit's, measured in
// the same run.
#pragma once

#include <benchmark/benchmark.h>

#include <functional>
#include <string>

namespace wavkit::bench {

/// Registers one library's run of a case; the library called "wavkit" is what others are held to.
void add(const std::string& what, const std::string& library,
         std::function<void(benchmark::State&)> run);

/// Runs what was added, as Google Benchmark's command line says, and prints the table of ratios.
int run_and_compare(int argc, char** argv);

}  // namespace wavkit::bench
