// Signals over the angle of shafts whose turning is known.
#include <cmath>

#include "support/signals.hpp"

namespace wavkit::test {
namespace {

/// A shaft that speeds up evenly: revolutions after so many samples, and the samples for them.
struct Shaft {
    long double first = 11.3L, speed = 1 / 61.0L, gain = 1 / 61.0L / 20000;

    long double turned(long double n) const {
        const long double t = n - first;
        return speed * t + gain * t * t / 2;
    }
    long double place(long double turns) const {
        return first + (std::sqrt(speed * speed + 2 * gain * turns) - speed) / gain;
    }
};

Signal<dsp> pulses(const Shaft& shaft, int n, long double per_revolution) {
    std::vector<long double> at;
    for (int i = 0; i < n; ++i) at.push_back(shaft.place(i / per_revolution));
    return real<dsp>(at);
}

BOTH_PRECISIONS(Orders, StandStillWhileTheSpeedDoubles) {
    const Shaft shaft;
    const int n = 20000;
    const long double orders[] = {1, 2.5L, 7};
    std::vector<std::complex<long double>> x;
    for (int i = 0; i < n; ++i) {
        std::complex<long double> sum;
        for (const auto order : orders) {
            sum += std::polar(1 / order, 2 * pi<long double> * order * shaft.turned(i));
        }
        x.push_back(sum);
    }
    for (const double per_revolution : {2.0, 2.5, 8.0}) {
        for (const int angles : {0, 20}) {
            const auto at = pulses(shaft, int(450 * per_revolution) + 1, per_revolution);
            Signal<R> out;
            ASSERT_EQ(dsph_rsmp_angle(complex<R>(x), out, at, T(per_revolution), angles), 0);
            const int each = angles > 0 ? angles : 64;
            ASSERT_EQ(out->points, 450 * each + 1);
            EXPECT_EQ(out->delta, T(1) / T(each));
            long double worst = 0;
            // (What the kernel sees of the signal's ends is left out.)
            for (int m = each; m < 448 * each; ++m) {
                std::complex<long double> want;
                for (const auto order : orders) {
                    want += std::polar(1 / order, 2 * pi<long double> * order * m / each);
                }
                const auto z = bins(out.get())[std::size_t(m)];
                worst = std::max(worst, std::abs(want - std::complex<long double>(z.re, z.im)));
            }
            // The spline's error near the ends, which orders multiply, and the kernel's.
            EXPECT_LT(worst, std::max(1e-6, 60 * double(epsilon<R>)));
        }
    }
    Signal<R> same = complex<R>(x), apart;
    const auto at = pulses(shaft, 900, 2);
    ASSERT_EQ(dsph_rsmp_angle(same, apart, at, 2, 30), 0);
    ASSERT_EQ(dsph_rsmp_angle(same, same, at, 2, 30), 0);
    EXPECT_TRUE(matches<R>(same, apart));
}

BOTH_PRECISIONS(Orders, RefuseWhatTellsNoAngle) {
    auto x = real<R>({1, 2, 3, 4, 5, 6, 7, 8});
    const auto before = x;
    Signal<R> same = x;
    const double none = std::nan(""), far = HUGE_VAL;
    const auto refused = [&](const Signal<dsp>& at, double per_revolution, int angles) {
        EXPECT_EQ(dsph_rsmp_angle(same, same, at, T(per_revolution), angles), -1);
        EXPECT_TRUE(matches<R>(same, before));
    };
    for (const auto& at : {std::vector<long double>{0, 1, 2, 3},
                           {0, 1, 2, 2, 3},
                           {0, 1, 3, 2, 4},
                           {0, 1, none, 2, 3},
                           {0, 1, 2, 3, far},
                           {-far, 1, 2, 3, 4}}) {
        refused(real<dsp>(at), 1, 4);
    }
    refused(complex<dsp>({1, 2, 3, 4, 5}), 1, 4);
    const auto steady = real<dsp>({0, 1, 2, 3, 4});
    for (const double per_revolution : {0.0, -1.0, none, far, 1e-30}) {
        refused(steady, per_revolution, 4);
        refused(steady, per_revolution, 1 << 30);
    }
    refused(steady, 1, 1 << 30);
    refused(steady, 1e30, 0);
}

}  // namespace
}  // namespace wavkit::test
