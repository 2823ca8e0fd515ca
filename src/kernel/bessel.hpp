// Bessel functions of vectors.
//
// J and Y from x = 4 on are modulus and phase, J = M cos(theta), Y = M sin(theta) with
// M = sqrt(2 / pi x) (1 + ...), theta = x - pi/4 - n pi/2 + ... (M. Abramowitz and I. A. Stegun,
// Handbook of Mathematical Functions, 9.2.17): the phase is reduced like the argument of a cosine,
// so that the zeros stay where they are. Below 4, J is a polynomial in x^2 times its first zeros.
// The polynomials interpolate at the Chebyshev nodes of their interval, mapped to -1 ... 1.
#pragma once

#include <math.h>  // the Bessel functions of integer order are POSIX's, not the C++ library's

#include "kernel/exponential.hpp"
#include "kernel/trigonometric.hpp"

namespace wavkit::kernel {
namespace {

/// Tables of the orders 0 and 1. Near: J / (x^2 - zero^2), of order 1 divided by x, over x^2 / 8
/// - 1. Modulus: sqrt(x) M, and phase: x (theta - x + pi/4 + n pi/2), over 32 / x^2 - 1.
template <int Order>
struct BesselTables;

template <>
struct BesselTables<0> {
    static constexpr double zero = 2.4048255576957729, zero_low = -1.1766916515308940e-16;
    static constexpr double near[] = {
        -0.08866241912277732,   0.06466008281491797,     -0.017030107053326454,
        0.002349675176132567,   -0.00020060356509921887, 1.1671878503732185e-05,
        -4.931799011580952e-07, 1.5832284373429136e-08,  -3.994329295091794e-10,
        8.130830978784947e-12,  -1.3645500267075958e-13, 1.9187202618789587e-15};
    static constexpr double modulus[] = {
        0.796396620706451,       -0.0014256455633684171,  5.5683951508283055e-05,
        -5.470751410172221e-06,  8.742653866388246e-07,   -1.8958859768115585e-07,
        5.074188697006657e-08,   -1.5845552880103457e-08, 5.566560055606104e-09,
        -2.1475605654275088e-09, 9.070006436811628e-10,   -4.05558233282047e-10,
        1.4452389763734652e-10,  -6.17222223474448e-11,   1.378642740342362e-10,
        -8.933404143631371e-11,  -1.183237005123376e-10,  8.573200544620264e-11,
        1.238921219458959e-10,   -8.699128875013928e-11,  -6.173917682594156e-11,
        4.36017831622127e-11,    1.5964374287837854e-11,  -1.1128277353808605e-11};
    static constexpr double phase[] = {
        -0.12313408143446063,    0.0017242921330442333,   -0.0001208914103784549,
        1.6328260174128227e-05,  -3.2138091773972286e-06, 8.101187219246593e-07,
        -2.434342963339809e-07,  8.34168531163035e-08,    -3.166553945269117e-08,
        1.31532024021575e-08,    -5.825369617273954e-09,  2.302905800768339e-09,
        -1.0419675493238643e-09, 1.6043272290205204e-09,  -1.0186839367842942e-09,
        -1.2661704498361677e-09, 9.277853744305485e-10,   1.483947282141008e-09,
        -1.0438989810431156e-09, -7.762843381232597e-10,  5.502199926043991e-10,
        2.139611403815411e-10,   -1.495504486691297e-10};
};

template <>
struct BesselTables<1> {
    static constexpr double zero = 3.8317059702075123, zero_low = -1.5269184090088067e-16;
    static constexpr double near[] = {
        -0.021174890016472454,   0.010530564217109451,  -0.0020996102272456477,
        0.0002328383160339415,   -1.66097920108534e-05, 8.297363254207275e-07,
        -3.0710679689788497e-08, 8.770127892385496e-10, -1.992450473377405e-11,
        3.6906427532064693e-13,  -5.675682899387594e-15};
    static constexpr double modulus[] = {
        0.8024245707412493,     0.004417590141679094,    -0.00011188781424659747,
        8.898346423740663e-06,  -1.2751066186241696e-06, 2.597657977864686e-07,
        -6.680714796074004e-08, 2.0293253621137413e-08,  -6.985314290336263e-09,
        2.652812524030819e-09,  -1.1050254609398187e-09, 4.887617830663718e-10,
        -1.762116113778814e-10, 7.542976804232279e-11,   -1.5696791707599405e-10,
        1.0106929613859936e-10, 1.3160990225556986e-10,  -9.531685528434212e-11,
        -1.387210046548324e-10, 9.719887675368973e-11,   6.904470591338095e-11,
        -4.867498363295627e-11, -1.7899089330208538e-11, 1.2451356851783472e-11};
    static constexpr double phase[] = {
        0.37018152923947845,     -0.004551265838991266,   0.00023461831943806418,
        -2.6303666993488722e-05, 4.675724404435668e-06,   -1.1099035636005013e-06,
        3.207756458353438e-07,   -1.0696352806405432e-07, 3.9790496740109014e-08,
        -1.6258388806927744e-08, 7.108168579977406e-09,   -2.8175527988777232e-09,
        1.2703370334211512e-09,  -1.8439219830896769e-09, 1.1617516326854905e-09,
        1.408972313871854e-09,   -1.0325856964768425e-09, -1.6668991778379184e-09,
        1.1698876197259542e-09,  8.705018663120685e-10,   -6.1584560608742e-10,
        -2.4063464040158075e-10, 1.678231652662752e-10};
};

/// What the exact function is called for: few arguments of many, or none.
template <class V, class Function>
[[gnu::noinline, gnu::cold]] void bessel_by_lane(V& result, const V& x, double from, double to,
                                                 Function f) {
    for (int i = 0; i < count<V>; ++i) {
        if (!(std::fabs(x[i]) >= from && std::fabs(x[i]) <= to)) result[i] = f(x[i]);
    }
}

/// M and theta of x >= 4 as sqrt(2 / pi x)-like factor and reduced angle, to be turned by
/// `quarters` quarters of a turn.
template <int Order, class V>
WAVKIT_LANES V oscillation(V x, int quarters) {
    using Table = BesselTables<Order>;
    constexpr double eighth = 0.78539816339744828, eighth_low = 3.061616997868383e-17;
    const V inverse = 1.0 / x, t = mul_add(inverse * inverse, 32.0, -1.0);
    const V turn = polynomial(t, Table::phase) * inverse;
    const auto [r, r_low, quadrant] = reduce(x);
    // x - pi/4 in the quadrant where it is small, and what rounding takes.
    const auto back = r < 0.0;
    const V shift = back ? all<V>(eighth) : all<V>(-eighth);
    const V shift_low = back ? all<V>(eighth_low) : all<V>(-eighth_low);
    const V near = shift + r, near_low = (r - (near - shift)) + shift_low + r_low;
    const V sum = near + turn, part = sum - near;
    const V sum_low = (near - (sum - part)) + (turn - part) + near_low;
    const V angle = sum + sum_low, angle_low = (sum - angle) + sum_low;
    const auto turned = quadrant + (back ? Bits<V>{} - 1 : Bits<V>{}) + quarters;
    const auto [s, c] = sine_cosine_of(Remainder<V>{angle, angle_low, turned});
    const V cosine = flip_by_sign_of(select_odd(turned, s, c), quadrant_sign<V>(turned + 1));
    return cosine * polynomial(t, Table::modulus) / sqrt(x);
}

template <int Order, class V, class Function>
WAVKIT_LANES V bessel_j(V signed_x, Function exact) {
    using Table = BesselTables<Order>;
    const V x = abs(signed_x), near = at_most(x, all<V>(4.0)), far = at_least(x, all<V>(4.0));
    const V t = mul_add(near, near * 0.125, -1.0);
    const V zero = ((near - Table::zero) - Table::zero_low) * (near + Table::zero);
    V inner = polynomial(t, Table::near) * zero;
    if (Order == 1) inner *= near;
    // J1 has the phase of J0 less a quarter of a turn, and is odd.
    V result = x < 4.0 ? inner : oscillation<Order>(far, -Order);
    if (Order == 1) result = flip_by_sign_of(result, bits(signed_x));
    if (any_above(x, last_reduced<V>)) [[unlikely]] {
        V mended = result;
        const V arguments = signed_x;
        bessel_by_lane(mended, arguments, 0, last_reduced<V>, exact);
        return mended;
    }
    return result;
}

/// Below 4 by the C library, whose logarithmic singularity has no short form.
template <int Order, class V, class Function>
WAVKIT_LANES V bessel_y(V x, Function exact) {
    const V result = oscillation<Order>(at_least(x, all<V>(4.0)), -Order - 1);
    V mended = result;
    const V arguments = x;
    if (any_above(x, last_reduced<V>) || any_above(x < 4.0 ? all<V>(1.0) : V{}, 0.0)) {
        bessel_by_lane(mended, arguments, 4, last_reduced<V>, exact);
        for (int i = 0; i < count<V>; ++i)
            mended[i] = arguments[i] < 0 ? exact(arguments[i]) : mended[i];
    }
    return mended;
}

/// f of floats in double precision: the oscillation needs it.
template <class V, class Function>
WAVKIT_LANES V in_double(V x, Function f) {
    if constexpr (is_double<V>) {
        return f(x);
    } else {
        constexpr int half = count<V> / 2;
        const auto low = load<float, half>((const float*)&x);
        const auto high = load<float, half>((const float*)&x + half);
        const auto narrow = [](Vec<double, half> v) {
            return __builtin_convertvector(v, Vec<float, half>);
        };
        V result;
        store<float, half>((float*)&result,
                           narrow(f(__builtin_convertvector(low, Vec<double, half>))));
        store<float, half>((float*)&result + half,
                           narrow(f(__builtin_convertvector(high, Vec<double, half>))));
        return result;
    }
}

template <class V>
WAVKIT_LANES V bessel_j0(V x) {
    return in_double(x, [](auto v) { return bessel_j<0>(v, [](double t) { return ::j0(t); }); });
}

template <class V>
WAVKIT_LANES V bessel_j1(V x) {
    return in_double(x, [](auto v) { return bessel_j<1>(v, [](double t) { return ::j1(t); }); });
}

template <class V>
WAVKIT_LANES V bessel_y0(V x) {
    return in_double(x, [](auto v) { return bessel_y<0>(v, [](double t) { return ::y0(t); }); });
}

template <class V>
WAVKIT_LANES V bessel_y1(V x) {
    return in_double(x, [](auto v) { return bessel_y<1>(v, [](double t) { return ::y1(t); }); });
}

/// (I0 - 1) / y over y = x^2 / 4 up to 16; and
/// x (sqrt(2 pi x) e^-x I0 - 1) over 16 / x - 1.
template <class T>
struct ModifiedTables;

template <>
struct ModifiedTables<double> {
    static constexpr double near[] = {1.0,
                                      0.25,
                                      0.027777777777777762,
                                      0.001736111111111147,
                                      6.944444444440493e-05,
                                      1.929012345705309e-06,
                                      3.936759887993035e-08,
                                      6.151187361364193e-10,
                                      7.594057685381156e-12,
                                      7.594070019494474e-14,
                                      6.275948796822122e-16,
                                      4.359498405380121e-18,
                                      2.5722398177811747e-20,
                                      1.3440225063774025e-22,
                                      5.062353740472859e-25,
                                      3.548836657975519e-27};
    static constexpr double far[] = {
        0.12971215947614195,     0.005066314453925904,    0.00039677456256937,
        5.012853434310733e-05,   9.38273304505673e-06,    2.5432011806561627e-06,
        1.0151146503129167e-06,  5.620308738271559e-07,   3.019711848516458e-07,
        1.4853444521783873e-09,  -2.7059816306901927e-07, -2.694816874727124e-07,
        4.603960701958129e-08,   2.642668172980614e-07,   5.349766509611047e-08,
        -2.1012104910174586e-07, -6.858799581479939e-08,  1.5302358930754792e-07,
        4.820436647726228e-08,   -9.412094186650315e-08,  -2.2481302801142765e-08,
        4.302447367618444e-08,   6.428913234518591e-09,   -1.2471336683220517e-08,
        -8.500535391424227e-10,  1.6850950727434155e-09};
};

template <>
struct ModifiedTables<float> {
    static constexpr float near[] = {1.0f,
                                     0.25000003f,
                                     0.0277777184f,
                                     0.00173615792f,
                                     6.94255868e-05f,
                                     1.93336223e-06f,
                                     3.87605041e-08f,
                                     6.67034983e-10f,
                                     4.96406518e-12f,
                                     1.46044391e-13f};
    static constexpr float far[] = {0.129712164f,    0.00506634917f,  0.000396770803f,
                                    4.98329682e-05f, 9.39533402e-06f, 3.24134135e-06f,
                                    1.10210328e-06f};
};

/// I0; infinite where e^|x| is.
template <class V>
WAVKIT_LANES V bessel_i0(V signed_x) {
    using T = Lane<V>;
    using Table = ModifiedTables<T>;
    const V x = abs(signed_x), near = at_most(x, all<V>(T(8))), far = at_least(x, all<V>(T(8)));
    const V square = near * near, y = square * T(0.25);
    const V rounded = mul_add(y, polynomial(y, Table::near), T(1));
    // What rounding took from the square shows as I0' / I0, near 2 / x - 1 / x^2 from 1 on.
    const V slope = rough_reciprocal(at_least(near, all<V>(T(1))));
    const V square_low = product_minus(near, near, square) * T(0.25);
    const V inner = mul_add(rounded * square_low, slope * (T(2) - slope), rounded);
    // e^x / sqrt(2 pi x) (1 + Q(1 / x) / x); what rounding took from 2 pi x and from the root.
    constexpr T two_pi = T(6.283185307179586476925);
    const V inverse = T(1) / far, scaled = far * two_pi, root = sqrt(scaled);
    const V rest = product_minus(root, root, scaled) - product_minus(far, all<V>(two_pi), scaled);
    const V tail = polynomial(mul_add(inverse, T(16), T(-1)), Table::far) * inverse;
    const V change = mul_add(rest * T(0.5), inverse * T(1 / two_pi), tail);
    const V leading = exp(far) / root, outer = mul_add(leading, change, leading);
    return x < T(8) ? inner : x > std::numeric_limits<T>::max() ? x : outer;
}

}  // namespace
}  // namespace wavkit::kernel
