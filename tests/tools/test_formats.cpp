// Formats of other programs: files that NumPy and SciPy wrote (data/make_files.py) and others put
// together by hand from the descriptions of their formats, as they are and damaged.
#include <cctype>
#include <regex>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

class FormatsTest : public ProgramTest {
  protected:
    static std::string file(const std::string& name) {
        std::ifstream stream(std::string(WAVKIT_FILES "/") + name, std::ios::binary);
        std::ostringstream text;
        text << stream.rdbuf();
        EXPECT_FALSE(text.str().empty()) << name;
        return name.ends_with(".hex") ? bytes_of(text.str()) : text.str();
    }

    /// The bytes of a dump: pairs of hexadecimal digits, text in quotes, and comments behind a #.
    static std::string bytes_of(const std::string& dump) {
        std::string bytes;
        std::istringstream lines(dump);
        for (std::string line; std::getline(lines, line);) {
            for (std::size_t i = 0; i < line.size() && line[i] != '#'; ++i) {
                if (line[i] == '"') {
                    const auto end = line.find('"', i + 1);
                    bytes += line.substr(i + 1, end - i - 1);
                    i = end;
                } else if (std::isxdigit(static_cast<unsigned char>(line[i]))) {
                    bytes += char(std::stoi(line.substr(i++, 2), nullptr, 16));
                }
            }
        }
        return bytes;
    }
};

const std::string ramp = "-1\n-0.5\n0\n0.5\n1\n1.5\n";

TEST_F(FormatsTest, FilesOfOtherPrograms) {
    const struct {
        std::string name, want, told = "";
    } cases[] = {
        {"big_endian.npy", "value\n" + ramp},
        {"complex.npy", "re,im\n-1,1.5\n-0.5,1\n0,0.5\n0.5,0\n1,-0.5\n1.5,-1\n"},
        {"columns.npy", "value 1,value 2\n1,-10\n2,-20\n3,300\n", "(3, 2) is taken for 2 signals"},
        {"fortran.npy", "value 1,value 2\n1,-10\n2,-20\n3,300\n", "(3, 2) is taken for 2 signals"},
        {"rows.npy", "value 1,value 2\n1,-10\n2,-20\n3,300\n", "(2, 3) is taken for 2 signals"},
        {"half.npy", "value\n0.5\n-2\n5.960464477539063e-08\n65504\n"},
        {"plain.mat",
         "# delta = 0.25\n# axis = s\nx\n" + ramp +
             "\n# delta = 0.25\n# axis = s\ny 1,y 2\n1,-10\n2,-20\n3,300\n",
         "fs is taken for all signals\nwavkit: in: y of 3 by 2 is taken for 2 signals"},
        {"time.mat",
         "# delta = 0.25\n# start = 3\n# name = u\nre,im\n-1,2\n-0.5,2\n0,2\n0.5,2\n1,2\n1.5,2\n",
         "left out: s; t is taken for the time"},
        {"column.mat", "# delta = 0.125\n# start = -2\nx\n" + ramp, "dt is taken"},
        {"vibration.uff",
         "# delta = 0.025\n# start = 0.5\n# axis = s\nAcceleration "
         "(m/s^2)\n1\n-2\n3.5\n-0.4\n5000\n"
         "-0.006\n\n# delta = 5\n# start = 10\n# axis = Hz\n# name = Transfer\nre,im\n"
         "1.234567890123,-2\n3,0.45\n"},
        {"binary.uff.hex", "# delta = 0.5\n# axis = s\nShaker (N)\n1\n-2\n0.5\n10\n"},
        {"logger.tdms.hex",
         "# delta = 0.5\n# start = 3\n# origin = 2026-03-01T12:00:00.5Z\n# axis = s\nvolt "
         "(V)\n1\n2\n"
         "3\n4\n5\n6\n7\n8\n\nit's\n10\n-10\n11\n-11\n12\n-12\n13\n14\n"},
    };
    for (const auto& [name, want, told] : cases) {
        write("in", file(name));
        const auto done = shell("wavkit convert in - --to csv");
        EXPECT_EQ(done.out, want) << name << "\n" << done.err;
        EXPECT_NE(done.err.find(told), std::string::npos) << done.err;
        EXPECT_EQ(done.err.empty(), told.empty()) << done.err;
        // Block by block it is the same, one signal after the other.
        write("one.txt", "1");
        const auto whole = shell(
            "wavkit convert in a.dsp 2>/dev/null; "
            "wavkit filter in --taps one.txt -o b.dsp; cmp a.dsp b.dsp");
        EXPECT_EQ(whole.status, 0) << name << whole.err;
    }
}

TEST_F(FormatsTest, ArraysAreWrittenAsTheyAreRead) {
    write("x.csv", "t,u (V),i\n2,0.1,-1\n2.5,1e300,3\n3,-0.3,5\n");
    const auto done = shell("wavkit convert x.csv x.npy");
    EXPECT_NE(done.err.find("holds no spacing"), std::string::npos) << done.err;
    EXPECT_EQ(contents("x.npy").substr(10, 59),
              "{\'descr\': \'<f8\', \'fortran_order\': False, \'shape\': (3, 2), }");
    EXPECT_EQ(contents("x.npy").size(), 128u + 48u);
    EXPECT_EQ(printed("convert x.npy - --to csv"), "value 1,value 2\n0.1,-1\n1e+300,3\n-0.3,5\n");
    for (const std::string options : {"", " --compress"}) {
        printed("convert x.csv x.mat" + options);
        EXPECT_EQ(printed("convert x.mat - --to csv"),
                  "# delta = 0.5\n# start = 2\nu (V)\n0.1\n1e+300\n-0.3\n\n"
                  "# delta = 0.5\n# start = 2\ni\n-1\n3\n5\n");
    }
}

/// Side by side as they come, and from file to file.
TEST_F(FormatsTest, ComplexChannelsStayComplex) {
    write("a.txt", Signals{complex<dsp>({{1, 2}, {3, 4}, {5, 6}})});
    write("b.txt", Signals{complex<dsp>({{7, 8}, {9, 0}, {-1, -2}})});
    const std::string want = "re,im\n1,2\n3,4\n5,6\n\nre,im\n7,8\n9,0\n-1,-2\n";
    for (const std::string format : {"dsp", "csv", "npy", "mat", "txt"}) {
        printed("join a.txt b.txt --channels -o c." + format);
        const auto told = [&](const std::string& from) {
            const auto text = printed("convert " + from + "." + format + " - --to csv");
            return std::regex_replace(text, std::regex("#.*\n"), "");
        };
        EXPECT_EQ(told("c"), want) << format;
        printed("convert c.dsp d." + format);
        EXPECT_EQ(told("d"), want) << format;
    }
}

// A start is on the axis of whatever comes of a signal, or it is told that it is not.
TEST_F(FormatsTest, TheStartTravels) {
    write("x.csv", "Time (s),u\n10,1\n10.5,4\n11,1\n11.5,1\n12,1\n");
    write("one.txt", "1");
    write("at.txt", "10.25");
    const std::pair<std::string, std::string> lines[] = {
        {"convert x.csv - --to text | wavkit convert - - --to csv --with-time", "\n10.5,4\n"},
        {"filter x.csv --taps one.txt --to csv --with-time", "\n10.5,4\n"},
        {"cut x.csv --begin 10.4 --to csv --with-time", "u\n10.5,4\n"},
        {"join x.csv x.csv --channels --to csv --with-time", "\n10.5,4,4\n"},
        {"mix x.csv x.csv --to csv --with-time", "\n10.5,8\n"},
        {"scale x.csv --gain 2 --unit m --to csv", "# start = 10\n# axis = s\nu (m)\n2\n"},
        {"derive x.csv --to csv", "# start = 10\n"},
        {"edges x.csv --level 2.5 --json", "\"first_at\":10.25"},
        {"decimate x.csv --by 2 --to csv", "# start = 10\n"},
        {"resample x.csv --to-times at.txt --to csv", "u\n3.0"},
        {"envelope x.csv --to csv -o - --with-time", "time (s),u\n10,"},
        {"envelope x.csv", "10.5\n"},
        {"interp x.csv --at at.txt", "10.25,2.5\n"},
        {"interp x.csv --rate 4", "\n10.25,2.5\n"},
        {"stats x.csv", "max at                 10.5 s\n"},
        {"info x.csv", "start     10 s\n"},
        {"fit x.csv --json", "\"mean_x\":11"},
        {"correlate one.txt x.csv --delta 0.5", "lag          10.5\n"},
        {"convert one.txt - --start -3 --to csv --with-time", "\n-3,1\n"},
    };
    for (const auto& [line, want] : lines) {
        EXPECT_NE(printed(line).find(want), std::string::npos) << line << "\n" << printed(line);
    }
    for (const std::string name : {"y.dsp", "y.wav", "y.npy"}) {
        const auto done = shell("wavkit convert x.csv " + name);
        EXPECT_NE(done.err.find("holds no start"), std::string::npos) << name << done.err;
    }
    if (std::system("command -v gnuplot >/dev/null") == 0) {
        printed("filter x.csv --taps one.txt --plot y.svg");
        EXPECT_NE(contents("y.svg").find("11.5<"), std::string::npos);
        EXPECT_NE(contents("y.svg").find("time (s)"), std::string::npos);
    }
}

TEST_F(FormatsTest, DamagedFilesAreRefused) {
    std::string made;
    int count = 0;
    for (const std::string name : {"fortran.npy", "plain.mat", "time.mat", "vibration.uff",
                                   "binary.uff.hex", "logger.tdms.hex"}) {
        const auto whole = file(name);
        // Cut short, and with bytes that count and point far beyond the end.
        for (std::size_t at = 5; at < whole.size();
             at += std::max<std::size_t>(whole.size() / 23, 1)) {
            write("m" + std::to_string(count++), whole.substr(0, at));
            auto wrong = whole;
            for (std::size_t i = at; i < std::min(at + 3, wrong.size()); ++i) wrong[i] = '\xFF';
            write("m" + std::to_string(count++), wrong);
        }
    }
    const auto done = shell(
        "for f in m*; do (ulimit -t 20; wavkit info $f >out 2>err); s=$?;"
        "[ $s -le 1 ] || echo $f $s; done");
    EXPECT_EQ(done.out, "") << count;
    auto wide = file("vibration.uff");  // a number with an exponent, wider than any field
    write("wide.uff", wide.insert(wide.find("1.234567890123D"), 1 << 22, '1'));
    EXPECT_NE(shell("wavkit info wide.uff").err.find("is not a number"), std::string::npos);
    write("daqmx.tdms", bytes_of("\"TDSm\" 8E000000 69120000 0000000000000000 0000000000000000"));
    EXPECT_NE(shell("wavkit info daqmx.tdms").err.find("DAQmx"), std::string::npos);
}

TEST_F(FormatsTest, SoundOfOtherKinds) {
    // AU: "Creating AU files", 16 bits, big endian, 8 kHz. W64: the same samples, little endian.
    write("x",
          bytes_of("\".snd\" 00000018 00000008 00000003 00001F40 00000001 4000 C000 2000 1000"));
    EXPECT_EQ(printed("convert x - --to csv"),
              "# delta = 0.000125\n# axis = s\nvalue\n0.5\n-0.5\n0.25\n0.125\n");
    write("x", bytes_of("\"riff\" 2E91CF11A5D628DB04C10000 7000000000000000"
                        "\"wave\" F3ACD3118CD100C04F8EDB8A \"fmt \" F3ACD3118CD100C04F8EDB8A"
                        "2800000000000000 01000100401F0000803E000002001000"
                        "\"data\" F3ACD3118CD100C04F8EDB8A 2000000000000000 0040 00C0 0020 0010"));
    EXPECT_EQ(printed("convert x - --to csv"),
              "# delta = 0.000125\n# axis = s\nvalue\n0.5\n-0.5\n0.25\n0.125\n");
    // Samples of floating point have an extended format and a count of samples.
    printed("convert x y.wav --bits 64");
    EXPECT_EQ(contents("y.wav").substr(48),
              bytes_of("\"fmt \" 12000000 0300 0100 401F0000 00FA0000 0800 4000 0000"
                       "\"fact\" 04000000 04000000 \"data\" 20000000"
                       "000000000000E03F 000000000000E0BF 000000000000D03F 000000000000C03F"));
}

}  // namespace
}  // namespace wavkit::test
