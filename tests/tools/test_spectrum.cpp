// Measured spectra against sines of known frequency and amplitude, and real recordings.
#include <algorithm>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using SpectrumTest = ProgramTest;

/// How far a peak between bins may be off, in bins and in relative amplitude; the guide states the
/// same figures.
struct Accuracy {
    const char* window;
    double bins, amplitude;
};
constexpr Accuracy accuracies[] = {
    {"Uniform", 0.24, 0.32},       {"Bartlett", 0.022, 0.07},     {"Hann", 0.017, 0.04},
    {"Hamming", 0.017, 0.05},      {"Blackman", 0.007, 0.012},    {"Blackman_Harris3", 0.006, 0.01},
    {"Lowleak", 0.0032, 0.0036},   {"Gausstop", 5e-6, 0.001},     {"Flat4", 0.16, 0.0006},
    {"Flattop", 0.16, 0.0004},     {"Flat6", 0.17, 0.0003},       {"Flat7", 0.17, 0.0002},
    {"P501", 0.17, 0.0003},        {"P601", 0.17, 0.0002},        {"Kaiser70", 0.0052, 0.0075},
    {"Kaiser80", 0.004, 0.0052},   {"Kaiser90", 0.0032, 0.0037},  {"Kaiser100", 0.0027, 0.0028},
    {"Kaiser110", 0.0023, 0.0022}, {"Kaiser120", 0.0019, 0.0017}, {"Gauss60", 0.003, 0.003},
    {"Gauss70", 0.001, 0.001},     {"Gauss80", 0.0005, 0.0005},   {"Riemann", 0.033, 0.15},
};

TEST_F(SpectrumTest, EveryWindowReadsASineOnABinAndBetweenBins) {
    write("on.dsp", Signals{sine(1024, 200, 3, 1e-3)});
    const double bin = 1000.0 / 1024;
    for (const auto& [window, bins, amplitude] : accuracies) {
        SCOPED_TRACE(window);
        const std::string options = std::string(" --window ") + window;
        const auto table = rows(printed("spectrum on.dsp -o - --to csv" + options));
        ASSERT_EQ(table.size(), 513u);
        EXPECT_DOUBLE_EQ(table[200][0], 200 * bin);
        EXPECT_NEAR(table[200][1], 3,
                    3 * 0.0006);  // flat windows are scaled for the middle of their error
        EXPECT_NEAR(table[400][1], 0, 2e-5);

        for (const double offset : {-0.45, -0.3, -0.12, 0.2, 0.37, 0.49}) {
            write("off.dsp", Signals{sine(1024, 200 + offset, 3, 1e-3)});
            const auto peak = rows(printed("spectrum off.dsp --peaks 1" + options)).at(0);
            EXPECT_NEAR(peak[0] / bin, 200 + offset, bins + 2e-6);
            EXPECT_NEAR(peak[1], 1 / peak[0], 1e-7);
            EXPECT_NEAR(peak[2] / 3, 1, amplitude + 1e-5);
        }
    }
}

TEST_F(SpectrumTest, PaddingAndShortRecordsKeepTheScale) {
    write("x.dsp", Signals{sine(1000, 100.3, 2, 0.01)});  // 10.03 Hz
    for (const auto& [window, bins, amplitude] : accuracies) {
        for (const std::string options : {"", "--fraction 0.5", "--points 512", "--points 5000"}) {
            SCOPED_TRACE(std::string(window) + " " + options);
            const auto peak = rows(printed(std::string("spectrum x.dsp --peaks 1 --window ") +
                                           window + " " + options))
                                  .at(0);
            EXPECT_NEAR(peak[0], 10.03, 0.5 * 100.0 / 512);
            EXPECT_NEAR(peak[2] / 2, 1, amplitude + 0.002);
        }
    }
}

TEST_F(SpectrumTest, SidesConstantsAndDecibels) {
    std::vector<long double> samples;
    for (int i = 0; i < 64; ++i)
        samples.push_back(5 + 2 * std::cos(pi<long double> * i / 8) + i % 2);
    write("x.dsp", Signals{real<dsp>(samples, 0.25)});
    const auto spectrum = [&](const std::string& options) {
        return rows(printed("spectrum x.dsp --window none -o - --to csv " + options));
    };
    const auto one = spectrum("");
    ASSERT_EQ(one.size(), 33u);
    EXPECT_NEAR(one[0][1], 5.5, 1e-12);  // the constant as itself
    EXPECT_NEAR(one[4][1], 2, 1e-12);
    EXPECT_NEAR(one[32][1], 0.5, 1e-12);  // and the alternation of +-0.5
    EXPECT_EQ(one[32][0], 2);

    const auto two = spectrum("--two-sided");
    ASSERT_EQ(two.size(), 64u);
    EXPECT_EQ(two[0][0], -2);
    EXPECT_NEAR(two[28][1], 1, 1e-12);
    EXPECT_NEAR(two[32][1], 5.5, 1e-12);
    EXPECT_NEAR(two[36][1], 1, 1e-12);
    EXPECT_EQ(two[36][0], 0.25);

    EXPECT_NEAR(spectrum("--db")[4][1], 20 * std::log10(2.0), 1e-12);
    EXPECT_NEAR(spectrum("--detrend")[0][1], 0, 1e-12);
    const auto parts = spectrum("--complex")[4];
    EXPECT_NEAR(std::hypot(parts[1], parts[2]), 2, 1e-12);
    const auto band = spectrum("--band 0.18 0.32");
    ASSERT_EQ(band.size(), 3u);
    EXPECT_EQ(band[0][0], 0.1875);

    // Seven samples through a window that fills its record: half a bin short of half the rate.
    write("odd.dsp", Signals{real<dsp>({1, 1, 1, 1, 1, 1, 1})});
    const auto odd = rows(printed("spectrum odd.dsp --window kaiser70 -o - --to csv"));
    ASSERT_EQ(odd.size(), 4u);
    EXPECT_NEAR(odd[0][1], 1, 1e-12);
    EXPECT_DOUBLE_EQ(odd[3][0], 3.0 / 7);
    // Complex bins are as the transform leaves them, the edges doubled; decibels are real.
    printed("spectrum x.dsp --window none -o x.sig");
    EXPECT_NEAR(read("x.sig").at(0)[0], 11, 1e-12);
    EXPECT_EQ(read("x.sig")[0]->delta, one[1][0]);
    printed("spectrum x.dsp --window hamming --db -o x.sig");
    EXPECT_EQ(read("x.sig").at(0)->complex, 0);

    write("z.dsp", Signals{complex<dsp>({{0, 3}, {3, 0}, {0, -3}, {-3, 0}})});  // 3 at -1/4
    EXPECT_EQ(rows(printed("spectrum z.dsp --window none --peaks 1")).at(0),
              (std::vector<double>{-0.25, 4, 3}));
}

TEST_F(SpectrumTest, Pictures) {
    write("x.dsp", Signals{sine(4096, 400, 1)});
    printed("spectrum x.dsp --plot x.png --peaks 1");
    EXPECT_TRUE(contents("x.png").starts_with("\x89PNG\r\n"));
    EXPECT_EQ(printed("spectrum x.dsp --db --plot x.svg"), "");
    EXPECT_NE(contents("x.svg").find("</svg>"), std::string::npos);
    EXPECT_NE(printed("spectrum x.dsp --plot -").find("x.dsp"), std::string::npos);
    const auto before = files();
    const auto done = shell("PATH=/nowhere; wavkit spectrum x.dsp --plot y.png");
    EXPECT_EQ(done.status, 1);
    EXPECT_NE(done.err.find("gnuplot"), std::string::npos) << done.err;
    EXPECT_EQ(files(), before);
}

TEST_F(SpectrumTest, TheSlopeOfASineBeatsTwiceAPeriod) {
    write("x.dsp", Signals{sine(1 << 14, 256, 3, 0.01)});
    const std::string options = "spectrum x.dsp --slope --detrend --any-length --peaks 1";
    const double hertz = 2 * 256 / (0.01 * (1 << 14));
    for (const std::string more : {"", " --average 8192"}) {
        const auto peak = rows(printed(options + more)).at(0);
        EXPECT_NEAR(peak[0], hertz, 1e-3 * hertz) << more;
        // |cos| is 2/pi + 4/(3 pi) cos of twice the angle - ...
        EXPECT_NEAR(peak[2], 3 * pi<double> * hertz * 4 / (3 * pi<double>), 0.02 * peak[2]) << more;
    }
}

TEST_F(SpectrumTest, ZoomsBetweenTwoFrequencies) {
    write("x.dsp", Signals{sine(4000, 50.013 * 4, 3, 1e-3)});
    const std::string zoom = "spectrum x.dsp --zoom 49 51 --zoom-points 2001 ";
    for (const std::string options : {"", "--window Blackman_Harris4 ", "--average 2000 "}) {
        const auto peaks = rows(printed(zoom + options + "--peaks 3"));
        ASSERT_EQ(peaks.size(), 1u) << options;  // neither lobes nor ends
        EXPECT_NEAR(peaks[0][0], 50.013, 1e-4) << options;
        EXPECT_NEAR(peaks[0][2], 3, 1e-3) << options;
    }
    const auto table = rows(printed(zoom + "-o - --to csv"));
    ASSERT_EQ(table.size(), 2001u);
    EXPECT_NEAR(table[0][0], 49, 1e-9);
    EXPECT_NEAR(table[1013][0], 50.013, 1e-9);
    EXPECT_NEAR(table[1013][1], 3, 1e-3);
    for (const std::string options : {"", "--average 2000 "}) {
        printed(zoom + options + "-o z.txt");
        EXPECT_NE(contents("z.txt").find("# start = 49\n"), std::string::npos) << options;
    }
    // Side lobes of what lies beyond are no components; a step over a lobe is told.
    EXPECT_TRUE(rows(printed("spectrum x.dsp --zoom 20 40 --peaks 5")).empty());
    const auto coarse = shell("wavkit spectrum x.dsp --zoom 0 500 --zoom-points 10");
    EXPECT_NE(coarse.err.find("--zoom-points 2001 shows all"), std::string::npos) << coarse.err;
    EXPECT_NE(printed(zoom + "--density").find("zoom of 2001 points"), std::string::npos);
    // The density of noise is the same through a zoom.
    write("n.dsp", Signals{Noise(1).real<dsp>(1 << 14)});
    const auto density = [&](const std::string& options) {
        double squares = 0;
        const auto all = rows(printed("spectrum n.dsp --density -o - --to csv " + options));
        for (const auto& row : all) squares += row[1] * row[1] / double(all.size());
        return squares;
    };
    EXPECT_NEAR(density("--zoom 0.1 0.3 --zoom-points 3277") / density("--band 0.1 0.3"), 1, 0.02);
    for (const auto& [options, status, told] :
         {std::tuple("--zoom 51 49", 2, "from a lower to a higher"),
          {"--zoom 400 600", 1, "there are frequencies from 0 to 500, not from 400 to 600"},
          {"--zoom 49 51 --points 100", 2, "--zoom takes all samples"},
          {"--zoom-points 5", 2, "--zoom"}}) {
        const auto done = shell(std::string("wavkit spectrum x.dsp ") + options);
        EXPECT_EQ(done.status, status) << options;
        EXPECT_NE(done.err.find(told), std::string::npos) << done.err;
    }
}

}  // namespace
}  // namespace wavkit::test
