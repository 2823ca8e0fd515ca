// Second-order sections over a whole signal, beside a loop over samples and sections and
// liquid-dsp.
#include <liquid/liquid.h>

#include "rows.hpp"

namespace wavkit::bench {
namespace {

/// Rows of b0 b1 b2 a0 a1 a2: Butterworth's low-pass with an even order.
std::vector<double> butterworth(int order, double edge) {
    const double w = std::tan(two_pi<double> / 2 * edge);
    std::vector<double> rows;
    for (int k = 0; k < order / 2; ++k) {
        const double damping = 2 * std::sin(two_pi<double> / 4 * (2 * k + 1) / order);
        const double a0 = 1 + damping * w + w * w, b0 = w * w / a0;
        for (const double v :
             {b0, 2 * b0, b0, 1., 2 * (w * w - 1) / a0, (1 - damping * w + w * w) / a0}) {
            rows.push_back(v);
        }
    }
    return rows;
}

/// The transposed form II, which has the shortest loop.
template <class T>
void filter_by_loop(Operands<T> o, const std::vector<double>& rows, std::vector<double>& state) {
    std::fill(state.begin(), state.end(), 0.);
    for (std::size_t i = 0; i < o.n; ++i) {
        double x = o.a[i];
        const double* row = rows.data();
        for (double* z = state.data(); z != state.data() + state.size(); z += 2, row += 6) {
            const double y = row[0] * x + z[0];
            z[0] = row[1] * x - row[4] * y + z[1];
            z[1] = row[2] * x - row[5] * y;
            x = y;
        }
        o.y[i] = T(x);
    }
}

template <Record R, class T = scalar<R>>
void sections(const Family<R>& f) {
    for (const int order : {2, 4, 8, 20}) {
        const auto name = "order " + std::to_string(order);
        if (!f.wants(name)) continue;
        const auto rows = butterworth(order, .1);
        const auto table = std::make_shared<Signal<dsp>>(rows.size(), false);
        table->set(rows.data(), rows.size(), false);
        std::vector<Peer<T>> peers{
            {"loop", [=, state = std::vector<double>(std::size_t(order))](Operands<T> o) mutable {
                 filter_by_loop<T>(o, rows, state);
             }}};
        if constexpr (sizeof(T) == 4) {
            std::vector<float> b, a;
            for (std::size_t k = 0; k < rows.size(); k += 6) {
                b.insert(b.end(), rows.begin() + long(k), rows.begin() + long(k) + 3);
                a.insert(a.end(), rows.begin() + long(k) + 3, rows.begin() + long(k) + 6);
            }
            peers.push_back(
                {"liquid-dsp", [of = iirfilt_rrrf_create_sos(b.data(), a.data(),
                                                             unsigned(order / 2))](Operands<T> o) {
                     iirfilt_rrrf_reset(of);
                     iirfilt_rrrf_execute_block(of, const_cast<T*>(o.a), unsigned(o.n), o.y);
                 }});
        }
        f.row(name, real(-1, 1),
              [=](R* in, R* out) { return dspd_iir(in, out, table->get(), nullptr); }, peers,
              {{}, sizeof(T) == 8 ? 1e-9 : 2e-3});
    }
}

[[maybe_unused]] const bool added = at_every_size("sections", [](const auto& f) { sections(f); });

}  // namespace
}  // namespace wavkit::bench
