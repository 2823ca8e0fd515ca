#include "base/progress.hpp"

#include <unistd.h>

#include <chrono>
#include <cstdio>

#include "base/text.hpp"

namespace wavkit::tool {

using namespace std::chrono_literals;

Progress::Progress(const std::string& what) : what_(printable(what)) {
    if (isatty(STDERR_FILENO)) watcher_ = std::thread([this] { show(); });
}

Progress::~Progress() {
    if (!watcher_.joinable()) return;
    {
        const std::lock_guard lock(mutex_);
        stop_ = true;
    }
    over_.notify_one();
    watcher_.join();
}

void Progress::show() {
    constexpr const char* to_line_start = "\r\033[K";
    const auto start = std::chrono::steady_clock::now();
    std::unique_lock lock(mutex_);
    if (over_.wait_for(lock, 1s, [this] { return stop_; })) return;
    do {
        const double fraction = fraction_.load(std::memory_order_relaxed);
        const auto seconds = (std::chrono::steady_clock::now() - start) / 1s;
        if (fraction > 0) {
            std::fprintf(stderr, "%s%s ... %.0f %%", to_line_start, what_.c_str(), 100 * fraction);
        } else {
            std::fprintf(stderr, "%s%s ... %lld s", to_line_start, what_.c_str(),
                         static_cast<long long>(seconds));
        }
        std::fflush(stderr);
    } while (!over_.wait_for(lock, 200ms, [this] { return stop_; }));
    std::fputs(to_line_start, stderr);
}

}  // namespace wavkit::tool
