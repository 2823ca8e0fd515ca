#include "base/progress.hpp"

#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>

#include "base/text.hpp"

namespace wavkit::tool {

using namespace std::chrono_literals;

namespace {

/// "40 s", "3 min", "2 h 5 min"
std::string rounded_time(double seconds) {
    const auto whole = std::llround(seconds), minutes = (whole + 30) / 60;
    if (whole < 90) return std::to_string(whole) + " s";
    if (minutes < 90) return std::to_string(minutes) + " min";
    return std::to_string(minutes / 60) + " h " + std::to_string(minutes % 60) + " min";
}

std::string progressed(double fraction, double seconds) {
    if (fraction <= 0) return rounded_time(seconds);
    const auto share = std::lround(100 * std::min(fraction, 1.0));
    // The first hundredth of the work says little about the rest.
    if (fraction < 0.01 || fraction >= 1) return std::to_string(share) + " %";
    return std::to_string(share) + " %, " + rounded_time(seconds * (1 - fraction) / fraction) +
           " left";
}

}  // namespace

std::atomic<bool> Progress::shown_{false};

Progress::Progress(const std::string& what) : what_(printable(what)) {
    if (!isatty(STDERR_FILENO) || shown_.exchange(true)) return;
    watcher_ = std::thread([this] { show(); });
}

Progress::~Progress() {
    if (!watcher_.joinable()) return;
    {
        const std::lock_guard lock(mutex_);
        stop_ = true;
    }
    over_.notify_one();
    watcher_.join();
    shown_ = false;
}

void Progress::show() {
    constexpr const char* to_line_start = "\r\033[K";
    const auto start = std::chrono::steady_clock::now();
    std::unique_lock lock(mutex_);
    if (over_.wait_for(lock, 1s, [this] { return stop_; })) return;
    do {
        const double fraction = fraction_.load(std::memory_order_relaxed);
        const std::chrono::duration<double> spent = std::chrono::steady_clock::now() - start;
        std::fprintf(stderr, "%s%s ... %s", to_line_start, what_.c_str(),
                     progressed(fraction, spent.count()).c_str());
        std::fflush(stderr);
    } while (!over_.wait_for(lock, 200ms, [this] { return stop_; }));
    std::fputs(to_line_start, stderr);
}

}  // namespace wavkit::tool
