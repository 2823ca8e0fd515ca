// Single frequencies of a stream.
//
// Goertzel's recurrence loses digits with every sample near 0 and half the rate. Here a phasor is
// laid out over a stretch of samples, the sums over a stretch are as short as it is, and phases are
// whole numbers from the start of the stream on.
#include <algorithm>
#include <array>
#include <cmath>
#include <limits>

#include "stats/result.hpp"
#include "transform/turns.hpp"

namespace wavkit {
namespace {

constexpr std::size_t stretch = 256;

/// Sums side by side, as many in all sets, each over every 16th sample.
constexpr std::size_t lanes = 16;

/// What a state holds of a frequency: itself, the sum over whole stretches, and the lanes of the
/// stretch that is under way: re and im of the samples, each times cosine and sine.
constexpr std::size_t values_of_line = 3 + 4 * lanes;

/// The place of a stream and its lines.
struct Stream {
    enum : std::size_t { samples, count, numbers };
};

template <class T>
using Sums = std::array<std::array<T, lanes>, 4>;

/// Adds the samples times cosine and sine to their lanes, from lane `first` on. No product is fused
/// with its sum, whatever way a sample takes.
template <class T>
void add_products(const T* x, const T* cosines, const T* sines, std::size_t first, std::size_t n,
                  T* with_cosine, T* with_sine) {
    constexpr std::size_t V = std::min<std::size_t>(kernel::lanes<T>, lanes);
    using Vector = kernel::Vec<T, int(V)>;
    const auto add_one = [=](std::size_t at) {
        const std::size_t lane = (first + at) % lanes;
        with_cosine[lane] += x[at] * cosines[at];
        with_sine[lane] += x[at] * sines[at];
    };
    std::size_t i = 0;
    for (; i < n && (first + i) % lanes != 0; ++i) add_one(i);
    Vector c[lanes / V], s[lanes / V];
    for (std::size_t k = 0; k < lanes / V; ++k) {
        c[k] = kernel::load<T, int(V)>(with_cosine + k * V);
        s[k] = kernel::load<T, int(V)>(with_sine + k * V);
    }
    for (; i + lanes <= n; i += lanes) {
        for (std::size_t k = 0; k < lanes / V; ++k) {
            const auto v = kernel::load<T, int(V)>(x + i + k * V);
            c[k] += v * kernel::load<T, int(V)>(cosines + i + k * V);
            s[k] += v * kernel::load<T, int(V)>(sines + i + k * V);
        }
    }
    for (std::size_t k = 0; k < lanes / V; ++k) {
        kernel::store<T, int(V)>(with_cosine + k * V, c[k]);
        kernel::store<T, int(V)>(with_sine + k * V, s[k]);
    }
    for (; i < n; ++i) add_one(i);
}

/// One frequency in a state, and the phasors of the stretch that it works with.
template <class T>
class Line {
  public:
    Line(double* values, double delta) : values_(values), turns_(values[0] * delta) {
        for (std::size_t k = 0; k < 4 * lanes; ++k) sums_[k / lanes][k % lanes] = T(values[3 + k]);
    }

    /// Adds a block that begins at a place of the stream.
    template <Record R>
    void add(const R& x, std::uint64_t place) {
        const auto n = length(&x);
        for (std::size_t done = 0; done < n;) {
            const std::size_t first = std::size_t(place % stretch);
            const std::size_t some = std::min(stretch - first, n - done);
            // A long block needs all phasors, a short one its own.
            const std::size_t end = n - done > some ? stretch : first + some;
            lay_out(first, n >= stretch ? stretch : end);
            add_part(x, done, first, some);
            done += some, place += some;
            if (place % stretch == 0) fold(place - stretch);
        }
    }

    void keep() const {
        for (std::size_t k = 0; k < 4 * lanes; ++k) {
            values_[3 + k] = double(sums_[k / lanes][k % lanes]);
        }
    }

    /// The sum over all samples of a stream of so many.
    Bin<double> sum(std::uint64_t place) const {
        return Bin<double>{values_[1], values_[2]} + part(place - place % stretch);
    }

  private:
    /// The phasors of the places first to end of a stretch, from its own start on.
    void lay_out(std::size_t first, std::size_t end) {
        if (first >= first_ && end <= end_) return;
        if (end == stretch) first = 0;
        first_ = first, end_ = end;
        turn(Phases(turns_ * first, turns_, {}), end - first,
             [this, first, end](std::size_t at, auto c, auto s) {
                 for (std::size_t i = 0; i < std::size_t(kernel::lanes<double>); ++i) {
                     if (first + at + i >= end) break;
                     cosines_[first + at + i] = T(c[i]);
                     sines_[first + at + i] = T(s[i]);
                 }
             });
    }

    template <Record R>
    void add_part(const R& x, std::size_t from, std::size_t first, std::size_t n) {
        const T *const c = cosines_ + first, *const s = sines_ + first;
        if (!x.complex) {
            add_products(x.data + from, c, s, first, n, sums_[0].data(), sums_[1].data());
            return;
        }
        T re[stretch], im[stretch];
        for (std::size_t i = 0; i < n; ++i) {
            re[i] = x.data[2 * (from + i)];
            im[i] = x.data[2 * (from + i) + 1];
        }
        add_products(re, c, s, first, n, sums_[0].data(), sums_[1].data());
        add_products(im, c, s, first, n, sums_[2].data(), sums_[3].data());
    }

    /// The sum over the stretch that begins at a place, as far as it has come.
    Bin<double> part(std::uint64_t begin) const {
        double total[4];
        for (std::size_t k = 0; k < 4; ++k) {
            total[k] = 0;
            for (const T v : sums_[k]) total[k] += double(v);
        }
        const double angle = (turns_ * begin).radians();
        const double c = std::cos(angle), s = -std::sin(angle);
        const double re = total[0] + total[3], im = total[2] - total[1];
        return {re * c - im * s, re * s + im * c};
    }

    void fold(std::uint64_t begin) {
        const auto more = part(begin);
        values_[1] += more.re;
        values_[2] += more.im;
        sums_ = {};
    }

    double* values_;
    Turns turns_;  // a sample
    Sums<T> sums_;
    std::size_t first_ = 0, end_ = 0;
    T cosines_[stretch], sines_[stretch];
};

/// Whether a state is one of these frequencies.
bool goes_on(const dsp* state, const dsp& frequencies) {
    const auto count = length(&frequencies);
    if (state->complex || length(state) != Stream::numbers + values_of_line * count) return false;
    const double samples = state->data[Stream::samples];
    if (!(samples >= 0 && samples < 0x1p53 && samples == std::floor(samples))) return false;
    for (std::size_t k = 0; k < count; ++k) {
        if (state->data[Stream::numbers + k * values_of_line] != frequencies.data[k]) return false;
    }
    return state->data[Stream::count] == double(count);
}

int begin(dsp* state, const dsp& frequencies) {
    const auto count = length(&frequencies);
    const auto scalars = Stream::numbers + values_of_line * count;
    if (scalars > std::size_t(std::numeric_limits<int>::max())) return -1;
    Temporary<dsp> fresh;
    fresh->points = int(scalars);
    if (dsp_alloc(fresh) || dspi_zero(fresh)) return -1;
    fresh->data[Stream::count] = double(count);
    for (std::size_t k = 0; k < count; ++k) {
        fresh->data[Stream::numbers + k * values_of_line] = frequencies.data[k];
    }
    return dsp_copy(state, fresh);
}

template <Record R>
int goertzel(const R* in, const dsp* at, R* out, dsp* state, int flags) {
    using T = scalar<R>;
    const R x = *in;
    const dsp frequencies = *at;
    const double delta = double(spacing(&x));
    const auto given = values(&frequencies);
    if (frequencies.complex || given.empty() ||
        !std::ranges::all_of(given, [=](double f) { return std::isfinite(f * delta); })) {
        return -1;
    }
    Temporary<R> result;
    result->points = frequencies.points;
    result->complex = 1;
    result->delta = T(frequencies.delta);
    if (dsp_alloc(result) ||
        (state->points < 1 ? begin(state, frequencies) : !goes_on(state, frequencies))) {
        return -1;
    }
    double* const numbers = state->data;
    const auto place = std::uint64_t(numbers[Stream::samples]), end = place + length(&x);
    const double mean = 1 / double(end);
    const double factor = flags & DSP_SPECTRUM_SUM         ? 1
                          : flags & DSP_SPECTRUM_TWO_SIDED ? mean
                                                           : 2 * mean;
    for (std::size_t k = 0; k < length(&frequencies); ++k) {
        Line<T> line(numbers + Stream::numbers + k * values_of_line, delta);
        line.add(x, place);
        line.keep();
        const auto z = line.sum(end);
        bins(result.get())[k] = {T(z.re * factor), T(z.im * factor)};
    }
    numbers[Stream::samples] = double(end);
    return dsp_copy(out, result);
}

}  // namespace
}  // namespace wavkit

int dsph_goertzel(const dsp* x, const dsp* frequencies, dsp* out, dsp* state, int flags) {
    return wavkit::goertzel(x, frequencies, out, state, flags);
}
int dspfh_goertzel(const dspf* x, const dsp* frequencies, dspf* out, dsp* state, int flags) {
    return wavkit::goertzel(x, frequencies, out, state, flags);
}
