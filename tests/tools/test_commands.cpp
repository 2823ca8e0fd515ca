// Correlations, envelopes and windows from the command line.
#include <array>
#include <map>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using CommandsTest = ProgramTest;

/// The numbers behind the words of a summary.
std::map<std::string, double> figures(const std::string& text) {
    std::map<std::string, double> result;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        const auto number = line.find_first_of("-0123456789");
        if (number == line.npos) continue;
        result[line.substr(0, line.find("  "))] = std::strtod(line.c_str() + number, nullptr);
    }
    return result;
}

TEST_F(CommandsTest, CorrelateFindsOneInTheOther) {
    write("a.txt", "1\n2\n");
    write("b.txt", "0\n0\n0\n1\n2\n");
    const std::vector<std::vector<double>> want{{-1, 0}, {0, 0}, {1, 0}, {2, 1}, {3, 2.5}, {4, 1}};
    const auto near = [&](const std::string& options, double scale, std::size_t first,
                          std::size_t count) {
        const auto got = rows(printed("correlate a.txt b.txt -o - --to csv " + options));
        ASSERT_EQ(got.size(), count);
        for (std::size_t i = 0; i < count; ++i) {
            EXPECT_EQ(got[i][0], want[first + i][0]);
            EXPECT_NEAR(got[i][1], scale * want[first + i][1], 1e-14);
        }
    };
    near("", 1, 0, 6);
    near("--coefficient", 0.4, 0, 6);
    near("--lags 2 3.5", 1, 3, 2);
    EXPECT_EQ(figures(printed("correlate a.txt b.txt --lags -1 2")).at("samples"), 2);
    printed("correlate a.txt b.txt -o c.dsp");
    EXPECT_TRUE(matches<dsp>(read("c.dsp").at(0), real<dsp>({0, 0, 0, 1, 2.5L, 1}), 4));
    // Upside down, and the other way round.
    write("b.txt", "#DSP delta = 0.5\n0\n0\n0\n-2\n-4\n");
    write("both.csv", "# delta = 0.5\nv\n1\n2\n\n# delta = 0.5\nv\n0\n0\n0\n-2\n-4\n");
    for (const std::string files :
         {"a.txt b.txt --delta 0.5", "both.csv", "- b.txt --delta 0.5 <a.txt"}) {
        auto found = figures(shell("wavkit correlate " + files).out);
        EXPECT_EQ(found["samples"], 3) << files;
        EXPECT_EQ(found["lag"], 1.5);
        EXPECT_EQ(found["correlation"], -5);
        EXPECT_EQ(found["coefficient"], -1);
    }
    EXPECT_EQ(figures(printed("correlate b.txt a.txt --delta 1")).at("samples"), -3);
}

TEST_F(CommandsTest, OptionsOfSeveralValuesStandBeforeTheFileToo) {
    write("x.dsp", Signals{Noise(3).real<dsp>(2000)});
    const std::string_view cases[][3] = {{"filter", "--lowpass 0.1", "--to csv -o -"},
                                         {"filter", "--bandpass 0.1 0.2", "--to csv -o -"},
                                         {"spectrum", "--band 0.1 0.2", "--peaks 3"},
                                         {"spectrum", "--zoom 0.1 0.2", "--peaks 3"},
                                         {"hist", "--range 0 1", "--bins 4"},
                                         {"correlate", "--lags 0 5", "x.dsp --json"},
                                         {"scale", "--calibrate 0=1 1=3", "-o - --to csv"}};
    for (const auto& part : cases) {
        const std::string command(part[0]), option(part[1]), rest(part[2]);
        EXPECT_EQ(printed(command + " " + option + " x.dsp " + rest),
                  printed(command + " x.dsp " + option + " " + rest))
            << option;
    }
}

TEST_F(CommandsTest, TheEnvelopeOfAModulatedToneIsItsModulation) {
    // Whole numbers of cycles in a length with a large prime factor, and a constant that must go.
    const int n = 3 * 337;
    std::vector<long double> samples;
    const auto modulation = [&](int i) { return 2 + std::cos(2 * pi<double> * 5 * i / n + 1); };
    for (int i = 0; i < n; ++i) {
        samples.push_back(0.5L + modulation(i) * std::cos(2 * pi<long double> * 120 * i / n));
    }
    write("x.dsp", Signals{real<dsp>(samples, 0.25), complex<dsp>({{3, 4}, {0, -1}})});
    printed("envelope x.dsp --detrend --signal 1 -o y.csv --with-time");
    const auto table = rows(contents("y.csv"));
    ASSERT_EQ(table.size(), std::size_t(n));
    for (int i = 0; i < n; ++i) {
        EXPECT_DOUBLE_EQ(table[std::size_t(i)][0], i * 0.25);
        EXPECT_NEAR(table[std::size_t(i)][1], modulation(i), 1e-11);
    }
    printed("envelope x.dsp -o y.dsp");
    const auto both = read("y.dsp");
    ASSERT_EQ(both.size(), 2u);
    EXPECT_TRUE(matches<dsp>(both[1], real<dsp>({5, 1}), 2));
    const auto summary = rows(printed("envelope x.dsp --detrend --signal 1")).at(0);
    EXPECT_NEAR(summary[0], 2, 1e-5);
    EXPECT_NEAR(summary[1], 1, 1e-3);
    EXPECT_NEAR(summary[2], 3, 1e-3);
}

TEST_F(CommandsTest, WindowsHaveTheirFigures) {
    // Coherent gain, noise bandwidth, highest sidelobe, scalloping loss (F. J. Harris, 1978).
    const std::pair<std::string, std::array<double, 4>> table[] = {
        {"Uniform", {1, 1, -13, 3.92}},
        {"Hann", {0.5, 1.5, -31, 1.42}},
        {"Flattop", {0.213283, 3.8221, -95, 0}},
        {"Kaiser70", {0.4015, 1.7995, -70, 1.02}}};
    for (const auto& [name, want] : table) {
        const auto got = figures(printed("window " + name));
        EXPECT_NEAR(got.at("coherent gain"), want[0], 6e-5) << name;
        EXPECT_NEAR(got.at("noise bandwidth"), want[1], 1.01e-4) << name;
        EXPECT_NEAR(got.at("highest sidelobe"), want[2], 0.6) << name;
        EXPECT_NEAR(got.at("scalloping loss"), want[3], 0.01) << name;
    }
    EXPECT_NE(printed("window hann --points 1").find("highest sidelobe  none"), std::string::npos);

    EXPECT_EQ(printed("window hann --points 6 -o w.dsp"), "");
    EXPECT_TRUE(
        matches<dsp>(read("w.dsp").at(0), real<dsp>({0, 0.25L, 0.75L, 1, 0.75L, 0.25L}), 2));
    EXPECT_NE(printed("window p601 --plot - --points 8").find("P601, 8 points"), std::string::npos);
}

}  // namespace
}  // namespace wavkit::test
