// Window identifiers, their constants and their names.
#include <cctype>

#include "support/precision.hpp"

namespace wavkit::test {
namespace {

template <Record R>
constexpr auto to_str = std::same_as<R, dsp> ? dsp_window_to_str : dspf_window_to_str;
template <Record R>
constexpr auto from_str = std::same_as<R, dsp> ? dsp_window_from_str : dspf_window_from_str;

struct Named {
    std::string name;
    int constant;
};
#define NAMED(name) \
    Named { #name, DSP_WINDOW_##name }

BOTH_PRECISIONS(WindowNames, EveryNameInAnyCaseAndTheFirstOneBack) {
    // By identifier; the first name of each is the one that comes back.
    const std::vector<Named> windows[] = {
        {NAMED(UNIFORM), NAMED(RECTANGULAR), NAMED(NONE), NAMED(P000)},
        {NAMED(BARTLETT), NAMED(TRIANGULAR)},
        {NAMED(HANN), NAMED(P110)},
        {NAMED(HAMMING), NAMED(P100)},
        {NAMED(BLACKMAN)},
        {NAMED(BLACKMAN_HARRIS3), NAMED(P200)},
        {NAMED(BLACKMAN_HARRIS4), NAMED(P310), NAMED(LOWLEAK)},
        {NAMED(GAUSSTOP), NAMED(P400)},
        {NAMED(FLAT4), NAMED(P301)},
        {NAMED(FLATTOP), NAMED(FLAT5), NAMED(P401)},
        {NAMED(FLAT6), NAMED(P511)},
        {NAMED(FLAT7), NAMED(P611)},
        {NAMED(P501)},
        {NAMED(P601)},
        {NAMED(KAISER70)},
        {NAMED(KAISER80)},
        {NAMED(KAISER90)},
        {NAMED(KAISER100)},
        {NAMED(KAISER110)},
        {NAMED(KAISER120)},
        {NAMED(GAUSS60)},
        {NAMED(GAUSS70)},
        {NAMED(GAUSS80)},
        {NAMED(RIEMANN), NAMED(SINC_LOBE)}};
    for (int id = 0; id < 24; ++id) {
        for (const auto& [name, constant] : windows[id]) {
            EXPECT_EQ(constant, id) << name;
            for (std::string text : {name, "DSP_WINDOW_" + name}) {
                for (int lower : {0, 1}) {
                    int parsed = -7;
                    for (char& c : text) c = lower ? char(std::tolower(c)) : c;
                    EXPECT_EQ(from_str<R>(text.c_str(), &parsed), 0) << text;
                    EXPECT_EQ(parsed, id) << text;
                }
            }
        }
        char first[20];
        EXPECT_EQ(to_str<R>(id, first, sizeof first), 0);
        EXPECT_STRCASEEQ(first, windows[id][0].name.c_str());
    }
}

BOTH_PRECISIONS(WindowNames, BuffersAreCutTerminatedAndCleared) {
    using namespace std::string_literals;
    for (auto [window, len, result, expected] : {std::tuple{9, 4, 0, "Fla\0xxxx"s},
                                                 {2, 5, 0, "Hann\0xxx"s},
                                                 {2, 7, 0, "Hann\0\0\0x"s},
                                                 {0, 1, 0, "\0xxxxxxx"s},
                                                 {24, 8, -1, "\0xxxxxxx"s},
                                                 {-1, 8, -1, "\0xxxxxxx"s},
                                                 {0, 0, -1, "xxxxxxxx"s},
                                                 {0, -3, -1, "xxxxxxxx"s}}) {
        std::string buf(8, 'x');
        EXPECT_EQ(to_str<R>(window, buf.data(), len), result) << window;
        EXPECT_EQ(buf, expected) << window << " " << len;
    }
    EXPECT_EQ(to_str<R>(0, nullptr, 8), -1);
}

BOTH_PRECISIONS(WindowNames, UnknownNamesGiveTheUniformWindowAndFail) {
    int window = 5;
    EXPECT_EQ(from_str<R>(nullptr, &window), -1);
    EXPECT_EQ(window, 5);
    EXPECT_EQ(from_str<R>("Hann", nullptr), -1);
    for (const char* name : {"", "Kaiser7", "Kaiser700", " Hann", "Hann ", "DSP_WINDOW_",
                             "DSP_WINDOW_DSP_WINDOW_HANN", "24", "H\xC4nn"}) {
        window = 5;
        EXPECT_EQ(from_str<R>(name, &window), -1) << name;
        EXPECT_EQ(window, 0) << name;
    }
}

}  // namespace
}  // namespace wavkit::test
