// Sines and cosines that the compiler computes.
#pragma once

namespace wavkit::kernel {

/// cos and sin of 2 pi k / n, 0 <= 8 k <= n, by their series.
constexpr long double series_cosine(long k, long n) {
    const long double x = 6.283185307179586476925286766559005768L * static_cast<long double>(k) /
                          static_cast<long double>(n);
    long double term = 1, sum = 1;
    for (int i = 1; i <= 12; ++i) sum += term *= -x * x / ((2 * i - 1) * (2 * i));
    return sum;
}

constexpr long double series_sine(long k, long n) {
    const long double x = 6.283185307179586476925286766559005768L * static_cast<long double>(k) /
                          static_cast<long double>(n);
    long double term = x, sum = x;
    for (int i = 1; i <= 12; ++i) sum += term *= -x * x / ((2 * i) * (2 * i + 1));
    return sum;
}

/// cos(2 pi k / n) for any 0 <= k < n: folded into the first eighth of the circle. The sine is the
/// cosine of a quarter less.
constexpr long double exact_cosine(long k, long n) {
    if (2 * k > n) k = n - k;
    if (4 * k > n) return -exact_cosine(n - 2 * k, 2 * n);
    return 8 * k > n ? series_sine(n - 4 * k, 4 * n) : series_cosine(k, n);
}

constexpr long double exact_sine(long k, long n) {
    return exact_cosine((4 * k + 3 * n) % (4 * n), 4 * n);
}

/// cos and sin of 2 pi k / Radix, k from 1 to half of it.
template <int Radix>
struct Circle {
    double cosine[Radix / 2], sine[Radix / 2];

    constexpr Circle() : cosine(), sine() {
        for (int k = 1; k <= Radix / 2; ++k) {
            cosine[k - 1] = double(exact_cosine(k, Radix));
            sine[k - 1] = double(exact_sine(k, Radix));
        }
    }
};

template <int Radix>
inline constexpr Circle<Radix> circle{};

/// cos and sin of 2 pi j k / Radix, j and k from 1 to half of it.
template <class T, int Radix>
struct CircleMatrix {
    struct Row {
        T cosine[Radix / 2], sine[Radix / 2];
    };
    Row row[Radix / 2];

    constexpr CircleMatrix() : row() {
        for (int j = 1; j <= Radix / 2; ++j) {
            for (int k = 1; k <= Radix / 2; ++k) {
                row[j - 1].cosine[k - 1] = T(exact_cosine(j * k % Radix, Radix));
                row[j - 1].sine[k - 1] = T(exact_sine(j * k % Radix, Radix));
            }
        }
    }
};

template <class T, int Radix>
inline constexpr CircleMatrix<T, Radix> circle_matrix{};

}  // namespace wavkit::kernel
