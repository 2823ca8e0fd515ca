// wavkit fit: lines, polynomials and sines through a signal.
#include <wavkit/dsp.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <functional>
#include <memory>
#include <numbers>
#include <span>
#include <vector>

#include "base/error.hpp"
#include "base/mark.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "base/scales.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/polynomial_fit.hpp"
#include "measure/prepare.hpp"
#include "show/json.hpp"
#include "show/labels.hpp"
#include "show/plot.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

struct FitOptions {
    ReportFiles files;
    std::string plot;
    std::optional<int> degree;
    bool centred = false, sine = false;
    std::optional<double> near, at;  // where a sine's frequency is looked for, or what it is
    ReadOptions reading;
    PictureLook look;
};

// The entries of dsps_lin_regres2(): seven for either line, then those of the data.
constexpr std::array line_names{"slope",
                                "intercept",
                                "residual_variance",
                                "slope_variance",
                                "intercept_variance",
                                "slope_intercept_covariance",
                                "slope_intercept_correlation"};
constexpr std::array data_names{"mean_x",     "mean_y",        "variance_x",
                                "variance_y", "covariance_xy", "correlation"};
constexpr std::size_t x_on_y = line_names.size(), data_entries = 2 * line_names.size();
enum : std::size_t { slope = 0, intercept = 1, slope_variance = 3, intercept_variance = 4 };
enum : std::size_t { mean_x = 14, variance_x = 16, covariance = 18 };

/// The pairs to fit, (x, y) = (re, im). A real signal goes over its axis; as pairs, its abscissae
/// do not begin anew within.
Signal pairs_of(Signal x) {
    if (x->complex) return x;
    Signal pairs;
    pairs.facts = x.facts;
    pairs->points = x->points;
    pairs->complex = 1;
    check(dsp_alloc(pairs), "fitting a line");
    for (int i = 0; i < x->points; ++i) {
        pairs->data[2 * i] = x.place(i);
        pairs->data[2 * i + 1] = x->data[i];
    }
    return pairs;
}

std::string words(std::string name) {
    std::ranges::replace(name, '_', ' ');
    return name;
}

/// The share of the variance that the line explains, where there is any.
double r_squared(std::span<const double> table) {
    const double r = table[covariance + 1];
    return table[variance_x] > 0 && table[variance_x + 1] > 0 ? r * r : std::nan("");
}

void print_row(std::FILE* to, const std::string& name, double a, double b) {
    std::fprintf(to, "%-28s %16.9g %16.9g\n", words(name).c_str(), a, b);
}

void print_line(std::FILE* to, std::span<const double> table, int points) {
    std::fprintf(to, "%-28s %16d\n\n%-28s %16s %16s\n", "points", points, "", "y on x", "x on y");
    const auto error = [&](std::size_t entry) { return std::sqrt(table[entry]); };
    for (std::size_t i = 0; i < line_names.size(); ++i) {
        print_row(to, line_names[i], table[i], table[x_on_y + i]);
        if (i != intercept) continue;
        print_row(to, "slope_error", error(slope_variance), error(x_on_y + slope_variance));
        print_row(to, "intercept_error", error(intercept_variance),
                  error(x_on_y + intercept_variance));
    }
    std::fprintf(to, "\n%-28s %16s %16s\n", "", "x", "y");
    print_row(to, "mean", table[mean_x], table[mean_x + 1]);
    print_row(to, "sample variance", table[variance_x], table[variance_x + 1]);
    std::fprintf(to, "\n%-28s %16.9g\n", "sample covariance", table[covariance]);
    std::fprintf(to, "%-28s %16.9g\n", "correlation coefficient", table[covariance + 1]);
    std::fprintf(to, "%-28s %16.9g\n", "R squared", r_squared(table));
}

void add_line(JsonMembers& members, std::span<const double> table) {
    for (const std::size_t first : {std::size_t(0), x_on_y}) {
        JsonMembers line;
        for (std::size_t i = 0; i < line_names.size(); ++i) {
            line.emplace_back(line_names[i], json_number(table[first + i]));
            if (i != intercept) continue;
            line.emplace_back("slope_error", json_number(std::sqrt(table[first + slope_variance])));
            line.emplace_back("intercept_error",
                              json_number(std::sqrt(table[first + intercept_variance])));
        }
        members.emplace_back(first == 0 ? "y_on_x" : "x_on_y", json_object(line));
    }
    for (std::size_t i = 0; i < data_names.size(); ++i) {
        members.emplace_back(data_names[i], json_number(table[data_entries + i]));
    }
    members.emplace_back("r_squared", json_number(r_squared(table)));
}

void print_polynomial(std::FILE* to, const PolynomialFit& fit, double about, int points) {
    std::fprintf(to, "%-22s %16d\n", "points", points);
    if (about != 0) std::fprintf(to, "%-22s %16.9g\n", "powers of x less", about);
    std::fprintf(to, "\n%5s %24s %16s\n", "power", "coefficient", "standard error");
    const auto coefficients = fit.coefficients(about);
    for (std::size_t i = 0; i < coefficients.size(); ++i) {
        std::fprintf(to, "%5zu %24.15g %16.6g\n", i, coefficients[i].value, coefficients[i].error);
    }
    std::fprintf(to, "\n%-22s %16.9g\n", "residual deviation", std::sqrt(fit.residual_variance()));
    std::fprintf(to, "%-22s %16.9g\n", "R squared", fit.r_squared());
}

void add_polynomial(JsonMembers& members, const PolynomialFit& fit, double about) {
    std::vector<double> values, errors;
    for (const auto& [value, error] : fit.coefficients(about)) {
        values.push_back(value);
        errors.push_back(error);
    }
    members.emplace_back("degree", std::to_string(fit.degree()));
    members.emplace_back("about", json_number(about));
    members.emplace_back("coefficients", json_numbers(values));
    members.emplace_back("coefficient_errors", json_numbers(errors));
    members.emplace_back("residual_variance", json_number(fit.residual_variance()));
    members.emplace_back("r_squared", json_number(fit.r_squared()));
}

std::vector<Mark> marks_of(const Signal& pairs) {
    std::vector<Mark> points;
    points.reserve(std::size_t(pairs->points));
    for (int i = 0; i < pairs->points; ++i) {
        points.push_back({pairs->data[2 * i], pairs->data[2 * i + 1]});
    }
    return points;
}

/// Draws the points, and a line through these places of it.
void draw_fit(const Signal& pairs, std::vector<Mark> points, std::vector<Mark> line,
              const std::string& file, const FitOptions& options) {
    std::ranges::stable_sort(points, {}, &Mark::x);
    Curve curve;
    curve.title = short_name(file);
    curve.x_label = "x";
    curve.x_unit = pairs.facts.axis_unit;
    curve.y_label = pairs.facts.label("y");
    curve.y_unit = options.look.unit_of(pairs.facts);
    curve.style = Style::dots;
    for (const auto& [x, y] : points) {
        curve.x.push_back(x);
        curve.y.push_back(y);
    }
    curve.line = std::move(line);
    draw(curve, options.plot, options.look);
}

/// Places of a function, close enough for a smooth curve.
std::vector<Mark> places_of(const std::function<double(double)>& function,
                            std::span<const Mark> points, int steps) {
    const auto [first, last] = std::ranges::minmax(points, {}, &Mark::x);
    std::vector<Mark> places;
    for (int i = 0; i <= steps; ++i) {
        const double x = first.x + (last.x - first.x) * i / steps;
        places.push_back({x, function(x)});
    }
    return places;
}

void fit_line(const Signal& pairs, const std::string& file, const FitOptions& options, Page& page) {
    Signal result;
    {
        Progress progress("fitting");
        check(dsps_lin_regres2(pairs, result), "fitting a line");
    }
    const auto table = std::as_const(result).values();
    if (!options.plot.empty()) {
        const auto line = [&](double x) { return table[slope] * x + table[intercept]; };
        const bool upright = table[variance_x] == 0;
        auto points = marks_of(pairs);
        auto ends = upright ? std::vector<Mark>() : places_of(line, points, 1);
        draw_fit(pairs, std::move(points), std::move(ends), file, options);
    }
    if (options.files.json) return add_line(page.signals.back(), table);
    if (options.plot.empty()) print_line(page.text(), table, pairs->points);
}

void fit_polynomial(const Signal& pairs, const std::string& file, const FitOptions& options,
                    Page& page) {
    auto points = marks_of(pairs);
    const auto fit = [&] {
        Progress progress("fitting");
        return PolynomialFit(points, *options.degree);
    }();
    const double about = options.centred ? fit.mean_x() : 0;
    if (!options.plot.empty()) {
        auto curve = places_of([&](double x) { return fit(x); }, points, 1000);
        draw_fit(pairs, std::move(points), std::move(curve), file, options);
    }
    if (options.files.json) return add_polynomial(page.signals.back(), fit, about);
    if (options.plot.empty()) print_polynomial(page.text(), fit, about, pairs->points);
}

// The entries of dsps_sine_fit(): four parameters, the rest, and the parameters' errors.
constexpr std::array sine_names{"frequency", "amplitude", "phase", "offset"};
enum : std::size_t { frequency = 0, amplitude = 1, phase = 2, offset = 3, rest = 4, errors = 5 };

/// Phases are told in degrees.
double told(std::span<const double> table, std::size_t parameter, std::size_t first) {
    const double value = table[first + parameter];
    return parameter == phase ? degrees(value) : value;
}

void print_sine(std::FILE* to, std::span<const double> table, int points, const Facts& facts,
                bool seconds) {
    const auto unit_of = [&](std::size_t i) {
        return i == frequency ? inverse_unit(facts.axis(seconds))
               : i == phase   ? std::string("degrees")
                              : facts.unit;
    };
    const auto name = [&](std::size_t i) {
        return printable(with_unit(sine_names[i], unit_of(i)));
    };
    std::fprintf(to, "%-22s %18d\n\n%-22s %18s %16s\n", "points", points, "", "value",
                 "standard error");
    for (std::size_t i = 0; i < sine_names.size(); ++i) {
        std::fprintf(to, "%-22s %18.12g %16.6g\n", name(i).c_str(), told(table, i, 0),
                     told(table, i, errors));
    }
    std::fprintf(to, "\n%-22s %18.9g\n",
                 printable(with_unit("rms of the rest", facts.unit)).c_str(), table[rest]);
}

void add_sine(JsonMembers& members, std::span<const double> table) {
    for (const std::size_t first : {std::size_t(0), std::size_t(errors)}) {
        for (std::size_t i = 0; i < sine_names.size(); ++i) {
            members.emplace_back(std::string(sine_names[i]) + (first ? "_error" : ""),
                                 json_number(told(table, i, first)));
        }
    }
    members.emplace_back("residual_rms", json_number(table[rest]));
}

void fit_sine(Signal x, const std::string& file, const FitOptions& options, bool seconds,
              Page& page) {
    const int parameters = options.at ? 3 : 4;
    if (x->complex) throw DataError("a sine is fitted to a real signal");
    if (x->points < parameters) {
        throw DataError("a sine takes " + std::to_string(parameters) + " samples");
    }
    Signal result;
    {
        Progress progress("fitting");
        check(dsps_sine_fit(x, result, options.at.value_or(options.near.value_or(0)),
                            options.at ? DSP_SINE_FIXED : DSP_SINE_FREE),
              "fitting a sine");
    }
    const auto table = std::as_const(result).values();
    if (options.files.json) add_sine(page.signals.back(), table);
    if (options.plot.empty()) {
        if (!options.files.json) print_sine(page.text(), table, x->points, x.facts, seconds);
        return;
    }
    const auto pairs = pairs_of(std::move(x));
    const auto sine = [&](double place) {
        const double turns = table[frequency] * (place - pairs.facts.start);
        return table[offset] +
               table[amplitude] * std::cos(2 * std::numbers::pi * turns + table[phase]);
    };
    // As fine as the eye asks, as long as that is no more than a page can hold.
    const double span = pairs->data[2 * pairs->points - 2] - pairs->data[0];
    const double steps = std::clamp(40 * std::fabs(table[frequency] * span), 1000.0, 1e5);
    auto points = marks_of(pairs);
    auto curve = places_of(sine, points, int(steps));
    draw_fit(pairs, std::move(points), std::move(curve), file, options);
}

void tell(const std::string& file, const FitOptions& options, Page& page) {
    auto reading = options.reading;
    reading.csv.pairs = !options.sine;
    InputFile input(file);
    const auto source = open_signals(input, reading);
    auto x = first_signal(*source);
    if (x->points < 1) throw DataError("the signal has no samples");
    check_finite(x);
    if (!x->complex) check_axis(x->delta);
    page.add_signal(x);
    if (options.sine) {
        return fit_sine(std::move(x), file, options, source->sound || reading.rate, page);
    }
    const auto pairs = pairs_of(std::move(x));
    if (options.degree.value_or(1) == 1 && !options.centred) {
        fit_line(pairs, file, options, page);
    } else {
        fit_polynomial(pairs, file, options, page);
    }
}

void run(FitOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    options.files.check_single("", options.plot);
    if (options.centred && !options.degree) throw UsageError("--centre goes with --degree");
    if ((options.near || options.at) && !options.sine) {
        throw UsageError("--near and --at go with --sine");
    }
    report_files("fit", options.files,
                 [&](const std::string& file, Page& page) { tell(file, options, page); });
}

constexpr const char* about =
    R"(The lines of least squares, y = slope x + intercept and the same with x and y exchanged. The values
of a real signal are y, over x = 0, delta, 2 delta ...; the points of a complex signal are x and y, so
that --column 2,3 fits the third column of a CSV file over the second.

Variances and covariances of slope and intercept tell how far other samples of the same line would
scatter them; their roots are the standard errors. R squared is the share of the variance of y that
the line explains. 1e100 stands for the slope of a line over equal abscissae.

--degree N fits a polynomial instead and prints its coefficients in ascending powers of x, with
--centre of x less its mean, each with its standard error.

--sine fits offset + amplitude cos(2 pi frequency t + phase), t from the first sample on: the
four-parameter fit of IEEE 1057, which begins at the strongest tone, or with --near at the
frequency that is given. --at takes that frequency as it is and fits the other three.

--plot draws the data and the line of y on x, the polynomial or the sine.

Examples:
  wavkit fit examples/data/sunspots-yearly.txt
  wavkit fit calibration.csv --column force,voltage --plot line.png
  wavkit fit thermistor.csv --column 1,2 --degree 3 --json
  wavkit fit mains.wav --sine --near 50)";

}  // namespace

void add_fit(CLI::App& program) {
    auto* const command =
        program.add_subcommand("fit", "Fits a straight line, a polynomial or a sine to a signal.");
    const auto options = std::make_shared<FitOptions>();
    options->files.declare(*command);
    auto* const sine = command->add_flag("--sine", options->sine, "fit a sine");
    auto* const degree =
        command->add_option("--degree", options->degree, "fit a polynomial of this degree")
            ->check(CLI::Range(0, 100))
            ->type_name("N");
    degree->excludes(sine);
    auto* const near =
        command->add_option("--near", options->near, "look for the sine's frequency from here on");
    near->check(number_between(1e-300, 1e300))->type_name("F");
    command->add_option("--at", options->at, "the sine's frequency, which is not fitted")
        ->check(number_between(0, 1e300))
        ->type_name("F")
        ->excludes(near);
    command->add_flag("--centre,--center", options->centred,
                      "powers of x less its mean, for abscissae far from 0");
    declare_plot(*command, options->plot, "data and line");
    options->look.declare(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
