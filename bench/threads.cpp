// What a second thread brings: transforms a second of two threads over those of one, each on
// records of its own, in the same run.
#include <wavkit/dsp.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <thread>
#include <vector>

namespace {

using Clock = std::chrono::steady_clock;

/// Transforms to and fro until told to stop; how many there were.
long transform_until(const std::atomic<bool>& stop, int points) {
    dsp x;
    dsp_init(&x);
    x.points = points;
    x.complex = 1;
    if (dspi_zero(&x)) return 0;
    long count = 0;
    for (; !stop.load(std::memory_order_relaxed); count += 2) {
        if (dspi_dft(&x, 0) || dspi_dft(&x, 1)) break;
    }
    dsp_destroy(&x);
    return count;
}

double transforms_a_second(int threads, int points) {
    constexpr auto duration = std::chrono::milliseconds(100);
    std::atomic<bool> stop{false};
    std::vector<long> counts(static_cast<std::size_t>(threads));
    std::vector<std::thread> workers;
    const auto start = Clock::now();
    for (auto& count : counts) {
        workers.emplace_back([&stop, &count, points] { count = transform_until(stop, points); });
    }
    std::this_thread::sleep_for(duration);
    stop = true;
    for (auto& worker : workers) worker.join();
    const std::chrono::duration<double> taken = Clock::now() - start;
    long total = 0;
    for (const long count : counts) total += count;
    return double(total) / taken.count();
}

}  // namespace

int main() {
    std::printf("%-24s %14s %14s  %s\n", "complex double", "1 thread, /s", "2 threads, /s",
                "ratio");
    for (const int points : {16, 60, 256, 1000, 1009, 4096, 65536, 100000}) {
        double one = 0, two = 0;
        for (int round = 0; round < 5; ++round) {
            one = std::max(one, transforms_a_second(1, points));
            two = std::max(two, transforms_a_second(2, points));
        }
        std::printf("%-24d %14.0f %14.0f  %.2f\n", points, one, two, two / one);
    }
}
