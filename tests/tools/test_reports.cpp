// Reports of several files, as text and as JSON; the commands themselves.
#include <algorithm>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using ReportsTest = ProgramTest;

/// The number behind a name in a line of JSON.
double member(const std::string& json, const std::string& name) {
    const auto at = json.find("\"" + name + "\":");
    return at == json.npos ? NAN : std::strtod(json.c_str() + at + name.size() + 3, nullptr);
}

std::vector<std::string> lines(const std::string& text) {
    std::vector<std::string> result;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) result.push_back(line);
    return result;
}

TEST_F(ReportsTest, EveryFileHasALineOfJson) {
    write("a.txt", "6\n-5\n1\n");
    write("\"b\"\t\xFF.txt", "1\n2\n3\n4\n5\n6\n7\n8\n");
    const std::string common = R"("signals":[{"signal":1,"complex":false,"points":)";
    for (const auto& [command, own] : {std::pair("info", "mean"),
                                       {"stats", "mean"},
                                       {"spectrum --any-length", "window"},
                                       {"fit", "y_on_x"},
                                       {"fit --degree 0", "coefficients"},
                                       {"hist", "counts"},
                                       {"edges", "rising"},
                                       {"peaks", "peaks"},
                                       {"envelope", "max_at"},
                                       {"roots", "roots"}}) {
        const auto name = std::string(command).substr(0, std::string(command).find(" "));
        const auto done =
            shell(std::string("wavkit ") + command + " --json *.txt no.dsp a.txt --jobs 3");
        EXPECT_EQ(done.status, 1) << command;
        EXPECT_NE(done.err.find("no.dsp"), done.err.npos) << command;
        EXPECT_EQ(lines(done.err).size(), 1u) << done.err;
        const auto got = lines(done.out);
        ASSERT_EQ(got.size(), 3u) << command << done.err;
        EXPECT_EQ(got[0].find("{\"command\":\"" + name +
                              R"(","file":"\"b\"\u0009)"
                              "\uFFFD.txt\","),
                  0u)
            << got[0];
        EXPECT_EQ(got[1], got[2]);
        for (const auto& line : got) {
            EXPECT_NE(line.find(common), line.npos) << line;
            EXPECT_NE(line.find("\"" + std::string(own) + "\":"), line.npos) << line;
        }
    }
    // Of no file; by the names that the text has, too.
    EXPECT_EQ(printed("roots 6 -5 1 --json"),
              "{\"command\":\"roots\",\"roots\":[2,3],\"residuals\":[0,0]}\n");
    EXPECT_EQ(member(printed("correlate a.txt a.txt --json"), "coefficient"), 1);
    EXPECT_EQ(member(printed("design delay 0.2 0.5 --length 9 --json"), "delay"), 4.5);
    EXPECT_EQ(member(printed("window hann --points 4 --json"), "coherent_gain"), 0.5);
}

TEST_F(ReportsTest, TextNamesTheFiles) {
    write("a.txt", "1\n2\n3\n");
    write("nan.txt", "1\nnan\n");
    const auto one = printed("fit a.txt");
    const auto done = shell("wavkit fit a.txt nan.txt - --jobs 2 <a.txt");
    EXPECT_EQ(done.out, "a.txt:\n" + one + "\nstandard input:\n" + one);
    EXPECT_EQ(done.err, "wavkit: nan.txt: sample 1 is not a finite number\n");
    EXPECT_EQ(done.status, 1);
}

TEST_F(ReportsTest, EdgesByTheirFigures) {
    // High for 3 of 8 samples, with noise at the level that the hysteresis passes over.
    const double delta = 0.25;
    std::vector<long double> samples;
    for (int i = 0; i < 80000; ++i) {
        const int p = i % 8;
        samples.push_back(p == 0 ? 0.4L : p == 1 ? 0.54L : p == 2 ? 0.45L : p < 6 ? 1 : 0);
    }
    write("x.dsp", Signals{real<dsp>(samples, delta), real<dsp>({1, 1, 1})});
    const auto json = printed("edges x.dsp --times --json");
    // Rising from 0.45 to 1 through 0.5 behind sample 2, falling half way from 5 to 6.
    const double rise = (2 + 0.05 / 0.55) * delta, fall = 5.5 * delta;
    EXPECT_EQ(member(json, "level"), 0.5);
    EXPECT_EQ(member(json, "hysteresis"), 0.1);
    EXPECT_EQ(member(json, "rising"), 10000);
    EXPECT_EQ(member(json, "falling"), 10000);
    EXPECT_NEAR(member(json, "first_at"), rise, 1e-12);
    EXPECT_NEAR(member(json, "last_at"), fall + 9999 * 8 * delta, 1e-9);
    EXPECT_NEAR(member(json, "frequency"), 0.5, 1e-12);
    EXPECT_NEAR(member(json, "period_max"), 2, 1e-9);
    EXPECT_NEAR(member(json, "period_deviation"), 0, 1e-9);
    EXPECT_NEAR(member(json, "duty"), (fall - rise) / 2, 1e-9);
    EXPECT_NEAR(member(json, "low_time"), 2 - (fall - rise), 1e-9);
    EXPECT_NE(json.find(R"("level":1,"hysteresis":0,"rising":0,"falling":0,"rising_at":[])"),
              json.npos);
    // Without hysteresis the noise counts, as the library finds it: two more edges a period.
    printed("edges x.dsp --signal 1 --level 0.5 -o e.csv");
    const auto table = rows(contents("e.csv"));
    Signal<dsp> x = real<dsp>(samples, delta), down = real<dsp>(samples, delta);
    ASSERT_EQ(dspi_edge(x, DSP_EDGE_RISING, 0.5), 0);
    ASSERT_EQ(dspi_edge(down, DSP_EDGE_FALLING, 0.5), 0);
    ASSERT_EQ(int(table.size()), x->points + down->points);
    for (std::size_t i = 0; i < table.size(); ++i) {
        const auto& want = i % 2 == 0 ? x : down;
        ASSERT_NEAR(table[i][0], want[int(i / 2)] * delta, 1e-9);
        ASSERT_EQ(table[i][1], i % 2 == 0 ? 1 : -1);
    }
}

/// The numbers of a list in a line of JSON.
std::vector<double> list(const std::string& json, const std::string& name) {
    std::vector<double> result;
    const auto begin = json.find("\"" + name + "\":[");
    if (begin == json.npos) return result;
    auto text = json.substr(begin + name.size() + 4, json.find(']', begin) - begin);
    std::ranges::replace(text, ',', ' ');
    std::istringstream numbers(text);
    for (double value; numbers >> value;) result.push_back(value);
    return result;
}

void expect_near(const std::vector<double>& got, const std::vector<double>& want,
                 double tolerance) {
    ASSERT_EQ(got.size(), want.size());
    for (std::size_t i = 0; i < want.size(); ++i) EXPECT_NEAR(got[i], want[i], tolerance) << i;
}

TEST_F(ReportsTest, PolynomialsWithTheirErrors) {
    // By hand: the inverse of the normal equations over 0 to 4 has 31/35, 87/70 and 1/14 in its
    // diagonal.
    write("x.txt", "1\n0\n3\n9\n15\n");
    const auto json = printed("fit x.txt --degree 2 --json");
    const double s2 = 29 / 35.0;
    expect_near(list(json, "coefficients"), {22 / 35.0, -81 / 70.0, 85 / 70.0}, 1e-13);
    expect_near(list(json, "coefficient_errors"),
                {std::sqrt(s2 * 31 / 35), std::sqrt(s2 * 87 / 70), std::sqrt(s2 / 14)}, 1e-13);
    EXPECT_NEAR(member(json, "residual_variance"), s2, 1e-13);
    EXPECT_NEAR(member(json, "r_squared"), 1 - 2 * s2 / 159.2, 1e-13);
    EXPECT_NE(printed("fit x.txt --degree 2").find("0.628571428571429         0.856667\n"),
              std::string::npos);

    // Far from 0, and of a degree at which powers of x are nearly the same.
    write("far.csv",
          "x;y\n1000000000;2\n1000000001;1\n1000000002;0\n1000000003;5\n1000000004;34\n");
    expect_near(
        list(printed("fit far.csv --column 1,2 --degree 3 --centre --json"), "coefficients"),
        {-36 / 35.0, 0, 66 / 14.0, 2}, 1e-12);
    std::vector<long double> chebyshev;
    for (int i = 0; i <= 1000; ++i)
        chebyshev.push_back(std::cos(20 * std::acos((i - 500) / 500.0L)));
    write("t20.dsp", Signals{real<dsp>(chebyshev, 0.002)});
    const auto powers = list(printed("fit t20.dsp --degree 20 --centre --json"), "coefficients");
    ASSERT_EQ(powers.size(), 21u);
    EXPECT_NEAR(powers[20], 524288, 1e-4);
    EXPECT_NEAR(powers[18], -2621440, 1e-4);
    EXPECT_NEAR(powers[2], -200, 1e-7);
    EXPECT_NEAR(powers[0], 1, 1e-9);
}

TEST_F(ReportsTest, CommandsThatDoNotExist) {
    const auto done = shell("wavkit spectrun x.dsp");
    EXPECT_EQ(done.status, 2);
    EXPECT_EQ(done.err, "wavkit: there is no command 'spectrun'; did you mean 'spectrum'?\n");
    EXPECT_EQ(shell("wavkit qqq").err,
              "wavkit: there is no command 'qqq'; wavkit help lists them\n");
    EXPECT_EQ(printed("help cut"), printed("cut --help"));
    EXPECT_EQ(printed("help"), printed("--help"));
}

TEST_F(ReportsTest, WhatIsThereIsNotMadeAgain) {
    write("x.dsp", Signals{real<dsp>({1, 2})});
    write("y.dsp", "old");
    for (const std::string line : {"convert x.dsp y.dsp", "scale x.dsp --gain 2 -o y.dsp",
                                   "generate cos 0.1 -o y.dsp", "spectrum x.dsp -o y.dsp"}) {
        EXPECT_EQ(shell("wavkit " + line + " --skip-existing").status, 0) << line;
        EXPECT_EQ(contents("y.dsp"), "old") << line;
    }
    printed("scale x.dsp --gain 2 -o z.dsp --skip-existing");
    EXPECT_TRUE(matches<dsp>(read("z.dsp").at(0), real<dsp>({2, 4}), 0));
}

}  // namespace
}  // namespace wavkit::test
