// Windows of the catalogue: filled, kept for the next signal of the same length, applied.
#include "window/generate.hpp"

#include <algorithm>
#include <array>

#include "state.hpp"
#include "window/apply.hpp"
#include "window/catalogue.hpp"
#include "window/tolerance.hpp"

namespace wavkit {
namespace {

/// What of `scale_type` decides the samples of a window; the rest is about rotation.
constexpr int shape_options = 15;

template <Record R>
int cosine_window_fill(R* w, int window, int scale_type, scalar<R> win_length) {
    const int mode = scale_mode(scale_type);
    const auto a = cosine_coefficients<R>(window, mode);
    if (a.empty()) return -1;
    if (window == DSP_WINDOW_UNIFORM ? uniform_fill(w, a, scale_type, win_length)
                                     : cosine_sum_fill(w, a, scale_type, win_length)) {
        return -1;
    }
    if (scale_type & DSP_SCALE_WIDTH) return normalise(w, mode, a[0]);
    const auto correction = aliasing_correction<R>(a, mode, w->points);
    return correction == 1 ? 0 : dspi_scale(w, correction);
}

template <Record R>
CachedWindow<R>* find(int points, int window, int options, scalar<R> win_length) {
    auto& cache = thread_state<R>.windows;
    const auto end = cache.slots.begin() + cache.filled;
    const auto found = std::find_if(cache.slots.begin(), end, [&](const CachedWindow<R>& slot) {
        return slot.samples.points == points && slot.window == window && slot.options == options &&
               (!(options & DSP_SCALE_WIDTH) || tol_equal(slot.win_length, win_length));
    });
    return found == end ? nullptr : &*found;
}

/// The next unused slot or, when there is none, the one after the newest, sized; null when memory
/// runs out, in which case the slot is the next one's again and matches nothing meanwhile.
template <Record R>
CachedWindow<R>* claim(int points) {
    auto& cache = thread_state<R>.windows;
    const int slots = int(cache.slots.size());
    const bool unused = cache.filled < slots;
    const int index = unused ? cache.filled : (cache.newest + 1) % slots;
    CachedWindow<R>& slot = cache.slots[std::size_t(index)];
    keep_until_thread_ends<R>();
    if (unused) dsp_init(&slot.samples);
    slot.options = -1;
    slot.samples.points = points;
    if (dsp_alloc(&slot.samples)) return nullptr;
    cache.filled += unused;
    cache.newest = index;
    return &slot;
}

/// A window that cannot be filled keeps its place, as zeros: asked for again, it is found.
template <Record R>
[[gnu::noinline]] R* make(int points, int window, int options, scalar<R> win_length) {
    CachedWindow<R>* slot = claim<R>(points);
    if (!slot) return nullptr;
    const int failed = window_fill(&slot->samples, window, options, win_length);
    if (failed) std::ranges::fill(values(&slot->samples), scalar<R>(0));
    slot->window = window;
    slot->options = options;
    slot->win_length = win_length;
    return failed ? nullptr : &slot->samples;
}

/// The uniform window over all points is 1 in every scale mode.
template <Record R>
bool leaves_samples_alone(const R* x, int window, int scale_type, scalar<R> win_length) {
    if (window != DSP_WINDOW_UNIFORM) return false;
    if (!(scale_type & DSP_SCALE_WIDTH)) return true;
    return !(scale_type & DSP_SCALE_SYMMETRIC) && tol_ceil(win_length) >= x->points;
}

/// The samples of a window, kept or made; null when it cannot be.
template <Record R>
R* obtain(int points, int window, int scale_type, scalar<R> win_length) {
    const int options = scale_type & shape_options;
    CachedWindow<R>* known = find<R>(points, window, options, win_length);
    return known ? &known->samples : make<R>(points, window, options, win_length);
}

template <Record R>
int apply_cached(R* x, int window, int scale_type, scalar<R> win_length, bool rotate) {
    R* samples = obtain<R>(x->points, window, scale_type, win_length);
    if (!samples) return -1;
    samples->delta = x->delta;
    return apply_samples(x, samples, rotate);
}

template <Record R>
int apply_window(R* x, int window, int scale_type, scalar<R> win_length) {
    if (scale_mode(scale_type) == 3) return -1;
    const bool rotate = window == DSP_WINDOW_UNIFORM ? scale_type & DSP_SCALE_ROTATE_UNIFORM
                                                     : !(scale_type & DSP_SCALE_NO_ROTATION);
    if (!leaves_samples_alone(x, window, scale_type, win_length)) {
        return apply_cached(x, window, scale_type, win_length, rotate);
    }
    return rotate ? dspi_swap_halves2(x) : 0;
}

template <Record R>
int apply_full_window(R* x, int window, int scale_type) {
    if (scale_type & DSP_SCALE_WIDTH) return -1;
    return apply_window(x, window, scale_type, scalar<R>(0));
}

}  // namespace

template <Record R>
int window_fill(R* w, int window, int scale_type, scalar<R> win_length) {
    if (w->complex) return -1;
    if (w->points < 1) return 0;
    if (window == DSP_WINDOW_BARTLETT) return bartlett_fill(w, scale_type);
    if (window >= DSP_WINDOW_KAISER70 && window <= DSP_WINDOW_KAISER120) {
        return kaiser_fill(w, kaiser_beta<R>(window), scale_type);
    }
    if (window >= DSP_WINDOW_GAUSS60 && window <= DSP_WINDOW_GAUSS80) {
        return gauss_fill(w, gauss_sigma<R>(window), scale_type);
    }
    if (window == DSP_WINDOW_RIEMANN) return sinc_fill(w, pi<scalar<R>>, scalar<R>(1), scale_type);
    return cosine_window_fill(w, window, scale_type, win_length);
}

template <Record R>
int window_apart(const R* in, int points, R* out, int room, int window, int scale_type,
                 scalar<R> win_length) {
    R* const samples = obtain<R>(points, window, scale_type, win_length);
    if (!samples) {
        dspu_subvec(in, out, 0, points);
        return -1;
    }
    out->points = room;
    out->complex = in->complex;
    samples->delta = out->delta = in->delta;
    if (dsp_alloc(out)) return -1;
    in->complex ? multiply_apart<2>(in, samples, out) : multiply_apart<1>(in, samples, out);
    return 0;
}

template int window_fill(dsp*, int, int, double);
template int window_fill(dspf*, int, int, float);
template int window_apart(const dsp*, int, dsp*, int, int, int, double);
template int window_apart(const dspf*, int, dspf*, int, int, int, float);

}  // namespace wavkit

int dspi_window2(dsp* x, int window, int scale_type, double win_length) {
    return wavkit::apply_window(x, window, scale_type, win_length);
}
int dspfi_window2(dspf* x, int window, int scale_type, float win_length) {
    return wavkit::apply_window(x, window, scale_type, win_length);
}

int dspi_window(dsp* x, int window, int scale_type) {
    return wavkit::apply_full_window(x, window, scale_type);
}
int dspfi_window(dspf* x, int window, int scale_type) {
    return wavkit::apply_full_window(x, window, scale_type);
}
