// The window catalogue's data.
#include "window/catalogue.hpp"

#include <array>

namespace wavkit {
namespace {

constexpr WindowName names[] = {
    {"Uniform", DSP_WINDOW_UNIFORM},
    {"Rectangular", DSP_WINDOW_UNIFORM},
    {"None", DSP_WINDOW_UNIFORM},
    {"P000", DSP_WINDOW_UNIFORM},
    {"Bartlett", DSP_WINDOW_BARTLETT},
    {"Triangular", DSP_WINDOW_BARTLETT},
    {"Hann", DSP_WINDOW_HANN},
    {"P110", DSP_WINDOW_HANN},
    {"Hamming", DSP_WINDOW_HAMMING},
    {"P100", DSP_WINDOW_HAMMING},
    {"Blackman", DSP_WINDOW_BLACKMAN},
    {"Blackman_Harris3", DSP_WINDOW_BLACKMAN_HARRIS3},
    {"P200", DSP_WINDOW_BLACKMAN_HARRIS3},
    {"Blackman_Harris4", DSP_WINDOW_BLACKMAN_HARRIS4},
    {"P310", DSP_WINDOW_BLACKMAN_HARRIS4},
    {"Lowleak", DSP_WINDOW_BLACKMAN_HARRIS4},
    {"Gausstop", DSP_WINDOW_GAUSSTOP},
    {"P400", DSP_WINDOW_GAUSSTOP},
    {"Flat4", DSP_WINDOW_FLAT4},
    {"P301", DSP_WINDOW_FLAT4},
    {"Flattop", DSP_WINDOW_FLATTOP},
    {"Flat5", DSP_WINDOW_FLATTOP},
    {"P401", DSP_WINDOW_FLATTOP},
    {"Flat6", DSP_WINDOW_FLAT6},
    {"P511", DSP_WINDOW_FLAT6},
    {"Flat7", DSP_WINDOW_FLAT7},
    {"P611", DSP_WINDOW_FLAT7},
    {"P501", DSP_WINDOW_P501},
    {"P601", DSP_WINDOW_P601},
    {"Kaiser70", DSP_WINDOW_KAISER70},
    {"Kaiser80", DSP_WINDOW_KAISER80},
    {"Kaiser90", DSP_WINDOW_KAISER90},
    {"Kaiser100", DSP_WINDOW_KAISER100},
    {"Kaiser110", DSP_WINDOW_KAISER110},
    {"Kaiser120", DSP_WINDOW_KAISER120},
    {"Gauss60", DSP_WINDOW_GAUSS60},
    {"Gauss70", DSP_WINDOW_GAUSS70},
    {"Gauss80", DSP_WINDOW_GAUSS80},
    {"Riemann", DSP_WINDOW_RIEMANN},
    {"Sinc_Lobe", DSP_WINDOW_RIEMANN},
};

constexpr int max_terms = 7;

/// A sum of cosines as it is defined: by coefficients of the mean 1 (or nearly so), or by ones
/// whose sum, the centre, is 1.
struct Definition {
    int terms = 0;
    int scale_mode = DSP_SCALE_MEAN;
    std::array<long double, max_terms> a{};
};

constexpr std::array<Definition, DSP_WINDOW_P601 + 1> definitions = {{
    {1, DSP_SCALE_PEAK, {1}},                        // DSP_WINDOW_UNIFORM
    {},                                              // DSP_WINDOW_BARTLETT is no sum of cosines
    {2, DSP_SCALE_PEAK, {0.5L, 0.5L}},               // DSP_WINDOW_HANN
    {2, DSP_SCALE_PEAK, {0.54L, 0.46L}},             // DSP_WINDOW_HAMMING
    {3, DSP_SCALE_PEAK, {0.42L, 0.5L, 0.08L}},       // DSP_WINDOW_BLACKMAN
    {3, DSP_SCALE_MEAN, {1, 1.171912L, 0.184449L}},  // DSP_WINDOW_BLACKMAN_HARRIS3
    {4,
     DSP_SCALE_PEAK,
     {0.355768L, 0.487396L, 0.144232L, 0.012604L}},  // DSP_WINDOW_BLACKMAN_HARRIS4
    {5,                                              // DSP_WINDOW_GAUSSTOP
     DSP_SCALE_MEAN,
     {1, 1.45875529058L, 0.543087184L, 0.08816718498L, 0.00390252806L}},
    {4, DSP_SCALE_MEAN, {0.9994484L, 1.911456L, 1.078578L, 0.183162L}},  // DSP_WINDOW_FLAT4
    {5,                                                                  // DSP_WINDOW_FLATTOP
     DSP_SCALE_MEAN,
     {0.9996403L, 1.940411L, 1.3079112L, 0.4038558L, 0.0350962L}},
    {6,  // DSP_WINDOW_FLAT6
     DSP_SCALE_MEAN,
     {0.999760855L, 1.959279864368L, 1.482207318028L, 0.639636244612L, 0.1236443547086L,
      0.00669641875546L}},
    {7,  // DSP_WINDOW_FLAT7
     DSP_SCALE_MEAN,
     {0.999820406L, 1.968927018592L, 1.58314833527L, 0.813811630104L, 0.226727679792L,
      0.0278660778114L, 0.000908305448086L}},
    {6,  // DSP_WINDOW_P501
     DSP_SCALE_MEAN,
     {0.99974762L, 1.95719157697L, 1.462421292406L, 0.611433912448L, 0.11186507767L,
      0.00553658087878L}},
    {7,  // DSP_WINDOW_P601
     DSP_SCALE_MEAN,
     {0.999813874L, 1.967871907162L, 1.57208459675L, 0.79456597081L, 0.21505509556L,
      0.0252934034374L, 0.00076928806393L}},
}};

/// By Newton's method, which comes down to the root from above until rounding stops it.
constexpr long double square_root(long double x) {
    long double root = x > 1 ? x : 1;
    for (;;) {
        const long double next = (root + x / root) / 2;
        if (next >= root) return root;
        root = next;
    }
}

/// What takes the coefficients of a definition to a scale mode: mean 1, mean square 1, centre 1.
constexpr long double factor(const Definition& window, int mode) {
    if (mode == window.scale_mode) return 1;
    if (mode == DSP_SCALE_MEAN) return 1 / window.a[0];
    long double centre = 0, squares = window.a[0] * window.a[0];
    for (const long double a : window.a) {
        centre += a;
        squares += a * a;
    }
    if (mode == DSP_SCALE_PEAK) return 1 / centre;
    return 1 / square_root(squares / 2);  // mean square: a[0]^2 + (a[1]^2 + ...) / 2
}

constexpr double kaiser_betas[] = {9.473960131326246,  10.751776690564654, 12.014077292090791,
                                   13.264372446115681, 14.505082414495599, 15.73795091271457};

constexpr double gauss_sigmas[] = {0.1583722, 0.1442161, 0.1328102};

/// The coefficients of one window in the three scale modes.
template <class T>
struct CosineSum {
    int terms = 0;
    std::array<std::array<T, max_terms>, 3> by_mode{};
};

template <class T>
constexpr auto cosine_sums = [] {
    std::array<CosineSum<T>, definitions.size()> sums;
    for (std::size_t window = 0; window < sums.size(); ++window) {
        const Definition& defined = definitions[window];
        sums[window].terms = defined.terms;
        for (int mode = 0; defined.terms > 0 && mode < 3; ++mode) {
            for (std::size_t k = 0; k < max_terms; ++k) {
                const long double a = defined.a[k] * factor(defined, mode);
                sums[window].by_mode[std::size_t(mode)][k] = T(a);
            }
        }
    }
    return sums;
}();

}  // namespace

std::span<const WindowName> window_names() { return names; }

template <Record R>
std::span<const scalar<R>> cosine_coefficients(int window, int scale_mode) {
    const auto& table = cosine_sums<scalar<R>>;
    if (window < 0 || std::size_t(window) >= table.size()) return {};
    if (scale_mode < 0 || scale_mode > 2) return {};
    const auto& sum = table[std::size_t(window)];
    return {sum.by_mode[std::size_t(scale_mode)].data(), std::size_t(sum.terms)};
}

template <Record R>
scalar<R> kaiser_beta(int window) {
    return scalar<R>(kaiser_betas[window - DSP_WINDOW_KAISER70]);
}

template <Record R>
scalar<R> gauss_sigma(int window) {
    return scalar<R>(gauss_sigmas[window - DSP_WINDOW_GAUSS60]);
}

template std::span<const double> cosine_coefficients<dsp>(int, int);
template std::span<const float> cosine_coefficients<dspf>(int, int);
template double kaiser_beta<dsp>(int);
template float kaiser_beta<dspf>(int);
template double gauss_sigma<dsp>(int);
template float gauss_sigma<dspf>(int);

}  // namespace wavkit
