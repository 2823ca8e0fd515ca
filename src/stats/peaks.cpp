// All peaks of a signal, by height, steepness, distance, prominence and width.
#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <memory>
#include <new>

#include "record_view.hpp"

namespace wavkit {
namespace {

/// What a peak must have at least; NaN asks for nothing.
template <class T>
struct Conditions {
    T height, threshold, distance, prominence, width, rel_height;
};

/// Memory that may not be there.
template <class Value>
std::unique_ptr<Value[]> block(std::size_t count) {
    return std::unique_ptr<Value[]>(new (std::nothrow) Value[std::max<std::size_t>(count, 1)]);
}

/// The lowest sample on the way from a sample to the next one above it; `low` at `at`.
template <class T>
struct Base {
    T low;
    int at;
};

template <class T>
struct Peak {
    int index;
    T prominence;
    int left_base, right_base;
    T left, right;  // where the signal has the height of the width
};

/// Lists the samples that are above their neighbours, of equal ones the middle.
template <class T>
std::size_t list_maxima(std::span<const T> x, Peak<T>* peaks) {
    std::size_t count = 0;
    const std::size_t n = x.size();
    for (std::size_t i = 1; i + 1 < n; ++i) {
        if (!(x[i - 1] < x[i])) continue;
        std::size_t end = i + 1;
        while (end + 1 < n && x[end] == x[i]) ++end;
        if (x[end] < x[i]) {
            peaks[count++].index = int((i + end - 1) / 2);
            i = end - 1;
        }
    }
    return count;
}

template <class T, class Keeps>
std::size_t keep_peaks(Peak<T>* peaks, std::size_t count, Keeps keeps) {
    return std::size_t(
        std::remove_if(peaks, peaks + count, [=](const Peak<T>& p) { return !keeps(p); }) - peaks);
}

/// Keeps peaks that no higher one is near, beginning with the highest; of equally high ones the
/// later comes first.
template <class T>
class Apart {
  public:
    Apart(std::span<const T> x, Peak<T>* peaks, std::size_t count, T distance)
        : x_(x), peaks_(peaks), count_(count), least_(std::ceil(double(distance))) {}

    /// False when memory runs out.
    bool choose() {
        state_ = block<State>(count_);
        if (!state_) return false;
        std::fill_n(state_.get(), count_, State::open);
        // As many as there are near a peak are looked at again and again, or all are sorted.
        constexpr double few = 24;
        return least_ * double(count_) < few * double(x_.size()) ? climb() : descend();
    }

    /// How many are left.
    std::size_t compact() {
        std::size_t left = 0;
        for (std::size_t i = 0; i < count_; ++i) {
            if (state_[i] == State::kept) peaks_[left++] = peaks_[i];
        }
        return left;
    }

  private:
    enum class State : unsigned char { open, kept, gone };

    T height(std::size_t i) const { return x_[std::size_t(peaks_[i].index)]; }
    bool before(std::size_t a, std::size_t b) const {
        return height(a) > height(b) || (height(a) == height(b) && a > b);
    }
    bool near(std::size_t a, std::size_t b) const {
        return double(peaks_[b].index) - peaks_[a].index < least_;
    }

    template <class Take>
    void each_near(std::size_t i, Take take) const {
        for (std::size_t k = i; k > 0 && near(k - 1, i); --k) take(k - 1);
        for (std::size_t k = i + 1; k < count_ && near(i, k); ++k) take(k);
    }
    void keep(std::size_t i) {
        each_near(i, [this](std::size_t k) { state_[k] = State::gone; });
        state_[i] = State::kept;
    }

    /// From peak to the highest one near it, up to one that none is above: that stays, whatever is
    /// decided elsewhere. Then on from the last that is still open on the way there.
    bool climb() {
        const auto way = block<std::uint32_t>(count_);
        if (!way) return false;
        for (std::size_t start = 0; start < count_; ++start) {
            if (state_[start] != State::open) continue;
            std::size_t steps = 0;
            way[steps++] = std::uint32_t(start);
            while (steps > 0) {
                const std::size_t i = way[steps - 1];
                if (state_[i] != State::open) {
                    --steps;
                    continue;
                }
                std::size_t top = i;
                each_near(i, [&](std::size_t k) {
                    if (state_[k] == State::open && before(k, top)) top = k;
                });
                if (top == i) {
                    keep(i);
                } else {
                    way[steps++] = std::uint32_t(top);
                }
            }
        }
        return true;
    }

    bool descend() {
        struct Ranked {
            T height;
            std::uint32_t peak;
        };
        const auto order = block<Ranked>(count_);
        if (!order) return false;
        for (std::size_t i = 0; i < count_; ++i) order[i] = {height(i), std::uint32_t(i)};
        std::sort(order.get(), order.get() + count_, [](Ranked a, Ranked b) {
            return a.height > b.height || (a.height == b.height && a.peak > b.peak);
        });
        for (std::size_t i = 0; i < count_; ++i) {
            if (state_[order[i].peak] == State::open) keep(order[i].peak);
        }
        return true;
    }

    std::span<const T> x_;
    Peak<T>* peaks_;
    std::size_t count_;
    double least_;
    std::unique_ptr<State[]> state_;
};

template <class T>
bool keep_apart(std::span<const T> x, Peak<T>* peaks, std::size_t& count, T distance) {
    Apart<T> apart(x, peaks, count, distance);
    if (!apart.choose()) return false;
    count = apart.compact();
    return true;
}

/// Walks from every peak to its bases, which is fast where most of them are near. False where it
/// becomes long.
template <class T>
bool walk_to_bases(std::span<const T> x, Peak<T>* peaks, std::size_t count) {
    const int n = int(x.size());
    std::int64_t steps_left = 4 * std::int64_t(n);
    for (std::size_t k = 0; k < count && steps_left >= 0; ++k) {
        auto& peak = peaks[k];
        const T top = x[std::size_t(peak.index)];
        const auto base = [&](int step) {
            Base<T> lowest{top, peak.index};
            int i = peak.index;
            for (; i >= 0 && i < n && x[std::size_t(i)] <= top; i += step) {
                if (x[std::size_t(i)] < lowest.low) lowest = {x[std::size_t(i)], i};
            }
            steps_left -= std::abs(i - peak.index);
            return lowest;
        };
        const auto left = base(-1), right = base(1);
        peak.left_base = left.at;
        peak.right_base = right.at;
        peak.prominence = top - std::max(left.low, right.low);
    }
    return steps_left >= 0;
}

/// The bases of all peaks on one side. The samples that no later one has exceeded are on a stack,
/// each with the lowest one between it and the one before it there. `at(i)` is the i-th sample on
/// the way, and a NaN ends it.
template <class T, class At, class Give>
bool find_bases(std::size_t n, At at, std::size_t count, Give give) {
    struct Open {
        T value;
        Base<T> base;
    };
    const auto stack = block<Open>(n);
    if (!stack) return false;
    std::size_t open = 0, peak = 0;
    for (std::size_t i = 0; i < n && peak < count; ++i) {
        const T value = at(i);
        if (std::isnan(value)) {
            open = 0;
            continue;
        }
        Base<T> base{value, int(i)};
        for (; open > 0 && stack[open - 1].value <= value; --open) {
            if (stack[open - 1].base.low < base.low) base = stack[open - 1].base;
        }
        stack[open++] = {value, base};
        if (give(peak, int(i), base)) ++peak;
    }
    return true;
}

template <class T>
bool find_prominences(std::span<const T> x, Peak<T>* peaks, std::size_t count) {
    const std::size_t n = x.size();
    const int last = int(n) - 1;
    const auto lows = block<T>(count);
    if (!lows) return false;
    const auto leftwards = [&](std::size_t k, int i, Base<T> base) {
        if (peaks[k].index != i) return false;
        peaks[k].left_base = base.at;
        lows[k] = base.low;
        return true;
    };
    const auto rightwards = [&](std::size_t k, int i, Base<T> base) {
        auto& peak = peaks[count - 1 - k];
        if (peak.index != last - i) return false;
        peak.right_base = last - base.at;
        const T higher = std::max(lows[count - 1 - k], base.low);
        peak.prominence = x[std::size_t(peak.index)] - higher;
        return true;
    };
    return find_bases<T>(
               n, [=](std::size_t i) { return x[i]; }, count, leftwards) &&
           find_bases<T>(
               n, [=](std::size_t i) { return x[n - 1 - i]; }, count, rightwards);
}

/// Minima of blocks of samples, of blocks of blocks, and so on: finds the next sample that is low
/// enough in a time that grows with the logarithm of its distance.
template <class T>
class Minima {
  public:
    /// False when memory runs out.
    bool build(std::span<const T> x) {
        std::size_t total = 0;
        for (std::size_t n = x.size(); n > fan; n = blocks(n)) total += blocks(n);
        room_ = block<T>(total);
        if (!room_) return false;
        level_[0] = x;
        T* to = room_.get();
        for (levels_ = 1; level_[levels_ - 1].size() > fan; ++levels_) {
            const auto below = level_[levels_ - 1];
            const std::size_t n = blocks(below.size());
            for (std::size_t k = 0; k < n; ++k) {
                const auto end = std::min((k + 1) * fan, below.size());
                T least = std::numeric_limits<T>::infinity();
                for (auto i = k * fan; i < end; ++i) least = below[i] < least ? below[i] : least;
                to[k] = least;
            }
            level_[levels_] = {to, n};
            to += n;
        }
        return true;
    }

    /// The first sample in the direction of `step` from i on that is not above h; `end` where there
    /// is none before it.
    int next(int i, int end, int step, T h) const {
        constexpr int f = int(fan);
        std::size_t level = 0;
        std::int64_t size = 1;  // samples to a value of the level
        while (i != end) {
            const std::int64_t value = i / size;
            if (level_[level][std::size_t(value)] <= h) {
                if (level == 0) return i;
                --level, size /= f;
                continue;
            }
            // Past this value, and up a level where a whole block begins and `end` is beyond it.
            const std::int64_t beyond = step > 0 ? (value + 1) * size : value * size - 1;
            if (step > 0 ? beyond >= end : beyond <= end) return end;
            i = int(beyond);
            const std::int64_t wider = size * f;
            const bool begins = step > 0 ? i % wider == 0 : (i + 1) % wider == 0;
            if (begins && level + 1 < levels_) ++level, size = wider;
        }
        return end;
    }

  private:
    static constexpr std::size_t fan = 16;
    static std::size_t blocks(std::size_t n) { return (n + fan - 1) / fan; }

    std::unique_ptr<T[]> room_;
    std::array<std::span<const T>, 10> level_{};
    std::size_t levels_ = 0;
};

/// Where the line between samples has the height of the width, between a peak and its bases:
/// `next(i, end, step, h)` finds the first sample from i on that is not above h, or the end.
template <class T, class Next>
void find_widths(std::span<const T> x, Peak<T>* peaks, std::size_t count, T rel_height, Next next) {
    for (std::size_t k = 0; k < count; ++k) {
        auto& peak = peaks[k];
        const T h = x[std::size_t(peak.index)] - peak.prominence * rel_height;
        const auto crossing = [&](int base, int step) {
            const int i = next(peak.index, base, step, h);
            const T low = x[std::size_t(i)];
            if (!(low < h)) return T(i);
            const T share = (h - low) / (x[std::size_t(i - step)] - low);
            return step < 0 ? T(i) + share : T(i) - share;
        };
        peak.left = crossing(peak.left_base, -1);
        peak.right = crossing(peak.right_base, 1);
    }
}

/// The widths, walked to where the bases have been near, else by a tree. False when memory runs
/// out.
template <class T>
bool find_widths(std::span<const T> x, Peak<T>* peaks, std::size_t count, T rel_height, bool near) {
    if (near) {
        find_widths(x, peaks, count, rel_height, [=](int i, int end, int step, T h) {
            while (i != end && !(x[std::size_t(i)] <= h)) i += step;
            return i;
        });
        return true;
    }
    Minima<T> minima;
    if (!minima.build(x)) return false;
    find_widths(x, peaks, count, rel_height,
                [&](int i, int end, int step, T h) { return minima.next(i, end, step, h); });
    return true;
}

/// Writes the rows, with the vertex of the parabola through each peak and its neighbours.
template <Record R>
void write_rows(std::span<const scalar<R>> x, const Peak<scalar<R>>* peaks, std::size_t count,
                R* out) {
    using T = scalar<R>;
    for (std::size_t k = 0; k < count; ++k) {
        const auto& peak = peaks[k];
        const auto i = std::size_t(peak.index);
        const T slope = (x[i + 1] - x[i - 1]) / 2, bend = (x[i + 1] - 2 * x[i] + x[i - 1]) / 2;
        const T aside = bend < 0 ? -slope / (2 * bend) : T(0);
        T* const row = out->data + k * DSP_PEAKS_VALUES;
        row[DSP_PEAKS_INDEX] = T(peak.index);
        row[DSP_PEAKS_HEIGHT] = x[i];
        row[DSP_PEAKS_PROMINENCE] = peak.prominence;
        row[DSP_PEAKS_LEFT_BASE] = T(peak.left_base);
        row[DSP_PEAKS_RIGHT_BASE] = T(peak.right_base);
        row[DSP_PEAKS_WIDTH] = peak.right - peak.left;
        row[DSP_PEAKS_LEFT] = peak.left;
        row[DSP_PEAKS_RIGHT] = peak.right;
        row[DSP_PEAKS_POSITION] = T(peak.index) + aside;
        row[DSP_PEAKS_TOP] = x[i] + slope / 2 * aside;
    }
}

template <Record R>
int find_peaks(const R* signal, R* out, Conditions<scalar<R>> least) {
    using T = scalar<R>;
    if (signal->complex) return -1;
    const auto x = values(signal);
    const auto peaks = block<Peak<T>>(x.size() / 2);
    if (!peaks) return -1;
    const auto at = [=](const Peak<T>& p, int aside) { return x.data()[p.index + aside]; };
    std::size_t count = list_maxima<T>(x, peaks.get());
    const auto keep = [&](auto keeps) { count = keep_peaks(peaks.get(), count, keeps); };
    if (!std::isnan(least.height)) keep([=](auto& p) { return at(p, 0) >= least.height; });
    if (!std::isnan(least.threshold)) {
        keep([=](auto& p) {
            return std::min(at(p, 0) - at(p, -1), at(p, 0) - at(p, 1)) >= least.threshold;
        });
    }
    if (least.distance > 1 && !keep_apart<T>(x, peaks.get(), count, least.distance)) return -1;
    const bool near = walk_to_bases<T>(x, peaks.get(), count);
    if (!near && !find_prominences<T>(x, peaks.get(), count)) return -1;
    if (!std::isnan(least.prominence)) {
        keep([=](auto& p) { return p.prominence >= least.prominence; });
    }
    if (!find_widths<T>(x, peaks.get(), count, least.rel_height, near)) return -1;
    if (!std::isnan(least.width)) keep([=](auto& p) { return p.right - p.left >= least.width; });

    const std::size_t most = std::size_t(std::numeric_limits<int>::max()) / DSP_PEAKS_VALUES;
    if (count > most) return -1;
    return write_to<R>(out, shares_memory(signal, out), [&](R* rows) {
        rows->points = int(count * DSP_PEAKS_VALUES);
        rows->complex = 0;
        rows->delta = out->delta;
        if (dsp_alloc(rows)) return -1;
        write_rows<R>(x, peaks.get(), count, rows);
        return 0;
    });
}

}  // namespace
}  // namespace wavkit

int dsps_peaks(const dsp* x, dsp* out, double height, double threshold, double distance,
               double prominence, double width, double rel_height) {
    return wavkit::find_peaks(x, out, {height, threshold, distance, prominence, width, rel_height});
}
int dspfs_peaks(const dspf* x, dspf* out, float height, float threshold, float distance,
                float prominence, float width, float rel_height) {
    return wavkit::find_peaks(x, out, {height, threshold, distance, prominence, width, rel_height});
}
