#include "measure/sections.hpp"

#include <wavkit/dsp.h>

#include <map>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "measure/by_channel.hpp"
#include "measure/prepare.hpp"

namespace wavkit::tool {
namespace {

struct Prototype {
    int design;
    bool ripples, stops;
};

const std::map<std::string, Prototype>& prototypes() {
    static const std::map<std::string, Prototype> names{
        {"butter", {DSP_IIR_BUTTERWORTH, false, false}},
        {"cheby1", {DSP_IIR_CHEBYSHEV1, true, false}},
        {"cheby2", {DSP_IIR_CHEBYSHEV2, false, true}},
        {"elliptic", {DSP_IIR_ELLIPTIC, true, true}},
        {"bessel", {DSP_IIR_BESSEL, false, false}},
        {"bessel-phase", {DSP_IIR_BESSEL_PHASE, false, false}},
        {"bessel-delay", {DSP_IIR_BESSEL_DELAY, false, false}}};
    return names;
}

const Prototype& prototype_of(const std::string& name) {
    const auto found = prototypes().find(CLI::detail::to_lower(name));
    if (found != prototypes().end()) return found->second;
    std::string known;
    for (const auto& [other, prototype] : prototypes())
        known += (known.empty() ? "" : ", ") + other;
    throw UsageError("there is no recursive filter '" + name + "'; there are " + known);
}

int band_of(const std::string& name) {
    static const std::map<std::string, int> bands{{"bandpass", DSP_IIR_BAND_PASS},
                                                  {"bandstop", DSP_IIR_BAND_STOP},
                                                  {"highpass", DSP_IIR_HIGH_PASS},
                                                  {"lowpass", DSP_IIR_LOW_PASS}};
    const auto found = bands.find(name);
    if (found == bands.end()) {
        throw UsageError("--iir is for lowpass, highpass, bandpass and bandstop");
    }
    return found->second;
}

void check_settling(int status) {
    if (status) throw DataError("a filter with a pole at 1 has no state to start from");
}

/// Sections at work on the channels of a stream.
class SectionFilter {
  public:
    SectionFilter(const SectionFiltering& filtering, const SampleStream& stream)
        : filtering_(filtering),
          each_(stream.delta, stream.channels, stream.complex),
          states_(stream.channels) {}

    std::span<const double> operator()(std::span<const double> values) {
        const auto filtered = each_(values, [&](std::size_t c, const Signal& in, Signal& out) {
            check_finite(in.values(), each_.complex() ? 2 : 1, position_);
            if (filtering_.zero_phase) {
                check_settling(dspd_iir_zero_phase(in, out, filtering_.sections, -1));
                return 0;
            }
            if (position_ == 0 && in->points > 0 && filtering_.hold) settle(states_[c], in->data);
            return dspd_iir(in, out, filtering_.sections, states_[c]);
        });
        position_ += each_.given();
        return filtered;
    }

  private:
    void settle(Signal& state, const double* first) const {
        check_settling(dspc_iir_state(state, filtering_.sections));
        check(each_.complex() ? dspi_rtoc(state) || dspi_cscale(state, first[0], first[1])
                              : dspi_scale(state, first[0]),
              "filtering");
    }

    const SectionFiltering& filtering_;
    ByChannel each_;
    std::vector<Signal> states_;
    long position_ = 0;
};

}  // namespace

void Recursion::declare(CLI::App& command) {
    const char* const group = "Recursive filter";
    command
        .add_option("--iir", name,
                    "filter by sections in place of taps: butter, cheby1, cheby2, elliptic, "
                    "bessel, bessel-phase, bessel-delay")
        ->type_name("NAME")
        ->group(group);
    command.add_option("--order", order, "of its prototype (default: 4)")
        ->check(CLI::Range(1, int(DSP_IIR_MOST_ORDER)))
        ->type_name("N")
        ->group(group);
    command
        .add_option("--ripple", ripple,
                    "of the pass band of cheby1 and elliptic in dB (default: 1)")
        ->check(number_between(1e-6, 100))
        ->type_name("DB")
        ->group(group);
    command.add_option("--q", quality, "of notch and peak: frequency over width (default: 30)")
        ->check(positive_number())
        ->type_name("Q")
        ->group(group);
}

void Recursion::check(const std::optional<double>& attenuation) const {
    if (name.empty()) {
        if (order || ripple) throw UsageError("--order and --ripple are for --iir");
        return;
    }
    const auto& prototype = prototype_of(name);
    if (ripple && !prototype.ripples) throw UsageError("--ripple is for cheby1 and elliptic");
    if (attenuation && !prototype.stops) {
        throw UsageError("of recursive filters, --attenuation is for cheby2 and elliptic");
    }
    const bool bessel = prototype.design >= DSP_IIR_BESSEL;
    if (bessel && order > int(DSP_IIR_MOST_BESSEL)) {
        throw UsageError("Bessel filters have orders up to " +
                         std::to_string(int(DSP_IIR_MOST_BESSEL)));
    }
}

bool single_frequency(const std::string& band) { return band == "notch" || band == "peak"; }

int RecursiveFilter::order() const { return single_frequency(band) ? 1 : shape.order.value_or(4); }

Signal RecursiveFilter::made_by(Design design) const {
    Signal made;
    if (single_frequency(band)) {
        const int number = band == "notch" ? DSP_IIR_NOTCH : DSP_IIR_PEAK;
        const double width = edges[0] / shape.quality.value_or(30);
        if (design(made, number, 0, 1, edges[0], width, 0, 0)) {
            throw UsageError("a " + band +
                             " lies below half the sampling rate, and so does its width");
        }
        return made;
    }
    const double ripple = shape.ripple.value_or(1), stops = attenuation.value_or(60);
    const int type = band_of(band);
    if (design(made, prototype_of(shape.name).design, type, order(), edges.front(), edges.back(),
               ripple, stops)) {
        throw UsageError(
            "no recursive filter has its edge at half the sampling rate, or more "
            "ripple than attenuation");
    }
    return made;
}

Signal RecursiveFilter::sections() const { return made_by(dspc_iir); }
Signal RecursiveFilter::roots() const { return made_by(dspc_iir_zpk); }

void filter_by_sections(
    const SectionFiltering& filtering, SampleStream& stream,
    const std::function<void(std::span<const double>, std::span<const double>)>& take) {
    SectionFilter filter(filtering, stream);
    if (filtering.zero_phase) {
        constexpr std::size_t most = std::size_t(1) << 27;
        const auto whole = read_rest(stream, most);
        if (whole.size() > most) {
            throw DataError(
                "--zero-phase takes the whole signal into memory, and this one has more than " +
                std::to_string(most) + " values");
        }
        take(whole, filter(whole));
        return;
    }
    std::vector<double> block((1 << 16) * stream.width());
    for (std::size_t count = block.size(); count == block.size();) {
        count = stream.read(block);
        const auto in = std::span(block).first(count);
        take(in, filter(in));
    }
}

}  // namespace wavkit::tool
