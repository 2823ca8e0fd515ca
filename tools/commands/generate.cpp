// wavkit generate: test signals as sums of waves, sweeps, pulses, lines and noise.
#include <wavkit/dsp.h>

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <map>
#include <memory>
#include <numbers>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/waves.hpp"

namespace wavkit::tool {
namespace {

struct GenerateOptions {
    std::vector<std::string> words;
    std::string out = "-";
    std::optional<int> points;
    std::optional<double> duration, delta, rate;
    std::optional<std::uint64_t> seed;
    bool complex = false;
    WriteOptions writing;
};

/// One of the signals that are added: its kind, the numbers behind it, the names with values.
struct Term {
    std::string kind;
    std::optional<double> number, second;
    std::map<std::string, std::string> settings;

    double value(const std::string& name, double otherwise) const;
    std::optional<double> given(const std::string& name) const;
    bool is(const std::string& name, const std::string& word) const;
};

double value_of(const std::string& text) {
    const auto value = number_in(text);
    if (!value || !std::isfinite(*value)) throw UsageError("'" + text + "' is not a number");
    return *value;
}

double Term::value(const std::string& name, double otherwise) const {
    const auto found = settings.find(name);
    return found == settings.end() ? otherwise : value_of(found->second);
}

std::optional<double> Term::given(const std::string& name) const {
    if (!settings.contains(name)) return std::nullopt;
    return value(name, 0);
}

bool Term::is(const std::string& name, const std::string& word) const {
    const auto found = settings.find(name);
    return found != settings.end() && found->second == word;
}

/// What a kind takes.
struct Kind {
    const char* number;  // what the number is; null where it may be left out
    std::vector<std::string> settings;
    bool wave = false;    // the number is a frequency
    bool second = false;  // there are two numbers
};

const std::map<std::string, Kind>& kinds() {
    static const std::map<std::string, Kind> known{
        {"cos", {"a frequency", {"amp", "phase", "offset"}, true}},
        {"sine", {"a frequency", {"amp", "phase", "offset"}, true}},
        {"square", {"a frequency", {"amp", "phase", "offset", "duty", "limit"}, true}},
        {"triangle", {"a frequency", {"amp", "phase", "offset", "symmetry", "limit"}, true}},
        {"sawtooth", {"a frequency", {"amp", "phase", "offset", "limit"}, true}},
        {"sweep", {"two frequencies", {"amp", "phase", "offset", "type"}, true, true}},
        {"pulse", {"a frequency (0: once)", {"amp", "offset", "at", "width"}, true}},
        {"cexp", {"a frequency", {"amp", "phase"}, true}},
        {"line", {"a slope", {"offset"}}},
        {"noise", {nullptr, {"type", "low", "high"}}},
        {"pink", {nullptr, {"low", "high"}}},
        {"brown", {nullptr, {"low", "high"}}}};
    return known;
}

std::string kind_list() {
    std::string list;
    for (const auto& [name, kind] : kinds()) list += (list.empty() ? "" : ", ") + name;
    return list;
}

const std::map<std::string, int>& noise_types() {
    static const std::map<std::string, int> types{
        {"uniform", 0}, {"normal", 1}, {"exponential", 2}, {"laplace", 3}};
    return types;
}

void check_type(const Term& term) {
    if (!term.settings.contains("type")) return;
    const auto& type = term.settings.at("type");
    if (term.kind == "sweep") {
        if (type == "linear" || type == "log") return;
        throw UsageError("a sweep is linear or log, not '" + type + "'");
    }
    if (!noise_types().contains(type)) {
        throw UsageError("noise is uniform, normal, exponential or laplace, not '" + type + "'");
    }
    if (type != "normal" && (term.settings.contains("low") || term.settings.contains("high"))) {
        throw UsageError("low= and high= are for normal noise");
    }
}

void check_ranges(const Term& term) {
    for (const char* const share : {"duty", "symmetry"}) {
        const double value = term.value(share, 0.5);
        if (!(value >= 0 && value <= 1)) {
            throw UsageError(std::string(share) + "= is a share of the period, 0 to 1");
        }
    }
    if (term.is("type", "log") && !(*term.number > 0 && *term.second > 0)) {
        throw UsageError("a logarithmic sweep goes from one positive frequency to another");
    }
    if (term.kind == "pulse" && *term.number < 0) {
        throw UsageError("the frequency of pulses is 0 or more");
    }
    if (term.given("limit") && *term.number == 0) throw UsageError("limit= takes a frequency");
    if (term.value("low", 0) > term.value("high", term.value("low", 0))) {
        throw UsageError("low= lies below high=");
    }
}

void check_term(const Term& term) {
    const auto kind = kinds().find(term.kind);
    if (kind == kinds().end()) {
        throw UsageError("'" + term.kind + "' is none of " + kind_list());
    }
    if ((kind->second.number && !term.number) || (kind->second.second && !term.second)) {
        throw UsageError(term.kind + " takes " + kind->second.number);
    }
    for (const auto& [name, value] : term.settings) {
        if (std::ranges::count(kind->second.settings, name)) continue;
        throw UsageError(term.kind + " has no " + name + "=");
    }
    check_type(term);
    check_ranges(term);
}

/// Reads "cos 50 amp=2 + line 0 offset=1".
std::vector<Term> terms_of(const std::vector<std::string>& words) {
    std::vector<Term> terms;
    bool begins = true;
    for (const auto& word : words) {
        const auto equals = word.find('=');
        if (word == "+") {
            if (begins) throw UsageError("there is nothing before a +");
            begins = true;
        } else if (begins) {
            terms.push_back({word, {}, {}, {}});
            begins = false;
        } else if (equals != word.npos) {
            terms.back().settings[word.substr(0, equals)] = word.substr(equals + 1);
        } else if (!terms.back().number) {
            terms.back().number = value_of(word);
        } else if (!terms.back().second && terms.back().kind == "sweep") {
            terms.back().second = value_of(word);
        } else {
            throw UsageError("'" + word + "' stands alone: join signals by + and set names by =");
        }
    }
    if (begins) throw UsageError("there is nothing behind a +");
    for (const auto& term : terms) check_term(term);
    return terms;
}

double radians(const Term& term) { return term.value("phase", 0) * std::numbers::pi / 180; }

/// Adds to x what `make` puts into a record of its shape, multiplied by `factor`.
template <class Make>
void add(Signal& x, double factor, Make make) {
    Signal part(x->delta);
    part->points = x->points;
    part->complex = x->complex;
    check(make(part) || dspi_scale(part, factor) || dspb_add(x, part, x), "adding a signal");
}

void add_white_noise(Signal& x, const Term& term) {
    const auto found = term.settings.find("type");
    const int type =
        found == term.settings.end() ? noise_types().at("normal") : noise_types().at(found->second);
    if (x->complex && type > 1) throw UsageError(found->second + " noise is real");
    add(x, term.number.value_or(1), [=](dsp* part) { return dspc_rand(part, type); });
}

/// True where the term is noise.
bool add_any_noise(Signal& x, const Term& term) {
    const std::map<std::string, double> exponents{{"noise", 0}, {"pink", 1}, {"brown", 2}};
    const auto found = exponents.find(term.kind);
    if (found == exponents.end()) return false;
    const auto low = term.given("low"), high = term.given("high");
    if (found->second > 0 || low || high) {
        add_noise(x, {found->second, term.number.value_or(1), low, high});
    } else {
        add_white_noise(x, term);
    }
    return true;
}

void add_term(Signal& x, const Term& term) {
    if (add_any_noise(x, term)) return;
    const double number = *term.number, amplitude = term.value("amp", 1);
    const double offset = term.value("offset", 0);
    const Wave wave{number, amplitude, term.value("phase", 0) / 360};
    if (term.kind == "line") {
        return add(x, 1, [=](dsp* part) { return dspc_line(part, number, offset); });
    }
    if (term.kind == "cos") {
        check(dspi_addcos(x, amplitude, number, radians(term)), "adding a cosine");
    } else if (term.kind == "sine") {
        check(dspi_addcos(x, amplitude, number, radians(term) - std::numbers::pi / 2),
              "adding a sine");
    } else if (term.kind == "cexp") {
        add(x, amplitude, [&](dsp* part) { return dspc_cexp(part, number, radians(term)); });
    } else if (term.kind == "square") {
        add_square(x, wave, term.value("duty", 0.5), term.given("limit"));
    } else if (term.kind == "pulse") {
        add_pulses(x, wave, term.value("at", 0), term.value("width", x->delta));
    } else if (term.kind == "sweep") {
        add_sweep(x, wave, *term.second, term.is("type", "log"));
    } else {
        const double symmetry = term.kind == "sawtooth" ? 1 : term.value("symmetry", 0.5);
        add_triangle(x, wave, symmetry, term.given("limit"));
    }
    if (offset != 0) check(dspi_offset(x, offset), "adding an offset");
}

/// Samples cannot tell an oscillation beyond these frequencies from a slower one; without a rate a
/// frequency in hertz is one, and a whole one a constant.
void check_frequencies(const Term& term, const GenerateOptions& options, double rate) {
    std::vector<std::optional<double>> frequencies{term.second, term.given("low"),
                                                   term.given("high"), term.given("limit")};
    if (kinds().at(term.kind).wave) frequencies.push_back(term.number);
    const bool turns = term.kind == "cexp";
    const double highest = turns ? rate : rate / 2;
    for (const auto& frequency : frequencies) {
        if (!frequency || std::fabs(*frequency) <= highest * (1 + 1e-9)) continue;
        const bool told = options.rate || options.delta;
        throw UsageError(term.kind + " " + rounded(*frequency) + " lies beyond " +
                         (turns ? "" : "half ") + "the sampling rate, " + rounded(highest) +
                         (told ? "" : "; say --rate"));
    }
}

int points_of(const GenerateOptions& options, double delta) {
    if (!options.duration) return options.points.value_or(1024);
    const double points = std::round(*options.duration / delta);
    if (points > 1 << 30) throw UsageError("that would be more than 1073741824 samples");
    return int(points);
}

void run(const GenerateOptions& options) {
    options.writing.checked_format_for(options.out);
    const auto terms = terms_of(options.words);
    const bool turning = std::ranges::any_of(terms, [](auto& t) { return t.kind == "cexp"; });
    Signal x(options.rate ? 1 / *options.rate : options.delta.value_or(1));
    x->points = points_of(options, x->delta);
    x->complex = options.complex || turning;
    for (const auto& term : terms) check_frequencies(term, options, 1 / x->delta);
    {
        Progress progress("generating");
        check(dsp_alloc(x), "making room for the signal");
        std::ranges::fill(x.values(), 0.0);
        if (options.seed) check(dspc_seed(*options.seed), "seeding");
        for (const auto& term : terms) add_term(x, term);
    }
    write_recording(options.out, {&x, 1}, options.writing);
}

constexpr const char* about =
    R"(SIGNAL is a sum of these, joined by a + between blanks:
  sine F, cos F                a sine or cosine of frequency F
  square F [duty=D]            high for the share D of the period (0.5)
  triangle F [symmetry=S]      rises for the share S of the period (0.5)
  sawtooth F                   rises, and falls at once
  sweep F1 F2 [type=log]       a sine that goes from F1 to F2 over the whole signal
  pulse F [width=W] [at=T]     pulses of the width W (one sample), F in a second, the first at T (0);
                               F of 0: one pulse
  cexp F                       the complex exponential, cosine and sine of the same angle
  line S [offset=B]            a straight line that rises by S in a second, from B
  noise [A] [type=T]           white noise times A: normal, with A for its standard deviation,
                               uniform from -A to A, exponential with mean A, or laplace
  pink [A], brown [A]          noise whose power falls by 3 or by 6 dB an octave, A its rms value

All but cexp, line and noise take amp=A (1; waves reach from -A to A, pulses from 0 to A) and
offset=B, waves phase=P in degrees, too. Waves with edges have harmonics beyond half the sampling rate,
which show below it: limit=F keeps those up to F alone. low=F and high=F limit the band of noise, A
being its rms value then; such noise goes on from its end to its begin.

With cexp, or --complex, the signal is complex: all but noise and cexp is its real part, normal noise
has two independent parts, uniform noise lies in the disc of radius A.

Without --rate or --delta the samples are 1 apart and frequencies are in cycles a sample. Noise
differs from run to run, except with --seed. Without -o the signal goes to standard output, in binary
unless --to says otherwise.

Examples:
  wavkit generate cos 1000 amp=0.5 + noise 0.1 --rate 48000 --duration 2 -o tone.wav
  wavkit generate cexp 0.1 + cexp -0.2 amp=0.5 phase=90 --points 4096 -o two.dsp
  wavkit generate line 2 offset=1 --delta 0.5 --points 5 --to csv
  wavkit generate sweep 20 20000 type=log amp=0.5 --rate 48000 --duration 10 -o sweep.wav
  wavkit generate square 50 duty=0.2 + pink 0.01 --rate 10000 --seed 1 --duration 1 -o clock.dsp
  wavkit generate noise --points 100000 | wavkit filter - --lowpass 0.1 | wavkit spectrum - --plot -)";

}  // namespace

void add_generate(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "generate", "Makes test signals: sums of waves, sweeps, pulses, lines and noise.");
    const auto options = std::make_shared<GenerateOptions>();
    command->add_option("SIGNAL", options->words, "what to add up, see below")
        ->required()
        ->type_name("");
    auto* const points =
        command->add_option("--points", options->points, "number of samples (default: 1024)")
            ->check(CLI::Range(0, 1 << 30))
            ->type_name("N");
    command->add_option("--duration", options->duration, "length in the unit of the spacing")
        ->check(number_between(0, 1e300))
        ->type_name("T")
        ->excludes(points);
    auto* const spacing =
        command->add_option("--delta", options->delta, "sample spacing (default: 1)")
            ->check(positive_number())
            ->type_name("STEP");
    command->add_option("--rate", options->rate, "sampling rate: a spacing of 1/RATE")
        ->check(positive_number())
        ->type_name("RATE")
        ->excludes(spacing);
    command->add_option("--seed", options->seed, "the same noise for the same number")
        ->type_name("N");
    command->add_flag("--complex", options->complex, "make a complex signal in any case");
    command
        ->add_option("-o,--output", options->out, "file to write; - is standard output (default)")
        ->type_name("FILE");
    options->writing.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
