// Twiddle tables: the sines and cosines of the power-of-two transforms.
#include <algorithm>

#include "transform/plan.hpp"
#include "transform/tables.hpp"

namespace wavkit {
namespace {

template <Record R>
TableCache<scalar<R>> twiddles;

/// Rotations by one step between two exact values of sine and cosine.
constexpr int steps_between_anchors = 256;

template <class T>
void write_group(T* group, long double c, long double s) {
    group[0] = T(c);
    group[1] = T(-(c + s));
    group[2] = T(s - c);
}

/// First halves of all groups: n / 8 angles, the others by symmetry about pi / 4.
template <class T>
void fill_angles(T* table, int n) {
    const long double step = two_pi<long double> / n;
    const long double step_cos = std::cos(step), step_sin = std::sin(step);
    write_group(table, 1, 0);
    long double c = 1, s = 0;
    for (int k = 1; k < n / 8; ++k) {
        if (k % steps_between_anchors == 1) {
            c = std::cos(k * step);
            s = std::sin(k * step);
        } else {
            const long double turned = c * step_cos - s * step_sin;
            s = s * step_cos + c * step_sin;
            c = turned;
        }
        write_group(table + 6 * std::size_t(k), c, s);
        write_group(table + 6 * std::size_t(n / 4 - k), s, c);
    }
    if (n > 4) {
        const long double half_root_two = std::sqrt(0.5L);
        write_group(table + 6 * std::size_t(n / 8), half_root_two, half_root_two);
    }
}

/// Second halves, the triple angles: each stands already as the first half of another group, in the
/// same quadrant or a mirrored one.
template <class T>
void fill_triple_angles(T* table, int n) {
    const std::size_t quarter = std::size_t(n) / 4;
    std::copy_n(table, 3, table + 3);
    for (std::size_t j = 1; j < quarter; ++j) {
        T* to = table + 6 * j + 3;
        if (3 * j < quarter) {
            std::copy_n(table + 6 * (3 * j), 3, to);
        } else if (3 * j < 2 * quarter) {
            const T* from = table + 6 * (2 * quarter - 3 * j);
            to[0] = -from[0];
            to[1] = -from[2];
            to[2] = -from[1];
        } else {
            const T* from = table + 6 * (3 * j - 2 * quarter);
            to[0] = -from[0];
            to[1] = -from[1];
            to[2] = -from[2];
        }
    }
}

}  // namespace

template <Record R>
int fft_twiddle_table(int n, const scalar<R>** table) {
    using T = scalar<R>;
    const int exponent = exponent_of(n);
    T* found = twiddles<R>.find(exponent);
    if (!found) {
        found = new_table<T>(std::size_t(n) / 4 * 6);
        if (!found) return -1;
        fill_angles(found, n);
        fill_triple_angles(found, n);
        twiddles<R>.keep(exponent, found);
    }
    *table = found;
    return 0;
}

template <Record R>
int fft_free_tables() {
    free_plans<R>();
    twiddles<R>.release();
    return 0;
}

template int fft_twiddle_table<dsp>(int, const double**);
template int fft_twiddle_table<dspf>(int, const float**);
template int fft_free_tables<dsp>();
template int fft_free_tables<dspf>();

}  // namespace wavkit
