// Filters and test signals from the command line.
#include <algorithm>
#include <tuple>

#include "support/oracles.hpp"
#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using FilterTest = ProgramTest;
using Complex = std::complex<long double>;

/// The gain of taps at a frequency in cycles a sample, seen from their middle.
Complex gain(const Samples& taps, double f) {
    Complex sum = 0;
    for (std::size_t k = 0; k < taps.size(); ++k) {
        const long double t = (long double)(k) - (long double)(taps.size() - 1) / 2;
        sum += taps[k] * std::polar(1.0L, -two_pi<long double> * f * t);
    }
    return sum;
}

/// Whether y is x convolved with the taps and shifted back, at its ends, around every 65536th
/// sample, where blocks may meet, and here and there. Before and behind x there is nothing, or its
/// first and last sample.
void expect_convolved(const Signal<dsp>& y, const Samples& x, const Samples& taps, int delay,
                      bool hold = false, double tolerance = 1e-13) {
    const Samples got = samples_of<dsp>(y);
    ASSERT_EQ(got.size(), x.size());
    const auto reach = std::ptrdiff_t(taps.size()), n = std::ptrdiff_t(x.size());
    for (std::ptrdiff_t i = 0; i < n; ++i) {
        const auto beyond = i % 65536;
        if (i > reach && i < n - reach && beyond > 3 && beyond < 65533 - delay && i % 997) continue;
        Complex sum = 0;
        for (std::ptrdiff_t k = 0; k < reach; ++k) {
            const auto at = i + delay - k;
            if (!hold && (at < 0 || at >= n)) continue;
            sum += taps[std::size_t(k)] * x[std::size_t(std::clamp<std::ptrdiff_t>(at, 0, n - 1))];
        }
        ASSERT_LE(std::abs(got[std::size_t(i)] - sum), tolerance) << "sample " << i;
    }
}

TEST_F(FilterTest, BlocksAreTheConvolutionOfTheWhole) {
    const Signals taps{Noise(1).real<dsp>(17), Noise(2).complex<dsp>(30)};
    printed("design lowpass 0.02 --length 901 -o long.dsp");
    const Samples length_901 = samples_of<dsp>(read("long.dsp").at(0));
    write("few.dsp", Signals{taps[0]});
    write("complex.dsp", Signals{taps[1]});
    for (const int points : {0, 1, 300, 65536, 150000}) {
        const auto x = Noise(3).real<dsp>(points), z = Noise(4).complex<dsp>(points);
        const Samples at_x = samples_of<dsp>(x), at_z = samples_of<dsp>(z);
        write("x.dsp", Signals{x, z});
        const auto filtered = [&](const std::string& options) {
            printed("filter x.dsp " + options + " -o y.dsp");
            const auto y = read("y.dsp");
            EXPECT_EQ(y.size(), 2u);
            return y;
        };
        SCOPED_TRACE(points);
        auto y = filtered("--taps long.dsp");
        expect_convolved(y.at(0), at_x, length_901, 450);
        expect_convolved(y.at(1), at_z, length_901, 450);
        y = filtered("--taps few.dsp");  // no mirror image of itself: no delay to take out
        expect_convolved(y.at(0), at_x, samples_of<dsp>(taps[0]), 0);
        y = filtered("--taps few.dsp --delay 40 --hold");
        expect_convolved(y.at(0), at_x, samples_of<dsp>(taps[0]), 40, true);
        y = filtered("--taps complex.dsp --hold");
        EXPECT_TRUE(y.at(0)->complex);
        expect_convolved(y.at(0), at_x, samples_of<dsp>(taps[1]), 0, true);
        expect_convolved(y.at(1), at_z, samples_of<dsp>(taps[1]), 0, true);
    }
    const auto x = Noise(3).real<dsp>(70000);
    write("x.dsp", Signals{x});
    printed("convert x.dsp x.csv --with-time --rate 8");
    for (const std::string out : {"y.txt", "y.csv", "y.dsp --type float", "y.wav"}) {
        printed("filter x.csv --taps long.dsp -o " + out);
        const auto y = through(out.substr(0, 5)).at(0);
        EXPECT_EQ(y->delta, 0.125);
        const bool exact = out == "y.txt" || out == "y.csv";
        expect_convolved(y, samples_of<dsp>(x), length_901, 450, false, exact ? 1e-13 : 1e-6);
    }
}

TEST_F(FilterTest, ChannelsAndSignalsAreFilteredEach) {
    auto a = Noise(5).real<dsp>(70000), b = Noise(6).real<dsp>(70000),
         slow = Noise(7).real<dsp>(99);
    a->delta = b->delta = 1e-3;
    slow->delta = 1e-2;
    write("ab.dsp", Signals{a, b});
    printed("convert ab.dsp stereo.wav");
    printed("filter stereo.wav --highpass 100 -o both.wav");
    printed("filter stereo.wav --highpass 100 -o both.csv");
    printed("filter stereo.wav --highpass 100 -o second.wav --channel 2");
    const auto both = through("both.wav"), rows = through("both.csv");
    ASSERT_TRUE(both.size() == 2 && rows.size() == 2);
    printed("design highpass 100 --rate 1000 -o taps.dsp");
    const Samples taps = samples_of<dsp>(read("taps.dsp").at(0));
    const auto delay = int(taps.size() / 2);
    for (int c = 0; c < 2; ++c) {
        const auto whole = samples_of<dsp>(c ? b : a);
        expect_convolved(both[std::size_t(c)], whole, taps, delay, false, 1e-6);
        expect_convolved(rows[std::size_t(c)], whole, taps, delay, false, 1e-6);
    }
    EXPECT_TRUE(matches<dsp>(through("second.wav").at(0), both[1]));

    // One filter behind the other.
    printed("filter ab.dsp --bandstop 200 300 -o - | wavkit filter - --highpass 100 -o y.dsp");
    printed("filter ab.dsp --highpass 100 --bandstop 200 300 -o yy.dsp");
    const auto twice = read("y.dsp"), once = read("yy.dsp");
    for (int i = 1000; i < 69000; ++i) ASSERT_NEAR(once.at(1)[i], twice.at(1)[i], 1e-12) << i;

    // Each signal has its own spacing, and so its own taps.
    write("x.dsp", Signals{a, slow});
    printed("filter x.dsp --lowpass 20 -o y.csv");
    const auto y = through("y.csv");
    ASSERT_EQ(y.size(), 2u);
    printed("design lowpass 20 --rate 100 -o taps.dsp");
    const Samples slow_taps = samples_of<dsp>(read("taps.dsp").at(0));
    expect_convolved(y[1], samples_of<dsp>(slow), slow_taps, int(slow_taps.size() / 2));
    EXPECT_EQ(shell("wavkit filter x.dsp --lowpass 20 -o y.wav").status, 1);
}

TEST_F(FilterTest, DesignsDoWhatTheirNamesSay) {
    const auto taps = [&](const std::string& arguments) {
        printed("design " + arguments + " -o h.dsp");
        return samples_of<dsp>(read("h.dsp").at(0));
    };
    const struct {
        const char* arguments;
        std::vector<std::pair<double, Complex>> gains;
    } designs[] = {
        {"lowpass 0.2", {{0.1, 1}, {0.2, 0.5}, {0.3, 0}}},
        {"lowpass 2000 --rate 10000 --transition 400", {{0.18, 1}, {0.2, 0.5}, {0.22, 0}}},
        {"highpass 0.2 --length 101", {{0.1, 0}, {0.2, 0.5}, {0.4, 1}}},
        {"bandpass 0.1 0.3 --attenuation 80", {{0.05, 0}, {0.1, 0.5}, {0.2, 1}, {0.4, 0}}},
        {"bandstop 0.1 0.3 --window gauss", {{0.03, 1}, {0.1, 0.5}, {0.2, 0}, {0.45, 1}}},
        {"lowpass 0.2 --window kaiser90", {{0.1, 1}, {0.2, 0.5}, {0.3, 0}}},
        {"lowpass 0.2 --window sinc", {{0.1, 1}, {0.2, 0.5}, {0.3, 0}}},
        {"lowpass 0.2 --window SINC2", {{0.1, 1}, {0.2, 0.5}, {0.3, 0}}},
        {"delay 0.4 0.25", {{0, 1}, {0.2, std::polar(1.0L, -0.1L * pi<long double>)}, {0.47, 0}}},
        {"differentiator 0.4", {{0.1, Complex(0, 0.2L * pi<long double>)}, {0.48, 0}}},
        {"hilbert 0.4", {{0.2, Complex(0, 1)}, {0.49, 0}}},
        {"ramp 0.4", {{0.1, 0.2}, {0.3, 0.6}, {0.48, 0}}},
        {"gauss 0.1", {{0, 1}, {0.1, std::sqrt(0.5L)}, {0.2, 0.25}}},
        {"sinh", {{0, 1}}},
        {"sinh-over-root 6 --length 31", {{0, 1}, {0.2, 0}}},
        {"fixed12", {{0, 1}}},
        {"fixed20", {{0.1, 1}, {0.35, 0}}},
    };
    for (const auto& [arguments, gains] : designs) {
        const auto h = taps(arguments);
        for (const auto& [f, want] : gains) {
            EXPECT_LT(std::abs(gain(h, f) - want), 2e-3) << arguments << ' ' << f;
        }
    }
    EXPECT_EQ(taps("lowpass 0.2 --length 20").size(), 20u);
    EXPECT_EQ(read("h.dsp").at(0)->delta, 1);
    taps("sinh --rate 8");
    EXPECT_EQ(read("h.dsp").at(0)->delta, 0.125);
}

TEST_F(FilterTest, FiguresOfADesignAreThoseOfItsTaps) {
    const auto report = printed("design bandpass 100 200 --rate 1000 --attenuation 70");
    printed("design bandpass 100 200 --rate 1000 --attenuation 70 -o h.dsp");
    const Samples h = samples_of<dsp>(read("h.dsp").at(0));
    const auto decibels = [&](double hertz) {
        return double(20 * std::log10(std::abs(gain(h, hertz / 1000))));
    };
    EXPECT_NE(report.find(", " + std::to_string(h.size()) + " taps\n"), std::string::npos);
    EXPECT_NE(report.find("even"), std::string::npos);
    int bands = 0;
    std::istringstream lines(report);
    for (std::string line; std::getline(lines, line);) {
        double low, high, figure;
        if (std::sscanf(line.c_str(), "-%lf dB at %lf, %lf", &figure, &low, &high) == 3) {
            EXPECT_NEAR(decibels(low), -figure, 0.03) << line;
            EXPECT_NEAR(decibels(high), -figure, 0.03) << line;
        } else if (std::sscanf(line.c_str(), "%*s %lf to %lf Hz, %*s %lf", &low, &high, &figure) ==
                   3) {
            const bool passes = line.starts_with("passes");
            double worst = passes ? 0 : -300;
            for (double f = low; f <= high; f += 0.1) {
                worst = std::max(worst, passes ? std::fabs(decibels(f)) : decibels(f));
            }
            EXPECT_NEAR(worst, passes ? figure : -figure, 0.02 * figure) << line;
            EXPECT_TRUE(!passes || (low < 112.6 && high > 187.4)) << line;
            ++bands;
        }
    }
    EXPECT_EQ(bands, 3);
    EXPECT_NE(printed("design hilbert 0.4 --plot -").find("phase"), std::string::npos);
}

TEST_F(FilterTest, GeneratedSignalsAreTheirSums) {
    printed(
        "generate cos 3 amp=0.5 phase=90 + line 2 offset=-1 + cos 40 + cexp -5 amp=2 phase=30 "
        "--rate 100 --duration 6 -o x.dsp");
    const auto x = read("x.dsp").at(0);
    ASSERT_TRUE(x->points == 600 && x->complex && x->delta == 0.01);
    for (int n = 0; n < 600; ++n) {
        const long double t = n / 100.0L, turn = two_pi<long double>;
        const auto want = std::polar(2.0L, turn * (-5 * t + 1.0L / 12)) +
                          (-0.5L * std::sin(turn * 3 * t) + 2 * t - 1 + std::cos(turn * 40 * t));
        ASSERT_LT(std::abs(samples_of<dsp>(x)[std::size_t(n)] - want), 1e-12L) << n;
    }
    EXPECT_EQ(printed("generate line 2 offset=1 --delta 0.5 --points 3 --to csv"),
              "# delta = 0.5\nvalue\n1\n2\n3\n");
    EXPECT_EQ(printed("generate line 1 --complex --points 2 --to csv"), "re,im\n0,0\n1,0\n");
    EXPECT_EQ(printed("generate line 1 --points 0 --to csv"), "value\n");

    const std::tuple<std::string, double, double, double> noises[] = {
        {"0.5", 0, 0.5, -4},
        {"3 type=uniform", 0, 3 / std::sqrt(3.0), -3},
        {"2 type=exponential", 2, 2, 0},
        {"-1 type=laplace", 0, std::sqrt(2.0), -30}};
    for (const auto& [term, mean, deviation, low] : noises) {
        printed("generate noise " + term + " --points 100000 --seed 7 -o n.dsp");
        const auto noise = read("n.dsp").at(0);
        double sum = 0, squares = 0;
        for (const double v : scalars<dsp>(noise)) {
            EXPECT_GE(v, low) << term;
            sum += v;
            squares += v * v;
        }
        EXPECT_NEAR(sum / 1e5, mean, 0.02 * deviation) << term;
        EXPECT_NEAR(std::sqrt(squares / 1e5 - mean * mean), deviation, 0.03 * deviation) << term;
    }
    const auto drawn = [&](const std::string& seed) {
        return printed("generate noise + noise 0.1 --points 9 --to csv" + seed);
    };
    EXPECT_EQ(drawn(" --seed 1"), drawn(" --seed 1"));
    EXPECT_NE(drawn(" --seed 1"), drawn(" --seed 2"));
    EXPECT_NE(drawn(""), drawn(""));
}

TEST_F(FilterTest, CommandsPipe) {
    const auto done = shell(
        "wavkit generate --rate 2000 --duration 8 cos 50 amp=3 + cos 300 amp=5 | "
        "wavkit filter - --lowpass 100 | wavkit spectrum - --any-length --peaks 1 --band 20 900");
    ASSERT_EQ(done.status, 0) << done.err;
    const auto peaks = rows(done.out);
    ASSERT_EQ(peaks.size(), 1u);
    EXPECT_NEAR(peaks[0][0], 50, 0.01);
    EXPECT_NEAR(peaks[0][2], 3, 0.01);
    write("x.txt", "1\n2\n3\n");
    const auto same = shell("wavkit design fixed20 -o - | wavkit filter x.txt --taps - --to csv");
    printed("design fixed20 -o h.txt");
    EXPECT_EQ(same.out, printed("filter x.txt --taps h.txt --to csv"));
    const auto half = shell("wavkit filter x.txt --lowpass 0.1 --length 2 --to csv");
    EXPECT_NE(half.err.find("half a sample"), std::string::npos);
    EXPECT_NE(printed("filter x.txt --lowpass 0.1 --plot - --span 0 1").find("filtered"),
              std::string::npos);
}

}  // namespace
}  // namespace wavkit::test
