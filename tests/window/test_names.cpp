// Window identifiers, their constants and their names.
#include <cctype>
#include <climits>
#include <cstring>
#include <sstream>

#include "support/precision.hpp"

namespace wavkit::test {
namespace {

/// The names of each identifier in turn.
constexpr const char* display_names =
    "Uniform Rectangular None P000/Bartlett Triangular/Hann P110/Hamming P100/Blackman/"
    "Blackman_Harris3 P200/Blackman_Harris4 P310 Lowleak/Gausstop P400/Flat4 P301/"
    "Flattop Flat5 P401/Flat6 P511/Flat7 P611/P501/P601/Kaiser70/Kaiser80/Kaiser90/Kaiser100/"
    "Kaiser110/Kaiser120/Gauss60/Gauss70/Gauss80/Riemann Sinc_Lobe";

/// In the order of the names above.
constexpr int constants[] = {
    DSP_WINDOW_UNIFORM,   DSP_WINDOW_RECTANGULAR,
    DSP_WINDOW_NONE,      DSP_WINDOW_P000,
    DSP_WINDOW_BARTLETT,  DSP_WINDOW_TRIANGULAR,
    DSP_WINDOW_HANN,      DSP_WINDOW_P110,
    DSP_WINDOW_HAMMING,   DSP_WINDOW_P100,
    DSP_WINDOW_BLACKMAN,  DSP_WINDOW_BLACKMAN_HARRIS3,
    DSP_WINDOW_P200,      DSP_WINDOW_BLACKMAN_HARRIS4,
    DSP_WINDOW_P310,      DSP_WINDOW_LOWLEAK,
    DSP_WINDOW_GAUSSTOP,  DSP_WINDOW_P400,
    DSP_WINDOW_FLAT4,     DSP_WINDOW_P301,
    DSP_WINDOW_FLATTOP,   DSP_WINDOW_FLAT5,
    DSP_WINDOW_P401,      DSP_WINDOW_FLAT6,
    DSP_WINDOW_P511,      DSP_WINDOW_FLAT7,
    DSP_WINDOW_P611,      DSP_WINDOW_P501,
    DSP_WINDOW_P601,      DSP_WINDOW_KAISER70,
    DSP_WINDOW_KAISER80,  DSP_WINDOW_KAISER90,
    DSP_WINDOW_KAISER100, DSP_WINDOW_KAISER110,
    DSP_WINDOW_KAISER120, DSP_WINDOW_GAUSS60,
    DSP_WINDOW_GAUSS70,   DSP_WINDOW_GAUSS80,
    DSP_WINDOW_RIEMANN,   DSP_WINDOW_SINC_LOBE,
};

std::string cased(std::string text, int (*change)(int)) {
    for (char& c : text) c = char(change(c));
    return text;
}

class WindowNames : public ::testing::TestWithParam<int> {
  protected:
    const bool single = GetParam();
    int (*const to_str)(int, char*, int) = single ? dspf_window_to_str : dsp_window_to_str;
    int (*const from_str)(const char*, int*) = single ? dspf_window_from_str : dsp_window_from_str;

    int parsed(const std::string& name) const {
        int window = -7;
        EXPECT_EQ(from_str(name.c_str(), &window), 0) << name;
        return window;
    }
};
INSTANTIATE_TEST_SUITE_P(BothPrecisions, WindowNames, ::testing::Values(0, 1));

TEST_P(WindowNames, EveryNameInAnyCaseAndTheFirstOneBack) {
    const int* constant = constants;
    std::istringstream windows(display_names);
    std::string names;
    for (int id = 0; std::getline(windows, names, '/'); ++id) {
        std::istringstream words(names);
        char first[20];
        ASSERT_EQ(to_str(id, first, sizeof first), 0);
        EXPECT_EQ(names.substr(0, names.find(' ')), first);
        EXPECT_EQ(parsed(first), id);
        for (std::string name; words >> name; ++constant) {
            const std::string enumerator = "DSP_WINDOW_" + cased(name, std::toupper);
            EXPECT_EQ(parsed(name), id);
            EXPECT_EQ(parsed(cased(name, std::toupper)), id);
            EXPECT_EQ(parsed(enumerator), id);
            EXPECT_EQ(parsed(cased(enumerator, std::tolower)), id);
            EXPECT_EQ(*constant, id) << enumerator;
        }
    }
    EXPECT_EQ(constant, std::end(constants));
}

TEST_P(WindowNames, BuffersAreCutTerminatedAndCleared) {
    char buf[12];
    const auto written = [&](int window, int len) {
        std::memset(buf, 'x', sizeof buf);
        return to_str(window, buf, len);
    };
    EXPECT_EQ(written(9, 4), 0);
    EXPECT_EQ(std::memcmp(buf, "Fla\0xxxxxxxx", 12), 0);
    EXPECT_EQ(written(2, 5), 0);
    EXPECT_EQ(std::memcmp(buf, "Hann\0xxxxxxx", 12), 0);
    EXPECT_EQ(written(2, 8), 0);
    EXPECT_EQ(std::memcmp(buf, "Hann\0\0\0\0xxxx", 12), 0);
    EXPECT_EQ(written(0, 1), 0);
    EXPECT_EQ(std::memcmp(buf, "\0xxxxxxxxxxx", 12), 0);
    for (int unknown : {24, -1, INT_MAX}) {
        EXPECT_EQ(written(unknown, 12), -1);
        EXPECT_EQ(std::memcmp(buf, "\0xxxxxxxxxxx", 12), 0);
    }
    for (int len : {0, -3}) {
        EXPECT_EQ(written(0, len), -1);
        EXPECT_EQ(std::memcmp(buf, "xxxxxxxxxxxx", 12), 0);
    }
    EXPECT_EQ(to_str(0, nullptr, 8), -1);
}

TEST_P(WindowNames, UnknownNamesGiveTheUniformWindowAndFail) {
    for (const char* name : {"", "Kaiser7", "Kaiser700", " Hann", "Hann ", "DSP_WINDOW_",
                             "DSP_WINDOW", "DSP_WINDOW_DSP_WINDOW_HANN", "24", "H\xC4nn"}) {
        int window = 5;
        EXPECT_EQ(from_str(name, &window), -1) << name;
        EXPECT_EQ(window, 0) << name;
    }
    int window = 5;
    EXPECT_EQ(from_str(nullptr, &window), -1);
    EXPECT_EQ(window, 5);
    EXPECT_EQ(from_str("Hann", nullptr), -1);
}

}  // namespace
}  // namespace wavkit::test
