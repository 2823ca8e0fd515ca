// wavkit smooth: local polynomials and their derivatives, medians, outliers replaced.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cstdio>
#include <memory>
#include <optional>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "commands/commands.hpp"
#include "measure/prepare.hpp"
#include "measure/smoother.hpp"
#include "show/comparison.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_points = 1 << 16;

using Method = Smoothing::Method;

struct SmoothOptions : ComparisonFiles {
    std::optional<Method> method;
    std::optional<int> order, derivative, ends, window;
    std::optional<double> threshold;
    bool json = false;
    Smoothing smoothing;
};

/// The method and what it goes by; throws where an option is for another one.
Smoothing smoothing_of(const SmoothOptions& options) {
    Smoothing s;
    s.method = options.method.value_or(s.method);
    s.window = options.window.value_or(s.window);
    s.order = options.order.value_or(std::min(s.order, s.window - 1));
    s.derivative = options.derivative.value_or(s.derivative);
    s.threshold = options.threshold.value_or(s.threshold);
    s.ends = options.ends.value_or(s.ends);
    const bool savgol = s.method == Method::savgol;
    if (!savgol && (options.order || options.derivative)) {
        throw UsageError("--order and --derivative are for --method savgol");
    }
    if (savgol && options.ends) throw UsageError("--ends is for --method median and hampel");
    if (s.method != Method::hampel && options.threshold) {
        throw UsageError("--threshold is for --method hampel");
    }
    if (savgol && s.window % 2 == 0) throw UsageError("a polynomial takes an odd window");
    if (savgol && s.order >= s.window) {
        throw UsageError("a polynomial of order " + std::to_string(s.order) +
                         " takes a window of " + std::to_string(s.order + 1 + s.order % 2) +
                         " samples");
    }
    return s;
}

/// One run of the program.
class SmoothRun {
  public:
    SmoothRun(const SmoothOptions& options, Page& page)
        : options_(options), page_(page), pass_(options, "smoothing") {}

    void run() {
        pass_.run([this](SampleStream& stream) { smooth(stream); });
    }

  private:
    void smooth(SampleStream& stream) {
        const int derivative = options_.smoothing.derivative;
        Smoother smoother(options_.smoothing, stream);
        ComparedPass::Changed changed{
            {stream.delta, stream.complex, stream.channels, stream.length, stream.facts},
            derivative == 0   ? "smoothed"
            : derivative == 1 ? "slope"
                              : "derivative " + std::to_string(derivative),
            derivative == 0};
        if (derivative > 0) {
            check_axis(stream.delta);
            const auto power = derivative > 1 ? "^" + std::to_string(derivative) : "";
            for (auto& facts : changed.shape.facts) facts.put_to_unit("/", power);
        }
        pass_.pass(stream, changed, [&](const ComparedPass::Take& take) {
            std::vector<double> block(block_points * stream.width());
            for (bool last = false; !last;) {
                const auto count = stream.read(block);
                last = count < block.size();
                const auto in = std::span(block).first(count);
                take(in, smoother.pass(in, last));
            }
        });
        tell(smoother, stream);
    }

    void tell(const Smoother& smoother, const SampleStream& stream) {
        const bool outliers = options_.smoothing.method == Method::hampel;
        for (std::size_t c = 0; c < stream.channels; ++c) {
            const auto facts = stream.facts_of(c);
            auto& members =
                page_.add_signal(stream.complex, double(smoother.points()), stream.delta, facts);
            if (!outliers) continue;
            std::vector<double> places;
            for (const auto at : smoother.outliers(c)) {
                places.push_back(facts.start + double(at) * stream.delta);
            }
            members.emplace_back("outliers", std::to_string(places.size()));
            members.emplace_back("outliers_at", json_numbers(places));
            if (options_.out == "-" || options_.plot == "-") continue;
            std::fprintf(page_.text(), "%zu outliers among %s samples\n", places.size(),
                         std::to_string(smoother.points()).c_str());
            for (const double place : places) {
                std::fprintf(page_.text(), "  at %s\n", rounded(place).c_str());
            }
        }
    }

    const SmoothOptions& options_;
    Page& page_;
    ComparedPass pass_;
};

constexpr const char* about =
    R"(Each sample is replaced by what the --window samples around it say, so that nothing is delayed:
  savgol  the value there of the polynomial of --order fitted to them (Savitzky and Golay), or with
          --derivative its slope, or a higher derivative, in the unit of the axis; at the ends the
          polynomials of the first and the last window, from end to end
  median  the middle one of them in order: single wild samples vanish, edges stay
  hampel  the sample itself, but the median where it is further from it than --threshold standard
          deviations (1.4826 times the median distance from the median); the places are told, in
          JSON too, and a value that is not a number is replaced as well

Beyond the ends, median and hampel find nothing (--ends shorter), the last sample over and over
(hold), the signal backwards (mirror) or zeros (zero). The recording may be longer than memory. All
signals of a file are smoothed, and all channels; a signal must be as long as the window. Without -o
the output goes to standard output, in binary unless --to says otherwise, or nowhere beside --json
and --plot, which draws the first signal before and after.

Examples:
  wavkit smooth log.csv --time --window 21 -o smooth.csv --with-time
  wavkit smooth track.csv --time --window 31 --derivative 1 -o speed.csv --with-time
  wavkit smooth ecg.txt --rate 360 --method median --window 181 -o baseline.dsp
  wavkit smooth sensor.dsp --method hampel --window 11 --json --plot outliers.png)";

}  // namespace

void add_smooth(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "smooth", "Smooths signals by local polynomials or medians; replaces outliers.");
    const auto options = std::make_shared<SmoothOptions>();
    command->add_option("IN", options->in, "file to read; - is standard input")
        ->required()
        ->type_name("");
    add_choice<Method>(
        *command, "--method", options->method,
        {{"savgol", Method::savgol}, {"median", Method::median}, {"hampel", Method::hampel}},
        "how (default: savgol)");
    const auto declare = [&](const char* name, std::optional<int>& value, int least, int most,
                             const char* about_it) {
        command->add_option(name, value, about_it)->check(CLI::Range(least, most))->type_name("N");
    };
    declare("--window", options->window, 1, 1 << 24, "samples of a window (default: 15)");
    declare("--order", options->order, 0, 64, "of the polynomials (default: 3)");
    declare("--derivative", options->derivative, 0, 64,
            "0 the value (default), 1 the slope, 2 ...");
    command
        ->add_option("--threshold", options->threshold,
                     "standard deviations that make an outlier (default: 3)")
        ->check(number_between(0, 1e300))
        ->type_name("K");
    add_choice<int>(*command, "--ends", options->ends,
                    {{"shorter", DSP_ENDS_SHORTER},
                     {"hold", DSP_ENDS_HOLD},
                     {"mirror", DSP_ENDS_MIRROR},
                     {"zero", DSP_ENDS_ZERO}},
                    "what windows find beyond the ends (default: shorter)");
    command
        ->add_option("-o,--output", options->out, "file to write; - is standard output (default)")
        ->type_name("FILE");
    declare_plot(*command, options->plot, "before and after");
    command->add_option("--span", options->span, "times between which --plot draws")
        ->expected(2)
        ->allow_extra_args(false)
        ->type_name("FROM TO");
    command->add_flag("--json", options->json, "print JSON");
    options->reading.declare(*command);
    options->writing.declare(*command);
    options->look.declare(*command);
    command->footer(about);
    command->callback([options] {
        options->smoothing = smoothing_of(*options);
        options->check(options->json);
        ReportFiles files;
        files.names = {options->in};
        files.json = options->json;
        report_files("smooth", files,
                     [&](const std::string&, Page& page) { SmoothRun(*options, page).run(); });
    });
}

}  // namespace wavkit::tool
