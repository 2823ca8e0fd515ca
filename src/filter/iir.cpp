// Filtering by second-order sections: block by block, and forwards and backwards.
#include "filter/iir.hpp"

#include <cmath>

#include "filter/convolution.hpp"

namespace wavkit::iir {
namespace {

std::unique_ptr<double[]> room(std::size_t scalars) {
    return std::unique_ptr<double[]>(new (std::nothrow) double[scalars]());
}

/// The samples before, between and behind sections, as they were and as they come to be.
class History {
  public:
    /// False when memory runs out.
    bool reserve(const Sections& sections, int width) {
        scalars_ = sections.state_points() * std::size_t(width);
        before_ = room(scalars_);
        after_ = room(scalars_);
        return before_ && after_;
    }

    /// Scalars, of which those that there are not are 0.
    void read(const dsp& state, std::size_t width) {
        const std::size_t step = std::size_t(wavkit::width(&state));
        const std::size_t known = std::min(length(&state), scalars_ / width);
        for (std::size_t k = 0; k < known; ++k) {
            before_[width * k] = state.data[step * k];
            if (width == 2) before_[2 * k + 1] = step == 2 ? state.data[2 * k + 1] : 0;
        }
    }

    /// As if the inputs had all been `value`, for the history of inputs that have been 1.
    template <class T>
    void settle(const double* of_one, const T* value, std::size_t width) {
        for (std::size_t k = 0; k < scalars_; ++k) {
            before_[k] = of_one[k / width] * double(value[k % width]);
        }
    }

    /// n samples through all sections; out may be in.
    template <int W, class T>
    void run(const Sections& sections, const T* in, T* out, std::size_t n) {
        if constexpr (std::same_as<T, double>) {
            pass<W>(sections, in, out, n);
        } else {
            // Of more sections than lanes, partial results stay in double precision.
            constexpr std::size_t some = 2048 / W;
            double part[W * some];
            for (std::size_t i = 0; i < n; i += some) {
                const std::size_t count = std::min(some, n - i);
                std::copy_n(in + W * i, W * count, part);
                pass<W>(sections, part, part, count);
                std::copy_n(part, W * count, out + W * i);
            }
        }
    }

    std::span<const double> scalars() const { return {before_.get(), scalars_}; }

  private:
    template <int W>
    void pass(const Sections& sections, const double* in, double* out, std::size_t n) {
        int done = 0;
        for (const int all = int(sections.count()); done < all; in = out) {
            const std::ptrdiff_t node = std::ptrdiff_t(2) * W * done;
            done +=
                kernel::run_sections<W>(sections.begin() + done, all - done, before_.get() + node,
                                        after_.get() + node, in, out, std::int64_t(n));
        }
        std::swap(before_, after_);
    }

    std::unique_ptr<double[]> before_, after_;
    std::size_t scalars_ = 0;
};

/// Brings the state to the kind of the input and the points it takes, and stores the history.
int keep(const History& history, bool complex, double delta, const Sections& sections, dsp* state) {
    state->delta = delta;
    if (bool(state->complex) != complex && (complex ? dspi_rtoc(state) : dspi_real(state))) {
        return -1;
    }
    if (dspi_zpad(state, int(sections.state_points()))) return -1;
    std::ranges::copy(history.scalars(), state->data);
    return 0;
}

template <Record R>
int filter(const R* input, R* out, const dsp* rows, dsp* state) {
    Sections sections;
    if (sections.read(rows)) return -1;
    if (sections.count() == 0) return dsp_copy(out, input);
    const R in = *input;
    const std::size_t n = length(&in);
    History history;
    if (!history.reserve(sections, width(&in))) return -1;
    if (state) history.read(*state, std::size_t(width(&in)));

    const bool apart =
        (out != input && shares_memory(out, &in)) || (state && shares_memory(out, state));
    Temporary<R> own;
    R* const result = apart ? own.get() : out;
    result->delta = in.delta;
    if (resize(result, n, in.complex)) return -1;
    if (in.complex) {
        history.template run<2>(sections, in.data, result->data, n);
    } else {
        history.template run<1>(sections, in.data, result->data, n);
    }
    // An output that is the state keeps no history. One that owns the state's buffer leaves it.
    if (state && static_cast<const void*>(state) != out) {
        if (state->alloc < 1 && shares_memory(out, state) && dsp_copy(state, state)) return -1;
        if (keep(history, in.complex, double(in.delta), sections, state)) return -1;
    }
    return apart ? dsp_copy(out, result) : 0;
}

int write_state(dsp* state, const dsp* rows) {
    Sections sections;
    if (sections.read(rows)) return -1;
    const auto settled = room(sections.state_points());
    if (!settled || sections.settle(settled.get())) return -1;
    if (resize(state, sections.state_points(), false)) return -1;
    std::copy_n(settled.get(), sections.state_points(), state->data);
    return 0;
}

/// Samples that each end is continued by: three times the coefficients, as has become usual.
std::size_t usual_extension(const Sections& sections) {
    const auto short_ones = [&](double Section::*last) {
        return std::ranges::count_if(sections, [=](const Section& s) { return s.*last == 0; });
    };
    const auto fewer = std::min(short_ones(&Section::b2), short_ones(&Section::a2));
    return 3 * (2 * sections.count() + 1 - std::size_t(fewer));
}

/// A signal and its odd continuation by `beyond` samples at each end.
template <int W, class T>
void extend(const T* x, std::size_t n, std::size_t beyond, double* to) {
    const auto at = [=](std::size_t i, std::size_t part) { return double(x[W * i + part]); };
    for (std::size_t part = 0; part < W; ++part) {
        double* const y = to + part;
        for (std::size_t i = 0; i < beyond; ++i) {
            y[W * i] = 2 * at(0, part) - at(beyond - i, part);
            y[W * (beyond + n + i)] = 2 * at(n - 1, part) - at(n - 2 - i, part);
        }
        for (std::size_t i = 0; i < n; ++i) y[W * (beyond + i)] = at(i, part);
    }
}

template <int W>
void turn_around(double* x, std::size_t n) {
    struct Sample {
        double parts[W];
    };
    auto* const samples = reinterpret_cast<Sample*>(x);
    std::reverse(samples, samples + n);
}

/// The filtered samples at `first`.
template <int W, class T>
int filter_both_ways(const Sections& sections, const T* x, std::size_t n, std::size_t beyond,
                     dsp* work) {
    const std::size_t points = n + 2 * beyond;
    const auto settled = room(sections.state_points());
    History history;
    if (!settled || sections.settle(settled.get()) || !history.reserve(sections, W)) return -1;
    if (resize(work, points, W == 2)) return -1;
    double* const y = work->data;
    extend<W>(x, n, beyond, y);
    for (int way = 0; way < 2; ++way) {
        history.settle(settled.get(), y, W);
        history.run<W>(sections, y, y, points);
        turn_around<W>(y, points);
    }
    return 0;
}

template <Record R>
int zero_phase(const R* in, R* out, const dsp* rows, int extension) {
    Sections sections;
    if (sections.read(rows)) return -1;
    const std::size_t n = length(in);
    const std::size_t w = std::size_t(width(in));
    if (sections.count() == 0 || n == 0) return dsp_copy(out, in);
    const std::size_t asked = extension < 0 ? usual_extension(sections) : std::size_t(extension);
    const std::size_t beyond = std::min(asked, n - 1);
    Temporary<dsp> work;
    if (w == 2 ? filter_both_ways<2>(sections, in->data, n, beyond, work)
               : filter_both_ways<1>(sections, in->data, n, beyond, work)) {
        return -1;
    }
    out->delta = in->delta;
    if (resize(out, n, w == 2)) return -1;
    std::transform(work->data + w * beyond, work->data + w * (beyond + n), out->data,
                   [](double v) { return scalar<R>(v); });
    return 0;
}

}  // namespace

int Sections::read(const dsp* rows) {
    const auto given = values(rows);
    if (rows->complex || given.size() % DSP_IIR_VALUES != 0) return -1;
    count_ = given.size() / DSP_IIR_VALUES;
    rows_.reset(new (std::nothrow) Section[count_]);
    if (!rows_) return -1;
    for (std::size_t k = 0; k < count_; ++k) {
        const double* const row = given.data() + DSP_IIR_VALUES * k;
        const double a0 = row[DSP_IIR_A0];
        if (a0 == 0 ||
            !std::all_of(row, row + DSP_IIR_VALUES, [](double v) { return std::isfinite(v); })) {
            return -1;
        }
        rows_[k] = {row[DSP_IIR_B0] / a0, row[DSP_IIR_B1] / a0, row[DSP_IIR_B2] / a0,
                    row[DSP_IIR_A1] / a0, row[DSP_IIR_A2] / a0};
    }
    return 0;
}

int Sections::settle(double* state) const {
    double level = 1;
    state[0] = state[1] = level;
    for (const Section& s : *this) {
        const double poles = (1 + s.a1) + s.a2;
        if (poles == 0) return -1;
        level *= ((s.b0 + s.b1) + s.b2) / poles;
        state += 2;
        state[0] = state[1] = level;
    }
    return 0;
}

}  // namespace wavkit::iir

int dspd_iir(const dsp* in, dsp* out, const dsp* sections, dsp* state) {
    return wavkit::iir::filter(in, out, sections, state);
}
int dspfd_iir(const dspf* in, dspf* out, const dsp* sections, dsp* state) {
    return wavkit::iir::filter(in, out, sections, state);
}

int dspc_iir_state(dsp* state, const dsp* sections) {
    return wavkit::iir::write_state(state, sections);
}
int dspfc_iir_state(dsp* state, const dsp* sections) { return dspc_iir_state(state, sections); }

int dspd_iir_zero_phase(const dsp* in, dsp* out, const dsp* sections, int extension) {
    return wavkit::iir::zero_phase(in, out, sections, extension);
}
int dspfd_iir_zero_phase(const dspf* in, dspf* out, const dsp* sections, int extension) {
    return wavkit::iir::zero_phase(in, out, sections, extension);
}
