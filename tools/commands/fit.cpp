// wavkit fit: a straight line through a signal.
#include <wavkit/dsp.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <memory>

#include "base/error.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/prepare.hpp"
#include "show/json.hpp"
#include "show/labels.hpp"
#include "show/plot.hpp"

namespace wavkit::tool {
namespace {

struct FitOptions {
    std::string in, plot;
    bool json = false;
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
enum : std::size_t { slope = 0, intercept = 1, mean_x = 14, variance_x = 16, covariance = 18 };

/// The pairs to fit, (x, y) = (re, im). A real signal goes over its axis; as pairs, its abscissae
/// do not begin anew within.
Signal pairs_of(Signal x) {
    if (x->complex) return x;
    const double step = x->delta == 0 ? 1 : x->delta;
    Signal pairs;
    pairs.facts = x.facts;
    pairs->points = x->points;
    pairs->complex = 1;
    check(dsp_alloc(pairs), "fitting a line");
    for (int i = 0; i < x->points; ++i) {
        pairs->data[2 * i] = x.facts.start + i * step;
        pairs->data[2 * i + 1] = x->data[i];
    }
    return pairs;
}

std::string words(std::string name) {
    std::ranges::replace(name, '_', ' ');
    return name;
}

void print_row(const std::string& name, double a, double b) {
    std::printf("%-28s %16.9g %16.9g\n", words(name).c_str(), a, b);
}

void print_table(std::span<const double> table, int points) {
    std::printf("%-28s %16d\n\n%-28s %16s %16s\n", "points", points, "", "y on x", "x on y");
    for (std::size_t i = 0; i < line_names.size(); ++i) {
        print_row(line_names[i], table[i], table[x_on_y + i]);
    }
    std::printf("\n%-28s %16s %16s\n", "", "x", "y");
    print_row("mean", table[mean_x], table[mean_x + 1]);
    print_row("sample variance", table[variance_x], table[variance_x + 1]);
    std::printf("\n%-28s %16.9g\n", "sample covariance", table[covariance]);
    std::printf("%-28s %16.9g\n", "correlation coefficient", table[covariance + 1]);
}

void print_json(std::span<const double> table, int points) {
    JsonMembers whole{{"points", std::to_string(points)}};
    for (const std::size_t first : {std::size_t(0), x_on_y}) {
        JsonMembers line;
        for (std::size_t i = 0; i < line_names.size(); ++i) {
            line.emplace_back(line_names[i], json_number(table[first + i]));
        }
        whole.emplace_back(first == 0 ? "y_on_x" : "x_on_y", json_object(line, "  "));
    }
    for (std::size_t i = 0; i < data_names.size(); ++i) {
        whole.emplace_back(data_names[i], json_number(table[data_entries + i]));
    }
    std::puts(json_object(whole).c_str());
}

void draw_line(const Signal& pairs, std::span<const double> table, const FitOptions& options) {
    std::vector<Mark> points;
    points.reserve(std::size_t(pairs->points));
    for (int i = 0; i < pairs->points; ++i) {
        points.push_back({pairs->data[2 * i], pairs->data[2 * i + 1]});
    }
    std::ranges::stable_sort(points, {}, &Mark::x);
    Curve curve;
    curve.title = short_name(options.in);
    curve.x_label = "x";
    curve.x_unit = pairs.facts.axis_unit;
    curve.y_label = pairs.facts.label("y");
    curve.y_unit = options.look.unit_of(pairs.facts);
    curve.style = Style::dots;
    for (const auto& [x, y] : points) {
        curve.x.push_back(x);
        curve.y.push_back(y);
    }
    if (table[variance_x] > 0) {
        for (const double x : {points.front().x, points.back().x}) {
            curve.line.push_back({x, table[slope] * x + table[intercept]});
        }
    }
    draw(curve, options.plot, options.look);
}

void run(const FitOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    if (options.json && options.plot == "-") {
        throw UsageError("standard output takes only one of --json and --plot -");
    }
    auto reading = options.reading;
    reading.csv.pairs = true;
    auto x = first_signal(options.in, reading);
    with_data_of(options.in, [&] {
        if (x->points < 1) throw DataError("the signal has no samples");
        check_finite(x.values(), x->complex);
    });
    Signal table;
    const auto pairs = [&] {
        Progress progress("fitting");
        auto result = pairs_of(std::move(x));
        check(dsps_lin_regres2(result, table), "fitting a line");
        return result;
    }();
    if (!options.plot.empty()) draw_line(pairs, table.values(), options);
    if (options.json) return print_json(table.values(), pairs->points);
    if (options.plot.empty()) print_table(table.values(), pairs->points);
}

constexpr const char* about =
    R"(The lines of least squares, y = slope x + intercept and the same with x and y exchanged. The values
of a real signal are y, over x = 0, delta, 2 delta ...; the points of a complex signal are x and y, so
that --column 2,3 fits the third column of a CSV file over the second.

Variances and covariances of slope and intercept tell how far other samples of the same line would
scatter them; their roots are the standard errors. 1e100 stands for the slope of a line over equal
abscissae. --json prints an object; --plot draws the data and the line of y on x.

Examples:
  wavkit fit examples/data/sunspots-yearly.txt
  wavkit fit calibration.csv --column force,voltage --plot line.png)";

}  // namespace

void add_fit(CLI::App& program) {
    auto* const command = program.add_subcommand("fit", "Fits a straight line to a signal.");
    const auto options = std::make_shared<FitOptions>();
    command->add_option("IN", options->in, "file to read; - is standard input")
        ->required()
        ->type_name("");
    command->add_flag("--json", options->json, "print JSON");
    command
        ->add_option("--plot", options->plot,
                     "draw data and line into a .png, .svg or .pdf file, or - the terminal")
        ->type_name("FILE");
    options->look.declare(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
