// Statistics, histograms, lines, roots and interpolation from the command line.
#include <algorithm>
#include <regex>

#include "support/oracles.hpp"
#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using NumbersTest = ProgramTest;
/// The numbers of a text; in the text, which loses its blanks, a # takes the place of each.
std::vector<double> take_numbers(std::string& text) {
    const std::regex number("-?[0-9]+(\\.[0-9]+)?(e[+-]?[0-9]+)?");
    std::vector<double> numbers;
    for (std::sregex_iterator at(text.begin(), text.end(), number), end; at != end; ++at) {
        numbers.push_back(std::stod(at->str()));
    }
    text = std::regex_replace(text, number, "#");
    std::erase_if(text, [](char c) { return c == ' ' || c == '\n'; });
    return numbers;
}

/// Compares JSON: the text but for its blanks, and the numbers but for rounding.
void expect_json(std::string got, std::string want) {
    const auto a = take_numbers(got), b = take_numbers(want);
    ASSERT_EQ(got, want);
    for (std::size_t i = 0; i < b.size(); ++i) {
        EXPECT_NEAR(a[i], b[i], 1e-14 * std::max(1.0, std::fabs(b[i]))) << i;
    }
}

TEST_F(NumbersTest, StatisticsOfEverySignal) {
    write("x.dsp", Signals{real<dsp>({1, 2, 3, 4, 10}, 0.5), complex<dsp>({{3, 4}, {0, -1}}),
                           real<dsp>({})});
    expect_json(
        shell("wavkit stats - --json <x.dsp").out,
        R"({"command":"stats","file":"-","signals":[{"signal":1,"complex":false,"points":5,)"
        R"("delta":0.5,"duration":2.5,"nan":0,"sum":20,"mean":4,)"
        R"("median":3,"rms":5.0990195135927845,"energy":130,"min":1,"max":10,)"
        R"("population_variance":10,"sample_variance":12.5,)"
        R"("population_deviation":3.1622776601683795,"sample_deviation":3.5355339059327378,)"
        R"("skewness":1.1384199576606167,"excess_kurtosis":-0.212,)"
        R"("geometric_mean":2.9925557394776896,"harmonic_mean":2.2900763358778624,"min_sample":0,)"
        R"("min_at":0,"max_sample":4,"max_at":2,"range":9},{"signal":2,"complex":true,"points":2,"delta":1,)"
        R"("duration":2,"nan":0,"sum":[3,3],"mean":[1.5,1.5],"median":[1.5,1.5],)"
        R"("rms":3.605551275463989,"energy":26,"min":[0,-1],"max":[3,4],"population_variance":8.5,)"
        R"("sample_variance":17,"population_deviation":2.9154759474226504,)"
        R"("sample_deviation":4.123105625617661,"geometric_mean":[2.1213203435596424,)"
        R"(-0.7071067811865476],"harmonic_mean":[0.3333333333333333,-2.3333333333333335],)"
        R"("min_sample":1,"min_at":1,"max_sample":0,"max_at":0},{"signal":3,"complex":false,"points":0,)"
        R"("delta":1,"duration":0}]})");
    // The text holds the same figures by the same names; JSON has no number for some values.
    const auto text = printed("stats x.dsp --signal 1");
    EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 25);
    EXPECT_NE(text.find("sample variance        12.5\n"), text.npos) << text;
    write("odd.dsp", Signals{real<dsp>({1, NAN}), real<dsp>({INFINITY})});
    auto odd = printed("stats odd.dsp --json");
    take_numbers(odd);
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
    EXPECT_TRUE(matches<dsp>(read("h.dsp").at(0), real<dsp>({3, 2}, 1.5)));

    // Without options: all finite values, in as many bins as the root of their number.
    write("many.dsp", Signals{sine(400, 7, 2)});
    EXPECT_EQ(rows(printed("hist many.dsp")).size(), 20u);
    write("z.dsp", Signals{complex<dsp>({{3, 4}, {0, 5}, {0, 1}})});
    EXPECT_EQ(rows(printed("hist z.dsp")),
              (std::vector<std::vector<double>>{{1, 3, 1}, {3, 5, 2}}));
    write("same.txt", "7\n7\n");
    EXPECT_EQ(rows(printed("hist same.txt")), (std::vector<std::vector<double>>{{6.5, 7.5, 2}}));

    printed("hist many.dsp --bins 50000 --plot h.svg");
    EXPECT_NE(contents("h.svg").find("many.dsp"), std::string::npos);
    EXPECT_NE(printed("hist z.dsp --plot -").find("magnitude"), std::string::npos);
}

TEST_F(NumbersTest, LinesByTheNamesOfTheirFigures) {
    write("x.csv", "time,volt,mm\n0,9,1\n1,9,2\n2,9,2\n");
    expect_json(
        printed("fit x.csv --column time,mm --json"),
        R"({"command":"fit","file":"x.csv","signals":[{"signal":1,"complex":true,"points":3,)"
        R"("delta":1,"y_on_x":{"slope":0.5,"intercept":1.1666666666666667,)"
        R"("slope_error":0.28867513459481287,"intercept_error":0.37267799624996506,)"
        R"("residual_variance":0.16666666666666666,"slope_variance":0.08333333333333333,)"
        R"("intercept_variance":0.1388888888888889,)"
        R"("slope_intercept_covariance":-0.08333333333333333,)"
        R"("slope_intercept_correlation":-0.7745966692414834},"x_on_y":{"slope":1.5,)"
        R"("intercept":-1.5,"slope_error":0.8660254037844386,"intercept_error":1.5,)"
        R"("residual_variance":0.5,"slope_variance":0.75,)"
        R"("intercept_variance":2.25,"slope_intercept_covariance":-1.25,)"
        R"("slope_intercept_correlation":-0.9622504486493763},"mean_x":1,)"
        R"("mean_y":1.6666666666666667,"variance_x":1,"variance_y":0.3333333333333333,)"
        R"("covariance_xy":0.5,"correlation":0.8660254037844386,"r_squared":0.75}]})");
    const auto text = printed("fit x.csv --column 1,3");
    EXPECT_NE(text.find("slope                                     0.5              1.5\n"),
              std::string::npos)
        << text;
    // An uneven axis is as good as any; a long signal goes over one axis from end to end.
    write("uneven.csv", "time,value\n0,1\n1,3\n5,11\n");
    const auto uneven = printed("fit uneven.csv --column 1,2");
    EXPECT_NE(uneven.find("slope                                       2 "), text.npos) << uneven;
    std::vector<long double> ramp;
    for (int i = 0; i < 5000; ++i) ramp.push_back(2 - i);
    write("ramp.dsp", Signals{real<dsp>(ramp, 0.25)});
    const auto steady = shell("wavkit fit - <ramp.dsp").out;
    EXPECT_NE(steady.find("slope                                      -4 "), text.npos) << steady;
    printed("fit x.csv --column 2,3 --plot upright.svg");
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

    // There and back through files: (x - 1)(x - 2) ... (x - 12), whose roots lose five digits.
    printed("roots --from-roots 1 2 3 4 5 6 7 8 9 10 11 12 -o p.dsp");
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

    write("squares.csv", "time;value\n0;0\n1;1\n3;9\n4;16\n");
    write("places.txt", "0.5 2 3.5");
    for (const auto& [method, want] :
         {std::pair("hold", "0 1 9"), std::pair("linear", "0.5 5 12.5"),
          std::pair("quadratic", "0.25 4 12.25")}) {
        std::istringstream values(want);
        for (const auto& row : rows(printed(
                 std::string("interp squares.csv --table --at places.txt --method ") + method))) {
            double value = 0;
            values >> value;
            EXPECT_DOUBLE_EQ(row.at(1), value) << method;
        }
    }
    EXPECT_EQ(rows(printed("interp squares.csv --table --rate 1")).size(), 5u);
}

}  // namespace
}  // namespace wavkit::test
