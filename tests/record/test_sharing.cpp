// Outputs that share memory with operands: every result is that of the same call on copies.
#include <array>
#include <functional>
#include <optional>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

constexpr int points = 6, operands = 4;

template <class R>
using Operands = std::array<R, operands>;

template <class R>
struct Call {
    const char* name;
    std::function<int(Operands<R>&, R* out)> run;
};

template <class R>
std::vector<Call<R>> calls() {
    using T = scalar<R>;
    std::vector<Call<R>> all;
    const auto unary = [&](const char* name, int (*f)(const R*, R*)) {
        all.push_back({name, [f](Operands<R>& x, R* out) { return f(&x[0], out); }});
    };
    const auto binary = [&](const char* name, int (*f)(const R*, const R*, R*)) {
        all.push_back({name, [f](Operands<R>& x, R* out) { return f(&x[0], &x[1], out); }});
        all.push_back({name, [f](Operands<R>& x, R* out) {
                           x[1].points -= 2;
                           return f(&x[0], &x[1], out);
                       }});
    };
    const auto other = [&](const char* name, int (*f)(Operands<R>&, R*)) {
        all.push_back({name, f});
    };
    binary("add", dspb_add);
    binary("sub", dspb_sub);
    binary("mul", dspb_mul);
    binary("conj_mul", dspb_conj_mul);
    binary("div", dspb_div);
    binary("min", dspb_min);
    binary("max", dspb_max);
    binary("ritoc", dspb_ritoc);
    binary("pmul", dspb_pmul);
    binary("dot", dspbs_dot);
    binary("inter", dspb_inter);
    unary("copy", [](const R* x, R* out) { return dsp_copy(out, x); });
    unary("append", [](const R* x, R* out) { return dsp_append(out, x); });
    unary("mag", dspu_mag);
    unary("magsq", dspu_magsq);
    unary("sqrt", dspu_sqrt);
    unary("sum", dsps_sum);
    unary("mean", dsps_mean);
    unary("min of", dsps_min);
    unary("max of", dsps_max);
    unary("median", dsps_median);
    unary("magsq_sum", dsps_magsq_sum);
    unary("rms", dsps_rms);
    unary("samp_stddev", dsps_samp_stddev);
    unary("skew", dsps_skew);
    unary("excess", dsps_excess);
    unary("gmean", dsps_gmean);
    unary("hmean", dsps_hmean);
    unary("lin_regres", dsps_lin_regres);
    unary("lin_regres2", dsps_lin_regres2);
    unary("roots", dsps_proots);
    other("avg_add",
          [](Operands<R>& x, R* out) { return dspb_avg_add(&x[0], &x[1], out, T(0.25)); });
    other("subvec", [](Operands<R>& x, R* out) { return dspu_subvec(&x[0], out, 1, 4); });
    other("copy_at_most", [](Operands<R>& x, R* out) { return dsp_copy_at_most(out, &x[0], 5); });
    other("few bins", [](Operands<R>& x, R* out) { return dsps_hist(&x[0], out, 1, 1, 5); });
    other("many bins", [](Operands<R>& x, R* out) { return dsps_hist(&x[0], out, 1, 1, 40); });
    other("peak", [](Operands<R>& x, R* out) { return dsps_peak(&x[0], out, 0x2000, 0); });
    other("psolve", [](Operands<R>& x, R* out) { return dsps_psolve(&x[0], out, 1); });
    other("pcsolve", [](Operands<R>& x, R* out) { return dsps_pcsolve(&x[0], out, 1, 1); });
    other("peval", [](Operands<R>& x, R* out) { return dsps_peval(&x[0], out, T(0.5)); });
    other("lines", [](Operands<R>& x, R* out) {
        return dsp_interp(&x[0], &x[1], nullptr, &x[2], out, DSP_INTERP_LINEAR);
    });
    other("spline",
          [](Operands<R>& x, R* out) { return dsp_cspline(&x[0], &x[1], &x[3], &x[2], out); });
    other("cspline_2d", [](Operands<R>& x, R* out) {
        return dspb_cspline_2d(&x[0], &x[1], out, 1, 1, DSP_SPLINE_SLOPE, DSP_SPLINE_NOT_A_KNOT);
    });
    other("measured", [](Operands<R>& x, R* out) { return dsph_fft(&x[0], out, 16, 1, 2, 0); });
    other("measured back", [](Operands<R>& x, R* out) {
        return dsph_fft(&x[0], out, 16, 1, 2, DSP_SPECTRUM_INVERSE);
    });
    other("measured at its length",
          [](Operands<R>& x, R* out) { return dsph_dft(&x[0], out, 2, 0); });
    other("linear mean",
          [](Operands<R>& x, R* out) { return dsph_avg(&x[0], out, &x[1], 1, 2, 0, T(0.25), 0); });
    other("harmonic mean",
          [](Operands<R>& x, R* out) { return dsph_avg(&x[0], out, &x[1], 4, 2, 0, T(0.25), 0); });
    other("mean power", [](Operands<R>& x, R* out) {
        return dsph_avg(&x[0], out, &x[1], 0x25, 2, 0, T(0.25), 0);
    });
    other("corr", [](Operands<R>& x, R* out) { return dspb_corr(&x[0], &x[1], out, &x[2], 3); });
    other("fir", [](Operands<R>& x, R* out) { return dspd_fir(&x[0], out, &x[1], &x[2]); });
    other("sfir", [](Operands<R>& x, R* out) { return dspd_sfir(&x[0], out, &x[1], 1, 0, &x[2]); });
    other("deci", [](Operands<R>& x, R* out) {
        x[2].points = 5;
        return dspd_deci(&x[0], out, &x[1], 2, &x[2]);
    });
    other("rsmp", [](Operands<R>& x, R* out) {
        x[2].points = 1;
        return dspd_rsmp(&x[0], out, &x[1], 3, 2, &x[2]);
    });
    other("half-band", [](Operands<R>& x, R* out) {
        x[1].points = 3;
        return dspd_hwfilt(&x[0], out, &x[1], DSP_HALF_UP, &x[2]);
    });
    return all;
}

/// How the output stands to the block of which all operands are slices: as the owner of no more
/// than they take, of room to grow, as a slice of it itself, or over a part that it may fill.
enum Room { tight, ample, borrowed, within, rooms };

template <class R>
struct Layout {
    std::array<int, operands> at;  // scalar at which each operand begins
    unsigned complex;              // bits: which of them are, and the output last
    Room room;

    int out_at() const { return room == within || (room == borrowed && at[1] % 2) ? 3 : 0; }
    int begin(int which) const { return which < operands ? at[std::size_t(which)] : out_at(); }
    R view(const R& block, int which) const {
        const int is_complex = complex >> which & 1;
        return {scalar<R>(which + 1), block.data + begin(which), 0, points, is_complex, 0};
    }
    int extent() const {
        int last = 0;
        for (int i = 0; i <= operands; ++i) {
            last = std::max(last, begin(i) + points * (complex >> i & 1 ? 2 : 1));
        }
        return last;
    }
};

/// The combinations of positions, kinds and rooms by their number; none behind the last.
template <class R>
std::optional<Layout<R>> layout(unsigned number) {
    const auto next = [&](unsigned count) {
        return int(std::exchange(number, number / count) % count);
    };
    const auto room = Room(next(rooms));
    const unsigned kinds = unsigned(next(8));
    const int first = std::array{0, 1, 2, 3, 5}[std::size_t(next(5))];
    const int step = std::array{0, 1, 3, 7}[std::size_t(next(4))];
    if (number > 0) return std::nullopt;
    const unsigned complex = (kinds & 3) | (kinds & 4 ? 1u << operands : 0);
    return Layout<R>{{first, first + step, first + 2 * step, first}, complex, room};
}

/// Whether the call gives the same on slices of the output's block and on copies of them.
template <class R>
::testing::AssertionResult agrees(const Call<R>& call, const Layout<R>& layout) {
    R block{1, nullptr, 0, layout.room == tight ? layout.extent() : 64, 0, 0};
    if (dsp_alloc(&block)) return ::testing::AssertionFailure();
    for (int i = 0; i < block.points; ++i) {
        block.data[i] = 1 + scalar<R>(0.375) * scalar<R>(i) + scalar<R>(i % 3) / 8;
    }
    Operands<R> slices;
    Operands<R> copied;
    for (std::size_t i = 0; i < operands; ++i) {
        slices[i] = layout.view(block, int(i));
        dsp_init(&copied[i]);
        dsp_copy(&copied[i], &slices[i]);
    }
    R out = layout.view(block, operands);
    Signal<R> expected;
    dsp_copy(expected, &out);
    if (layout.room != borrowed) out.alloc = block.points - layout.out_at();

    const int wanted = call.run(copied, expected), result = call.run(slices, &out);
    auto same = result != wanted ? ::testing::AssertionFailure() << "returned " << result
                : result         ? ::testing::AssertionSuccess()
                : out.delta != expected->delta
                    ? ::testing::AssertionFailure() << "spacing " << out.delta
                    : matches<R>(&out, expected, 16);
    for (auto& x : slices) dsp_destroy(&x);
    for (auto& x : copied) dsp_destroy(&x);
    if (layout.room != within) dsp_destroy(&out);
    if (layout.room == within || layout.room == borrowed) dsp_destroy(&block);
    return same;
}

BOTH_PRECISIONS(Sharing, OperandsMayLieAnywhereInTheBlockOfTheOutput) {
    for (const auto& call : calls<R>()) {
        auto same = ::testing::AssertionSuccess();
        for (unsigned i = 0; same && layout<R>(i); ++i) {
            same = agrees(call, *layout<R>(i));
            EXPECT_TRUE(same) << call.name << ", layout " << i;
        }
    }
}

}  // namespace
}  // namespace wavkit::test
