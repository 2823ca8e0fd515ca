// wavkit interp: a signal at other places.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <limits>
#include <memory>
#include <numeric>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "files/facts_text.hpp"
#include "files/output.hpp"
#include "files/recording.hpp"
#include "measure/prepare.hpp"

namespace wavkit::tool {
namespace {

enum class Edges { hold, extrapolate, refuse };

struct InterpOptions {
    std::string in, out, at;
    std::optional<double> rate;
    std::optional<unsigned> method;
    std::optional<Edges> edges;
    bool table = false;
    ReadOptions reading;
    WriteOptions writing;
};

/// Knots, one column of values for a real signal and two for a complex one.
struct Table {
    Signal x;
    std::vector<Signal> columns;

    double first() const { return x->data[0]; }
    double last() const { return x->data[x->points - 1]; }
};

void check_usage(const InterpOptions& options) {
    if (options.at.empty() == !options.rate) {
        throw UsageError("say where to interpolate, with one of --at and --rate");
    }
    if (options.at == "-" && options.in == "-") {
        throw UsageError("standard input holds only one of IN and the places of --at");
    }
    options.writing.format_for(options.out);
}

/// One of dspi_real() and dspi_imag() of a copy.
Signal part_of(const Signal& x, int (*part)(dsp*)) {
    Signal copy;
    check(dsp_copy(copy, x) || part(copy), "taking in values");
    return copy;
}

/// Places `first`, `first` + `step` ..., each by itself: none inherits the rounding of others.
Signal even_places(int points, double first, double step) {
    Signal x(step);
    x->points = points;
    check(dsp_alloc(x), "making places");
    for (int i = 0; i < points; ++i) x->data[i] = first + i * step;
    return x;
}

Table table_of(const Signal& x, const InterpOptions& options) {
    if (x->points < 1) throw DataError("a signal has no samples");
    if (options.table && !x->complex) throw DataError("--table takes two columns, x and y");
    Table table{
        options.table ? part_of(x, dspi_real) : even_places(x->points, x.facts.start, x->delta),
        {}};
    if (!options.table) table.columns.push_back(part_of(x, dspi_real));
    if (x->complex) table.columns.push_back(part_of(x, dspi_imag));

    const auto knots = table.x.values();
    const auto back =
        std::ranges::adjacent_find(knots, [](double a, double b) { return !(a < b); });
    if (back != knots.end()) {
        throw DataError("sample " + std::to_string(back - knots.begin() + 1) +
                        " does not lie behind the one before");
    }
    if (options.method == unsigned(DSP_INTERP_SPLINE)) {
        if (x->points < 5) throw DataError("a spline takes 5 points or more");
        check_finite(x);
    }
    return table;
}

/// As many places as the table covers; those a rounding error beyond its end count.
Signal places_at_rate(const Table& table, double rate) {
    const double steps = (table.last() - table.first()) * rate;
    constexpr double tolerance = 1e-9;
    if (!(steps < std::numeric_limits<int>::max() - 1)) {
        throw Error("that would be more than 2147483647 samples");
    }
    return even_places(int(std::floor(steps * (1 + tolerance) + tolerance)) + 1, table.first(),
                       1 / rate);
}

/// Tells where a signal of a lower rate shows what is too fast for it as something slow.
void tell_of_aliases(double delta, double rate) {
    if (!(rate * delta < 1 - 1e-9)) return;
    std::fprintf(stderr,
                 "wavkit: at the lower rate %s, whatever is above %s in the signal shows below it; "
                 "'wavkit resample' removes it\n",
                 number(rate).c_str(), number(rate / 2).c_str());
}

Signal read_places(const std::string& path) {
    auto places = first_signal(path, {});
    if (places->complex) throw Error("the places of --at are one column, real numbers");
    with_data_of(path, [&] { check_finite(places); });
    return places;
}

void check_inside(const Table& table, const Signal& places) {
    for (const double t : places.values()) {
        if (t >= table.first() && t <= table.last()) continue;
        throw DataError(number(t) + " lies outside the signal, which goes from " +
                        number(table.first()) + " to " + number(table.last()));
    }
}

/// The order in which the places ascend, as the library wants them.
std::vector<std::size_t> ascending(std::span<const double> places) {
    std::vector<std::size_t> order(places.size());
    std::iota(order.begin(), order.end(), std::size_t(0));
    std::ranges::stable_sort(order, {}, [&](std::size_t i) { return places[i]; });
    return order;
}

Signal interpolated(const Table& table, const Signal& values, const Signal& places,
                    unsigned flags) {
    const auto order = ascending(places.values());
    Signal sorted, found, result;
    check(dsp_copy(sorted, places) || dsp_copy(result, places), "interpolating");
    for (std::size_t i = 0; i < order.size(); ++i) sorted->data[i] = places->data[order[i]];
    check(dsp_interp(table.x, values, nullptr, sorted, found, flags), "interpolating");
    for (std::size_t i = 0; i < order.size(); ++i) result->data[order[i]] = found->data[i];
    return result;
}

struct Sampled {
    Signal places, values;
};

Sampled sampled(const Table& table, Signal places, const InterpOptions& options) {
    const auto edges = options.edges.value_or(Edges::hold);
    if (edges == Edges::refuse && options.rate == std::nullopt) check_inside(table, places);
    const unsigned flags = options.method.value_or(DSP_INTERP_LINEAR) |
                           (edges == Edges::extrapolate ? 0u : unsigned(DSP_INTERP_HOLD_ENDS));
    auto values = interpolated(table, table.columns[0], places, flags);
    if (table.columns.size() == 2) {
        const auto imaginary = interpolated(table, table.columns[1], places, flags);
        check(dspb_ritoc(values, imaginary, values), "interpolating");
    }
    return {std::move(places), std::move(values)};
}

void write_tables(std::FILE* to, const std::vector<Sampled>& results) {
    for (const auto& [places, values] : results) {
        if (&places != &results[0].places) std::fputc('\n', to);
        const auto& facts = values.facts;
        std::fprintf(to, "%s,%s\n", heading("t", facts.axis_unit).c_str(),
                     values->complex ? "re,im" : "value");
        const std::size_t width = values->complex ? 2 : 1;
        for (int i = 0; i < places->points; ++i) {
            std::fputs(number(places->data[i]).c_str(), to);
            for (const double part : values.values().subspan(std::size_t(i) * width, width)) {
                std::fprintf(to, ",%s", number(part).c_str());
            }
            std::fputc('\n', to);
        }
    }
}

void write(std::vector<Sampled> results, const InterpOptions& options) {
    if (options.writing.format_for(options.out) == Format::csv) {
        OutputFile output(options.out);
        write_tables(output.stream(), results);
        return output.commit();
    }
    std::vector<Signal> signals;
    signals.reserve(results.size());
    for (auto& result : results) signals.push_back(std::move(result.values));
    write_recording(options.out, signals, options.writing);
}

void run(InterpOptions options) {
    if (options.out.empty()) {
        options.out = "-";
        if (!options.writing.format) options.writing.format = Format::csv;
    }
    check_usage(options);
    auto& columns = options.reading.csv.columns;
    if (options.table && columns.empty()) columns = {"1", "2"};
    options.reading.csv.complex |= options.table;
    const auto recording = read_recording(options.in, options.reading);
    const auto at = options.rate ? Signal() : read_places(options.at);
    std::vector<Sampled> results;
    {
        Progress progress("interpolating");
        for (const auto& x : recording.signals) {
            const auto table = with_data_of(options.in, [&] { return table_of(x, options); });
            Signal places;
            if (options.rate) {
                if (!options.table) tell_of_aliases(x->delta, *options.rate);
                places = places_at_rate(table, *options.rate);
            } else {
                check(dsp_copy(places, at), "interpolating");
            }
            results.push_back(sampled(table, std::move(places), options));
            auto& facts = results.back().values.facts;
            facts = x.facts;
            if (options.rate) {
                facts.start = table.first();
            } else {
                facts.start = 0;
                facts.axis_unit = facts.origin = "";
            }
        }
    }
    write(std::move(results), options);
}

constexpr const char* about =
    R"(--rate gives a signal of RATE samples a second (or whatever the spacing counts), from the first
sample of IN to the last; to a lower rate rather use 'wavkit resample', which removes what is above half
of it. --at gives the values at the places that a file lists, one column, in any order. Sample n of IN lies at
n delta, or with --table at the first column of IN, whose second one holds the values.

Methods: hold keeps each value until the next sample, linear draws lines (the default), quadratic
parabolas through the three nearest samples, spline a cubic spline with not-a-knot ends. Outside of
IN the end values are held; --edges extrapolate lets the curve go on, --edges refuse fails.

CSV has the places in its first column; signal files and sounds hold the values. All signals of a
file are taken, complex ones part by part. Without -o the CSV goes to standard output.

Examples:
  wavkit interp log.csv --rate 100 --method spline -o log100.dsp
  wavkit interp calibration.csv --table --at readings.txt --method linear
  wavkit interp slow.dsp --rate 8000 --method spline -o - | wavkit spectrum - --peaks 3)";

}  // namespace

void add_interp(CLI::App& program) {
    auto* const command =
        program.add_subcommand("interp", "Reads a signal or a table at other places.");
    const auto options = std::make_shared<InterpOptions>();
    command->add_option("IN", options->in, "file to read; - is standard input")
        ->required()
        ->type_name("");
    auto* const at =
        command->add_option("--at", options->at, "places to interpolate at")->type_name("FILE");
    command->add_option("--rate", options->rate, "sampling rate of the result")
        ->check(positive_number())
        ->excludes(at)
        ->type_name("RATE");
    add_choice<unsigned>(*command, "--method", options->method,
                         {{"hold", DSP_INTERP_HOLD},
                          {"linear", DSP_INTERP_LINEAR},
                          {"quadratic", DSP_INTERP_QUADRATIC},
                          {"spline", DSP_INTERP_SPLINE}},
                         "how (default: linear)");
    add_choice<Edges>(
        *command, "--edges", options->edges,
        {{"hold", Edges::hold}, {"extrapolate", Edges::extrapolate}, {"refuse", Edges::refuse}},
        "what lies outside of IN (default: hold)");
    command->add_flag("--table", options->table, "IN has two columns, x and y");
    command->add_option("-o,--output", options->out, "file to write; - is standard output")
        ->type_name("FILE");
    add_choice(*command, "--to", options->writing.format, written_formats(),
               "format of the output (default: by its name)");
    options->reading.declare(*command, false);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
