// Transforms beside FFTW (MEASURE) and KissFFT: powers of two, and round, smooth and prime lengths.
//
// wavkit works in place; the peers go from one buffer to another, which is what they do fastest.
// All of them transform zeros: the time does not depend on the samples as long as none is
// subnormal, and zeros neither decay nor grow when a transform runs over its own result.
#include <benchmark/benchmark.h>
#include <fftw3.h>
#include <wavkit/dsp.h>

#include <complex>
#include <kissfft.hh>
#include <string>
#include <vector>

#include "ratios.hpp"

namespace {

/// The names of one precision.
struct Double {
    using Scalar = double;
    using Record = dsp;
    using Plan = fftw_plan;
    static constexpr const char* name = "double";
    static int dft(Record* x) { return dspi_dft(x, 0); }
    static int rdft(Record* x) { return dspi_rdft(x); }
    static void init(Record* x) { dsp_init(x); }
    static int reserve(Record* x) { return dsp_alloc(x); }
    static void release(Record* x) { dsp_destroy(x); }
    static Scalar* allocate(std::size_t n) { return fftw_alloc_real(n); }
    static void free(void* p) { fftw_free(p); }
    static Plan plan_complex(int n, Scalar* in, Scalar* out) {
        return fftw_plan_dft_1d(n, reinterpret_cast<fftw_complex*>(in),
                                reinterpret_cast<fftw_complex*>(out), FFTW_FORWARD, FFTW_MEASURE);
    }
    static Plan plan_real(int n, Scalar* in, Scalar* out) {
        return fftw_plan_dft_r2c_1d(n, in, reinterpret_cast<fftw_complex*>(out), FFTW_MEASURE);
    }
    static void execute(Plan plan) { fftw_execute(plan); }
    static void destroy(Plan plan) { fftw_destroy_plan(plan); }
};

struct Single {
    using Scalar = float;
    using Record = dspf;
    using Plan = fftwf_plan;
    static constexpr const char* name = "float";
    static int dft(Record* x) { return dspfi_dft(x, 0); }
    static int rdft(Record* x) { return dspfi_rdft(x); }
    static void init(Record* x) { dspf_init(x); }
    static int reserve(Record* x) { return dspf_alloc(x); }
    static void release(Record* x) { dspf_destroy(x); }
    static Scalar* allocate(std::size_t n) { return fftwf_alloc_real(n); }
    static void free(void* p) { fftwf_free(p); }
    static Plan plan_complex(int n, Scalar* in, Scalar* out) {
        return fftwf_plan_dft_1d(n, reinterpret_cast<fftwf_complex*>(in),
                                 reinterpret_cast<fftwf_complex*>(out), FFTW_FORWARD, FFTW_MEASURE);
    }
    static Plan plan_real(int n, Scalar* in, Scalar* out) {
        return fftwf_plan_dft_r2c_1d(n, in, reinterpret_cast<fftwf_complex*>(out), FFTW_MEASURE);
    }
    static void execute(Plan plan) { fftwf_execute(plan); }
    static void destroy(Plan plan) { fftwf_destroy_plan(plan); }
};

template <class P>
void wavkit_transform(benchmark::State& state, int n, bool real) {
    typename P::Record x;
    P::init(&x);
    x.points = 4 * n;  // room for the convolution behind lengths that are no power of two
    x.complex = 1;
    if (P::reserve(&x)) state.SkipWithError("out of memory");
    std::fill_n(x.data, 8 * std::size_t(n), 0);
    for (auto _ : state) {
        x.points = n;
        x.complex = !real;
        if (real ? P::rdft(&x) : P::dft(&x)) state.SkipWithError("transform failed");
        benchmark::ClobberMemory();
    }
    P::release(&x);
}

template <class P>
void fftw_transform(benchmark::State& state, int n, bool real) {
    auto* in = P::allocate(2 * std::size_t(n));
    auto* out = P::allocate(2 * std::size_t(n) + 2);
    const auto plan = real ? P::plan_real(n, in, out) : P::plan_complex(n, in, out);
    std::fill_n(in, 2 * std::size_t(n), 0);
    for (auto _ : state) {
        P::execute(plan);
        benchmark::ClobberMemory();
    }
    P::destroy(plan);
    P::free(in);
    P::free(out);
}

template <class P>
void kiss_transform(benchmark::State& state, int n, bool real) {
    using T = typename P::Scalar;
    std::vector<std::complex<T>> in(std::size_t(n) / (real ? 2 : 1)), out(std::size_t(n) + 1);
    kissfft<T> transform(in.size(), false);
    for (auto _ : state) {
        if (real) {
            transform.transform_real(reinterpret_cast<T*>(in.data()), out.data());
        } else {
            transform.transform(in.data(), out.data());
        }
        benchmark::ClobberMemory();
    }
}

template <class P>
void add_lengths(bool real) {
    using wavkit::bench::add;
    std::vector<int> lengths;
    for (int n = 16; n <= 1 << 20; n *= 2) lengths.push_back(n);
    for (const int n : {60, 100, 127, 360, 1000, 1009, 4800, 6007, 10000, 10007, 44100, 48000,
                        96000, 100003, 480000, 1000000}) {
        lengths.push_back(n);
    }
    for (const int n : lengths) {
        const std::string what =
            std::string(real ? "real " : "complex ") + P::name + " " + std::to_string(n);
        add(what, "wavkit", [=](auto& state) { wavkit_transform<P>(state, n, real); });
        add(what, "FFTW", [=](auto& state) { fftw_transform<P>(state, n, real); });
        if (!real || n % 2 == 0)
            add(what, "KissFFT", [=](auto& state) { kiss_transform<P>(state, n, real); });
    }
}

}  // namespace

int main(int argc, char** argv) {
    add_lengths<Double>(false);
    add_lengths<Double>(true);
    add_lengths<Single>(false);
    add_lengths<Single>(true);
    return wavkit::bench::run_and_compare(argc, argv);
}
