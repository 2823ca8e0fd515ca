// A sign of life on standard error.
#pragma once

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

namespace wavkit::tool {

/// While it lives, and from its first second on, shows on a line of the terminal what is being
/// done, how far it is and what time remains, and wipes the line at the end. Silent where standard
/// error is no terminal, and while another one lives.
class Progress {
  public:
    explicit Progress(const std::string& what);
    ~Progress();
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    /// How much of the work is done, 0 to 1; where it is never told, seconds are shown.
    void done(double fraction) { fraction_.store(fraction, std::memory_order_relaxed); }

  private:
    void show();

    static std::atomic<bool> shown_;  // whether the line is taken
    std::string what_;
    std::atomic<double> fraction_{0.0};
    std::mutex mutex_;
    std::condition_variable over_;
    bool stop_ = false;
    std::thread watcher_;
};

}  // namespace wavkit::tool
