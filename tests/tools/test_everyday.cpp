// Signals cut, scaled, mixed, joined, differentiated, integrated and generated.
#include <array>
#include <random>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using EverydayTest = ProgramTest;
using Samples = std::vector<long double>;

/// Longer than the blocks in which commands read.
constexpr int long_points = 150001;

Samples noise(unsigned seed, int points = long_points) {
    std::mt19937 bits(seed);
    std::uniform_real_distribution<double> values(-1, 1);
    Samples samples;
    for (int i = 0; i < points; ++i) samples.push_back(values(bits));
    return samples;
}

template <class Function>
Samples mapped(const Samples& x, Function function) {
    Samples y;
    for (std::size_t i = 0; i < x.size(); ++i) y.push_back(function(i));
    return y;
}

TEST_F(EverydayTest, EachSampleGoesWhereItBelongs) {
    const double delta = 0.01;
    const auto a = noise(1), b = noise(2), c = noise(3, 70000);
    write("a.dsp", Signals{real<dsp>(a, delta)});
    write("ab.dsp", Signals{real<dsp>(a, delta), real<dsp>(b, delta)});
    write("c.dsp", Signals{real<dsp>(c, delta)});
    const auto at = [](const Samples& x, std::size_t i) { return i < x.size() ? x[i] : 0; };
    const auto part = [](const Samples& x, long from, long to) {
        return Samples(x.begin() + from, x.begin() + to);
    };
    Samples row = a, total;
    row.insert(row.end(), c.begin(), c.end());
    long double sum = 0, mean = 0;
    for (const auto v : a) mean += v / a.size();
    for (const auto v : a) total.push_back(sum += static_cast<long double>(delta) * (v - mean));
    const struct {
        std::string line;
        std::vector<Samples> want;
        double tolerance;  // some epsilons
    } cases[] = {
        {"cut ab.dsp --begin 700.004 --end 1400",
         {part(a, 70001, 140000), part(b, 70001, 140000)},
         0},
        {"cut a.dsp --begin 0.07 --length 0.3", {part(a, 7, 37)}, 0},  // 0.37 / 0.01 < 37
        {"cut - --samples --begin 65536 --length 65536 <a.dsp", {part(a, 65536, 131072)}, 0},
        {"scale ab.dsp --gain -2 --offset 3",
         {mapped(a, [&](auto i) { return 3 - 2 * a[i]; }),
          mapped(b, [&](auto i) { return 3 - 2 * b[i]; })},
         4},
        {"scale a.dsp --calibrate 1=5 -1=3", {mapped(a, [&](auto i) { return 4 + a[i]; })}, 4},
        {"mix a.dsp c.dsp --gains 0.5,-3",
         {mapped(a, [&](auto i) { return a[i] / 2 - 3 * at(c, i); })},
         4},
        {"join a.dsp c.dsp", {row}, 0},
        {"join ab.dsp ab.dsp --channels", {a, a, b, b}, 0},
        {"derive a.dsp",
         {mapped(a, [&](auto i) { return (a[i ? i : 1] - a[i ? i - 1 : 0]) / delta; })},
         300},
        {"derive a.dsp --from-zero | wavkit integrate -", {a}, 1e5},
        {"integrate a.dsp --detrend", {total}, 1e5},
    };
    for (const auto& [line, want, tolerance] : cases) {
        const auto done = shell("wavkit " + line + " >y.dsp");
        ASSERT_EQ(done.status, 0) << line << done.err;
        EXPECT_EQ(done.err.find("zeros follow") == done.err.npos, line.find("mix") == line.npos);
        const auto got = read("y.dsp");
        ASSERT_EQ(got.size(), want.size()) << line;
        for (std::size_t s = 0; s < want.size(); ++s) {
            EXPECT_EQ(got[s]->delta, delta);
            ASSERT_EQ(got[s]->points, int(want[s].size())) << line;
            for (int i = 0; i < got[s]->points; ++i) {
                const auto value = want[s][std::size_t(i)];
                ASSERT_NEAR(got[s][i], double(value), tolerance * 3e-16)
                    << line << ", sample " << i;
            }
        }
    }
}

TEST_F(EverydayTest, ChannelsStayApart) {
    // The same commands on the channels of sound, into sound and into signal files.
    write("l.dsp", Signals{real<dsp>({0, 1, 2, 3}, 0.125)});
    write("r.dsp", Signals{real<dsp>({5, 5, 6, 8}, 0.125)});
    printed("join l.dsp r.dsp --channels -o lr.wav");
    const Signals both{real<dsp>({0, 1, 2, 3}, 0.125), real<dsp>({5, 5, 6, 8}, 0.125)};
    const auto expect = [&](const std::string& line, const Signals& want) {
        for (const std::string name : {"y.dsp", "y.wav", "y.txt"}) {
            printed(line + " -o " + name);
            const auto got = through(name);
            ASSERT_EQ(got.size(), want.size()) << line << name;
            for (std::size_t i = 0; i < want.size(); ++i) {
                EXPECT_TRUE(matches<dsp>(got[i], want[i], 2)) << line << name;
            }
        }
    };
    expect("scale lr.wav --gain 1", both);
    expect("cut lr.wav --begin 0.125 --end 0.375",
           {real<dsp>({1, 2}, 0.125), real<dsp>({5, 6}, 0.125)});
    expect("derive lr.wav", {real<dsp>({8, 8, 8, 8}, 0.125), real<dsp>({0, 0, 8, 16}, 0.125)});
    expect("mix lr.wav l.dsp", {real<dsp>({0, 2, 4, 6}, 0.125), real<dsp>({5, 6, 8, 11}, 0.125)});
    expect("scale lr.wav --channel 2 --offset 1", {real<dsp>({6, 6, 7, 9}, 0.125)});
    // A real signal joins a complex one as its real part; the offset is that of the real part.
    write("z.dsp", Signals{complex<dsp>({{1, 2}, {3, 4}}, 0.125)});
    printed("join z.dsp l.dsp -o y.dsp");
    EXPECT_TRUE(matches<dsp>(read("y.dsp").at(0),
                             complex<dsp>({{1, 2}, {3, 4}, {0, 0}, {1, 0}, {2, 0}, {3, 0}}), 0));
    printed("scale z.dsp --gain 2 --offset 1 -o y.dsp");
    EXPECT_TRUE(matches<dsp>(read("y.dsp").at(0), complex<dsp>({{3, 4}, {7, 8}}), 0));
}

/// What a wave is at a phase, in cycles.
double square_at(double p, double duty) { return p - std::floor(p) < duty ? 1 : -1; }
double triangle_at(double p, double rise) {
    p += rise / 2;
    p -= std::floor(p);
    return p < rise ? 2 * p / rise - 1 : 1 - 2 * (p - rise) / (1 - rise);
}

TEST_F(EverydayTest, WavesHaveTheirShapes) {
    const int n = 4000;
    const double pi2 = 2 * pi<double>, ratio = std::log(50.0);
    const std::pair<std::string, std::function<double(double)>> waves[] = {
        {"sine 50 amp=2 phase=30",
         [&](double t) { return 2 * std::sin(pi2 * (50 * t + 1 / 12.0)); }},
        {"square 50 duty=0.2 offset=1",
         [&](double t) { return 1 + square_at(50 * t + 1e-7, 0.2); }},
        {"triangle 30 symmetry=0.3", [&](double t) { return triangle_at(30 * t, 0.3); }},
        {"sawtooth 30 amp=3", [&](double t) { return 3 * triangle_at(30 * t + 1e-12, 1); }},
        {"sweep 10 500", [&](double t) { return std::sin(pi2 * (10 * t + 245 * t * t)); }},
        {"sweep 10 500 type=log",
         [&](double t) { return std::sin(pi2 * 10 * std::expm1(ratio * t) / ratio); }},
        {"pulse 100 width=0.002 at=0.005 amp=3",
         [&](double t) {
             return t + 1e-7 >= 0.005 && square_at(100 * t - 0.5 + 1e-5, 0.2) > 0 ? 3 : 0;
         }},
        {"pulse 0 at=0.25", [&](double t) { return t == 0.25 ? 1 : 0; }},
    };
    for (const auto& [words, value] : waves) {
        printed("generate " + words + " --rate 4000 --duration 1 -o y.dsp");
        const auto y = read("y.dsp").at(0);
        ASSERT_EQ(y->points, n);
        for (int i = 0; i < n; ++i) {
            ASSERT_NEAR(y[i], value(i / double(n)), 1e-8) << words << ", sample " << i;
        }
    }
}

/// The amplitude of what a signal holds at k cycles in its length, by the sum itself.
double amplitude_at(const Signal<dsp>& y, int k) {
    std::complex<double> sum = 0;
    for (int i = 0; i < y->points; ++i) {
        sum += y[i] * std::polar(1.0, -2 * pi<double> * k * i / y->points);
    }
    return 2 * std::abs(sum) / y->points;
}

TEST_F(EverydayTest, BandsAreLimited) {
    // Fourier series of the waves, up to the limit and no further.
    const auto harmonics = [&](const std::string& words, std::array<double, 4> want) {
        printed("generate " + words + " limit=40 --rate 1000 --points 1000 -o y.dsp");
        const auto y = read("y.dsp").at(0);
        for (int k = 1; k <= 4; ++k)
            EXPECT_NEAR(amplitude_at(y, 10 * k), want[std::size_t(k - 1)], 1e-12) << words;
        for (const int k : {5, 15, 50, 70, 250}) EXPECT_NEAR(amplitude_at(y, k), 0, 1e-12) << words;
    };
    const double p = pi<double>;
    harmonics("square 10", {4 / p, 0, 4 / (3 * p), 0});
    harmonics("triangle 10", {8 / (p * p), 0, 8 / (9 * p * p), 0});
    harmonics("sawtooth 10", {2 / p, 1 / p, 2 / (3 * p), 0.5 / p});
    harmonics("square 10 duty=0.25",
              {4 / p * std::sqrt(0.5), 2 / p, 4 / (3 * p) * std::sqrt(0.5), 0});

    // Noise: its rms value, nothing beyond its band, and an octave up a half or a quarter of the
    // power.
    for (const auto& [words, fall] :
         {std::pair("noise 3", 1.0), {"pink 3", 2.0}, {"brown 3", 4.0}}) {
        printed(std::string("generate ") + words +
                " low=0.05 high=0.2 --seed 7 --points 2000 -o y.dsp");
        const auto y = read("y.dsp").at(0);
        double square = 0, lower = 0, upper = 0;
        for (int i = 0; i < 2000; ++i) square += y[i] * y[i] / 2000;
        EXPECT_NEAR(square, 9, 1e-9) << words;
        for (int k = 100; k < 200; ++k) {
            lower += std::pow(amplitude_at(y, k), 2);
            upper += std::pow(amplitude_at(y, 2 * k), 2);
        }
        EXPECT_NEAR(lower / upper / fall, 1, 0.5) << words;
        for (const int k : {0, 50, 99, 401, 700}) EXPECT_NEAR(amplitude_at(y, k), 0, 1e-12);
    }
    EXPECT_EQ(printed("generate pink --seed 7 --to csv"),
              printed("generate pink --seed 7 --to csv"));
}

}  // namespace
}  // namespace wavkit::test
