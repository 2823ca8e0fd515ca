// Outliers by the median and the median absolute deviation of the window around each sample.
#include <cmath>

#include "smooth/network.hpp"
#include "smooth/sorted_window.hpp"

namespace wavkit {
namespace {

/// The standard deviation of Gaussian noise over its median absolute deviation.
constexpr double to_deviation = 1.4826;

/// The median of |x - m| over a sorted window with the median m. The samples nearest to m lie side
/// by side: where those that are half of them begin, a search finds.
template <class T>
T deviation(const SortedWindow<T>& x, T m) {
    const std::size_t n = x.count(), near = (n + 1) / 2;
    std::size_t first = 0;
    for (std::size_t end = n - near; first < end;) {
        const std::size_t mid = (first + end) / 2;
        if (m - x[mid] > x[mid + near] - m) {
            first = mid + 1;
        } else {
            end = mid;
        }
    }
    const T lower = std::max(m - x[first], x[first + near - 1] - m);
    if (n % 2) return lower;
    const T none = std::numeric_limits<T>::infinity();
    const T left = first > 0 ? m - x[first - 1] : none;
    const T right = first + near < n ? x[first + near] - m : none;
    return (lower + (right < left ? right : left)) * T(0.5);
}

/// What becomes of a sample.
template <class T>
T judged(T sample, const SortedWindow<T>& window, T threshold) {
    const T m = window.median();
    if (!std::isfinite(m)) return sample;
    return std::isnan(sample) || std::fabs(sample - m) > threshold * deviation(window, m) ? m
                                                                                          : sample;
}

template <class T>
bool by_network(const Segment<T>& s, T threshold, T* out) {
    return in_network(s, [&]<int Window>(std::integral_constant<int, Window>) {
        slide<Window>(s.x, s.count, out, [=](const auto& values) {
            using V = kernel::Lanes<T>;
            const V m = median_of<Window>(values) + T(0), sample = values[Window / 2];
            V far[Window];
            kernel::unrolled<Window>([&](auto k) { far[k] = kernel::abs(values[k] - m); });
            const V limit = median_of<Window>(far) * threshold;
            return kernel::abs(sample - m) > limit ? m : sample;
        });
    });
}

template <class T>
int replace(const Segment<T>& s, T threshold, T* out) {
    if (by_network(s, threshold, out)) return 0;
    return slide_sorted(s, [=](std::size_t i, const auto& sorted) {
        out[i] = judged(s.x[i + s.window / 2], sorted, threshold);
    });
}

/// The places of the samples that have been replaced: by numbers, which they differ from.
template <class T, class Place>
void each_replaced(const T* x, const T* out, std::size_t n, Place place) {
    for (std::size_t i = 0; i < n; ++i) {
        if (x[i] != out[i] && !std::isnan(out[i])) place(i);
    }
}

template <Record R>
int note(const scalar<R>* x, const R* out, R* outliers) {
    std::size_t count = 0;
    each_replaced(x, out->data, length(out), [&](std::size_t) { ++count; });
    if (resize(outliers, count, false)) return -1;
    scalar<R>* to = outliers->data;
    each_replaced(x, out->data, length(out), [&](std::size_t i) { *to++ = scalar<R>(i); });
    return 0;
}

template <Record R>
int hampel(const R* in, R* out, R* outliers, int window, scalar<R> threshold, int ends, R* state,
           bool last) {
    using T = scalar<R>;
    if (in->complex || window < 1 || !(threshold >= 0) || ends < DSP_ENDS_SHORTER ||
        ends > DSP_ENDS_ZERO) {
        return -1;
    }
    const T limit = T(threshold * to_deviation);
    bool noted = false;
    const auto compute = [&](const WindowCall<R>& call, R* result) {
        if (in_segments(call, ends, result->data, [=](const Segment<T>& segment, T* to) {
                return replace(segment, limit, to);
            })) {
            return -1;
        }
        noted = true;
        return outliers ? note(call.x + call.first, result, outliers) : 0;
    };
    if (run_windows(in, out, std::size_t(window), state, last, compute)) return -1;
    return noted || !outliers ? 0 : resize(outliers, 0, false);
}

}  // namespace
}  // namespace wavkit

int dspd_hampel(const dsp* in, dsp* out, dsp* outliers, int window, double threshold, int ends,
                dsp* state, int last) {
    return wavkit::hampel(in, out, outliers, window, threshold, ends, state, last != 0);
}
int dspfd_hampel(const dspf* in, dspf* out, dspf* outliers, int window, float threshold, int ends,
                 dspf* state, int last) {
    return wavkit::hampel(in, out, outliers, window, threshold, ends, state, last != 0);
}
