// wavkit roots: from the coefficients of a polynomial to its roots, and back.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <complex>
#include <cstdio>
#include <memory>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/progress.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/prepare.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

using Complex = std::complex<double>;

struct RootsOptions {
    std::vector<std::string> values;
    std::string out;
    ReportFiles files;  // those that the values name
    bool from_roots = false, descending = false;
    ReadOptions reading;
    WriteOptions writing;
};

std::complex<double> point(const Signal& x, int i) {
    if (!x->complex) return x->data[i];
    return {x->data[2 * i], x->data[2 * i + 1]};
}

Signal signal_of(const std::vector<Complex>& points) {
    const bool real = std::ranges::all_of(points, [](auto z) { return z.imag() == 0; });
    Signal x;
    x->points = int(points.size());
    x->complex = !real;
    check(dsp_alloc(x), "taking in values");
    for (std::size_t i = 0; i < points.size(); ++i) {
        if (real) {
            x->data[i] = points[i].real();
        } else {
            x->data[2 * i] = points[i].real();
            x->data[2 * i + 1] = points[i].imag();
        }
    }
    return x;
}

// ---- input ----

/// "2", "-1.5e3", "1+2i", "-2i"
std::optional<Complex> parsed(std::string_view text) {
    const auto first = take_number(text);
    if (!first || text.empty()) return first;
    if (text == "i") return Complex(0, *first);
    if (text.front() != '+' && text.front() != '-') return std::nullopt;
    const auto second = take_number(text);
    if (!second || text != "i") return std::nullopt;
    return Complex(*first, *second);
}

/// Whether the values are names of files, for the first one is no number.
bool names_files(const RootsOptions& options) { return !parsed(options.values[0]); }

/// The numbers that the command line holds.
Signal read_values(const RootsOptions& options) {
    std::vector<Complex> points;
    for (const auto& value : options.values) {
        const auto number = parsed(value);
        if (!number) throw UsageError("'" + value + "' is not a number");
        points.push_back(*number);
    }
    return signal_of(points);
}

// ---- coefficients to roots ----

/// The roots of a real polynomial in ascending powers: up to degree 5 in closed form.
Signal roots_of(const Signal& polynomial) {
    const auto c = polynomial.values();
    const auto zero = [](double v) { return v == 0; };
    if (std::ranges::all_of(c, zero)) throw DataError("the polynomial is 0 everywhere");
    const auto leading = std::ranges::find_if_not(c.rbegin(), c.rend(), zero) - c.rbegin();
    constexpr int closed_form_points = 6;
    const int points = polynomial->points - int(leading);
    Signal used, roots;
    check(dsp_copy_at_most(used, polynomial, points), "taking in coefficients");
    if (points <= closed_form_points && dsps_proots(used, roots) == 0) return roots;
    if (dspi_proots(used) != 0) {
        throw DataError("the roots cannot be found; many of them may lie close together");
    }
    return used;
}

/// |p(z)| beside the sum of all |c[k] z^k|: how nearly z is a root. Powers of 1/z where those of z
/// would overflow.
double residual(const Signal& polynomial, Complex z) {
    using Wide = std::complex<long double>;
    const bool outside = std::abs(z) > 1;
    const Wide place = outside ? 1.0L / Wide(z) : Wide(z);
    const int n = polynomial->points;
    Wide value = 0;
    long double terms = 0;
    for (int k = 0; k < n; ++k) {
        const long double c = polynomial->data[outside ? k : n - 1 - k];
        value = value * place + c;
        terms = terms * std::abs(place) + std::fabs(c);
    }
    return terms > 0 ? double(std::abs(value) / terms) : 0;
}

void print_roots(std::FILE* to, const Signal& polynomial, const Signal& roots) {
    if (roots->points == 0) {
        std::fputs("no roots\n", to);
        return;
    }
    std::fprintf(to, "%24s %24s %16s %10s\n", "real part", "imaginary part", "modulus", "residual");
    for (int i = 0; i < roots->points; ++i) {
        const auto z = point(roots, i);
        const double re = z.real() + 0.0;  // no -0
        std::fprintf(to, "%24.15g ", re);
        if (z.imag() == 0) {
            std::fprintf(to, "%24s", "");
        } else {
            std::fprintf(to, "%23.15gi", z.imag());
        }
        std::fprintf(to, " %16.9g %10.1e\n", std::abs(z), residual(polynomial, z));
    }
}

std::string json_points(const Signal& x) {
    std::vector<std::string> points;
    points.reserve(std::size_t(x->points));
    for (int i = 0; i < x->points; ++i) {
        const auto z = point(x, i);
        points.push_back(x->complex ? json_value({z.real(), z.imag()}) : json_number(z.real()));
    }
    return json_list(points);
}

void add_roots(JsonMembers& members, const Signal& polynomial, const Signal& roots) {
    std::vector<double> residuals;
    residuals.reserve(std::size_t(roots->points));
    for (int i = 0; i < roots->points; ++i) {
        residuals.push_back(residual(polynomial, point(roots, i)));
    }
    members.emplace_back("roots", json_points(roots));
    members.emplace_back("residuals", json_numbers(residuals));
}

// ---- roots to coefficients ----

/// Whether every complex root has its conjugate, so that the coefficients are real.
bool closed_under_conjugation(const Signal& roots) {
    const auto order = [](Complex a, Complex b) {
        return a.real() != b.real() ? a.real() < b.real() : a.imag() < b.imag();
    };
    std::vector<Complex> points, conjugates;
    for (int i = 0; i < roots->points; ++i) {
        points.push_back(point(roots, i));
        conjugates.push_back(std::conj(points.back()));
    }
    std::ranges::sort(points, order);
    std::ranges::sort(conjugates, order);
    return points == conjugates;
}

Signal polynomial_of(Signal roots) {
    const bool real = closed_under_conjugation(roots);
    check(dspi_pztoc(roots), "multiplying out");
    if (real && roots->complex) check(dspi_real(roots), "multiplying out");
    return roots;
}

void print_coefficients(std::FILE* to, const Signal& polynomial, bool descending) {
    std::fprintf(to, "%6s %24s%s\n", "power", "coefficient", polynomial->complex ? "  re,im" : "");
    const int degree = polynomial->points - 1;
    for (int i = 0; i <= degree; ++i) {
        const auto c = point(polynomial, i);
        std::fprintf(to, "%6d %24.17g", descending ? degree - i : i, c.real());
        if (polynomial->complex) std::fprintf(to, ",%.17g", c.imag());
        std::fputc('\n', to);
    }
}

// ---- the command ----

void multiply_out(Signal roots, const RootsOptions& options, JsonMembers& members, Page& page) {
    auto polynomial = polynomial_of(std::move(roots));
    if (options.descending) check(dspi_rev(polynomial), "reversing");
    if (!options.out.empty()) write_recording(options.out, {&polynomial, 1}, options.writing);
    if (options.files.json) {
        members.emplace_back("coefficients", json_points(polynomial));
    } else if (options.out.empty()) {
        print_coefficients(page.text(), polynomial, options.descending);
    }
}

void find_roots(Signal x, const RootsOptions& options, JsonMembers& members, Page& page) {
    if (x->complex) throw DataError("the coefficients must be real");
    if (options.descending) check(dspi_rev(x), "reversing");
    const auto roots = [&] {
        Progress progress("finding roots");
        return roots_of(x);
    }();
    if (!options.out.empty()) write_recording(options.out, {&roots, 1}, options.writing);
    if (options.files.json) {
        add_roots(members, x, roots);
    } else if (options.out.empty()) {
        print_roots(page.text(), x, roots);
    }
}

void tell(Signal x, const RootsOptions& options, JsonMembers& members, Page& page) {
    check_finite(x);
    const auto work = options.from_roots ? multiply_out : find_roots;
    work(std::move(x), options, members, page);
}

void run(RootsOptions& options) {
    options.writing.check_without_sound(options.out, "roots and coefficients");
    if (!names_files(options)) {
        options.files.check_single(options.out, "");
        return report("roots", options.files.json,
                      [&](Page& page) { tell(read_values(options), options, page.members, page); });
    }
    options.files.names = options.values;
    options.files.check_single(options.out, "");
    report_files("roots", options.files, [&](const std::string& file, Page& page) {
        auto x = first_signal(file, options.reading);
        auto& members = page.add_signal(x);
        tell(std::move(x), options, members, page);
    });
}

constexpr const char* about =
    R"(Coefficients are real, in ascending powers: 6 -5 1 is 6 - 5x + x^2. --descending takes and gives the
highest power first, as the taps of a filter are a polynomial in z^-1: its zeros are those of
--descending. Up to degree 5 the roots follow from closed forms, beyond from a search; the residual
is |p(z)| beside the sum of all |c[k] z^k|, for a good root some 1e-16. A root of multiplicity m
keeps one m-th of its 15 digits.

--from-roots multiplies (x - r) for all roots, written like 2, -1.5, 1+2i, 3i; the highest
coefficient is 1. Where each root comes with its conjugate the coefficients are real.

A first value that is no number names a file, and so do all behind it; - is standard input.

Examples:
  wavkit roots 6 -5 1
  wavkit roots --from-roots 1+2i 1-2i 3
  wavkit roots taps.dsp --descending -o zeros.csv
  wavkit roots -1 0 0 1 -o - | wavkit roots - --from-roots)";

}  // namespace

void add_roots(CLI::App& program) {
    auto* const command =
        program.add_subcommand("roots", "Finds the roots of a polynomial, or multiplies them out.");
    const auto options = std::make_shared<RootsOptions>();
    command
        ->add_option("VALUE", options->values,
                     "coefficients (with --from-roots roots), or files of them")
        ->required()
        ->type_name("");
    command->add_flag("--from-roots", options->from_roots, "give the coefficients of these roots");
    command->add_flag("--descending", options->descending, "highest power first");
    options->files.declare_json(*command);
    options->files.declare_jobs(*command);
    command->add_option("-o,--output", options->out, "write the result; - is standard output")
        ->type_name("FILE");
    options->writing.declare_without_sound(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
