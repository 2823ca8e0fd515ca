// wavkit generate: test signals as sums of cosines, lines and noise.
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

/// One of the signals that are added: its kind, the number behind it, the names with values.
struct Term {
    std::string kind;
    std::optional<double> number;
    std::map<std::string, std::string> settings;

    double value(const std::string& name, double otherwise) const;
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

/// What a kind takes.
struct Kind {
    const char* number;  // what the number is; null where it may be left out
    std::vector<std::string> settings;
};

const std::map<std::string, Kind>& kinds() {
    static const std::map<std::string, Kind> known{{"cos", {"a frequency", {"amp", "phase"}}},
                                                   {"cexp", {"a frequency", {"amp", "phase"}}},
                                                   {"line", {"a slope", {"offset"}}},
                                                   {"noise", {nullptr, {"type"}}}};
    return known;
}

const std::map<std::string, int>& noise_types() {
    static const std::map<std::string, int> types{
        {"uniform", 0}, {"normal", 1}, {"exponential", 2}, {"laplace", 3}};
    return types;
}

void check_term(const Term& term) {
    const auto kind = kinds().find(term.kind);
    if (kind == kinds().end()) {
        throw UsageError("'" + term.kind + "' is none of cos, cexp, line, noise");
    }
    if (kind->second.number && !term.number) {
        throw UsageError(term.kind + " takes " + kind->second.number);
    }
    for (const auto& [name, value] : term.settings) {
        if (std::ranges::count(kind->second.settings, name)) continue;
        throw UsageError(term.kind + " has no " + name + "=");
    }
    const auto type = term.settings.find("type");
    if (type != term.settings.end() && !noise_types().contains(type->second)) {
        throw UsageError("noise is uniform, normal, exponential or laplace, not '" + type->second +
                         "'");
    }
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
            terms.push_back({word, {}, {}});
            begins = false;
        } else if (equals != word.npos) {
            terms.back().settings[word.substr(0, equals)] = word.substr(equals + 1);
        } else if (!terms.back().number) {
            terms.back().number = value_of(word);
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

void add_noise(Signal& x, const Term& term) {
    const auto found = term.settings.find("type");
    const int type =
        found == term.settings.end() ? noise_types().at("normal") : noise_types().at(found->second);
    if (x->complex && type > 1) throw UsageError(found->second + " noise is real");
    add(x, term.number.value_or(1), [=](dsp* part) { return dspc_rand(part, type); });
}

void add_term(Signal& x, const Term& term) {
    if (term.kind == "noise") return add_noise(x, term);
    const double number = *term.number, amplitude = term.value("amp", 1);
    if (term.kind == "cos") {
        check(dspi_addcos(x, amplitude, number, radians(term)), "adding a cosine");
    } else if (term.kind == "cexp") {
        add(x, amplitude, [&](dsp* part) { return dspc_cexp(part, number, radians(term)); });
    } else {
        const double offset = term.value("offset", 0);
        add(x, 1, [=](dsp* part) { return dspc_line(part, number, offset); });
    }
}

/// Samples cannot tell an oscillation beyond these frequencies from a slower one; without a rate a
/// frequency in hertz is one, and a whole one a constant.
void check_frequency(const Term& term, const GenerateOptions& options, double rate) {
    const bool turns = term.kind == "cexp";
    if (term.kind != "cos" && !turns) return;
    const double highest = turns ? rate : rate / 2;
    if (std::fabs(*term.number) <= highest * (1 + 1e-9)) return;
    const bool told = options.rate || options.delta;
    throw UsageError(term.kind + " " + rounded(*term.number) + " lies beyond " +
                     (turns ? "" : "half ") + "the sampling rate, " + rounded(highest) +
                     (told ? "" : "; say --rate"));
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
    for (const auto& term : terms) check_frequency(term, options, 1 / x->delta);
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
  cos F [amp=A] [phase=P]      a cosine of frequency F; its amplitude is 1 and its phase 0 degrees
  cexp F [amp=A] [phase=P]     the complex exponential, cosine and sine of the same angle
  line S [offset=B]            a straight line that rises by S in a second, from B
  noise [A] [type=T]           white noise times A: normal, with A for its standard deviation,
                               uniform from -A to A, exponential with mean A, or laplace

With cexp, or --complex, the signal is complex: cosines and lines are its real part, normal noise has
two independent parts, uniform noise lies in the disc of radius A.

Without --rate or --delta the samples are 1 apart and frequencies are in cycles a sample. Noise
differs from run to run, except with --seed. Without -o the signal goes to standard output, in binary
unless --to says otherwise.

Examples:
  wavkit generate cos 1000 amp=0.5 + noise 0.1 --rate 48000 --duration 2 -o tone.wav
  wavkit generate cexp 0.1 + cexp -0.2 amp=0.5 phase=90 --points 4096 -o two.dsp
  wavkit generate line 2 offset=1 --delta 0.5 --points 5 --to csv
  wavkit generate noise --points 100000 | wavkit filter - --lowpass 0.1 | wavkit spectrum - --plot -)";

}  // namespace

void add_generate(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "generate", "Makes test signals: sums of cosines, exponentials, lines and noise.");
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
