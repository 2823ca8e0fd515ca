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

/// The coefficients of one window in the three scale modes: mean a[0], mean square 1, centre 1.
template <class T>
struct CosineSum {
    int terms = 0;
    std::array<std::array<T, max_terms>, 3> by_mode{};
};

using CosineSums = std::array<CosineSum<double>, DSP_WINDOW_P601 + 1>;

constexpr CosineSums cosine_sums_in_double = {{
    {1,  // DSP_WINDOW_UNIFORM
     {{{1.0}, {1.0}, {1.0}}}},
    {},  // DSP_WINDOW_BARTLETT is no sum of cosines
    {2,  // DSP_WINDOW_HANN
     {{{1.0, 1.0}, {0.816496580927726, 0.816496580927726}, {0.5, 0.5}}}},
    {2,  // DSP_WINDOW_HAMMING
     {{{1.0, 0.8518518518518519}, {0.8566034682170329, 0.729699250703398}, {0.54, 0.46}}}},
    {3,  // DSP_WINDOW_BLACKMAN
     {{{1.0, 1.1904761904761905, 0.19047619047619047},
       {0.76099944650684, 0.905951722031952, 0.144952275525112},
       {0.42, 0.5, 0.08}}}},
    {3,  // DSP_WINDOW_BLACKMAN_HARRIS3
     {{{1.0, 1.171912, 0.184449},
       {0.766131803818887, 0.897839054477, 0.14131224508259},
       {0.424383190860823, 0.497339753968089, 0.078277055171088}}}},
    {4,  // DSP_WINDOW_BLACKMAN_HARRIS4
     {{{1.0, 1.36998268534551, 0.405410267365249, 0.0354275820197432},
       {0.703382979783909, 0.963622503470687, 0.28515868189436, 0.0249191582075858},
       {0.355768, 0.487396, 0.144232, 0.012604}}}},
    {5,  // DSP_WINDOW_GAUSSTOP
     {{{1.0, 1.45875529058, 0.543087184, 0.08816718498, 0.00390252806},
       {0.67186010909274, 0.98007948866869, 0.364878614689109, 0.0592360145190626,
        0.00262195292812908},
       {0.3232153788984078, 0.47149214396487166, 0.1755341299514293, 0.028496990099716707,
        0.0012613570855745683}}}},
    {4,  // DSP_WINDOW_FLAT4
     {{{0.9994484, 1.911456, 1.078578, 0.183162},
       {0.540110737248871, 1.03296769435899, 0.582873071546678, 0.0989823615265958},
       {0.239523981482822, 0.458092235226179, 0.258487878813733, 0.0438959044772663}}}},
    {5,  // DSP_WINDOW_FLATTOP
     {{{0.9996403, 1.940411, 1.3079112, 0.4038558, 0.0350962},
       {0.511503346408074, 0.992883860231563, 0.669241681837557, 0.206647924424725,
        0.0179582833407247},
       {0.213283237831627, 0.414006058783449, 0.279055911943774, 0.0861666667911267,
        0.00748812465002295}}}},
    {6,  // DSP_WINDOW_FLAT6
     {{{0.999760855, 1.959279864368, 1.482207318028, 0.639636244612, 0.1236443547086,
        0.00669641875546},
       {0.486122572817733, 0.952677996716077, 0.720706788313935, 0.311015994818339,
        0.0601206893875967, 0.00325605898429494},
       {0.191847568346755, 0.375972989750395, 0.28442588877861, 0.122742011293553,
        0.0237265428747444, 0.00128499895594193}}}},
    {7,  // DSP_WINDOW_FLAT7
     {{{0.999820406, 1.968927018592, 1.58314833527, 0.813811630104, 0.226727679792, 0.0278660778114,
        0.000908305448086},
       {0.468805828779846, 0.923210265782527, 0.742322484061889, 0.381588166666788,
        0.106310350533314, 0.013066126301104, 0.000425895376629477},
       {0.177865709213752, 0.350267506494545, 0.281638382006947, 0.144775183509154,
        0.0403343233670632, 0.00495730999606168, 0.000161585412477099}}}},
    {6,  // DSP_WINDOW_P501
     {{{0.99974762, 1.95719157697, 1.462421292406, 0.611433912448, 0.11186507767, 0.00553658087878},
       {0.489148752531658, 0.957599497301472, 0.715522134332392, 0.299157636933899,
        0.0547324765765759, 0.00270889530114197},
       {0.194193773561842, 0.380170365312055, 0.284064801584131, 0.118766633064811,
        0.0217289855238924, 0.00107544095326841}}}},
    {7,  // DSP_WINDOW_P601
     {{{0.999813874, 1.967871907162, 1.57208459675, 0.79456597081, 0.21505509556, 0.0252934034374,
        0.00076928806393},
       {0.470756142359013, 0.926560244624348, 0.740206251856888, 0.374116444065528,
        0.101257353806709, 0.0119092416488318, 0.000362214498874338},
       {0.179324203849725, 0.352952756714861, 0.281965299769994, 0.142511435204976,
        0.0385717630030842, 0.0045365638065367, 0.00013797765082358}}}},
}};

constexpr double kaiser_betas[] = {9.473960131326246,  10.751776690564654, 12.014077292090791,
                                   13.264372446115681, 14.505082414495599, 15.73795091271457};

constexpr double gauss_sigmas[] = {0.1583722, 0.1442161, 0.1328102};

/// The table with every coefficient rounded to a precision.
template <class T>
constexpr auto rounded(const CosineSums& table) {
    std::array<CosineSum<T>, std::tuple_size_v<CosineSums>> result;
    for (std::size_t window = 0; window < table.size(); ++window) {
        result[window].terms = table[window].terms;
        for (std::size_t mode = 0; mode < 3; ++mode) {
            for (std::size_t k = 0; k < max_terms; ++k) {
                result[window].by_mode[mode][k] = T(table[window].by_mode[mode][k]);
            }
        }
    }
    return result;
}

template <class T>
constexpr auto cosine_sums = rounded<T>(cosine_sums_in_double);

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
