// Windows that reach beyond the ends of a signal, as stretches of samples that all of them lie in.
#pragma once

#include <bit>
#include <cmath>
#include <limits>
#include <memory>
#include <new>

#include "kernel/quicksort.hpp"
#include "smooth/windows.hpp"

namespace wavkit {

/// Samples with a window for each output. Of those beyond an end of the signal there may be none:
/// the first and the last so many then count for nothing.
template <class T>
struct Segment {
    const T* x;
    std::size_t window, count;  // outputs
    std::size_t absent_before = 0, absent_behind = 0;

    std::size_t samples() const { return count + window - 1; }
    /// Samples of the window of an output that count.
    std::size_t present(std::size_t i) const {
        const std::size_t end = samples() - absent_behind;
        return std::min(i + window, end) - std::max(i, absent_before);
    }
};

/// What lies i samples beyond an end of the signal, the samples from there on being `step` apart.
template <class T>
T beyond(int ends, const T* end, std::ptrdiff_t step, std::size_t i) {
    if (ends == DSP_ENDS_MIRROR) return end[step * std::ptrdiff_t(i)];
    return ends == DSP_ENDS_HOLD ? *end : T(0);
}

/// Has `run(segment, place of its sample, out)` write all outputs of a call; -1 when memory runs
/// out.
template <Record R, class Run>
int in_segments(const WindowCall<R>& call, int ends, scalar<R>* out, Run run) {
    using T = scalar<R>;
    const std::size_t w = call.window, before = call.before(), behind = call.behind();
    const std::unique_ptr<T[]> edge(new (std::nothrow) T[w + before]);
    if (!edge) return -1;
    const bool absent = ends == DSP_ENDS_SHORTER;
    if (call.begins && before > 0) {
        for (std::size_t i = 0; i < before; ++i) {
            edge[before - 1 - i] = beyond(ends, call.x, 1, i);
        }
        std::copy_n(call.x, w - 1, edge.get() + before);
        if (run(Segment<T>{edge.get(), w, before, absent ? before : 0}, out)) return -1;
    }
    const std::size_t begin = std::max(call.first, before), end = call.inner_end();
    if (begin < end) {
        if (run(Segment<T>{call.x + begin - before, w, end - begin}, out + (begin - call.first)))
            return -1;
    }
    if (call.ends && behind > 0) {
        const T* const last = call.x + call.points - 1;
        std::copy_n(last + 1 - (w - 1), w - 1, edge.get());
        for (std::size_t i = 0; i < behind; ++i) edge[w - 1 + i] = beyond(ends, last, -1, i);
        if (run(Segment<T>{edge.get(), w, behind, 0, absent ? behind : 0},
                out + (call.count - behind))) {
            return -1;
        }
    }
    return 0;
}

/// An integer that is in order where the number is, that of a NaN behind all others.
template <class T>
kernel::OrderKey<T> key_of(T value) {
    using Key = kernel::OrderKey<T>;
    const Key key = kernel::turn_order<T>(std::bit_cast<Key>(value));
    return std::isnan(value) ? std::numeric_limits<Key>::max() : key;
}

template <class T>
T value_of(kernel::OrderKey<T> key) {
    return std::bit_cast<T>(kernel::turn_order<T>(key));
}

/// One value for every way of having it: no -0, and a single NaN.
template <class T>
T plain(T value) {
    return std::isnan(value) ? std::numeric_limits<T>::quiet_NaN() : value + T(0);
}

/// The median, from the one or the two middle samples.
template <class T>
T middle_of(T lower, T upper, std::size_t count) {
    return plain(count % 2 ? lower : (lower + upper) * T(0.5));
}

}  // namespace wavkit
