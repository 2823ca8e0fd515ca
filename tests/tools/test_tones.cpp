// What the program measures of tones and peaks whose answers are known.
#include <cmath>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using TonesTest = ProgramTest;

Signal<dsp> tone(int n, double delta, double frequency,
                 const std::vector<std::pair<double, double>>& harmonics, double offset = 0) {
    std::vector<long double> x;
    for (int i = 0; i < n; ++i) {
        long double sum = offset;
        for (std::size_t h = 0; h < harmonics.size(); ++h) {
            const long double turns = (long double)(h + 1) * frequency * delta * i;
            const auto& [level, degrees] = harmonics[h];
            sum += level * std::cos(2 * pi<long double> * (turns + degrees / 360.0L));
        }
        x.push_back(sum);
    }
    return real<dsp>(x, delta);
}

TEST_F(TonesTest, SinesAreFittedInUnitsOfTheAxis) {
    write("x.dsp", Signals{tone(1000, 1e-3, 49.7, {{3, 75}}, 0.5)});
    for (const std::string options : {"", " --near 49.5"}) {
        const auto json = printed("fit x.dsp --sine --json" + options);
        EXPECT_NEAR(member(json, "frequency"), 49.7, 1e-9);
        EXPECT_NEAR(member(json, "amplitude"), 3, 1e-9);
        EXPECT_NEAR(member(json, "phase"), 75, 1e-7);
        EXPECT_NEAR(member(json, "offset"), 0.5, 1e-9);
        EXPECT_LT(member(json, "residual_rms"), 1e-9);
        EXPECT_LT(member(json, "frequency_error"), 1e-9);
    }
    EXPECT_EQ(member(printed("fit x.dsp --sine --at 50 --json"), "frequency"), 50);
    EXPECT_NE(printed("fit x.dsp --sine --rate 1000").find("frequency (Hz)"), std::string::npos);
    EXPECT_EQ(shell("wavkit fit x.dsp --at 50").status, 2);
    EXPECT_EQ(shell("wavkit fit x.dsp --sine --degree 2").status, 2);
    write("z.dsp", Signals{complex<dsp>({1, 2, 3, 4, 5})});
    EXPECT_EQ(shell("wavkit fit z.dsp --sine").err,
              "wavkit: z.dsp: a sine is fitted to a real signal\n");
    write("short.dsp", Signals{real<dsp>({1, 2, 3})});
    EXPECT_EQ(shell("wavkit fit short.dsp --sine").err,
              "wavkit: short.dsp: a sine takes 4 samples\n");
}

TEST_F(TonesTest, HarmonicsOfEverySignal) {
    const double delta = 1 / 48000.0;
    write("x.dsp", Signals{tone(16384, delta, 997, {{1, 30}, {1e-3, -60}, {0, 0}, {2e-3, 90}}, 0.1),
                           tone(16384, delta, 9000, {{0.5, 0}, {0, 0}, {5e-4, 10}})});
    const auto json = printed("distortion x.dsp --json --full-scale 2");
    EXPECT_NEAR(member(json, "frequency"), 997, 1e-5);
    EXPECT_NEAR(member(json, "phase"), 30, 1e-3);
    EXPECT_NEAR(member(json, "offset"), 0.1, 1e-5);
    EXPECT_NEAR(member(json, "thd"), std::sqrt(5e-6), 1e-6);
    EXPECT_NEAR(member(json, "sfdr"), 20 * std::log10(1 / 2e-3), 0.01);
    EXPECT_NEAR(member(json, "spur_frequency"), 4 * 997, 1e-3);
    EXPECT_NEAR(member(json, "level_dbfs"), -6.0206, 1e-3);
    EXPECT_NEAR(member(json, "enob_full_scale"), member(json, "enob") + 1, 1e-3);
    EXPECT_NEAR(member(json, "level_db", 3), 20 * std::log10(2e-3), 0.01);
    EXPECT_NEAR(member(json, "phase", 4), 90, 0.01);  // behind that of the tone itself
    // The third harmonic of the second signal shows at 48 - 27 kHz.
    const auto second = printed("distortion x.dsp --signal 2 --harmonics 3 --json");
    EXPECT_NEAR(member(second, "seen_at", 2), 21000, 1e-3);
    EXPECT_NEAR(member(second, "level_db", 2), -60, 0.01);
    const auto text = printed("distortion x.dsp --rate 48000");
    for (const std::string part : {" Hz\namplitude ", ", -53.0103 dB\n", "\nENOB ", " to 3988 Hz\n",
                                   "       9            81000            15000  in the lobe of"}) {
        EXPECT_NE(text.find(part), text.npos) << part << text;
    }
    write("short.dsp", Signals{tone(100, 1, 0.1, {{1, 0}})});
    const auto done = shell("wavkit distortion short.dsp");
    EXPECT_EQ(done.status, 1);
    EXPECT_NE(done.err.find("short.dsp: there is no tone with periods enough among 100 samples"),
              done.err.npos)
        << done.err;
    EXPECT_EQ(shell("wavkit distortion short.dsp --window Hann").status, 0);
}

TEST_F(TonesTest, PeaksInUnitsOfTheAxis) {
    // Bumps of 1, 2 and 3 at 1, 2 and 3 s, the second upside down.
    std::vector<long double> x;
    for (int i = 0; i < 400; ++i) {
        long double sum = 0;
        for (const int k : {1, 2, 3}) {
            sum += (k == 2 ? -k : k) * std::exp(-std::pow((i - 100.25L * k) / 10, 2.0L));
        }
        x.push_back(sum);
    }
    write("x.dsp", Signals{real<dsp>(x, 0.01)});
    const auto json = printed("peaks x.dsp --prominence 0.5 --json");
    for (const int k : {0, 1}) {
        EXPECT_NEAR(member(json, "at", k), 1.0025 * (1 + 2 * k), 2e-4);
        EXPECT_NEAR(member(json, "top", k), 1 + 2 * k, 2e-4);
        EXPECT_EQ(member(json, "sample", k), k == 0 ? 100 : 301);
    }
    EXPECT_NEAR(member(json, "prominence", 1), 3, 1e-2);
    EXPECT_NEAR(member(json, "width", 0), 0.2 * std::sqrt(std::log(2)), 1e-3);
    EXPECT_TRUE(std::isnan(member(json, "at", 2)));
    EXPECT_NEAR(member(printed("peaks x.dsp --valleys --height -1 --json"), "top"), -2, 1e-3);
    EXPECT_NEAR(member(printed("peaks x.dsp --distance 2.5 --json"), "height"), 3, 1e-2);
    for (const std::string distance : {"2", "200 --samples"}) {
        EXPECT_EQ(rows(printed("peaks x.dsp --prominence 0.5 -o - --distance " + distance)).size(),
                  2u);
    }
    EXPECT_EQ(printed("peaks x.dsp --height 5"), "no peaks\n");
    // Of a spectrum, by its magnitudes.
    write("y.dsp", Signals{sine(1000, 100, 1, 1e-3)});
    const auto spectral = printed(
        "spectrum y.dsp --any-length -o s.dsp >/dev/null && wavkit peaks s.dsp --height 0.5 "
        "--json");
    EXPECT_NEAR(member(spectral, "at"), 100, 1e-6);
    EXPECT_EQ(shell("wavkit peaks x.dsp --delta 0 --width 1").status, 2);
}

TEST_F(TonesTest, PicturesMarkWhatWasFound) {
    write("x.dsp", Signals{tone(4096, 1e-4, 700, {{1, 30}, {1e-2, -60}, {1e-3, 0}})});
    write("gnuplot", "#!/bin/sh\nexec /bin/cat\n");
    for (const auto& [command, label, marks] :
         {std::tuple("distortion x.dsp", "'level beside the tone (dB)'", 3),
          {"peaks x.dsp --distance 0.1", "'value'", 5},
          {"fit x.dsp --sine", "'y'", 0}}) {
        const auto done = shell(std::string("chmod +x gnuplot; PATH=$PWD:$PATH; wavkit ") +
                                command + " --plot p.svg");
        ASSERT_EQ(done.status, 0) << done.err;
        const auto script = contents("p.svg");
        EXPECT_NE(script.find(std::string("set ylabel ") + label), script.npos) << command;
        int found = 0;
        for (auto at = script.find("point pt 7"); at != script.npos; ++found) {
            at = script.find("point pt 7", at + 1);
        }
        EXPECT_EQ(found, marks) << command;
    }
}

}  // namespace
}  // namespace wavkit::test
