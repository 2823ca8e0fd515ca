#include "measure/sections.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <map>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "measure/groups.hpp"
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

/// One channel of a block through the sections.
class Channel {
  public:
    Channel(const SectionFiltering& filtering, bool complex)
        : filtering_(filtering), complex_(complex) {}

    /// Takes the channel's scalars from `in`, of which `step` make a point, and writes them to the
    /// same place of `out`.
    void filter(const double* in, double* out, std::size_t step, std::size_t points) {
        const std::size_t width = complex_ ? 2 : 1;
        part_->points = int(points);
        part_->complex = complex_;
        check(dsp_alloc(part_), "filtering");
        copy_groups(in, step, part_->data, width, width, points);
        check_finite(part_.values(), width, position_);
        if (filtering_.zero_phase) {
            check_settling(dspd_iir_zero_phase(part_, part_, filtering_.sections, -1));
        } else {
            if (position_ == 0 && points > 0 && filtering_.hold) settle();
            check(dspd_iir(part_, part_, filtering_.sections, state_), "filtering");
        }
        copy_groups(part_->data, width, out, step, width, points);
        position_ += long(points);
    }

  private:
    static void check_settling(int status) {
        if (status) throw DataError("a filter with a pole at 1 has no state to start from");
    }

    void settle() {
        check_settling(dspc_iir_state(state_, filtering_.sections));
        const double* const first = part_->data;
        check(complex_ ? dspi_rtoc(state_) || dspi_cscale(state_, first[0], first[1])
                       : dspi_scale(state_, first[0]),
              "filtering");
    }

    const SectionFiltering& filtering_;
    bool complex_;
    Signal part_, state_;
    long position_ = 0;
};

/// The whole of a stream, as far as it is worth the memory.
std::vector<double> whole(SampleStream& stream) {
    constexpr std::size_t most = std::size_t(1) << 27;
    std::vector<double> values;
    for (std::size_t step = 1 << 16;; step = values.size()) {
        const auto filled = values.size();
        values.resize(filled + step * (filled ? 1 : stream.width()));
        const auto count = stream.read(std::span(values).subspan(filled));
        if (filled + count < values.size()) {
            values.resize(filled + count);
            return values;
        }
        if (values.size() > most) {
            throw DataError(
                "--zero-phase takes the whole signal into memory, and this one has "
                "more than " +
                std::to_string(most) + " values");
        }
    }
}

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
    const std::size_t width = stream.complex ? 2 : 1;
    const std::size_t step = width * std::max<std::size_t>(stream.channels, 1);
    std::vector<Channel> channels;
    for (std::size_t c = 0; c < stream.channels; ++c)
        channels.emplace_back(filtering, stream.complex);
    std::vector<double> in((1 << 16) * step), out;
    for (bool ended = false; !ended;) {
        std::size_t count;
        if (filtering.zero_phase) {
            in = whole(stream);
            count = in.size();
            ended = true;
        } else {
            count = stream.read(in);
            ended = count < in.size();
        }
        out.resize(count);
        for (std::size_t c = 0; c < channels.size(); ++c) {
            channels[c].filter(in.data() + c * width, out.data() + c * width, step, count / step);
        }
        take(std::span(in).first(count), out);
    }
}

}  // namespace wavkit::tool
