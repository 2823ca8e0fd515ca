// What the program measures between two signals whose connection is known.
#include <cmath>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

class ResponseTest : public ProgramTest {
  protected:
    /// White noise at 1 kHz, and the same 12 samples later, half as high, with an echo.
    void write_pair(int n = 40000) const {
        Noise random(3);
        std::vector<long double> x, y;
        for (int i = 0; i < n; ++i) {
            x.push_back(random());
            const auto before = [&](int k) { return i < k ? 0 : x[std::size_t(i - k)]; };
            y.push_back(0.5L * before(12) + 0.25L * before(13));
        }
        write("x.dsp", Signals{real<dsp>(x, 1e-3)});
        write("y.dsp", Signals{real<dsp>(y, 1e-3)});
        write("both.dsp", Signals{real<dsp>(x, 1e-3), real<dsp>(y, 1e-3)});
    }
};

TEST_F(ResponseTest, OfTwoFilesOrTwoSignalsOfOne) {
    write_pair();
    printed("join x.dsp y.dsp --channels -o both.csv");
    const std::string options = " --segment 512 --window hann", csv = " -o - --to csv" + options;
    const auto want = printed("response x.dsp y.dsp" + csv);
    for (const std::string from : {"both.dsp", "both.csv --delta 0.001", "- <both.dsp",
                                   "x.dsp - <y.dsp", "both.dsp --signal 1"}) {
        const auto done = shell("wavkit response " + from + csv);
        const bool one = from.find("--signal") != from.npos;
        EXPECT_EQ(done.status, one ? 1 : 0) << from << done.err;
        EXPECT_TRUE(one || done.out == want) << from;
    }
    const auto table = rows(want);
    ASSERT_EQ(table.size(), 257u);
    EXPECT_EQ(want.substr(0, want.find('\n')), "frequency,gain,phase,coherence");
    const auto aligned = rows(printed("response x.dsp y.dsp --align" + csv));
    for (const std::size_t k : {20u, 100u, 200u}) {
        const double w = 2 * pi<double> * double(k) / 512;
        const std::complex<double> h = 0.5 + 0.25 * std::polar(1.0, -w);
        EXPECT_NEAR(table[k][0], double(k) / 0.512, 1e-9);
        EXPECT_NEAR(table[k][1], std::abs(h), 0.03);
        EXPECT_NEAR(std::remainder(table[k][2] - (std::arg(h) - 12 * w) * 180 / pi<double>, 360), 0,
                    3);
        EXPECT_GT(table[k][3], 0.98);
        EXPECT_LT(std::fabs(aligned[k][2]), 40);
    }
    EXPECT_EQ(rows(printed("response x.dsp y.dsp --band 100 200" + csv)).size(), 51u);
    printed("response x.dsp y.dsp -o h.dsp --h2" + options);
    const auto h = read("h.dsp").at(0);
    EXPECT_EQ(h->points, 257);
    EXPECT_NEAR(std::hypot(h[200], h[201]), table[100][1], 0.02);
}

TEST_F(ResponseTest, TellsDelayAndWhatIsExplained) {
    write_pair();
    const auto json = printed("response x.dsp y.dsp --segment 1024 --json");
    for (const std::string part : {"\"delay_samples\":12.", "\"segments\":77,", "\"length\":1024,",
                                   "\"explained\":0.9", "\"bin_width\":0.9765625"}) {
        EXPECT_NE(json.find(part), json.npos) << part << json;
    }
    const auto text = printed("response x.dsp y.dsp --rate 1000");
    for (const std::string part : {"77 segments of 1024 samples through Hann\n", " s, 12.",
                                   "  frequency (Hz)", "\n             500 "}) {
        EXPECT_NE(text.find(part), text.npos) << part << text;
    }
    printed("response x.dsp y.dsp --plot bode.svg");
    EXPECT_NE(contents("bode.svg").find("coherence"), std::string::npos);
    const auto drawn = printed("response x.dsp y.dsp --linear --plot -");
    EXPECT_NE(drawn.find("coherence"), drawn.npos) << drawn;
}

TEST_F(ResponseTest, RefusesWhatHasNoResponse) {
    write_pair(2000);
    write("z.dsp", Signals{complex<dsp>({1, 2, 3, 4, 5})});
    write("slow.dsp", Signals{real<dsp>(std::vector<long double>(2000, 1), 1)});
    write("short.dsp", Signals{real<dsp>({1, 2, 3}, 1e-3)});
    for (const auto& [arguments, status, told] :
         {std::tuple("x.dsp", 1, "there is one signal in x.dsp; name a second file"),
          {"x.dsp slow.dsp", 1, "the sample spacings differ"},
          {"z.dsp z.dsp", 1, "the response between complex signals is not defined"},
          {"x.dsp short.dsp", 1, "3 samples of both signals, fewer than one segment of 1024"},
          {"- -", 2, "standard input"},
          {"x.dsp y.dsp -o - --json", 2, "standard output takes only one"},
          {"x.dsp y.dsp --band 5 2", 2, "--band goes from a lower"}}) {
        const auto done = shell(std::string("wavkit response ") + arguments);
        EXPECT_EQ(done.status, status) << arguments;
        EXPECT_NE(done.err.find(told), std::string::npos) << arguments << done.err;
    }
    const auto uneven = shell(
        "wavkit cut y.dsp --samples --length 1500 -o c.dsp && "
        "wavkit response x.dsp c.dsp --segment 1024");
    EXPECT_EQ(uneven.status, 0) << uneven.err;
    EXPECT_NE(uneven.err.find("the first 1500 samples"), std::string::npos) << uneven.err;
    EXPECT_NE(uneven.err.find("of one segment the coherence tells nothing"), std::string::npos);
}

}  // namespace
}  // namespace wavkit::test
