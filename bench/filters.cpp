// FIR filters beside the plain loop and overlap-save through FFTW (MEASURE), at the transform
// length that serves it best.
//
// Each filters block after block with the history of the ones before. Small random samples: sums of
// zeros would spare nobody anything, but decaying ones could become subnormal.
#include <benchmark/benchmark.h>
#include <fftw3.h>
#include <wavkit/dsp.h>

#include <algorithm>
#include <bit>
#include <chrono>
#include <complex>
#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

#include "ratios.hpp"

namespace {

using Samples = std::vector<double>;

Samples noise(std::size_t n) {
    Samples x(n);
    for (auto& v : x) v = std::rand() / double(RAND_MAX) - 0.5;
    return x;
}

dsp borrowed(Samples& x) { return {1, x.data(), 0, int(x.size()), 0, 0}; }

void wavkit_filter(benchmark::State& state, std::size_t taps, std::size_t block) {
    auto h = noise(taps), x = noise(block);
    const dsp filter = borrowed(h), in = borrowed(x);
    dsp out, history;
    dsp_init(&out);
    dsp_init(&history);
    for (auto _ : state) {
        if (dspd_fir(&in, &out, &filter, &history)) state.SkipWithError("filtering failed");
        benchmark::ClobberMemory();
    }
    dsp_destroy(&out);
    dsp_destroy(&history);
}

void loop_filter(benchmark::State& state, std::size_t taps, std::size_t block) {
    const auto h = noise(taps), x = noise(block);
    Samples stream(taps - 1 + block), out(block);
    for (auto _ : state) {
        std::copy(stream.end() - std::ptrdiff_t(taps - 1), stream.end(), stream.begin());
        std::copy(x.begin(), x.end(), stream.begin() + std::ptrdiff_t(taps - 1));
        for (std::size_t n = 0; n < block; ++n) {
            double sum = 0;
            for (std::size_t k = 0; k < taps; ++k) sum += h[k] * stream[n + taps - 1 - k];
            out[n] = sum;
        }
        benchmark::ClobberMemory();
    }
}

/// Overlap-save with transforms of one length.
class OverlapSave {
  public:
    OverlapSave(const Samples& taps, int length)
        : length_(std::size_t(length)),
          order_(taps.size() - 1),
          samples_(fftw_alloc_real(length_), fftw_free),
          bins_(fftw_alloc_complex(length_ / 2 + 1), fftw_free),
          forward_(fftw_plan_dft_r2c_1d(length, samples_.get(), bins_.get(), FFTW_MEASURE)),
          back_(fftw_plan_dft_c2r_1d(length, bins_.get(), samples_.get(), FFTW_MEASURE)) {
        std::fill_n(samples_.get(), length_, 0);
        std::transform(taps.begin(), taps.end(), samples_.get(),
                       [=](double h) { return h / length; });
        fftw_execute(forward_);
        spectrum_.assign(bins(), bins() + length_ / 2 + 1);
    }
    OverlapSave(const OverlapSave&) = delete;
    OverlapSave& operator=(const OverlapSave&) = delete;
    ~OverlapSave() {
        fftw_destroy_plan(forward_);
        fftw_destroy_plan(back_);
    }

    /// Outputs to the samples behind the first `order` ones of a stream.
    void run(const Samples& stream, Samples& out) {
        const std::size_t fresh = length_ - order_;
        for (std::size_t first = 0; first < out.size(); first += fresh) {
            const std::size_t count = std::min(fresh, out.size() - first);
            std::copy_n(stream.data() + first, order_ + count, samples_.get());
            std::fill_n(samples_.get() + order_ + count, fresh - count, 0);
            fftw_execute(forward_);
            for (std::size_t i = 0; i < spectrum_.size(); ++i) {
                const auto x = bins()[i], h = spectrum_[i];
                bins()[i] = {x.real() * h.real() - x.imag() * h.imag(),
                             x.real() * h.imag() + x.imag() * h.real()};
            }
            fftw_execute(back_);
            std::copy_n(samples_.get() + order_, count, out.data() + first);
        }
    }

  private:
    std::complex<double>* bins() { return reinterpret_cast<std::complex<double>*>(bins_.get()); }

    std::size_t length_, order_;
    std::unique_ptr<double, void (*)(void*)> samples_;
    std::unique_ptr<fftw_complex, void (*)(void*)> bins_;
    fftw_plan forward_, back_;
    std::vector<std::complex<double>> spectrum_;
};

/// The fastest of the lengths that are worth a try.
std::unique_ptr<OverlapSave> best_overlap_save(const Samples& taps, const Samples& stream,
                                               Samples& out) {
    using Clock = std::chrono::steady_clock;
    std::unique_ptr<OverlapSave> best;
    auto least = Clock::duration::max();
    for (auto length = std::bit_ceil(2 * taps.size()); !best || length <= 1 << 18; length *= 2) {
        auto filter = std::make_unique<OverlapSave>(taps, int(length));
        filter->run(stream, out);
        const auto start = Clock::now();
        filter->run(stream, out);
        const auto time = Clock::now() - start;
        if (time < least) {
            least = time;
            best = std::move(filter);
        }
        if (length >= stream.size()) break;
    }
    return best;
}

void fftw_filter(benchmark::State& state, std::size_t taps, std::size_t block) {
    const auto h = noise(taps), x = noise(block);
    Samples stream(taps - 1 + block), out(block);
    const auto filter = best_overlap_save(h, stream, out);
    for (auto _ : state) {
        std::copy(stream.end() - std::ptrdiff_t(taps - 1), stream.end(), stream.begin());
        std::copy(x.begin(), x.end(), stream.begin() + std::ptrdiff_t(taps - 1));
        filter->run(stream, out);
        benchmark::ClobberMemory();
    }
}

}  // namespace

int main(int argc, char** argv) {
    using wavkit::bench::add;
    constexpr double most_products = 1e8;  // that the loop is given the time for
    for (const std::size_t taps : {5, 20, 45, 46, 100, 400, 2000, 20000}) {
        for (const std::size_t block : {256, 4096, 65536, 1 << 20}) {
            const auto what = std::to_string(taps) + " taps, " + std::to_string(block);
            add(what, "wavkit", [=](auto& state) { wavkit_filter(state, taps, block); });
            if (double(taps) * double(block) <= most_products) {
                add(what, "loop", [=](auto& state) { loop_filter(state, taps, block); });
            }
            add(what, "FFTW", [=](auto& state) { fftw_filter(state, taps, block); });
        }
    }
    return wavkit::bench::run_and_compare(argc, argv);
}
