// Levels and integrals of recordings that are known.
#include <cmath>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using LevelsTest = ProgramTest;

constexpr double rate = 48000;

/// A sine at a level, for two seconds.
Signal<dsp> tone(double f, double level, double reference = 1) {
    return sine(96000, 2 * f, reference * std::sqrt(2) * std::pow(10, level / 20), 1 / rate);
}

TEST_F(LevelsTest, OfTonesThroughWeightingsAndBands) {
    write("x.dsp", Signals{tone(1000, -20), tone(63.0957, -10)});
    const auto json = printed("levels x.dsp --octaves 3 --json");
    EXPECT_NEAR(member(json, "leq"), -20, 0.01);
    EXPECT_NEAR(member(json, "max"), -20, 0.05);
    EXPECT_NEAR(member(json, "peak"), -20 + 3.01, 0.3);
    EXPECT_NEAR(member(json, "exposure"), -20 + 3.01, 0.01);
    EXPECT_NEAR(member(json, "l50"), -20, 0.05);
    EXPECT_EQ(member(json, "response_ms"), 125);
    // The bands begin at 20 Hz: the 18th is that of 1 kHz. (The first level is that of the whole.)
    EXPECT_NEAR(member(json, "centre", 17), 1000, 1e-9);
    EXPECT_NEAR(member(json, "leq", 18), -20, 0.01);
    EXPECT_LT(member(json, "leq", 16), -20 - 16.6);
    const auto second = printed("levels x.dsp --signal 2 --weighting C --response slow --json");
    EXPECT_NEAR(member(second, "leq"), -10 - 0.8, 0.1);
    // (2 s are no five time constants.)
    EXPECT_NE(second.find("\"min\":null"), second.npos) << second;
    const auto brief = printed("levels x.dsp --signal 2 --response slow --octaves 1");
    EXPECT_NE(brief.find("no least, L10, L50, L90: they begin after five time constants, 5 s"),
              brief.npos)
        << brief;
    EXPECT_EQ(brief.find("nan"), brief.npos) << brief;
    for (const std::string way : {"-o l.csv", "--plot l.svg"}) {
        const auto done = shell("wavkit levels x.dsp --signal 2 --response slow " + way);
        EXPECT_EQ(done.status, 1) << way;
        EXPECT_NE(done.err.find("five time constants, 5 s"), done.err.npos) << done.err;
    }
    EXPECT_NEAR(member(printed("levels x.dsp --signal 2 --json"), "leq"), -10 - 26.2, 0.1);
    const auto text = printed("levels x.dsp --octaves 1 --weighting z");
    EXPECT_NE(text.find("Leq           -20.00 dB\n"), text.npos) << text;
    EXPECT_NE(text.find("\n      31.5 "), text.npos) << text;
    EXPECT_NE(text.find("\n     16000 "), text.npos) << text;
    printed("levels x.dsp --signal 1 --every 0.25 -o course.csv");
    const auto course = rows(contents("course.csv"));
    ASSERT_EQ(course.size(), 6u);  // from five time constants on
    EXPECT_EQ(course[0][0], 0.75);
    EXPECT_NEAR(course.back()[1], -20, 0.05);
}

TEST_F(LevelsTest, AreCalibrated) {
    write("x.dsp", Signals{tone(500, 60, 0.003)});
    write("calibrator.dsp", Signals{tone(1000, 114, 0.003)});
    const auto a = member(printed("levels x.dsp --calibrator calibrator.dsp --calibrator-level 114 "
                                  "--json"),
                          "leq");
    EXPECT_NEAR(a, 60 - 3.2, 0.1);
    EXPECT_NEAR(member(printed("levels x.dsp --reference 0.003 --json"), "leq"), a, 1e-9);
    for (const auto& [arguments, words] :
         {std::pair("x.dsp --calibrator calibrator.dsp --reference 2", "exclude each other"),
          {"x.dsp --rate 1500", "is too low for the weighting"},
          {"x.dsp --weighting z --octaves 1 --band 20 32000", "out of reach"},
          {"x.dsp --band 100 200", "goes with --octaves"},
          {"x.dsp --response quick", "fast, slow or a number"},
          {"x.dsp --every 1e-9", "no useful number of samples"}}) {
        const auto done = shell(std::string("wavkit levels ") + arguments);
        EXPECT_NE(done.status, 0) << arguments;
        EXPECT_NE(done.err.find(words), std::string::npos) << done.err;
    }
}

TEST_F(LevelsTest, IntegralsHaveNoDrift) {
    const double w = 2 * M_PI * 20;
    std::vector<long double> a;
    for (int n = 0; n < 20000; ++n) a.push_back(9.81 - w * w * std::sin(w * n * 1e-3));
    write("a.dsp", Signals{real<dsp>(a, 1e-3)});
    printed(
        "integrate a.dsp --highpass 5 --twice -o x.dsp && wavkit integrate a.dsp --highpass 5 "
        "-o v.dsp");
    const auto x = read("x.dsp").at(0), v = read("v.dsp").at(0);
    ASSERT_EQ(x->points, 20000);
    for (int n = 3000; n < 17000; n += 7) {
        EXPECT_NEAR(x[n], std::sin(w * n * 1e-3), 1e-4);
        EXPECT_NEAR(v[n] / w, std::cos(w * n * 1e-3), 1e-4);
    }
    EXPECT_EQ(printed("integrate a.dsp --highpass 5 --plot x.svg"), "");
    EXPECT_NE(contents("x.svg").find("integrated"), std::string::npos);
    EXPECT_EQ(shell("wavkit integrate a.dsp --plot x.svg").status, 2);
    EXPECT_EQ(shell("wavkit integrate a.dsp --twice").status, 2);
    EXPECT_EQ(shell("wavkit integrate a.dsp --highpass 2 --detrend").status, 2);
    EXPECT_EQ(shell("wavkit integrate a.dsp --highpass 450 -o y.dsp").status, 1);
}

}  // namespace
}  // namespace wavkit::test
