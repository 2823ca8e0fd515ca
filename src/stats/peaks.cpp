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

template <class T>
struct Peak {
    int index;
    T prominence;
    int left_base, right_base;
    T left, right;  // where the signal has the height of the width
};

/// Lists the samples that are above their neighbours, of equal ones the middle. There must be room
/// for one more than there can be.
template <class T>
std::size_t list_maxima(std::span<const T> x, int* maxima) {
    std::size_t count = 0;
    const std::size_t n = x.size();
    for (std::size_t i = 1; i + 1 < n; ++i) {
        const bool rises = x[i - 1] < x[i];
        maxima[count] = int(i);  // written in any case: in noise, no branch could be foreseen
        count += std::size_t(rises & (x[i + 1] < x[i]));
        if (rises & (x[i + 1] == x[i])) {
            std::size_t end = i + 2;
            while (end < n && x[end] == x[i]) ++end;
            if (end < n && x[end] < x[i]) maxima[count++] = int((i + end - 1) / 2);
            i = end - 1;
        }
    }
    return count;
}

/// Keeps some of a list, in their order.
template <class Item, class Keeps>
std::size_t keep_if(Item* items, std::size_t count, Keeps keeps) {
    std::size_t left = 0;
    for (std::size_t k = 0; k < count; ++k) {
        const bool kept = keeps(items[k]);
        items[left] = items[k];
        left += std::size_t(kept);
    }
    return left;
}

/// Keeps maxima that no higher one is near, beginning with the highest; of equally high ones the
/// later comes first. False when memory runs out.
///
/// From one the way leads to the highest near it, and on, up to one that none near it is above:
/// that stays, whatever is decided elsewhere, and those near it go. Then on from the last on the
/// way that has not gone. A way leads in one direction, as far in two steps as the distance, so
/// that all looks around together see each sample a few times.
template <class T>
bool keep_apart(std::span<const T> x, int* maxima, std::size_t& count, T distance) {
    constexpr T gone = -std::numeric_limits<T>::infinity();  // which is above nothing
    const auto height = block<T>(count);
    const auto way = block<std::uint32_t>(count);
    if (!height || !way) return false;
    for (std::size_t k = 0; k < count; ++k) height[k] = x[std::size_t(maxima[k])];
    const double least = std::ceil(double(distance));
    const auto near = [&](std::size_t a, std::size_t b) { return maxima[b] - maxima[a] < least; };

    for (std::size_t start = 0; start < count; ++start) {
        std::size_t steps = 0;
        way[steps++] = std::uint32_t(start);
        while (steps > 0) {
            const std::size_t i = way[steps - 1];
            if (height[i] == gone) {
                --steps;
                continue;
            }
            std::size_t first = i, end = i + 1, top = i;
            while (first > 0 && near(first - 1, i)) --first;
            while (end < count && near(i, end)) ++end;
            for (std::size_t k = first; k < end; ++k) {
                if (height[k] >= height[top]) top = k;
            }
            if (top != i) {
                way[steps++] = std::uint32_t(top);
                continue;
            }
            std::fill(&height[first], &height[i], gone);
            std::fill(&height[i + 1], &height[0] + end, gone);
            --steps;
        }
    }
    std::size_t left = 0;
    for (std::size_t k = 0; k < count; ++k) {
        maxima[left] = maxima[k];
        left += std::size_t(height[k] != gone);
    }
    count = left;
    return true;
}

/// The lowest of a run of samples; of equally low ones the first and the last.
template <class T>
struct Lowest {
    T low;
    int first, last;

    /// Of this run and the next.
    Lowest with(const Lowest& next) const {
        if (low == next.low) return {low, first, next.last};
        return low < next.low ? *this : next;
    }
};

/// The prominences and bases of the peaks that are some of the maxima. The maxima that no later one
/// has exceeded are on a stack, each with the lowest sample since the one before it there. False
/// when memory runs out.
template <class T>
bool find_prominences(std::span<const T> x, std::span<const int> maxima, std::span<Peak<T>> peaks) {
    struct Open {
        T height;
        std::size_t peak;
        Lowest<T> since, left;  // the one before; the last that is higher, or the end
    };
    const auto stack = block<Open>(maxima.size());
    if (!stack) return false;
    constexpr Lowest<T> none{std::numeric_limits<T>::infinity(), -1, -1};
    Lowest<T> gap = none;  // since the top of the stack
    std::size_t open = 0, peak = 0;
    const auto close = [&](auto exceeded) {
        for (; open > 0 && exceeded(stack[open - 1].height); --open) {
            const Open& top = stack[open - 1];
            if (top.peak < peaks.size()) {
                auto& p = peaks[top.peak];
                p.left_base = top.left.last;
                p.right_base = gap.first;
                p.prominence = top.height - std::max(top.left.low, gap.low);
            }
            gap = top.since.with(gap);
        }
    };
    const auto close_all = [&] { close([](T) { return true; }); };

    int i = 0;
    const auto look_until = [&](int end) {
        for (; i < end; ++i) {
            const T value = x[std::size_t(i)];
            if (value < gap.low) {
                gap = {value, i, i};
            } else if (value == gap.low) {
                gap.last = i;
            } else if (std::isnan(value)) {  // as good as an end
                close_all();
                gap = none;
            }
        }
    };
    for (const int maximum : maxima) {
        look_until(maximum);
        const T height = x[std::size_t(maximum)];
        close([=](T other) { return other < height; });
        const bool alike = open > 0 && stack[open - 1].height == height;
        const bool wanted = peak < peaks.size() && peaks[peak].index == maximum;
        stack[open] = {height, wanted ? peak++ : peaks.size(), gap,
                       alike ? stack[open - 1].left.with(gap) : gap};
        ++open;
        gap = none;
        i = maximum + 1;
    }
    look_until(int(x.size()));
    close_all();
    return true;
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
void find_width(std::span<const T> x, Peak<T>& peak, T rel_height, Next next) {
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

/// The widths, walked to as long as they are near, then by a tree. False when memory runs out.
template <class T>
bool find_widths(std::span<const T> x, std::span<Peak<T>> peaks, T rel_height) {
    auto steps_left = 4 * std::int64_t(x.size());
    std::size_t k = 0;
    for (; k < peaks.size() && steps_left >= 0; ++k) {
        find_width(x, peaks[k], rel_height, [&](int i, int end, int step, T h) {
            const int from = i;
            while (i != end && !(x[std::size_t(i)] <= h)) i += step;
            steps_left -= std::abs(i - from);
            return i;
        });
    }
    if (k == peaks.size()) return true;
    Minima<T> minima;
    if (!minima.build(x)) return false;
    for (; k < peaks.size(); ++k) {
        find_width(x, peaks[k], rel_height,
                   [&](int i, int end, int step, T h) { return minima.next(i, end, step, h); });
    }
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
    const T* const at = x.data();
    const auto maxima = block<int>(x.size() / 2 + 1);
    if (!maxima) return -1;
    const std::span<const int> all(maxima.get(), list_maxima<T>(x, maxima.get()));
    const auto chosen = block<int>(all.size());
    if (!chosen) return -1;
    std::ranges::copy(all, chosen.get());
    std::size_t count = all.size();
    const auto choose = [&](auto keeps) { count = keep_if(chosen.get(), count, keeps); };
    if (!std::isnan(least.height)) choose([=](int i) { return at[i] >= least.height; });
    if (!std::isnan(least.threshold)) {
        choose([=](int i) {
            return std::min(at[i] - at[i - 1], at[i] - at[i + 1]) >= least.threshold;
        });
    }
    if (least.distance > 1 && !keep_apart<T>(x, chosen.get(), count, least.distance)) return -1;

    const auto peaks = block<Peak<T>>(count);
    if (!peaks) return -1;
    for (std::size_t k = 0; k < count; ++k) peaks[k].index = chosen[k];
    const auto found = [&] { return std::span(peaks.get(), count); };
    const auto keep = [&](auto keeps) { count = keep_if(peaks.get(), count, keeps); };
    if (!find_prominences<T>(x, all, found())) return -1;
    if (!std::isnan(least.prominence)) {
        keep([=](auto& p) { return p.prominence >= least.prominence; });
    }
    if (!find_widths<T>(x, found(), least.rel_height)) return -1;
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
