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
    int constant, id;
};
#define NAMED(name, id) \
    Named { #name, DSP_WINDOW_##name, id }

BOTH_PRECISIONS(WindowNames, EveryNameInAnyCaseAndTheFirstOneBack) {
    const Named windows[] = {NAMED(UNIFORM, 0),    NAMED(RECTANGULAR, 0),
                             NAMED(NONE, 0),       NAMED(P000, 0),
                             NAMED(BARTLETT, 1),   NAMED(TRIANGULAR, 1),
                             NAMED(HANN, 2),       NAMED(P110, 2),
                             NAMED(HAMMING, 3),    NAMED(P100, 3),
                             NAMED(BLACKMAN, 4),   NAMED(BLACKMAN_HARRIS3, 5),
                             NAMED(P200, 5),       NAMED(BLACKMAN_HARRIS4, 6),
                             NAMED(P310, 6),       NAMED(LOWLEAK, 6),
                             NAMED(GAUSSTOP, 7),   NAMED(P400, 7),
                             NAMED(FLAT4, 8),      NAMED(P301, 8),
                             NAMED(FLATTOP, 9),    NAMED(FLAT5, 9),
                             NAMED(P401, 9),       NAMED(FLAT6, 10),
                             NAMED(P511, 10),      NAMED(FLAT7, 11),
                             NAMED(P611, 11),      NAMED(P501, 12),
                             NAMED(P601, 13),      NAMED(KAISER70, 14),
                             NAMED(KAISER80, 15),  NAMED(KAISER90, 16),
                             NAMED(KAISER100, 17), NAMED(KAISER110, 18),
                             NAMED(KAISER120, 19), NAMED(GAUSS60, 20),
                             NAMED(GAUSS70, 21),   NAMED(GAUSS80, 22),
                             NAMED(RIEMANN, 23),   NAMED(SINC_LOBE, 23)};
    int next = 0;
    for (const Named& window : windows) {
        EXPECT_EQ(window.constant, window.id) << window.name;
        for (std::string text : {window.name, "DSP_WINDOW_" + window.name}) {
            for (int lower : {0, 1}) {
                int parsed = -7;
                for (char& c : text) c = lower ? char(std::tolower(c)) : c;
                EXPECT_EQ(from_str<R>(text.c_str(), &parsed), 0) << text;
                EXPECT_EQ(parsed, window.id) << text;
            }
        }
        if (window.id < next) continue;
        char first[20];
        EXPECT_EQ(to_str<R>(next++, first, sizeof first), 0);
        EXPECT_STRCASEEQ(first, window.name.c_str());
    }
    EXPECT_EQ(next, 24);
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
