// A machine that speeds up, of which the program tells what comes so many times a revolution.
#include <cmath>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using OrdersTest = ProgramTest;

/// From 10 to 30 revolutions a second within as many seconds as make 200 of them, at 2 kHz.
constexpr double rate = 2000, seconds = 10;
long double turned(int n) {
    const long double t = n / rate;
    return 10 * t + t * t;
}

/// Sines of some orders, and what a tachometer of 3 teeth says of the shaft.
Signals machine() {
    std::vector<long double> x, tacho;
    for (int n = 0; n < int(seconds * rate); ++n) {
        x.push_back(std::cos(2 * pi<long double> * turned(n)) +
                    0.25L * std::sin(2 * pi<long double> * 4.5L * turned(n)));
        tacho.push_back(5 + std::sin(2 * pi<long double> * 3 * turned(n)));
    }
    return {real<dsp>(x, 1 / rate), real<dsp>(tacho, 1 / rate)};
}

TEST_F(OrdersTest, AreMeasuredWhateverTheSpeed) {
    write("x.dsp", machine());
    const std::string command = "orders x.dsp --tacho 2 --per-revolution 3 ";
    const auto json = printed(command + "--json");
    EXPECT_NEAR(member(json, "revolutions"), 200, 1);
    EXPECT_EQ(member(json, "angles"), 256);  // 200 samples in the first revolution
    EXPECT_NEAR(member(json, "rpm_min"), 600, 10);
    EXPECT_NEAR(member(json, "rpm_max"), 1800, 10);
    EXPECT_EQ(member(json, "bin_width"), 0.125);
    EXPECT_NEAR(member(json, "frequency"), 1, 1e-4);
    EXPECT_NEAR(member(json, "amplitude"), 1, 1e-3);
    EXPECT_NEAR(member(json, "frequency", 1), 4.5, 1e-3);
    EXPECT_NEAR(member(json, "amplitude", 1), 0.25, 1e-3);
    const auto peak = rows(printed(command + "--peaks 1 --band 2 100 --revolutions 20")).at(1);
    EXPECT_NEAR(peak[0], 4.5, 1e-3);
    // The signal itself over the angle: that of the first revolution and a later one are alike.
    printed(command + "--over-angle --angles 90 -o angle.csv");
    auto over = rows(printed("convert angle.csv - --to csv"));
    std::erase_if(over, [](const auto& row) { return row.empty(); });
    ASSERT_GE(over.size(), 199u * 90);
    for (const std::size_t m : {500u, 9000u, 17000u}) {
        const double turn = 2 * M_PI * double(m) / 90;
        // (The tachometer first rises one tooth after the start.)
        const double shift = 2 * M_PI / 3;
        EXPECT_NEAR(over[m].back(), std::cos(turn + shift) + 0.25 * std::sin(4.5 * (turn + shift)),
                    1e-3);
    }
    EXPECT_NE(printed("info angle.csv").find("rev"), std::string::npos);
}

TEST_F(OrdersTest, RefuseWhatDoesNotTell) {
    write("x.dsp", machine());
    for (const auto& [arguments, words] :
         {std::pair("x.dsp --tacho 3", "there is no signal 3 for the tachometer"),
          {"x.dsp --tacho 2 --level 7", "the tachometer has 0 rising edges"},
          {"x.dsp --tacho 2 --revolutions 2000", "fewer than one segment"},
          {"x.dsp --tacho 2 --signal 2", "--tacho is another signal"},
          {"x.dsp --tacho 2 --over-angle", "--over-angle is for the output"},
          {"x.dsp --tacho 2 --band 300 400", "no frequency of the spectrum lies from"}}) {
        const auto done = shell(std::string("wavkit orders ") + arguments);
        EXPECT_NE(done.status, 0) << arguments;
        EXPECT_NE(done.err.find(words), std::string::npos) << done.err;
    }
}

}  // namespace
}  // namespace wavkit::test
