// What the program makes of windows that slide along a signal, and of the spectra of frames.
#include <cmath>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using SmoothTest = ProgramTest;

TEST_F(SmoothTest, DerivativesInUnitsOfTheAxis) {
    std::vector<long double> cube, slope, line;
    for (int i = 0; i < 200000; ++i) {
        const long double t = i / 1000.0L - 100;
        cube.push_back(t * t * t);
        slope.push_back(3 * t * t);
        line.push_back(6 * t);
    }
    write("x.dsp", Signals{real<dsp>(cube, 0.001), real<dsp>(line, 0.001)});
    printed("smooth x.dsp --window 21 --derivative 1 -o y.dsp");
    const auto y = read("y.dsp");
    ASSERT_EQ(y.size(), 2u);
    EXPECT_TRUE(matches<dsp>(y[0], real<dsp>(slope), 1e6));
    EXPECT_TRUE(matches<dsp>(y[1], real<dsp>(std::vector<long double>(200000, 6)), 1e6));
    printed("smooth x.dsp -o - | wavkit convert - same.dsp");
    EXPECT_TRUE(matches<dsp>(read("same.dsp")[0], real<dsp>(cube), 50));
}

TEST_F(SmoothTest, MediansAndOutliersOfEveryChannel) {
    write("x.csv", "t,a,b\n0,1,5\n1,2,5\n2,90,5\n3,4,-70\n4,5,5\n5,6,5\n");
    const auto table = rows(printed("smooth x.csv --time --method median --window 3 --to csv"));
    const std::vector<std::vector<double>> want{{1.5, 5}, {2, 5}, {4, 5}, {5, 5}, {5, 5}, {5.5, 5}};
    EXPECT_EQ(table, want);
    const auto json = printed("smooth x.csv --time --start 10 --method hampel --window 5 --json");
    EXPECT_NE(json.find("\"outliers\":1,\"outliers_at\":[12]"), json.npos) << json;
    EXPECT_NE(json.find("\"outliers\":1,\"outliers_at\":[13]"), json.npos) << json;
    const auto told = printed("smooth x.csv --time --method hampel --window 5 -o y.csv");
    EXPECT_EQ(told, "1 outliers among 6 samples\n  at 2\n1 outliers among 6 samples\n  at 3\n");
    EXPECT_EQ(rows(contents("y.csv")),
              (std::vector<std::vector<double>>{{1, 5}, {2, 5}, {4, 5}, {4, 5}, {5, 5}, {6, 5}}));
    EXPECT_EQ(
        rows(printed("smooth x.csv --time --method median --window 3 --ends zero --to csv"))[0],
        (std::vector<double>{1, 5}));
}

TEST_F(SmoothTest, FramesGoForthAndBack) {
    write("x.dsp", Signals{sine(100000, 1234, 0.5, 1e-3), sine(1000, 7, 2, 1e-3)});
    printed("stft x.dsp --length 500 --hop 125 --window P601 -o s.dsp");
    printed("stft s.dsp --inverse --length 500 --hop 125 --window P601 -o y.dsp");
    const auto more = shell(
        "wavkit stft s.dsp --signal 2 --inverse --length 500 --hop 125 "
        "--window P601 --points 1002 -o y.dsp");
    EXPECT_NE(more.err.find("no more than 1001 samples, not 1002"), std::string::npos) << more.err;
    const auto x = read("x.dsp"), s = read("s.dsp"), y = read("y.dsp");
    ASSERT_EQ(s.size(), 2u);
    EXPECT_EQ(s[0]->points, 251 * (99999 / 125 + 2));
    EXPECT_NEAR(s[0]->delta, 2, 1e-12);
    // A sine of 12.34 Hz is a share of bin 6 in the frames amid it.
    EXPECT_NEAR(std::hypot(s[0][2 * (251 * 400 + 6)], s[0][2 * (251 * 400 + 6) + 1]), 0.5, 0.01);
    for (const std::size_t i : {0, 1}) {
        Signal<dsp> cut;
        dspu_subvec(y[i], cut, 0, x[i]->points);
        EXPECT_TRUE(matches<dsp>(cut, x[i], 50));
        EXPECT_NEAR(cut->delta, 1e-3, 1e-15);
    }
    printed(
        "stft s.dsp --signal 2 --inverse --length 500 --hop 125 --window P601 --points 1000 -o "
        "y.dsp");
    EXPECT_EQ(read("y.dsp")[0]->points, 1000);
    // Complex samples, through standard output.
    write("z.dsp", Signals{Noise(1).complex<dsp>(3000)});
    printed(
        "stft z.dsp --length 64 | wavkit stft - --inverse --two-sided --length 64 --points 3000 -o "
        "y.dsp");
    EXPECT_TRUE(matches<dsp>(read("y.dsp")[0], read("z.dsp")[0], 50));
}

TEST_F(SmoothTest, WhatMakesNoSenseIsTold) {
    write("x.dsp", Signals{sine(10, 1, 1)});
    write("z.dsp", Signals{Noise(1).complex<dsp>(30)});
    for (const auto& [line, status, told] :
         {std::tuple("smooth x.dsp", 1, "longer than the signal, which has 10"),
          {"smooth x.dsp --window 4", 2, "odd window"},
          {"smooth x.dsp --window 3 --order 3", 2, "takes a window of 5 samples"},
          {"smooth x.dsp --threshold 3", 2, "--method hampel"},
          {"smooth x.dsp --method median --order 3", 2, "--method savgol"},
          {"smooth z.dsp --method median", 1, "only savgol"},
          {"smooth x.dsp --json -o -", 2, "standard output"},
          {"stft z.dsp --inverse --length 64 --hop 64", 2, "smaller --hop"},
          {"stft x.dsp --length 64 --hop 65", 2, "--hop is at most"},
          {"stft x.dsp --inverse", 1, "spectra are complex"},
          {"stft z.dsp --inverse --length 64", 1, "not whole"}}) {
        const auto done = shell(std::string("wavkit ") + line);
        EXPECT_EQ(done.status, status) << line << done.err;
        EXPECT_NE(done.err.find(told), done.err.npos) << line << done.err;
    }
}

}  // namespace
}  // namespace wavkit::test
