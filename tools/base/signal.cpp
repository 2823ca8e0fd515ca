#include "base/signal.hpp"

#include <algorithm>
#include <limits>
#include <utility>

#include "base/error.hpp"

namespace wavkit::tool {

void check(int status, const std::string& what) {
    if (status != 0) throw DataError("out of memory while " + what);
}

Signal::Signal() { dsp_init(&record_); }
Signal::Signal(double delta) : Signal() { record_.delta = delta; }
Signal::Signal(Signal&& other) noexcept : facts(std::move(other.facts)), record_(other.record_) {
    dsp_init(&other.record_);
}
Signal& Signal::operator=(Signal&& other) noexcept {
    std::swap(record_, other.record_);
    std::swap(facts, other.facts);
    return *this;
}
Signal::~Signal() { dsp_destroy(&record_); }

std::span<double> Signal::values() {
    return {record_.data, std::size_t(record_.points) * (record_.complex ? 2 : 1)};
}
std::span<const double> Signal::values() const {
    return {record_.data, std::size_t(record_.points) * (record_.complex ? 2 : 1)};
}

void Signal::append(std::span<const double> samples) {
    constexpr std::size_t most = std::numeric_limits<int>::max();
    const auto held = std::size_t(record_.points), needed = held + samples.size();
    if (needed > most) throw DataError("more than 2147483647 samples in one signal");
    if (needed > std::size_t(record_.alloc)) {
        record_.points = int(std::min(most, std::max(needed, 2 * held)));
        check(dsp_realloc(&record_, int(held), 0), "reading samples");
    }
    std::ranges::copy(samples, record_.data + held);
    record_.points = int(needed);
}

void Signal::pair() {
    record_.points /= 2;
    record_.complex = 1;
}

double statistic(int (*reduce)(const dsp*, dsp*), const Signal& x) {
    Signal result;
    check(reduce(x, result), "computing a statistic");
    return result->data[0];
}

}  // namespace wavkit::tool
