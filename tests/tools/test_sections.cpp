// Recursive filters from the command line, beside the library's on the whole signal.
#include <numbers>
#include <sstream>

#include "support/oracles.hpp"
#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using SectionTest = ProgramTest;

Signal<dsp> sections(int design, int band, int order, double f1, double f2 = 0, double ripple = 1,
                     double attenuation = 60) {
    Signal<dsp> rows;
    EXPECT_EQ(::dspc_iir(rows, design, band, order, f1, f2, ripple, attenuation), 0);
    return rows;
}

TEST_F(SectionTest, BlocksAreTheFilteredWhole) {
    auto x = Noise(1).real<dsp>(150000), z = Noise(2).complex<dsp>(70000);
    x->delta = z->delta = 0.001;
    write("x.dsp", Signals{x, z});
    const auto band = sections(DSP_IIR_ELLIPTIC, DSP_IIR_BAND_PASS, 3, 0.05, 0.1, 0.5, 50);
    auto both = sections(DSP_IIR_BUTTERWORTH, DSP_IIR_HIGH_PASS, 4, 0.01);
    dsp_append(both, sections(DSP_IIR_NOTCH, 0, 1, 0.05, 0.05 / 7));
    printed(
        "design bandpass 50 100 --rate 1000 --iir elliptic --order 3 --ripple 0.5 "
        "--attenuation 50 -o sections.dsp");
    for (const auto& [options, rows] :
         {std::pair("--iir elliptic --order 3 --ripple 0.5 --attenuation 50 --bandpass 50 100",
                    band),
          {"--sections sections.dsp", band},
          {"--iir butter --highpass 10 --notch 50 --q 7", both}}) {
        for (const std::string way : {"", " --hold", " --zero-phase"}) {
            printed("filter x.dsp -o y.dsp " + std::string(options) + way);
            const auto y = read("y.dsp");
            ASSERT_EQ(y.size(), 2u);
            for (const auto* in : {&x, &z}) {
                Signal<dsp> want, state;
                if (way == " --hold") {
                    ASSERT_EQ(::dspc_iir_state(state, rows), 0);
                    const dsp* first = *in;
                    if (first->complex) {
                        dspi_rtoc(state), dspi_cscale(state, first->data[0], first->data[1]);
                    } else {
                        dspi_scale(state, first->data[0]);
                    }
                }
                ASSERT_EQ(way == " --zero-phase" ? ::dspd_iir_zero_phase(*in, want, rows, -1)
                                                 : ::dspd_iir(*in, want, rows, state),
                          0);
                EXPECT_TRUE(matches<dsp>(y[in == &z], want, 1e4)) << options << way;
            }
        }
    }
}

TEST_F(SectionTest, ReportsWhatTheFilterDoes) {
    const auto text = printed("design lowpass 100 --rate 1000 --iir butter --order 2");
    EXPECT_NE(text.find("-3 dB at     100 Hz"), std::string::npos) << text;
    // w = tan(0.1 pi): b0 = w^2 / (1 + 2^(1/2) w + w^2)
    EXPECT_NE(text.find("0.0674552738890719"), std::string::npos) << text;
    const auto json = printed("design lowpass 0.25 --iir butter --order 1 --json");
    EXPECT_NE(json.find("\"sections\":[[0.5,0.5,0,1,"), std::string::npos) << json;
    EXPECT_NE(json.find("\"zeros\":[[-1,0]]"), std::string::npos) << json;
    printed("design notch 50 --rate 1000 --q 5 --plot notch.svg");
    EXPECT_GT(contents("notch.svg").size(), 1000u);
}

TEST_F(SectionTest, ReportsNarrowAndLowFilters) {
    const auto numbers = [](const std::string& json, const std::string& name) {
        std::vector<double> values;
        std::istringstream list(json.substr(json.find("\"" + name + "\":[") + name.size() + 4));
        for (double v; list >> v; list.get()) values.push_back(v);
        return values;
    };
    // With W = tan(pi f), a peak has the power 1 / (1 + ((W^2 - W0^2) / (B W))^2).
    const auto edge = [](double f, double width, double power, int sign) {
        constexpr double pi = std::numbers::pi;
        const double w = std::tan(pi * f), b = std::tan(pi * width) * (1 + w * w);
        const double half = b / 2 * std::sqrt(1 / power - 1);
        return std::atan(sign * half + std::hypot(half, w)) / pi;
    };
    for (const auto& [call, rate, f, q] :
         {std::tuple("notch 50 --rate 96000 --q 100", 96e3, 50.0, 100.0),
          {"peak 0.1 --q 1e6", 1.0, 0.1, 1e6}}) {
        const auto json = printed("design " + std::string(call) + " --json");
        const bool notch = *call == 'n';
        for (const auto& [name, power] : {std::pair("at_3db", 0.5), {"at_6db", 0.25}}) {
            const auto found = numbers(json, name);
            ASSERT_EQ(found.size(), 2u) << json;
            for (const int i : {0, 1}) {
                const double want =
                    edge(f / rate, f / q / rate, notch ? 1 - power : power, 2 * i - 1);
                EXPECT_NEAR(found[std::size_t(i)], want * rate, 1e-5 * f / q) << json;
            }
        }
        EXPECT_NE(json.find("\"bands\":[]"), std::string::npos) << json;
        EXPECT_EQ(json.find("null"), std::string::npos) << json;
    }
    EXPECT_NE(printed("design peak 0.1 --q 1e6").find(" 0.09999995, 0.10000005\n"),
              std::string::npos);
    for (const auto& [band, f, order] :
         {std::tuple("lowpass", 1e-6, 8), {"lowpass", 1e-5, 4}, {"highpass", 1e-5, 2}}) {
        const auto json = printed("design " + std::string(band) + " " + std::to_string(f) +
                                  " --iir butter --json --order " + std::to_string(order));
        // The power is 1 / (1 + (f / edge)^(2 order)), and that of the high-pass the other way.
        const double ratio = std::pow(3, (*band == 'l' ? 1 : -1) / (2.0 * order));
        EXPECT_NEAR(numbers(json, "at_3db").at(0), f, 1e-4 * f) << json;
        EXPECT_NEAR(numbers(json, "at_6db").at(0), f * ratio, 1e-4 * f) << json;
    }
}

TEST_F(SectionTest, RefusesWhatDoesNotGoTogether) {
    write("x.dsp", Signals{Noise(1).real<dsp>(100)});
    for (const char* call :
         {"design lowpass 0.1 --iir butterfly", "design lowpass 0.1 --order 3",
          "design lowpass 0.1 --iir butter --ripple 1", "design hilbert 0.1 --iir butter",
          "design bandpass 0.1 --iir butter", "design lowpass 0.5 --iir butter",
          "design lowpass 0.1 --iir bessel --order 30",
          "design lowpass 0.1 --iir butter --length 9", "filter x.dsp --lowpass 0.1 --zero-phase",
          "filter x.dsp --lowpass 0.1 --notch 0.2", "filter x.dsp --notch 0.2 --delay 3",
          "filter x.dsp --notch 0.2 --taps x.dsp", "filter x.dsp --notch 0.2 --zero-phase --hold",
          "filter x.dsp --iir butter"}) {
        EXPECT_EQ(shell("wavkit " + std::string(call)).status, 2) << call;
    }
    EXPECT_EQ(shell("wavkit filter x.dsp --sections x.dsp -o y.dsp").status, 1);
}

}  // namespace
}  // namespace wavkit::test
