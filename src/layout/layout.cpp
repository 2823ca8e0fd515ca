// Points moved, added and dropped: rotation by half a length, padding, trimming, interleaved zeros.
#include <algorithm>
#include <cstring>
#include <limits>
#include <optional>

#include "kernel/in_turn.hpp"
#include "record_view.hpp"

namespace wavkit {
namespace {

constexpr int scale_bits = 3, placement_bits = 0x700;

/// Where the points of a short signal lie in a long one: the first `head` points from point `lead`
/// on, the others at the very end.
struct Placement {
    std::size_t lead, head;
};

std::optional<Placement> placement(int mode, std::size_t longer, std::size_t shorter) {
    switch (mode & placement_bits) {
        case DSP_PAD_AT_START:
            return Placement{0, shorter};
        case DSP_PAD_IN_MIDDLE:  // half the length, the zero frequency of a spectrum, stays so
            return Placement{longer / 2 - shorter / 2, shorter};
        case DSP_PAD_AT_END:
            return Placement{0, 0};
        case DSP_PAD_SPLIT:
            return Placement{0, (shorter + 1) / 2};
        default:
            return std::nullopt;
    }
}

template <class T>
std::optional<T> scale_factor(int mode, std::size_t old_count, std::size_t new_count) {
    const int kept = mode & scale_bits;
    if (kept == scale_bits) return std::nullopt;
    if (kept == DSP_PAD_UNSCALED || old_count == 0 || new_count == 0) return T(1);
    const double ratio = double(new_count) / double(old_count);
    return T(kept == DSP_PAD_KEEP_POWER ? std::sqrt(ratio) : ratio);
}

template <Record R>
void scale_points(R* x, std::size_t count, scalar<R> factor) {
    if (factor == 1) return;
    for (auto& value : values(x).first(count * width(x))) value *= factor;
}

template <Record R>
void move_points(R* x, std::size_t to, std::size_t from, std::size_t count) {
    const std::size_t w = width(x);
    std::memmove(x->data + to * w, x->data + from * w, count * w * sizeof(scalar<R>));
}

template <Record R>
void clear_points(R* x, std::size_t first, std::size_t last) {
    std::fill(x->data + first * width(x), x->data + last * width(x), scalar<R>(0));
}

template <Record R>
int pad(R* x, int n, int mode) {
    const std::size_t had = length(x);
    if (n <= 0 || had >= std::size_t(n)) return 0;
    x->points = n;
    if (dsp_realloc(x, int(had), x->complex)) return -1;

    const std::size_t now = length(x);
    const auto factor = scale_factor<scalar<R>>(mode, had, now);
    const auto place = placement(mode, now, had);
    if (!factor || !place) return -1;

    const std::size_t tail = had - place->head;
    scale_points(x, had, *factor);
    move_points(x, now - tail, place->head, tail);
    move_points(x, place->lead, 0, place->head);
    clear_points(x, 0, place->lead);
    clear_points(x, place->lead + place->head, now - tail);
    return 0;
}

template <Record R>
int trim(R* x, int n, int mode) {
    const std::size_t had = length(x), now = n > 0 ? std::size_t(n) : 0;
    if (had <= now) return 0;
    const auto factor = scale_factor<scalar<R>>(mode, had, now);
    const auto place = placement(mode, had, now);
    if (!factor || !place) return -1;

    const std::size_t tail = now - place->head;
    move_points(x, 0, place->lead, place->head);
    move_points(x, place->head, had - tail, tail);
    x->points = int(now);
    scale_points(x, now, *factor);
    return 0;
}

/// Exchanges two stretches of so many scalars.
template <class T>
void exchange(T* a, T* b, std::size_t count) {
    constexpr std::size_t V = kernel::lanes<T>;
    std::size_t i = 0;
    for (; i + V <= count; i += V) {
        const auto p = kernel::load<T, V>(a + i), q = kernel::load<T, V>(b + i);
        kernel::store<T, V>(a + i, q);
        kernel::store<T, V>(b + i, p);
    }
    std::swap_ranges(a + i, a + count, b + i);
}

/// to[i] = x[i], x[i] = from[i] for `count` scalars, from the first or from the last on. `to`
/// begins a point before `from`, backwards a point behind: what is written there has been read by
/// then.
template <bool Backwards, class T>
void pass_on(T* x, const T* from, T* to, std::size_t count) {
    constexpr std::size_t V = kernel::lanes<T>;
    std::size_t i = 0;
    for (; i + V <= count; i += V) {
        const std::size_t at = Backwards ? count - V - i : i;
        const auto moved = kernel::load<T, V>(x + at), next = kernel::load<T, V>(from + at);
        kernel::store<T, V>(to + at, moved);
        kernel::store<T, V>(x + at, next);
    }
    for (; i < count; ++i) {
        const std::size_t at = Backwards ? count - 1 - i : i;
        const T moved = x[at], next = from[at];
        to[at] = moved;
        x[at] = next;
    }
}

/// Exchanges the halves; a middle point comes last, or else first.
template <Record R>
int rotate(R* x, bool middle_last) {
    using T = scalar<R>;
    const std::size_t n = length(x), w = width(x), half = n / 2 * w;
    if (n < 2) return 0;
    T* const data = x->data;
    if (n % 2 == 0) {
        exchange(data, data + half, half);
        return 0;
    }
    T kept[2];
    T* const place = middle_last ? data + half : data + 2 * half;
    std::copy_n(place, w, kept);
    if (middle_last) {
        pass_on<false>(data, data + half + w, data + half, half);
        std::copy_n(kept, w, data + 2 * half);
    } else {
        pass_on<true>(data, data + half, data + half + w, half);
        std::copy_n(kept, w, data + half);
    }
    return 0;
}

template <Record R>
int interleave_zeros(R* x) {
    const int n = int(length(x));
    x->delta *= scalar<R>(0.5);
    if (n > std::numeric_limits<int>::max() / 2) {  // as when memory runs out
        x->data = nullptr;
        x->alloc = 0;
        return -1;
    }
    x->points = 2 * n;
    if (dsp_realloc(x, n, x->complex)) return -1;
    constexpr const scalar<R>* zeros = nullptr;
    if (x->complex) {
        kernel::put_in_turn<2>(x->data, zeros, x->data, std::size_t(n));
    } else {
        kernel::put_in_turn<1>(x->data, zeros, x->data, std::size_t(n));
    }
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_swap_halves(dsp* x) { return wavkit::rotate(x, true); }
int dspfi_swap_halves(dspf* x) { return wavkit::rotate(x, true); }

int dspi_swap_halves2(dsp* x) { return wavkit::rotate(x, false); }
int dspfi_swap_halves2(dspf* x) { return wavkit::rotate(x, false); }

int dspi_zpad(dsp* x, int n) { return wavkit::pad(x, n, DSP_PAD_AT_START | DSP_PAD_UNSCALED); }
int dspfi_zpad(dspf* x, int n) { return wavkit::pad(x, n, DSP_PAD_AT_START | DSP_PAD_UNSCALED); }

int dspi_zpad2(dsp* x, int n, int mode) { return wavkit::pad(x, n, mode); }
int dspfi_zpad2(dspf* x, int n, int mode) { return wavkit::pad(x, n, mode); }

int dspi_unzpad(dsp* x, int n, int mode) { return wavkit::trim(x, n, mode); }
int dspfi_unzpad(dspf* x, int n, int mode) { return wavkit::trim(x, n, mode); }

int dspi_zinter(dsp* x) { return wavkit::interleave_zeros(x); }
int dspfi_zinter(dspf* x) { return wavkit::interleave_zeros(x); }
