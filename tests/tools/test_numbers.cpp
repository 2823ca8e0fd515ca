// Statistics, histograms, lines, roots and interpolation from the command line.
#include <algorithm>
#include <complex>
#include <regex>

#include "support/oracles.hpp"
#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using NumbersTest = ProgramTest;
/// JSON without blanks, with a # in place of each number, and the numbers.
struct Json {
    std::string layout;
    std::vector<double> numbers;

    explicit Json(const std::string& text) {
        const std::regex number("-?[0-9]+(\\.[0-9]+)?(e[+-]?[0-9]+)?");
        for (std::sregex_iterator at(text.begin(), text.end(), number), end; at != end; ++at) {
            numbers.push_back(std::stod(at->str()));
        }
        layout = std::regex_replace(text, number, "#");
        std::erase_if(layout, [](char c) { return c == ' ' || c == '\n'; });
    }
};

void expect_near(const std::vector<double>& got, const std::vector<double>& want,
                 double tolerance = 1e-14) {
    ASSERT_EQ(got.size(), want.size());
    for (std::size_t i = 0; i < want.size(); ++i) {
        EXPECT_NEAR(got[i], want[i], tolerance * std::max(1.0, std::fabs(want[i]))) << i;
    }
}

TEST_F(NumbersTest, StatisticsOfEverySignal) {
    write("x.dsp", Signals{real<dsp>({1, 2, 3, 4, 10}, 0.5), complex<dsp>({{3, 4}, {0, -1}}),
                           real<dsp>({})});
    const auto got = Json(shell("wavkit stats - --json <x.dsp").out);
    const std::string deviations =
        R"("population_variance":#,"sample_variance":#,"population_deviation":#,"sample_deviation":#,)";
    const std::string places = R"("min_sample":#,"min_at":#,"max_sample":#,"max_at":#)";
    EXPECT_EQ(got.layout,
              R"([{"complex":false,"points":#,"delta":#,"duration":#,"nan":#,"sum":#,"mean":#,)"
              R"("median":#,"rms":#,"energy":#,"min":#,"max":#,)" +
                  deviations + R"("skewness":#,"excess_kurtosis":#,"geometric_mean":#,)" +
                  R"("harmonic_mean":#,)" + places +
                  R"(,"range":#},{"complex":true,"points":#,"delta":#,"duration":#,"nan":#,)" +
                  R"("sum":[#,#],"mean":[#,#],"median":[#,#],"rms":#,"energy":#,"min":[#,#],)" +
                  R"("max":[#,#],)" + deviations +
                  R"("geometric_mean":[#,#],"harmonic_mean":[#,#],)" + places +
                  R"(},{"complex":false,"points":#,"delta":#,"duration":#}])");
    const double skewness = 36 / std::pow(10, 1.5), kurtosis = 1394.0 / 500 - 3;
    const auto geometric = std::sqrt(std::complex(3.0, 4.0) * std::complex(0.0, -1.0));
    const auto harmonic = 2.0 / (1.0 / std::complex(3.0, 4.0) + std::complex(0.0, 1.0));
    std::vector<double> want{5, 0.5, 2.5, 0, 20, 4, 3, std::sqrt(26.0), 130, 1, 10, 10, 12.5};
    for (const double v : {std::sqrt(10.0), std::sqrt(12.5), skewness, kurtosis, std::pow(240, 0.2),
                           300.0 / 131, 0.0, 0.0, 4.0, 2.0, 9.0}) {
        want.push_back(v);
    }
    for (const double v : {2.0,
                           1.0,
                           2.0,
                           0.0,
                           3.0,
                           3.0,
                           1.5,
                           1.5,
                           1.5,
                           1.5,
                           std::sqrt(13.0),
                           26.0,
                           0.0,
                           -1.0,
                           3.0,
                           4.0,
                           8.5,
                           17.0,
                           std::sqrt(8.5),
                           std::sqrt(17.0),
                           geometric.real(),
                           geometric.imag(),
                           harmonic.real(),
                           harmonic.imag(),
                           1.0,
                           1.0,
                           0.0,
                           0.0,
                           0.0,
                           1.0,
                           0.0}) {
        want.push_back(v);
    }
    expect_near(got.numbers, want);

    // The text holds the same figures by the same names; JSON has no number for some values.
    const auto text = printed("stats x.dsp --signal 1");
    EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 25);
    EXPECT_NE(text.find("sample variance        12.5\n"), text.npos) << text;
    write("odd.dsp", Signals{real<dsp>({1, NAN}), real<dsp>({INFINITY})});
    const auto odd = Json(printed("stats odd.dsp --json")).layout;
    EXPECT_NE(odd.find(R"("nan":#,"sum":null,)"), odd.npos) << odd;
    EXPECT_NE(odd.find(R"("sum":null,)", odd.find("},{")), odd.npos) << odd;
    write("same.txt", "0.1 0.1 0.1 0.1 0.1 0.1");
    EXPECT_NE(printed("stats same.txt").find("sample deviation       0\n"), text.npos);
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
    const auto got = Json(printed("fit x.csv --column time,mm --json"));
    const std::string line =
        R"({"slope":#,"intercept":#,"residual_variance":#,"slope_variance":#,)"
        R"("intercept_variance":#,"slope_intercept_covariance":#,"slope_intercept_correlation":#},)";
    EXPECT_EQ(got.layout, R"({"points":#,"y_on_x":)" + line + R"("x_on_y":)" + line +
                              R"("mean_x":#,"mean_y":#,"variance_x":#,"variance_y":#,)" +
                              R"("covariance_xy":#,"correlation":#})");
    expect_near(got.numbers, {3,
                              0.5,
                              7.0 / 6,
                              1.0 / 6,
                              1.0 / 12,
                              5.0 / 36,
                              -1.0 / 12,
                              -std::sqrt(0.6),
                              1.5,
                              -1.5,
                              0.5,
                              0.75,
                              2.25,
                              -1.25,
                              -std::sqrt(25.0 / 27),
                              1,
                              5.0 / 3,
                              1,
                              1.0 / 3,
                              0.5,
                              std::sqrt(0.75)});
    const auto text = printed("fit x.csv --column 1,3");
    EXPECT_NE(text.find("slope                                     0.5              1.5\n"),
              std::string::npos)
        << text;

    // An uneven axis is as good as any; a long signal goes over one axis from end to end.
    write("uneven.csv", "time,value\n0,1\n1,3\n5,11\n");
    const auto slope_and_intercept = [](const std::string& text) {
        const auto numbers = Json(text).numbers;
        return std::vector(numbers.begin() + 1, numbers.begin() + 3);
    };
    expect_near(slope_and_intercept(printed("fit uneven.csv --column 1,2 --json")), {2, 1});
    std::vector<long double> ramp;
    for (int i = 0; i < 5000; ++i) ramp.push_back(2 - i);
    write("ramp.dsp", Signals{real<dsp>(ramp, 0.25)});
    expect_near(slope_and_intercept(shell("wavkit fit - --json <ramp.dsp").out), {-4, 2}, 1e-9);
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

}  // namespace
}  // namespace wavkit::test
