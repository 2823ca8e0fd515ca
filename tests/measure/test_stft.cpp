// Short-time spectra beside direct sums, and the way back.
#include "support/oracles.hpp"

namespace wavkit::test {
namespace {

struct Frame {
    int window, size, hop;
};
const std::vector<Frame> frames{{DSP_WINDOW_UNIFORM, 2, 1},  {DSP_WINDOW_UNIFORM, 8, 8},
                                {DSP_WINDOW_HANN, 8, 3},     {DSP_WINDOW_P601, 17, 5},
                                {DSP_WINDOW_KAISER80, 7, 4}, {DSP_WINDOW_HANN, 32, 31}};

/// The bins of the frame about a sample, by the definition.
template <Record R>
Samples frame_bins(const Signal<R>& x, const Frame& f, int centre, bool full) {
    std::vector<long double> ones(std::size_t(f.size), 1);
    auto w = real<R>(ones);
    dspi_window(w, f.window, DSP_SCALE_NO_ROTATION);
    const Samples samples = samples_of<R>(x);
    Samples bins;
    const int first = full ? -(f.size / 2) : 0;
    for (int k = first; k < (full ? f.size - f.size / 2 : f.size / 2 + 1); ++k) {
        std::complex<long double> sum = 0;
        for (int i = 0; i < f.size; ++i) {
            const int n = i - f.size / 2, at = centre + n;
            if (at < 0 || at >= x->points) continue;
            sum += (long double)(w[i]) * samples[std::size_t(at)] *
                   unit_root(-std::int64_t(n) * k, f.size);
        }
        bins.push_back(sum * ((full ? 1.0L : 2.0L) / f.size));
    }
    return bins;
}

/// Real signals, complex ones, and real ones with all bins.
template <Record R, class Check>
void each_signal(Check check) {
    for (const int n : {1, 2, 40, 101}) {
        Noise noise{std::uint64_t(n)};
        check(noise.real<R>(n), 0);
        check(noise.complex<R>(n), DSP_SPECTRUM_TWO_SIDED);
        check(noise.real<R>(n), DSP_SPECTRUM_TWO_SIDED);
    }
}

BOTH_PRECISIONS(Stft, HasTheSpectraOfFramesAndComesBack) {
    each_signal<R>([](Signal<R> x, int flags) {
        x->delta = T(0.25);
        for (const auto& f : frames) {
            SCOPED_TRACE(::testing::Message() << x->points << " points, flags " << flags
                                              << ", window " << f.window << ", hop " << f.hop);
            Signal<R> rows, back;
            ASSERT_EQ(0, dsph_stft(x, rows, f.window, f.size, f.hop, flags, nullptr, 1));
            Samples want;
            const int count = (x->points - 1 + f.hop - 1) / f.hop + 1;
            for (int m = 0; m < count; ++m) {
                const auto bins = frame_bins<R>(x, f, m * f.hop, flags != 0);
                want.insert(want.end(), bins.begin(), bins.end());
            }
            EXPECT_LT(relative_error<R>(rows, want), 20 * epsilon<R>);
            EXPECT_FLOAT_EQ(float(rows->delta), float(4.0 / f.size));

            ASSERT_EQ(0, dsph_istft(rows, back, f.window, f.size, f.hop, flags, nullptr, 1));
            ASSERT_EQ(back->points, (count - 1) * f.hop + 1);
            EXPECT_FLOAT_EQ(float(back->delta), 0.25f);
            // Hann's frames 31 of 32 samples apart add up to little where they meet.
            const double units = f.hop == 31 ? 8000 : 200;
            dspu_subvec(back, back, 0, x->points);
            EXPECT_LT(relative_error<R>(back, samples_of<R>(x)), units * epsilon<R>);
        }
    });
}

/// A call on a whole signal, and on blocks of it.
template <Record R>
using Call = int (*)(const R*, R*, int, int, int, int, R*, int);

template <Record R>
Signal<R> in_blocks(Call<R> call, const Signal<R>& x, const Frame& f, int flags, int step) {
    Signal<R> state, joined, block, part;
    for (int at = 0; at <= x->points; at += step) {
        dspu_subvec(x, block, at, step);
        const int last = at + step > x->points;
        EXPECT_EQ(0, call(block, part, f.window, f.size, f.hop, flags, state, last));
        joined->delta = part->delta;
        joined->complex = part->complex;
        dsp_append(joined, part);
    }
    EXPECT_EQ(0, state->points);
    return joined;
}

BOTH_PRECISIONS(Stft, GoesOnFromBlockToBlock) {
    const Call<R> forth = [](const R* x, R* out, int window, int size, int hop, int flags, R* state,
                             int last) {
        return dsph_stft(x, out, window, size, hop, flags, state, last);
    };
    const Call<R> back = [](const R* x, R* out, int window, int size, int hop, int flags, R* state,
                            int last) {
        return dsph_istft(x, out, window, size, hop, flags, state, last);
    };
    each_signal<R>([&](const Signal<R>& x, int flags) {
        for (const auto& f : frames) {
            SCOPED_TRACE(::testing::Message() << x->points << " points, flags " << flags
                                              << ", window " << f.window << ", hop " << f.hop);
            Signal<R> rows, samples;
            ASSERT_EQ(0, forth(x, rows, f.window, f.size, f.hop, flags, nullptr, 1));
            ASSERT_EQ(0, back(rows, samples, f.window, f.size, f.hop, flags, nullptr, 1));
            const int bins = flags ? f.size : f.size / 2 + 1;
            for (const int step : {1, 3, 50}) {
                EXPECT_TRUE(matches<R>(in_blocks<R>(forth, x, f, flags, step), rows)) << step;
                EXPECT_TRUE(matches<R>(in_blocks<R>(back, rows, f, flags, step * bins), samples))
                    << step;
            }
        }
    });
}

BOTH_PRECISIONS(Stft, RefusesWhatDoesNotComeBack) {
    const auto x = Noise(2).real<R>(40), kept = real<R>({1, 2, 3});
    Signal<R> rows, out = kept;
    ASSERT_EQ(0, dsph_stft(x, rows, DSP_WINDOW_HANN, 8, 8, 0, nullptr, 1));
    EXPECT_EQ(-1, dsph_istft(rows, out, DSP_WINDOW_HANN, 8, 8, 0, nullptr, 1));
    EXPECT_EQ(0, dsph_istft(rows, out, DSP_WINDOW_UNIFORM, 8, 8, 0, nullptr, 1));
    out = kept;
    Signal<R> state = kept;
    for (const auto& [window, size, hop] :
         std::vector<Frame>{{99, 8, 2}, {2, 1, 1}, {2, 8, 9}, {2, 8, 0}, {2, -8, 2}}) {
        EXPECT_EQ(-1, dsph_stft(x, out, window, size, hop, 0, nullptr, 1)) << size << ' ' << hop;
        EXPECT_EQ(-1, dsph_istft(rows, out, window, size, hop, 0, nullptr, 1)) << size;
    }
    EXPECT_EQ(-1, dsph_istft(rows, out, 2, 7, 2, 0, nullptr, 1));  // bins left over
    EXPECT_EQ(-1, dsph_istft(x, out, 2, 8, 2, 0, nullptr, 1));     // no spectra
    EXPECT_TRUE(matches<R>(out, kept));
    EXPECT_EQ(-1, dsph_istft(rows, out, 2, 8, 2, 0, state, 1));  // a state of other frames
    EXPECT_TRUE(matches<R>(state, kept));
}

}  // namespace
}  // namespace wavkit::test
