// Spectra at any length, densities, and averages over the segments of long recordings.
#include <algorithm>
#include <random>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

class SegmentsTest : public ProgramTest {
  protected:
    /// The rows of a spectrum through the uniform window unless `options` say otherwise.
    std::vector<std::vector<double>> spectrum(const std::string& options) const {
        return rows(printed("spectrum " + options + " -o - --to csv"));
    }
};

/// White noise, equally distributed from -1 to 1.
Signal<dsp> noise(int n, double delta) {
    std::mt19937 random(5);
    std::vector<long double> samples;
    for (int i = 0; i < n; ++i) samples.push_back(2.0L * random() / 4294967296.0L - 1);
    return real<dsp>(samples, delta);
}

double mean_square(const Signal<dsp>& x) {
    double sum = 0;
    for (int i = 0; i < x->points; ++i) sum += x[i] * x[i];
    return sum / x->points;
}

TEST_F(SegmentsTest, AnyLengthTakesAllSamplesAndNoZeros) {
    write("x.dsp", Signals{sine(1009, 100, 3, 0.5)});  // a prime
    for (const std::string window : {"none", "Hann", "Kaiser90"}) {
        const auto table = spectrum("x.dsp --any-length --window " + window);
        ASSERT_EQ(table.size(), 505u);
        EXPECT_NEAR(table[100][1], 3, 0.002) << window;
        EXPECT_DOUBLE_EQ(table[100][0], 100 / (1009 * 0.5));
    }
    write("x.dsp", Signals{sine(9, 4, 3), sine(8, 4, 3)});
    EXPECT_NEAR(spectrum("x.dsp --signal 2 --window none --any-length")[4][1], 3 * std::sin(0.4),
                1e-12);  // half the sampling rate has no mirror image
    EXPECT_NEAR(spectrum("x.dsp --points 5 --any-length")[2][0], 0.4, 1e-12);
    const auto both = spectrum("x.dsp --window none --any-length --two-sided");
    ASSERT_EQ(both.size(), 9u);
    EXPECT_NEAR(both[0][1], 1.5, 1e-12);
    EXPECT_DOUBLE_EQ(both[4][0], 0);
}

TEST_F(SegmentsTest, DensitiesAddUpToTheMeanSquare) {
    for (const int n : {1024, 1009, 1000}) {
        const auto x = noise(n, 0.01);
        write("x.dsp", Signals{x});
        for (const std::string options : {"--any-length", "", "--any-length --two-sided"}) {
            const auto table = spectrum("x.dsp --window none --density " + options);
            double sum = 0;
            for (const auto& row : table) sum += row[1] * row[1] * (table[1][0] - table[0][0]);
            EXPECT_NEAR(sum, mean_square(x), 1e-12) << n << options;
        }
    }
}

TEST_F(SegmentsTest, WhiteNoiseReadsItsDensityThroughEveryWindow) {
    const auto x = noise(1 << 17, 1e-3);
    write("x.dsp", Signals{x});
    const double two_sided = std::sqrt(mean_square(x) / 1000);
    const auto level = [&](const std::string& options) {
        const auto table = spectrum("x.dsp --average 500 --density " + options);
        double sum = 0;
        for (std::size_t i = 1; i + 1 < table.size(); ++i) sum += table[i][1] * table[i][1];
        return std::sqrt(sum / double(table.size() - 2)) / two_sided;
    };
    for (const std::string window : {"Uniform", "Hann", "Flattop", "Kaiser70"}) {
        EXPECT_NEAR(level("--window " + window), std::sqrt(2), 0.008) << window;
    }
    EXPECT_NEAR(level("--window Flattop --any-length"), std::sqrt(2), 0.008);
    EXPECT_NEAR(level("--window Kaiser80 --two-sided --overlap 75"), 1, 0.008);
    EXPECT_NEAR(20 * std::log10(spectrum("x.dsp --density --average 512")[9][1]),
                spectrum("x.dsp --density --average 512 --db")[9][1], 1e-9);
}

TEST_F(SegmentsTest, AveragesAreWhatTheirTypeSays) {
    // Segments of amplitude 1, 2 and 4, and a rest that fills none.
    std::vector<long double> samples;
    for (int i = 0; i < 3 * 64 + 63; ++i) {
        samples.push_back((1 << i / 64) * std::sin(2 * pi<long double> * i / 8 + 0.3L));
    }
    write("x.dsp", Signals{real<dsp>(samples)});
    const struct {
        std::string type;
        double want;
    } cases[] = {
        {"", std::sqrt(21.0 / 3)},
        {"--type linear", std::sqrt(21.0 / 3)},
        {"--type max", 4},
        {"--type MIN", 1},
        {"--type harmonic", std::sqrt(3 / (1 + 1.0 / 4 + 1.0 / 16))},
        {"--type log", 2},
        {"--type last", 4},
        {"--type every --every 3", 1},
        {"--type every --every 2", 4},
        {"--forget 2", std::sqrt(0.5 * 16 + 0.5 * (0.5 * 4 + 0.5 * 1))},
    };
    for (const auto& [type, want] : cases) {
        const auto table = spectrum("x.dsp --window none --average 64 --overlap 0 " + type);
        ASSERT_EQ(table.size(), 33u);
        EXPECT_NEAR(table[8][1], want, 1e-12) << type;
    }
    // Overlapping by half, two segments lie across a step.
    EXPECT_NE(printed("spectrum x.dsp --average 64").find("6 segments of 64 samples"),
              std::string::npos);
    EXPECT_NE(printed("spectrum x.dsp --average 64 --overlap 75").find("12 segments"),
              std::string::npos);
}

/// The same bytes as a machine of the other order writes them.
std::string other_order(const Signal<dsp>& x) {
    std::string bytes;
    const auto put = [&](auto value) {
        std::string field(reinterpret_cast<const char*>(&value), sizeof value);
        std::ranges::reverse(field);
        bytes += field;
    };
    put(0xEB0330BEu), put(1032u), put(x->points), put(x->complex), put(x->delta);
    for (int i = 0; i < x->points * (x->complex ? 2 : 1); ++i) put(x[i]);
    return bytes;
}

TEST_F(SegmentsTest, EverySourceGivesTheSame) {
    const auto x = noise(40000, 1.0 / 8000), other = sine(40000, 7, 0.5, 1.0 / 8000);
    write("x.dsp", Signals{x, other});
    write("swapped.dsp", other_order(x));
    printed("convert x.dsp x.wav");
    printed("convert x.dsp x.csv --with-time --signal 1");
    const std::string options = " --average 3000 --overlap 30 --slope --detrend";
    const auto want = spectrum("x.dsp" + options);
    for (const std::string source :
         {"swapped.dsp", "x.wav --channel 1", "x.wav --signal 1", "x.csv", "- <x.dsp"}) {
        const auto got = spectrum(source + options);
        ASSERT_EQ(got.size(), want.size()) << source;
        for (std::size_t i = 0; i < want.size(); ++i) {
            EXPECT_NEAR(got[i][0], want[i][0], 1e-7 * want.back()[0]) << source;
            EXPECT_NEAR(got[i][1], want[i][1], 1e-5 * want[10][1]) << source;
        }
    }
    EXPECT_EQ(shell("wavkit spectrum --average 64 x.csv").err, "");
    EXPECT_NE(shell("wavkit spectrum x.dsp --average 64").err.find("--signal"), std::string::npos);
    EXPECT_NE(shell("wavkit spectrum x.wav --average 64").err.find("--channel"), std::string::npos);

    write("z.dsp", Signals{complex<dsp>({{0, 3}, {3, 0}, {0, -3}, {-3, 0}, {0, 3}, {3, 0}})});
    EXPECT_EQ(
        rows(printed("spectrum z.dsp --window none --average 4 --overlap 75 --peaks 1")).at(0),
        (std::vector<double>{-0.25, 4, 3}));
    printed("spectrum x.dsp --average 64 -o bins.dsp --signal 1");
    EXPECT_EQ(read("bins.dsp").at(0)->complex, 0);
    EXPECT_NEAR(read("bins.dsp").at(0)[20], spectrum("x.dsp --average 64 --signal 1")[20][1], 0);
}

TEST_F(SegmentsTest, TheWaterfallShowsWhatWasWhen) {
    // 16 bins up for the first half of the time, 48 for the second; gnuplot hands its script out.
    std::vector<long double> samples;
    const int n = 128 * 1500;
    for (int i = 0; i < n; ++i) {
        samples.push_back(2 * std::sin(2 * pi<long double> * i * (i < n / 2 ? 16 : 48) / 128));
    }
    write("x.dsp", Signals{real<dsp>(samples, 1.0 / 128)});
    write("gnuplot", "#!/bin/sh\nexec /bin/cat\n");
    const auto done = shell(
        "chmod +x gnuplot; PATH=$PWD:$PATH; wavkit spectrum x.dsp --average 128 --overlap 0 "
        "--window none --waterfall w.png --unit s");
    ASSERT_EQ(done.status, 0) << done.err;
    EXPECT_EQ(done.out, "");
    const auto script = contents("w.png");
    EXPECT_NE(script.find("set xlabel 'time (s)'"), std::string::npos);
    EXPECT_NE(script.find("set xrange [0:1500]"), std::string::npos) << script.substr(0, 900);
    EXPECT_NE(script.find("set yrange [-0.5:64.5]"), std::string::npos);
    const auto cells = rows(script.substr(script.find("$cells"), script.rfind("EOD")));
    ASSERT_GE(cells.size(), 65u);
    ASSERT_EQ(cells[16].size(), 750u);  // two segments each
    EXPECT_NEAR(cells[16][100], 20 * std::log10(2.0), 1e-3);
    EXPECT_NEAR(cells[48][600], 20 * std::log10(2.0), 1e-3);
    EXPECT_LT(cells[48][100], -200);
    EXPECT_LT(cells[16][600], -200);

    printed("spectrum x.dsp --waterfall w.png --density --band 10 50");
    EXPECT_TRUE(contents("w.png").starts_with("\x89PNG\r\n"));
}

}  // namespace
}  // namespace wavkit::test
