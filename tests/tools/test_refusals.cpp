// What cannot be done: told in one line, by an exit status, and nothing is left behind.
#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using RefusalsTest = ProgramTest;

TEST_F(RefusalsTest, OneOfAKind) {
    write("x.txt", "1\n2\n3\n");
    write("slow.txt", "#DSP delta = 0.5\n1\n2\n");
    write("still.txt", "#DSP delta = 0\n1\n2\n");
    write("nan.txt", "1\n2\nnan\n1\n1\n");
    write("none.txt", "#DSP points = 0\n");
    write("back.csv", "x,y\n0,1\n2,1\n2,1\n");
    write("times.csv", "time,x\n0,1\n1,1\n3,1\n");
    write("z.csv", "re,im\n1,2\n3,4\n");
    write("cut.dsp", "\xBE\x30\x03\xEB\x08\x04");
    write("word.txt", "1 2 3 four");
    write("mixed.txt", "\n\xBE\x10\x01\xEB" + std::string(11, '\xB7') + "2");
    write("zero.txt", "0\n0\n0\n0\n0\n");
    write("great.txt", "1e300\n-1e300\n2\n");
    write("five.txt", "1\n4\n2\n3\n5\n");
    write("many.csv", "1\n2\n\n3\n");
    write("many.txt", "#DSP points = 9223372036854775807\n#DSP complex = 1\n1 2 3 4");
    const struct {
        int status;
        std::string line, complaint;
    } refusals[] = {
        // Sources
        {1, "stats missing.txt --json", "missing.txt"},
        {1, "filter cut.dsp --lowpass 0.1 -o y.csv", "signal 1 is damaged"},
        {1, "spectrum word.txt --average 2", "signal 1 is damaged"},
        {1, "info many.txt", "fewer values than it says"},
        {1, "spectrum times.csv --average 2", "the time column is not equally spaced"},
        {1, "convert x.txt o.csv --signal 2", "x.txt holds 1 signal, no signal 2"},
        {1, "filter x.txt --lowpass 0.1 -o nowhere/y.csv", "nowhere"},
        // Samples
        {1, "spectrum nan.txt -o y.csv", "nan.txt: sample 2 is not a finite number"},
        {1, "spectrum nan.txt --average 2 -o y.csv", "sample 2 is not a finite number"},
        {1, "filter nan.txt --lowpass 0.1 -o y.csv", "nan.txt: sample 2 is not a finite number"},
        {1, "spectrum none.txt", "no samples"},
        {1, "filter x.txt --taps none.txt", "none.txt: there are no taps"},
        {1, "correlate x.txt nan.txt", "nan.txt: sample 2"},
        {1, "convert mixed.txt y.csv --from text", "signal 1 is damaged or no signal"},
        {1, "spectrum x.txt --band 0.6 0.7", "goes from 0 to 0.5"},
        {1, "response five.txt five.txt --segment 4 --band 0.3 0.4",
         "five.txt: no frequency of the spectrum lies from 0.3 to 0.4; it goes from 0 to 0.5"},
        {1, "response five.txt five.txt --segment 4 --band 7 9 --json", "from 7 to 9"},
        {1, "levels five.txt --rate 48000 --octaves 3 --band 101 102",
         "five.txt: no centre of a band lies from 101 to 102"},
        {1, "correlate x.txt slow.txt -o c.csv", "spacings differ, 1 and 0.5"},
        {1, "spectrum still.txt", "still.txt: a sample spacing of 0"},
        {1, "spectrum x.txt --average 4 -o y.csv", "fewer than one segment of 4"},
        {1, "filter z.csv --lowpass 0.1 --plot y.png", "real signals"},
        {1, "interp back.csv --table --rate 1", "sample 2 does not lie behind"},
        {1, "interp x.txt --rate 2 --method spline", "5 points"},
        {1, "roots 0 0", "0 everywhere"},
        {1, "cut x.txt --begin 3 -o y.csv", "ends at 3"},
        {1, "mix x.txt slow.txt -o y.csv", "differ, 1 in x.txt and 0.5 in slow.txt"},
        {1, "join x.txt many.csv -o y.csv", "many.csv holds more signals than x.txt"},
        {1, "fit x.txt --degree 3", "4 points with different x"},
        {1, "response zero.txt five.txt --segment 4", "zero.txt: the signal is 0"},
        {1, "response five.txt zero.txt --segment 4", "zero.txt: the signal is 0"},
        {1, "levels great.txt --rate 48000", "great.txt: the values are too great"},
        // Places and sizes
        {1, "filter x.txt --lowpass nan -o y.csv", "half the sampling rate"},
        {1, "filter x.txt --bandpass 0.3 0.2 -o y.csv", "lower to a higher"},
        {1, "interp x.txt --at x.txt --edges refuse", "3 lies outside"},
        {2, "generate cos 1 --duration 1e99 -o x.dsp", "1073741824"},
        {2, "generate cos 1000 -o x.dsp", "say --rate"},
        {2, "generate cexp 101 --rate 100 -o x.dsp", "beyond the sampling rate, 100"},
        {2, "design sinh-over-root 1e300 -o x.dsp", "no finite taps"},
        {2, "design delay 0.2 1e9 -o x.dsp", "more than half their number"},
        {2, "design hilbert 0.3 --length 1 -o x.dsp", "all taps are 0"},
        {2, "filter x.txt --lowpass 0.1 --transition 1e-9", "--length"},
        {2, "filter x.txt --highpass 0.1 --length 10", "odd number"},
        // Words
        {2, "", "subcommand"},
        {2, "convert x.txt out", "--to"},
        {2, "window hanning", "Uniform, Bartlett, Hann"},
        {2, "filter x.txt --lowpass 0.1 --window hann", "Kaiser70"},
        {2, "generate sinus 50 -o x.dsp", "'sinus' is none of brown, cexp, cos, line"},
        {2, "generate cos 0.1 amp=x -o x.dsp", "is not a number"},
        {2, "generate sweep 0 0.1 type=log -o x.dsp", "from one positive frequency"},
        {2, "generate pink low=0.6 -o x.dsp", "half the sampling rate"},
        {2, "generate noise type=laplace --complex -o x.dsp", "real"},
        // Numbers out of range
        {2, "convert x.txt out.csv --delta nan", "positive number"},
        {2, "spectrum x.txt --fraction nan", "between"},
        // Options that do not go together, or not with the output
        {2, "convert x.txt o.csv --rate 1 --delta 1", "--delta"},
        {2, "convert x.txt o.csv --missing no", "--missing"},
        {2, "peaks x.txt -o p.mat", "a list of peaks cannot be written as a "},
        {2, "peaks x.txt -o p.dsp", "only as CSV"},
        {2, "levels x.txt -o l.wav", "levels over time cannot be written as a "},
        {2, "levels x.txt --calibrator-level 100", "goes with --calibrator"},
        {2, "filter x.txt --q 3 --lowpass 0.1 -o y.csv", "--q is for --notch and --peak"},
        {2, "design lowpass 0.1 --q 3", "--q is for notch and peak"},
        {2, "convert x.txt o.txt --with-time", "--with-time is for CSV"},
        {2, "convert x.txt o.flac --bits float", "FLAC"},
        {2, "correlate x.txt x.txt -o c.dsp --lags 0 1", "--lags goes with CSV"},
        {2, "spectrum x.txt --overlap 50", "go with --average"},
        {2, "spectrum x.txt --waterfall -", ".png, .svg or .pdf"},
        {2, "spectrum x.txt --plot x.gif", ".png, .svg or .pdf"},
        {2, "spectrum x.txt --plot x.png --size 10x9x8", "no size"},
        {2, "cut x.txt --samples --length 0.5 -o y.csv", "whole numbers"},
        {2, "scale x.txt -o y.csv", "how to scale"},
        {2, "scale x.txt --calibrate 1=2 1=3 -o y.csv", "close together"},
        {2, "mix x.txt x.txt --gains 1 -o y.csv", "a number for every file: 2, not 1"},
        {2, "hist x.txt x.txt -o y.csv", "one file"},
        {2, "filter x.txt -o y.csv", "what to filter by"},
        {2, "filter x.txt --taps x.txt --length 9", "not for --taps"},
        {2, "filter x.txt --lowpass 0.1 --length 9 --transition 0.1 --attenuation 50", "no choice"},
        {2, "interp x.txt", "--at and --rate"},
        {2, "interp - --at -", "standard input"},
        {2, "correlate - -", "standard input can be A or B"},
        {2, "spectrum x.txt -o - --peaks 1", "standard output"},
    };
    const auto before = files();
    for (const auto& [status, line, complaint] : refusals) {
        const auto done = shell("wavkit " + line);
        EXPECT_EQ(done.status, status) << line;
        EXPECT_NE(done.err.find(complaint), std::string::npos) << line << "\n" << done.err;
        EXPECT_EQ(std::count(done.err.begin(), done.err.end(), '\n'), 1) << done.err;
        EXPECT_EQ(done.out, "") << line;
        EXPECT_EQ(files(), before) << line;
    }
}

TEST_F(RefusalsTest, SpacingsWithoutPlaces) {
    const auto samples = "\n1\n3\n2\n5\n4\n6\n1\n2\n3\n";
    const std::string spacings[] = {"0", "-1", "nan", "inf", "1e-320"};
    for (const auto& delta : spacings) write(delta + ".txt", "#DSP delta = " + delta + samples);
    const auto before = files();
    for (const char* line :
         {"fit F", "fit F --sine", "fit F --degree 2",
          "smooth F --derivative 1 --window 5 -o y.csv", "derive F -o y.csv",
          "integrate F -o y.csv", "integrate F --highpass 0.1 -o y.csv",
          "stft F --length 4 -o y.dsp", "spectrum F", "spectrum F --average 4", "response F F",
          "filter F --lowpass 0.1 -o y.csv", "filter F --iir butter --lowpass 0.1 -o y.csv",
          "distortion F", "levels F", "resample F --rate 2 -o y.csv", "edges F",
          "cut F --begin 1 -o y.csv"}) {
        for (const auto& delta : spacings) {
            const auto file = delta + ".txt";
            auto call = "wavkit " + std::string(line);
            for (std::size_t at; (at = call.find('F')) != std::string::npos;) {
                call.replace(at, 1, file);
            }
            const auto done = shell(call);
            EXPECT_EQ(done.status, 1) << call;
            EXPECT_NE(done.err.find(file + ": a sample spacing of "), std::string::npos)
                << call << "\n"
                << done.err;
            EXPECT_EQ(std::count(done.err.begin(), done.err.end(), '\n'), 1) << done.err;
            EXPECT_EQ(done.out, "") << call;
            EXPECT_EQ(files(), before) << call;
        }
    }
}

TEST_F(RefusalsTest, EveryCommandExplainsItself) {
    for (const std::string command :
         {"info",   "convert", "spectrum", "correlate", "envelope", "window",
          "filter", "design",  "generate", "stats",     "hist",     "fit",
          "roots",  "interp",  "resample", "decimate",  "cut",      "join",
          "mix",    "scale",   "derive",   "integrate", "edges"}) {
        EXPECT_NE(printed(command + " --help").find("Example"), std::string::npos) << command;
    }
}

}  // namespace
}  // namespace wavkit::test
