// Lays out, once a length, what the transform kernels read: twiddles in the order of their use.
#include "transform/plan.hpp"

#include <algorithm>

#include "transform/mixed.hpp"
#include "transform/tables.hpp"

namespace wavkit {
namespace {

using kernel::direct_limit;
using kernel::FftPlan;
using kernel::strip_width;

template <Record R>
struct Plans {
    std::array<Fft<scalar<R>>, exponents> ffts{};
    std::array<bool, exponents> ready{};
    TableCache<scalar<R>> tables, split_roots;
    const kernel::FftKernels<scalar<R>>* chosen = nullptr;
    scalar<R>* work = nullptr;
    std::size_t work_scalars = 0;
};

template <Record R>
Plans<R> plans;

/// Writes roots of unity of n points one after the other, as pairs or in blocks of lanes; or, on a
/// dry run without memory, counts them.
template <class T>
class Writer {
  public:
    Writer(const T* twiddle_table, std::size_t n, T* memory)
        : table_(twiddle_table), n_(n), memory_(memory) {}

    const T* here() const { return memory_ ? memory_ + used_ : nullptr; }
    std::size_t used() const { return used_; }

    void pair(std::size_t k) { put(used_, used_ + 1, k), used_ += 2; }

    /// Lanes of the roots k(0), k(1), ...: all cosines, then all negated sines.
    template <class Index>
    void block(std::size_t lanes, Index k) {
        for (std::size_t lane = 0; lane < lanes; ++lane) {
            put(used_ + lane, used_ + lanes + lane, k(lane));
        }
        used_ += 2 * lanes;
    }

  private:
    void put(std::size_t re, std::size_t im, std::size_t k) {
        if (!memory_) return;
        const Bin<T> root = root_of_unity(table_, n_, k & (n_ - 1));
        memory_[re] = root.re;
        memory_[im] = root.im;
    }

    const T* table_;
    std::size_t n_;
    T* memory_;
    std::size_t used_ = 0;
};

/// Twiddles of the radix-4 passes over blocks of n, n / 4, ... points: those of a pass shorter than
/// a vector lane by lane, those of the others one triple a rotation. `step` is how far apart the
/// roots of n points lie among those that the writer knows.
template <class T>
void write_passes(Writer<T>& out, std::size_t n, std::size_t step, std::size_t stride,
                  std::size_t lanes) {
    for (; n > 8; n /= 4, step *= 4, stride *= 4) {
        if (stride < lanes) {
            for (std::size_t i = 0; i < n / 4 * stride; i += lanes) {
                for (std::size_t power = 1; power <= 3; ++power) {
                    out.block(lanes,
                              [&](std::size_t lane) { return (i + lane) / stride * power * step; });
                }
            }
        } else {
            for (std::size_t p = 1; p < n / 4; ++p) {
                for (std::size_t power = 1; power <= 3; ++power) out.pair(p * power * step);
            }
        }
    }
}

template <class T>
void lay_out_direct(FftPlan<T>& plan, Writer<T>& out, std::size_t lanes) {
    plan.twiddles = out.here();
    write_passes(out, plan.points, 1, 1, lanes);
}

template <class T>
void lay_out_matrix(FftPlan<T>& plan, Writer<T>& out, int exponent, std::size_t lanes) {
    plan.columns = std::size_t(1) << exponent / 2;
    plan.rows = plan.points / plan.columns;
    plan.fine_bits = exponent / 2;

    plan.row_twiddles = out.here();
    write_passes(out, plan.rows, plan.columns, strip_width<T>, lanes);
    plan.column_twiddles = out.here();
    write_passes(out, plan.columns, plan.rows, strip_width<T>, lanes);
    while (out.used() % (alignment / sizeof(T)) != 0) out.pair(0);
    plan.rotations = out.here();
    for (std::size_t k = 0; k < plan.rows; ++k) {
        for (std::size_t b = 0; b < strip_width<T>; b += lanes) {
            out.block(lanes, [&](std::size_t lane) { return (b + lane) * k; });
        }
    }
    plan.coarse_roots = out.here();
    for (std::size_t k = 0; k < plan.points; k += std::size_t(1) << plan.fine_bits) out.pair(k);
    plan.fine_roots = out.here();
    for (std::size_t k = 0; k < std::size_t(1) << plan.fine_bits; ++k) out.pair(k);
}

template <class T>
void lay_out(FftPlan<T>& plan, Writer<T>& out, int exponent, const kernel::FftKernels<T>& kernels) {
    const bool wide = plan.points >= kernel::wide_from;
    const auto lanes = std::size_t(wide ? kernels.wide_lanes : kernels.narrow_lanes);
    if (plan.points <= direct_limit<T>) {
        lay_out_direct(plan, out, lanes);
    } else {
        lay_out_matrix(plan, out, exponent, lanes);
    }
}

/// The workspace is one for all lengths; it grows to what the longest of them needs.
template <Record R>
bool reserve_work(std::size_t count) {
    using T = scalar<R>;
    auto& all = plans<R>;
    if (count <= all.work_scalars) return true;
    T* grown = new_aligned<T>(count);
    if (!grown) return false;
    std::free(all.work);
    all.work = grown;
    all.work_scalars = count;
    for (auto& fft : all.ffts) fft.work = grown;
    return true;
}

template <Record R>
bool build(int exponent) {
    using T = scalar<R>;
    auto& fft = plans<R>.ffts[std::size_t(exponent)];
    fft.kernels = &kernels_in_use<R>();
    FftPlan<T> plan{.points = std::size_t(1) << exponent};
    if (plan.points >= 16) {
        const T* twiddle_table;
        if (fft_twiddle_table<R>(1 << exponent, &twiddle_table)) return false;
        Writer<T> count(twiddle_table, plan.points, nullptr);
        lay_out(plan, count, exponent, *fft.kernels);
        if (!reserve_work<R>(kernel::work_scalars(plan))) return false;
        T* memory = new_aligned<T>(count.used());
        if (!memory) return false;
        Writer<T> out(twiddle_table, plan.points, memory);
        lay_out(plan, out, exponent, *fft.kernels);
        plans<R>.tables.keep(exponent, memory);
    }
    fft.plan = plan;
    fft.work = plans<R>.work;
    plans<R>.ready[std::size_t(exponent)] = true;
    return true;
}

}  // namespace

template <Record R>
const Fft<scalar<R>>* find_fft(int exponent) {
    if (!plans<R>.ready[std::size_t(exponent)] && !build<R>(exponent)) return nullptr;
    return &plans<R>.ffts[std::size_t(exponent)];
}

template <Record R>
const scalar<R>* find_split_roots(int exponent) {
    using T = scalar<R>;
    T* roots = plans<R>.split_roots.find(exponent);
    if (roots) return roots;
    const std::size_t n = std::size_t(1) << exponent, count = n / 4 + 1;
    const T* twiddle_table;
    if (fft_twiddle_table<R>(1 << exponent, &twiddle_table)) return nullptr;
    roots = new_aligned<T>(2 * count);
    if (!roots) return nullptr;
    for (std::size_t k = 0; k < count; ++k) {
        const Bin<T> root = root_of_unity(twiddle_table, n, k);
        roots[k] = root.re;
        roots[count + k] = -root.im;
    }
    plans<R>.split_roots.keep(exponent, roots);
    return roots;
}

template <Record R>
void free_plans() {
    auto& all = plans<R>;
    all.ready.fill(false);
    all.tables.release();
    all.split_roots.release();
    std::free(all.work);
    all.work = nullptr;
    all.work_scalars = 0;
}

template <Record R>
const kernel::FftKernels<scalar<R>>& kernels_in_use() {
    return plans<R>.chosen ? *plans<R>.chosen : kernel::fft_kernels<scalar<R>>();
}

template <Record R>
void use_kernels(const kernel::FftKernels<scalar<R>>* kernels) {
    free_plans<R>();
    free_mixed_ffts<R>();
    plans<R>.chosen = kernels;
}

template const Fft<double>* find_fft<dsp>(int);
template const Fft<float>* find_fft<dspf>(int);
template const double* find_split_roots<dsp>(int);
template const float* find_split_roots<dspf>(int);
template const kernel::FftKernels<double>& kernels_in_use<dsp>();
template const kernel::FftKernels<float>& kernels_in_use<dspf>();
template void free_plans<dsp>();
template void free_plans<dspf>();
template void use_kernels<dsp>(const kernel::FftKernels<double>*);
template void use_kernels<dspf>(const kernel::FftKernels<float>*);

}  // namespace wavkit
