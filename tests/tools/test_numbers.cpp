// Statistics, histograms, lines, roots and interpolation from the command line.
#include <algorithm>
#include <complex>
#include <map>
#include <stdexcept>

#include "support/oracles.hpp"
#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using NumbersTest = ProgramTest;
using Signals = std::vector<Signal<dsp>>;
using Values = std::map<std::string, std::string>;

/// What JSON holds, by paths like "[0].mean"; strict, and an exception for what is no JSON.
struct Json {
    std::istringstream in;
    Values values;

    explicit Json(const std::string& text) : in(text) {
        take("");
        if (in >> std::ws; !in.eof()) throw std::runtime_error("more than one value");
    }
    char next() {
        in >> std::ws;
        return char(in.get());
    }
    void take(const std::string& path) {
        const char c = next();
        if (c == '{' || c == '[') return take_members(path, c);
        std::string word(1, c);
        while (std::isalnum(in.peek()) || std::string("+-.").find(char(in.peek())) != word.npos) {
            word += char(in.get());
        }
        char* end;
        const double value = std::strtod(word.c_str(), &end);
        const bool is_number = *end == '\0' && std::isfinite(value) && !std::isalpha(c);
        if (!is_number && word != "null" && word != "true" && word != "false") {
            throw std::runtime_error("no value: " + word);
        }
        values[path] = word;
    }
    void take_members(const std::string& path, char open) {
        for (int i = 0;; ++i) {
            std::string name = "[" + std::to_string(i) + "]";
            if (open == '{') {
                if (next() != '"') throw std::runtime_error("no name");
                std::getline(in, name, '"');
                name.insert(0, path.empty() ? "" : ".");
                if (next() != ':') throw std::runtime_error("no colon");
            }
            take(path + name);
            const char c = next();
            if (c == (open == '{' ? '}' : ']')) return;
            if (c != ',') throw std::runtime_error("no end");
        }
    }
};

void expect_near(const Values& got, const std::string& path,
                 const std::vector<std::pair<std::string, double>>& want) {
    for (const auto& [name, value] : want) {
        ASSERT_TRUE(got.contains(path + name)) << name;
        EXPECT_NEAR(std::stod(got.at(path + name)), value, 1e-14 * std::max(1.0, std::fabs(value)))
            << path + name;
    }
}

TEST_F(NumbersTest, StatisticsOfEverySignal) {
    write("x.dsp", Signals{real<dsp>({1, 2, 3, 4, 10}, 0.5), complex<dsp>({{3, 4}, {0, -1}}),
                           real<dsp>({0.1L, 0.1L, 0.1L, 0.1L, 0.1L, 0.1L}), real<dsp>({1, NAN}),
                           real<dsp>({INFINITY}), real<dsp>({})});
    const auto got = Json(shell("wavkit stats - --json <x.dsp").out).values;
    const double variance = 10, cubes = -27 - 8 - 1 + 216, fourths = 81 + 16 + 1 + 1296;
    expect_near(got, "[0].",
                {{"points", 5},
                 {"delta", 0.5},
                 {"duration", 2.5},
                 {"nan", 0},
                 {"sum", 20},
                 {"mean", 4},
                 {"median", 3},
                 {"rms", std::sqrt(26.0)},
                 {"energy", 130},
                 {"min", 1},
                 {"max", 10},
                 {"min_sample", 0},
                 {"max_sample", 4},
                 {"max_at", 2},
                 {"range", 9},
                 {"population_variance", variance},
                 {"sample_variance", 12.5},
                 {"population_deviation", std::sqrt(10.0)},
                 {"sample_deviation", std::sqrt(12.5)},
                 {"skewness", cubes / 5 / std::pow(variance, 1.5)},
                 {"excess_kurtosis", fourths / 5 / variance / variance - 3},
                 {"geometric_mean", std::pow(240, 0.2)},
                 {"harmonic_mean", 300.0 / 131}});
    expect_near(got, "[1].",
                {{"mean[0]", 1.5},
                 {"mean[1]", 1.5},
                 {"min[1]", -1},
                 {"min_sample", 1},
                 {"max[0]", 3},
                 {"population_variance", 13 - 4.5}});
    EXPECT_EQ(got.at("[1].complex"), "true");
    EXPECT_FALSE(got.contains("[1].skewness") || got.contains("[1].range"));
    expect_near(got, "[2].", {{"sample_deviation", 0}, {"skewness", 0}, {"range", 0}});
    EXPECT_EQ(got.at("[3].mean"), "null");
    expect_near(got, "[3].", {{"nan", 1}, {"min", 1}});
    EXPECT_EQ(got.at("[4].sum"), "null");
    expect_near(got, "[5].", {{"points", 0}});
    EXPECT_FALSE(got.contains("[5].mean") || got.contains("[6].points"));

    // The text holds the same figures, by the same names.
    std::istringstream text(printed("stats x.dsp --signal 1"));
    int lines = 0;
    for (std::string line; std::getline(text, line); ++lines) {
        auto name = line.substr(0, line.find("  "));
        std::ranges::replace(name, ' ', '_');
        if (name == "kind") continue;
        EXPECT_NEAR(std::stod(line.substr(22)), std::stod(got.at("[0]." + name)), 1e-7) << name;
    }
    EXPECT_EQ(lines, 25);
}

TEST_F(NumbersTest, HistogramsCountWhatIsThere) {
    write("x.dsp", Signals{real<dsp>({0, 0.5L, 1, 2, -0.1L, 3, INFINITY, NAN}, 7)});
    const std::vector<std::vector<double>> bins{{0, 1, 2}, {1, 2, 2}};
    const auto done = shell("wavkit hist - --range 0 2 --bins 2 -o - --to csv <x.dsp");
    EXPECT_EQ(rows(done.out), bins);
    EXPECT_EQ(done.err, "wavkit: 4 values are in no bin\n");
    const auto text = printed("hist x.dsp --range 0 2 --bins 2");
    for (const std::string line :
         {"below          1\n", "above          2\n", "number          1\n"})
        EXPECT_NE(text.find(line), std::string::npos) << text;
    printed("hist x.dsp --range 0 3 --bins 2 -o h.dsp");
    const auto counts = read("h.dsp").at(0);
    EXPECT_TRUE(is_real<dsp>(counts, {3, 2}));
    EXPECT_EQ(counts->delta, 1.5);

    // Without options: all finite values, in as many bins as the root of their number.
    write("many.dsp", Signals{sine(400, 7, 2)});
    const auto table = rows(printed("hist many.dsp"));
    double sum = 0;
    for (const auto& row : table) sum += row.at(2);
    EXPECT_EQ(table.size(), 20u);
    EXPECT_EQ(sum, 400);
    write("z.dsp", Signals{complex<dsp>({{3, 4}, {0, 5}, {0, 1}})});
    EXPECT_EQ(rows(printed("hist z.dsp")),
              (std::vector<std::vector<double>>{{1, 3, 1}, {3, 5, 2}}));
    write("same.txt", "7\n7\n");
    EXPECT_EQ(rows(printed("hist same.txt")), (std::vector<std::vector<double>>{{6.5, 7.5, 2}}));

    printed("hist many.dsp --plot h.png && wavkit hist many.dsp --bins 50000 --plot h.svg");
    EXPECT_TRUE(contents("h.png").starts_with("\x89PNG\r\n"));
    EXPECT_NE(contents("h.svg").find("many.dsp"), std::string::npos);
    EXPECT_NE(printed("hist z.dsp --plot -").find("magnitude"), std::string::npos);
}

TEST_F(NumbersTest, LinesByTheNamesOfTheirFigures) {
    write("x.csv", "time,volt,mm\n0,9,1\n1,9,2\n2,9,2\n");
    const auto got = Json(printed("fit x.csv --column time,mm --json")).values;
    expect_near(got, "",
                {{"points", 3},
                 {"mean_x", 1},
                 {"mean_y", 5.0 / 3},
                 {"variance_x", 1},
                 {"variance_y", 1.0 / 3},
                 {"covariance_xy", 0.5},
                 {"correlation", std::sqrt(0.75)}});
    expect_near(got, "y_on_x.",
                {{"slope", 0.5},
                 {"intercept", 7.0 / 6},
                 {"residual_variance", 1.0 / 6},
                 {"slope_variance", 1.0 / 12},
                 {"intercept_variance", 5.0 / 36},
                 {"slope_intercept_covariance", -1.0 / 12},
                 {"slope_intercept_correlation", -std::sqrt(0.6)}});
    expect_near(got, "x_on_y.",
                {{"slope", 1.5},
                 {"intercept", -1.5},
                 {"residual_variance", 0.5},
                 {"slope_variance", 0.75},
                 {"intercept_variance", 2.25},
                 {"slope_intercept_covariance", -1.25},
                 {"slope_intercept_correlation", -std::sqrt(25.0 / 27)}});
    const auto text = printed("fit x.csv --column 1,3");
    EXPECT_NE(text.find("slope                                     0.5              1.5\n"),
              std::string::npos)
        << text;

    // An uneven axis is as good as any; a long signal goes over one axis from end to end.
    write("uneven.csv", "time,value\n0,1\n1,3\n5,11\n");
    expect_near(Json(printed("fit uneven.csv --column 1,2 --json")).values, "y_on_x.",
                {{"slope", 2}, {"intercept", 1}});
    std::vector<long double> ramp;
    for (int i = 0; i < 5000; ++i) ramp.push_back(2 - i);
    write("ramp.dsp", Signals{real<dsp>(ramp, 0.25)});
    const auto line = Json(printed("fit - --json <" + (home / "ramp.dsp").string())).values;
    EXPECT_NEAR(std::stod(line.at("y_on_x.slope")), -4, 1e-13);
    EXPECT_NEAR(std::stod(line.at("y_on_x.intercept")), 2, 1e-9);
    printed("fit ramp.dsp --plot f.png && wavkit fit x.csv --column 2,3 --plot upright.svg");
    EXPECT_TRUE(contents("f.png").starts_with("\x89PNG\r\n"));
    EXPECT_NE(contents("upright.svg").find("x.csv"), std::string::npos);
}

TEST_F(NumbersTest, RootsAndBack) {
    const auto roots = [&](const std::string& arguments) {
        auto table = rows(printed("roots " + arguments));
        for (auto& row : table) row.resize(2);
        return table;
    };
    using Table = std::vector<std::vector<double>>;
    EXPECT_EQ(roots("6 -5 1"), (Table{{2, 2}, {3, 3}}));  // no imaginary part, then the modulus
    EXPECT_EQ(roots("1 -5 6 0 --descending"), (Table{{0, 0}, {2, 2}, {3, 3}}));
    EXPECT_EQ(roots("5 -2 6 -2 1"), (Table{{0, -1}, {0, 1}, {1, -2}, {1, 2}}));
    EXPECT_EQ(roots("--from-roots 2 3"), (Table{{0, 6}, {1, -5}, {2, 1}}));
    EXPECT_EQ(roots("--from-roots --descending 1-2i +1+2i"), (Table{{2, 1}, {1, -2}, {0, 5}}));
    EXPECT_EQ(printed("roots 7 0 0"), "no roots\n");
    EXPECT_NE(printed("roots --from-roots 2i 1").find("0,2"), std::string::npos);

    const auto unity = rows(printed("roots -1 0 0 0 0 0 0 1 -o - --to csv"));
    ASSERT_EQ(unity.size(), 7u);
    for (const auto& z : unity) {
        const auto power = std::pow(std::complex<double>(z.at(0), z.at(1)), 7);
        EXPECT_LT(std::abs(power - 1.0), 1e-14);
    }
    // There and back through files: (x - 1)(x - 2) ... (x - 12), whose roots lose five digits.
    printed("roots --from-roots 1 2 3 4 5 6 7 8 9 10 11 12 -o p.dsp");
    const auto found = rows(printed("roots p.dsp"));
    ASSERT_EQ(found.size(), 12u);
    for (std::size_t i = 0; i < 12; ++i) EXPECT_NEAR(found[i].at(0), double(i) + 1, 1e-8);
    const auto back = shell("wavkit roots - -o - <p.dsp | wavkit roots - --from-roots -o q.dsp");
    EXPECT_EQ(back.status, 0) << back.err;
    EXPECT_LT(relative_error<dsp>(read("q.dsp").at(0), samples_of<dsp>(read("p.dsp").at(0))),
              1e-11);
}

TEST_F(NumbersTest, InterpolationAtAnyPlace) {
    std::vector<long double> cubes;
    for (int i = 0; i < 9; ++i) cubes.push_back(std::pow(0.5L * i - 1, 3));
    const auto cubic = [](double t) { return std::pow(t - 1, 3); };
    write("x.dsp", Signals{real<dsp>(cubes, 0.5), complex<dsp>({{0, 4}, {2, 2}}, 0.25)});
    write("at.txt", "3.25\n-1\n0.75\n5\n");
    const std::string spline = "interp x.dsp --signal 1 --method spline ";
    const auto table = rows(printed(spline + "--at at.txt --edges extrapolate"));
    ASSERT_EQ(table.size(), 4u);
    for (const auto& row : table) EXPECT_NEAR(row.at(1), cubic(row.at(0)), 1e-12);
    EXPECT_EQ(table[1][0], -1);  // in the order of the places
    const auto held = rows(printed(spline + "--at - <at.txt"));
    EXPECT_NEAR(held.at(0).at(1), cubic(3.25), 1e-12);
    EXPECT_EQ(held.at(1).at(1), -1);
    EXPECT_EQ(held.at(3).at(1), 27);

    // A rate gives a record from the first sample to the last; all signals of a file are taken.
    printed(spline + "--rate 10 -o y.dsp");
    const auto y = read("y.dsp").at(0);
    ASSERT_EQ(y->points, 41);
    EXPECT_EQ(y->delta, 0.1);
    for (int i = 0; i < 41; ++i) EXPECT_NEAR(y[i], cubic(0.1 * i), 1e-12);
    EXPECT_EQ(shell("wavkit interp - --rate 8 -o - <x.dsp | cat >both.dsp").status, 0);
    EXPECT_TRUE(matches<dsp>(read("both.dsp").at(1), complex<dsp>({{0, 4}, {1, 3}, {2, 2}}), 2));

    const std::pair<std::string, std::vector<double>> methods[] = {
        {"hold", {0, 0, 1, 1, 9, 9, 16}},
        {"linear", {0, 0.5, 1, 5, 9, 12.5, 16}},
        {"quadratic", {0, 0.25, 1, 4, 9, 12.25, 16}}};
    write("squares.csv", "time;value\n0;0\n1;1\n3;9\n4;16\n");
    write("places.txt", "0 0.5 1 2 3 3.5 4\n");
    for (const auto& [method, want] : methods) {
        const auto got =
            rows(printed("interp squares.csv --table --at places.txt --method " + method));
        for (std::size_t i = 0; i < want.size(); ++i) EXPECT_DOUBLE_EQ(got.at(i).at(1), want[i]);
    }
    EXPECT_EQ(rows(printed("interp squares.csv --table --rate 1")).size(), 5u);
}

TEST_F(NumbersTest, FailuresAreToldAndLeaveNothing) {
    write("x.txt", "1\n2\n3\n");
    write("nan.txt", "1\nnan\n1\n1\n1\n");
    write("none.txt", "#DSP points = 0\n");
    write("back.csv", "x,y\n0,1\n2,1\n2,1\n");
    expect_failures({
        {1, "stats missing.txt --json", "missing.txt"},
        {2, "stats", "IN"},
        {1, "hist none.txt -o h.csv", "no finite values"},
        {1, "hist x.txt --range 0 inf -o h.csv", "too wide"},
        {2, "hist x.txt --range 2 1", "lower end first"},
        {2, "hist x.txt --bins 0", "--bins"},
        {2, "hist x.txt -o h.wav", "sound file"},
        {2, "hist x.txt -o - --plot -", "standard output"},
        {1, "fit none.txt", "no samples"},
        {1, "fit nan.txt --plot f.png", "sample 1 is not a finite number"},
        {2, "fit x.txt --plot f.gif", ".png"},
        {2, "fit x.txt --json --plot -", "only one"},
        {1, "roots 0 0", "0 everywhere"},
        {1, "roots 1 inf", "not a finite number"},
        {1, "roots 1i 1", "real"},
        {1, "roots none.txt", "0 everywhere"},
        {2, "roots 1 2x", "2x"},
        {2, "roots 1 2 --to csv", "-o"},
        {2, "roots 1 2 -o r.wav", "sound file"},
        {2, "interp x.txt", "--at and --rate"},
        {2, "interp - --at -", "standard input"},
        {1, "interp x.txt --rate 2 --method spline -o y.csv", "5 points"},
        {1, "interp nan.txt --rate 2 --method spline -o y.csv", "sample 1 is not a finite number"},
        {1, "interp x.txt --at nan.txt -o y.csv", "sample 1 is not a finite number"},
        {1, "interp x.txt --at x.txt --edges refuse -o y.csv", "3 lies outside"},
        {1, "interp x.txt --rate 1e10 -o y.csv", "2147483647"},
        {1, "interp none.txt --rate 2 -o y.csv", "no samples"},
        {1, "interp x.txt --table --rate 1", "two columns"},
        {1, "interp back.csv --table --rate 1 -o y.csv", "sample 2 does not lie behind"},
    });
}

}  // namespace
}  // namespace wavkit::test
