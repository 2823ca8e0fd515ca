// Other sampling rates from the command line: every output is the signal at its time.
#include <functional>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using ResampleTest = ProgramTest;

/// Two tones, at a time in samples of a rate of 1.
long double value_at(long double t) {
    return 0.5L * std::sin(2 * pi<long double> * 0.013L * t + 0.3L) +
           0.4L * std::cos(2 * pi<long double> * 0.0411L * t);
}

Signal<dsp> tones(int points, double delta, bool is_complex = false) {
    std::vector<long double> real_parts;
    std::vector<std::complex<long double>> pairs;
    for (int n = 0; n < points; ++n) {
        real_parts.push_back(value_at(n));
        pairs.emplace_back(value_at(n), -value_at(n));
    }
    return is_complex ? complex<dsp>(pairs, delta) : real<dsp>(real_parts, delta);
}

/// Whether a signal holds the tones at every step-th time, but for what their sudden begin and end
/// spoil; in the imaginary parts upside down.
void expect_tones(const Signal<dsp>& y, int points, double step, double tolerance,
                  double margin = 3000) {
    ASSERT_EQ(y->points, points);
    const int width = y->complex ? 2 : 1;
    for (int m = 0; m < points; ++m) {
        const long double t = m * static_cast<long double>(step);
        if (t < margin || t > points * step - margin) continue;
        ASSERT_NEAR(y[width * m], double(value_at(t)), tolerance) << "sample " << m;
        if (width == 2) {
            ASSERT_NEAR(y[2 * m + 1], -double(value_at(t)), tolerance);
        }
    }
}

TEST_F(ResampleTest, EveryOutputIsTheSignalAtItsTime) {
    const int points = 150001;
    write("x.dsp", Signals{tones(points, 1 / 48000.0), tones(20000, 1 / 48000.0, true)});
    struct Way {
        std::string options;
        double ratio, delta, tolerance;
    };
    const double clock = 1 / (1 + 38.5e-6);
    for (const auto& way : std::vector<Way>{
             {"resample --rate 44100 --quality best", 147 / 160.0, 1 / 44100.0, 1e-9},
             {"resample --rate 96000", 2, 1 / 96000.0, 1e-6},
             {"resample --rate 44100.7 --quality best", 44100.7 / 48000, 1 / 44100.7, 1e-9},
             {"resample --ratio 48001/48000 --quality best", 48001 / 48000.0, 1 / 48001.0, 1e-9},
             {"resample --ratio 5/12 --quality fast", 5 / 12.0, 1 / 20000.0, 1e-4},
             {"resample --ratio 0.371 --quality best", 0.371, 1 / (48000 * 0.371), 1e-9},
             {"resample --ppm 38.5 --quality best", clock, 1 / 48000.0, 1e-9},
             {"resample --rate 48000", 1, 1 / 48000.0, 0},
             {"resample --signal 2 --ratio 100", 100, 1 / 4800000.0, 1e-6},
             {"decimate --by 7 --quality best", 1 / 7.0, 7 / 48000.0, 1e-9},
             {"decimate --by 8", 1 / 8.0, 8 / 48000.0, 1e-6}}) {
        SCOPED_TRACE(way.options);
        printed(way.options + " x.dsp -o y.dsp");
        auto y = read("y.dsp");
        if (y.size() == 1) y.insert(y.begin(), y[0]);
        ASSERT_EQ(y.size(), 2u);
        for (const auto& [signal, from] : {std::pair(0u, points), std::pair(1u, 20000)}) {
            if (way.ratio == 100 && signal == 0) continue;
            EXPECT_NEAR(y[signal]->delta / way.delta, 1, 1e-12);
            const auto wanted = int(std::ceil(from * way.ratio - 1e-9));
            expect_tones(y[signal], wanted, 1 / way.ratio, way.tolerance + 1e-15);
        }
    }
}

TEST_F(ResampleTest, WhatHasNoPlaceIsRemoved) {
    // 0.3 of the rate lies beyond half of the new ones, also where they are far below.
    write("x.dsp", Signals{sine(200000, 60000, 1)});
    for (const std::string options :
         {"resample --ratio 1/2", "resample --ratio 0.51", "resample --ratio 1/40",
          "resample --ratio 0.0123", "decimate --by 2", "decimate --by 100", "decimate --by 17"}) {
        printed(options + " --quality best x.dsp -o y.dsp");
        const auto y = read("y.dsp").at(0);
        for (int m = y->points / 4; m < y->points * 3 / 4; ++m)
            ASSERT_NEAR(y[m], 0, 2e-9) << options;
    }
}

TEST_F(ResampleTest, ChannelsAndFormatsPassThrough) {
    write("left.dsp", Signals{tones(100000, 1 / 48000.0)});
    write("both.dsp", Signals{tones(100000, 1 / 48000.0, true)});
    printed("convert both.dsp both.wav --bits 24");
    printed("resample both.wav --rate 44100 -o both.flac");
    const auto channels = through("both.flac");
    ASSERT_EQ(channels.size(), 2u);
    for (int c = 0; c < 2; ++c) {
        auto y = channels[std::size_t(c)];
        EXPECT_EQ(dspi_scale(y, c == 0 ? 1 : -1), 0);
        expect_tones(y, 91875, 160 / 147.0, 3e-7);
    }
    // From a pipe, whose length nobody knows before, and as text.
    const auto piped = shell(
        "wavkit convert left.dsp - --to csv | wavkit decimate - --from csv --by 4 --to csv "
        "| wavkit convert - y.dsp --from csv");
    EXPECT_EQ(piped.status, 0) << piped.err;
    expect_tones(read("y.dsp").at(0), 25000, 4, 1e-6);
    printed("decimate left.dsp --by 4 --with-time -o y.csv");
    EXPECT_NEAR(rows(contents("y.csv")).at(24999).at(0), 24999 * 4 / 48000.0, 1e-12);
    for (const int points : {0, 1, 5}) {
        write("short.dsp", Signals{tones(points, 1)});
        printed("resample short.dsp --ratio 3/2 -o y.dsp");
        EXPECT_EQ(read("y.dsp").at(0)->points, (points * 3 + 1) / 2);
    }
}

TEST_F(ResampleTest, TimesAreReadFromAFile) {
    write("x.dsp", Signals{tones(100000, 0.5)});
    std::string times;
    std::vector<double> list;
    for (double t = 3000; t < 45000; t += 17.3 + 10 * std::sin(t)) list.push_back(t);
    for (const double t : list) times += std::to_string(t) + "\n";
    write("times.txt", times);
    printed("resample x.dsp --to-times times.txt --quality best -o y.dsp");
    const auto y = read("y.dsp").at(0);
    ASSERT_EQ(y->points, int(list.size()));
    for (int m = 0; m < y->points; ++m) {
        const double t = std::stod(std::to_string(list[std::size_t(m)]));
        ASSERT_NEAR(y[m], double(value_at(2 * t)), 1e-9) << t;
    }
}

TEST_F(ResampleTest, CallsWithoutSenseAreRefused) {
    write("x.txt", "1\n2\n3\n");
    write("falling.txt", "2\n1\n");
    write("early.txt", "-1\n1\n");
    write("late.txt", "1\n3\n");
    for (const std::string options :
         {"", "--rate 2 --ratio 2", "--ratio 0", "--ratio 2/0", "--ratio 1/2/3", "--ratio x",
          "--rate 0", "--rate nan", "--to-times early.txt --to csv --with-time",
          "--to-times early.txt --ppm 3", "--rate 2 --quality top"}) {
        EXPECT_EQ(shell("wavkit resample x.txt -o y.dsp " + options).status, 2) << options;
    }
    for (const std::string times : {"falling", "early", "late"}) {
        EXPECT_EQ(shell("wavkit resample x.txt -o y.dsp --to-times " + times + ".txt").status, 1);
    }
    for (const std::string ratio : {"1001", "9e-7"}) {
        EXPECT_EQ(shell("wavkit resample x.txt -o y.dsp --ratio " + ratio).status, 1);
    }
    EXPECT_EQ(shell("wavkit decimate x.txt -o y.dsp").status, 2);
    EXPECT_EQ(shell("wavkit decimate x.txt --by 0 -o y.dsp").status, 2);
    EXPECT_FALSE(files().contains("y.dsp"));
    // Interpolation to a lower rate says who does it better.
    const auto told = shell("wavkit interp x.txt --rate 0.5 -o y.dsp");
    EXPECT_EQ(told.status, 0);
    EXPECT_NE(told.err.find("wavkit resample"), std::string::npos);
    EXPECT_EQ(shell("wavkit interp x.txt --rate 1 -o y.dsp").err, "");
}

}  // namespace
}  // namespace wavkit::test
