// Formats, in and out: nothing is lost that the format can hold, and nothing is made up.
#include <algorithm>
#include <tuple>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using ConvertTest = ProgramTest;

void expect_near(const Signals& got, const Signals& want, double tolerance) {
    ASSERT_EQ(got.size(), want.size());
    for (std::size_t s = 0; s < want.size(); ++s) {
        // A spacing in single precision, or as a whole rate, is as near as it can be.
        EXPECT_NEAR(got[s]->delta / want[s]->delta, 1, tolerance > 0 ? 2e-7 : 0);
        ASSERT_TRUE(got[s]->points == want[s]->points && got[s]->complex == want[s]->complex);
        for (int i = 0; i < int(used(want[s].operator->())); ++i) {
            const double a = got[s][i], b = want[s][i];
            if (std::isnan(a) && std::isnan(b)) continue;
            EXPECT_LE(std::fabs(a - b), tolerance * std::max(1.0, std::fabs(b))) << s << ", " << i;
        }
    }
}

TEST_F(ConvertTest, EveryFormatGivesBackWhatItWasGiven) {
    const double step = 1.0 / 48000;
    const Signals one{real<dsp>({0.1L, -1.0L, 1.0L / 3, 0.0L, 0.999L}, step)};
    const Signals complex_one{complex<dsp>({{0.1L, -0.2L}, {0.3L, 1.0L / 7}}, step)};
    const Signals mixed{sine(100, 3.3, 0.7, step), complex_one[0], one[0]};
    const Signals pair{sine(9, 1.2, 0.5, step), sine(9, 2.0, -0.9, step)};
    const Signals odd{real<dsp>({1e-300L, -1e300L, std::nan(""), 5e7L}, 0.25)};
    const double exact = 0, digits16 = 1e-15, single = 1e-7, bits16 = 1.0 / 32767, bits24 = 3e-7;
    const struct {
        Signals signals;
        std::string file, options;
        double tolerance;
    } cases[] = {
        {mixed, "x.sig", "", exact},
        {mixed, "x.csv", "", exact},
        {odd, "x.csv", "", exact},
        {mixed, "x.csv", "--with-time", digits16},
        {odd, "x.csv", "--with-time", exact},
        {mixed, "x.txt", "", digits16},
        {mixed, "x.bin", "--type float", single},
        {mixed, "x.dsa", "--type float", 1e-6},
        {one, "x.wav", "", single},
        {pair, "x.wav", "--bits float", single},
        {pair, "x.wav", "--bits 16", bits16},
        {pair, "x.wav", "--bits 24", bits24},
        {pair, "x.wav", "--bits 32", 1e-9},
        {pair, "x.wav", "--bits 64", exact},
        {mixed, "x.mat", "", exact},
        {mixed, "x.mat", "--compress --type float", single},
        {pair, "x.flac", "", bits24},
        {one, "x.flac", "--bits 16", bits16},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.file + " " + c.options);
        write("start.dsp", c.signals);
        printed("convert start.dsp " + c.file + " " + c.options);
        expect_near(through(c.file), c.signals, c.tolerance);
    }
    write("x.dsp", complex_one);
    printed("convert x.dsp x.wav");
    const auto imaginary = through("x.wav", "--channel 2");
    expect_near(imaginary, {real<dsp>({-0.2L, 1.0L / 7}, step)}, single);
}

/// What comes of a table, and the guesses that are told about it.
struct TableCase {
    std::string text, options, want, told = "";
};

TEST_F(ConvertTest, CsvDialects) {
    const TableCase cases[] = {
        {"1\n2\n3\n", "", "value\n1\n2\n3\n"},
        {"value\n1\n\n\n", "--rate 4", "# delta = 0.25\n# axis = s\nvalue\n1\n"},
        {"a;b\n1,5;-2e3\n", "", "a,b\n1.5,-2000\n"},
        {"1\t2,5\n", "--column 2", "value\n2.5\n"},
        {"\"t\",\"v\"\r\n0,+7,\r\n0.5,8,\r\n", "", "# delta = 0.5\nv\n7\n8\n"},
        {"# c\nTime [s], U\n1,4\n1.25,5\n# a\n1.5,6\n", "",
         "# delta = 0.25\n# start = 1\n# axis = s\nU\n4\n5\n6\n"},
        {"frequency,Re,IM\n-1,2,3\n0,4,5\n", "", "# start = -1\nre,im\n2,3\n4,5\n"},
        {"10 1\n  20   2\n30 3 \n", "--time", "# delta = 10\n# start = 10\nvalue\n1\n2\n3\n"},
        {"t,u (V),i\n0,1,2\n1,3,4\n", "--column \"U (V),I\"", "u (V),i\n1,2\n3,4\n"},
        {"d,u,i\nMo,1,2\nTu,3,4\n", "--column u,3 --delta 9 --complex-columns",
         "# delta = 9\nre,im\n1,2\n3,4\n"},
        {"d,u,i\nMo,1,2\nTu,3,4\n", "", "u,i\n1,2\n3,4\n", "'d' holds no numbers"},
        {"NaN,inf\n-INF,nan\n", "", "value 1,value 2\nnan,inf\n-inf,nan\n"},
        {"0.00 1\n0.33 2\n0.67 3\n1 4\n", "--time --delta 1", "value\n1\n2\n3\n4\n"},
        {"# delta = 5\nv\n1\n\nre,im\n2,3\n", "", "# delta = 5\nv\n1\n\nre,im\n2,3\n"},
        {"1e-400,1\n", "--column 1", "value\n0\n"},
        // As instruments and spreadsheets write tables.
        {"\xEF\xBB\xBFtime,v\n1,4\n2,5\n", "", "# start = 1\nv\n4\n5\n"},
        {std::string("\xFF\xFEu\0;\0v\0\n\0001\0,\0005\0;\0002\0\n\0", 22), "", "u,v\n1.5,2\n"},
        {"Time,U\n(ms),(V)\n0,1\n1,2\n", "--with-time", "time (s),U (V)\n0,1\n0.001,2\n",
         "times in ms are taken in seconds; line 2 is taken for the units"},
        {"Scope,X1\nInterval,4e-8\n\nTIME,CH1,CH2\n0,1,2\n1e-3,3,4\n", "",
         "# delta = 0.001\nCH1,CH2\n1,2\n3,4\n", "2 lines above the table"},
        {"ID 7\n8 9\nv\n1\n2\n", "--skip 2", "v\n1\n2\n"},
        {"Wert\n1,5\n2,7\n", "", "Wert\n1.5\n2.7\n", "taken for decimal points"},
        {"1,05\n-2,5\n", "", "value\n1.05\n-2.5\n", "taken for decimal points"},
        {"1,2\n4,5\n", "", "value 1,value 2\n1,2\n4,5\n", "taken to separate columns"},
        {"\"1,5\",\"2,5\"\n", "--decimal comma", "value 1,value 2\n1.5,2.5\n"},
        {"0,1.5\n0.1,2.5\n0.2,3.5\n", "", "# delta = 0.1\nvalue\n1.5\n2.5\n3.5\n",
         "column 1 ascends in equal steps"},
        {"sample,a,b\n1,5,6\n2,7,8\n3,9,9\n", "", "a,b\n5,6\n7,8\n9,9\n", "counts the rows"},
        {"T (h)  U [V]\n0 1\n1 2\n", "", "# delta = 3600\n# axis = s\nU (V)\n1\n2\n", "in h"},
        {"t,v\n0,1\n11,2\n", "", "# delta = 11\nv\n1\n2\n"},
        {"(ms),(V)\n0,1\n2,3\n", "", "# delta = 0.002\n# axis = s\nvalue (V)\n1\n3\n", "ms"},
        {",a\n0,5\n1,7\n", "", "a\n5\n7\n", "column 1 counts the rows"},
        {"# time, u\n0,1.5\n1,2\n", "", "u\n1.5\n2\n", "the comment in line 1"},
        {"at,x\n2026-03-01T12:00:00+01:00,1\n2026-03-01T12:00:00.5+01:00,2\n", "--with-time",
         "# origin = 2026-03-01T11:00:00Z\ntime (s),x\n0,1\n0.5,2\n", "dates"},
        {"Date;Time;U\n1.3.2026;12:00:59,5;1,5\n1.3.2026;12:01:00;2\n", "",
         "# delta = 0.5\n# origin = 2026-03-01T12:00:59.5\n# axis = s\nU\n1.5\n2\n"},
        // What is missing.
        {"v\nNA\nNA\n1\n\n", "--missing hold", "v\n1\n1\n1\n"},
        {"u,v\n1,\n,5\n3,\n4,9\n", "--missing linear", "u,v\n1,5\n2,5\n3,7\n4,9\n"},
        {"t,v\n0,1\n1,2\n4,5\n5,nan\n", "--missing linear", "v\n1\n2\n3\n4\n5\n5\n"},
        {"t,v\n0,1\n1,2\n,\n4,5\n", "--missing hold", "v\n1\n2\n2\n2\n5\n"},
    };
    for (const auto& [text, options, want, told] : cases) {
        write("in.csv", text);
        const auto done = shell("wavkit convert in.csv - --to csv " + options);
        EXPECT_EQ(done.out, want) << text << done.err;
        EXPECT_EQ(std::count(done.err.begin(), done.err.end(), '\n'), told.empty() ? 0 : 1);
        EXPECT_NE(done.err.find(told), std::string::npos) << done.err;
    }
}

TEST_F(ConvertTest, CsvFaultsAreFoundWhereTheyAre) {
    const std::tuple<std::string, std::string, std::string> cases[] = {
        {"1\n2\nx\n", "", "in.csv:3: 'x' is not a number"},
        {"# c\nu,v\n\n1,2\n3\n", "", "in.csv:5: expected 2 fields, found 1"},
        {"v\nNA\n1\n", "", "in.csv:2: the value of 'v' is missing ('NA')"},
        {"v\nNA\n\n1\n", "", "in.csv:2: the value of 'v' is missing ('NA')"},
        {"u,v\n1,2\n3,\n", "", "in.csv:3: the value of 'v' is missing"},
        {"a,b\n1,2\n", "--column c", "in.csv:2: there is no column 'c'"},
        {"1,2,3\n", "--complex-columns", "in.csv:1: a complex signal takes two columns, not 3"},
        {"0,1\n1,2\n3,3\n4,4\n", "--time", "in.csv:3: the time column is not equally spaced: 1 "},
        {"0,1\n1,2\n2,1\n9,3\n10,0\n12,0\n", "--time",
         "in.csv:4: the time column is not equally spaced: 6 samples are missing between 2 and 9, "
         "and some in 1 other place"},
        {"0,1\n1,2\n2,1\n2.4,3\n3,3\n4,0\n", "--time", "in.csv:4: the time column is not equally"},
        {"2,1\n1,2\n", "--time", "in.csv:2: the time column is not equally spaced and increasing"},
        {"0\n1\n", "--time", "in.csv:1: no column beside the time"},
        {"time,value\n", "", "there is no signal in in.csv"},
    };
    for (const auto& [text, options, complaint] : cases) {
        write("in.csv", text);
        const auto done = shell("wavkit convert in.csv out.dsp " + options);
        EXPECT_EQ(done.status, 1);
        EXPECT_NE(done.err.find(complaint), std::string::npos) << done.err;
    }
}

TEST_F(ConvertTest, TheFormatIsToldFromTheContents) {
    write("plain.txt", "1 2\n0x10\n");
    EXPECT_EQ(printed("convert plain.txt - --to csv --delta 3"), "# delta = 3\nvalue\n1\n2\n16\n");
    write("table.txt", "u, i\n1, 2\n");
    write("at.txt", "1 2\n3 4\n");
    EXPECT_EQ(printed("convert table.txt - --to csv"), "u,i\n1,2\n");
    EXPECT_EQ(printed("convert at.txt - --to csv --from csv"), "value 1,value 2\n1,2\n3,4\n");
    // Its own CSV through a pipe, with a header and without.
    const std::string made = "generate cos 0.1 --delta 0.5 --points 3 --to csv | ";
    const std::string want = printed("generate cos 0.1 --delta 0.5 --points 3 --to csv");
    EXPECT_EQ(printed(made + "wavkit convert - - --to csv"), want);
    EXPECT_EQ(printed(made + "grep -v value | wavkit convert - - --to csv"), want);
    write("x.dsp", Signals{sine(50, 2, 0.5, 0.125)});
    printed("convert x.dsp x.wav && mv x.wav misnamed.csv");
    EXPECT_NE(printed("info misnamed.csv").find("WAV"), std::string::npos);
}

TEST_F(ConvertTest, ReadingWholeAndBlockByBlockAreOne) {
    const auto same = [&](const std::string& name, const std::string& want) {
        EXPECT_EQ(printed("convert " + name + " - --to csv"), want);
        EXPECT_EQ(printed("filter " + name + " --taps one.txt --to csv"), want);
    };
    write("one.txt", "1");
    const std::pair<std::string, std::string> texts[] = {
        {"1 2 3\n#DSP delta = 2\n4 5 6\n", "# delta = 2\nvalue\n1\n2\n3\n4\n5\n6\n"},
        {"1 2 3 #DSP complex = 1\n4 5 # end", "re,im\n1,2\n3,4\n5,0\n"},
        {"#DSP points = 0\n#DSP delta = 2\n#DSP points = 1\n7", "# delta = 2\nvalue\n7\n"},
        {"#DSP points = 2\n1-2-3 # b\n4", "value\n1\n-2\n\nvalue\n-3\n4\n"},
        {"#DSP points = 2\n1 # a\n2 #DSP points = 1\n3", "value\n1\n2\n\nvalue\n3\n"},
    };
    for (const auto& [text, want] : texts) {
        write("x.txt", text);
        same("x.txt", want);
    }
    write("x.csv", "v\n1\n\nno other\n\n");
    same("x.csv", "v\n1\n");
    write("x.dsp", Signals{real<dsp>({5}), real<dsp>({6})});
    write("mixed.dsp", contents("x.dsp") + "7 8");
    same("mixed.dsp", "value\n5\n\nvalue\n6\n\nvalue\n7\n8\n");

    // What nobody asked for may be damaged; what comes late counts for the whole.
    write("x.txt", "#DSP points = 1\n4\n#DSP points = 9\n5 worse");
    EXPECT_EQ(printed("convert x.txt - --to csv --signal 1"), "value\n4\n");
    EXPECT_NE(shell("wavkit hist x.txt").err.find("several signals"), std::string::npos);
    std::string text, want = "# delta = 4\nvalue\n";
    for (int i = 0; i < 40000; ++i) {
        text += std::to_string(i) + (i % 9000 ? " " : "\n# a note\n");
        want += std::to_string(i) + "\n";
    }
    write("x.txt", text + "#DSP delta = 4");
    same("x.txt", want);
}

TEST_F(ConvertTest, ManySignalsAreReadOnce) {
    Signals signals;
    for (int i = 0; i < 100; ++i) signals.push_back(sine(300, 3 + i / 100.0, 1));
    write("x.dsp", signals);
    write("one.txt", "1");
    for (const std::string name : {"x.dsp", "x.txt", "x.csv"}) {
        if (name != "x.dsp") printed("convert x.dsp " + name);
        const auto done = shell("read -r _ before </proc/$$/io; wavkit filter " + name +
                                " --taps one.txt -o y.dsp; read -r _ after </proc/$$/io;"
                                "echo $((after - before))");
        expect_near(read("y.dsp"), signals, 1e-15);
        // Where the system counts the bytes that a program reads, they are a few times the file.
        if (std::filesystem::exists("/proc/self/io")) {
            const auto bytes = std::stod(done.out), size = double(contents(name).size());
            EXPECT_GE(bytes, size) << name;
            EXPECT_LT(bytes, 10 * size) << name;
        }
    }
}

TEST_F(ConvertTest, SoundKeepsWhatItCanAndSaysWhatItCannot) {
    write("loud.dsp", Signals{real<dsp>({0.5L, 1.5L, -3.0L}, 0.5)});
    const auto done = shell("wavkit convert loud.dsp loud.wav --bits 16");
    EXPECT_NE(done.err.find("2 samples beyond -1 to 1 clipped"), std::string::npos) << done.err;
    expect_near(through("loud.wav"), {real<dsp>({0.5L, 1.0L, -1.0L}, 0.5)}, 1.0 / 32767);
    write("odd.dsp", Signals{real<dsp>({0, NAN}, 1 / 2.5)});
    for (const auto& [options, complaint] :
         {std::pair{"", "whole number of samples a second, not 2.5"},
          {" --rate 2 --bits 24", "sample 1 is not a number"}}) {
        const auto failed = shell(std::string("wavkit convert odd.dsp odd.wav") + options);
        EXPECT_NE(failed.err.find(complaint), std::string::npos) << failed.err;
    }
    EXPECT_EQ(printed("convert odd.dsp odd.wav --rate 2"), "");
}

TEST_F(ConvertTest, CommandsPipe) {
    write("x.csv", "time,value\n0,1\n0.5,2\n1,-1\n");
    const auto done =
        shell("wavkit convert x.csv - | wavkit convert - - --to wav | wavkit convert - - --to csv");
    EXPECT_EQ(done.out, "# delta = 0.5\n# axis = s\nvalue\n1\n2\n-1\n") << done.err;
}

TEST_F(ConvertTest, AFailureLeavesEverythingAsItWas) {
    write("good.dsp", Signals{sine(64, 4, 1)});
    write("bad.dsp", contents("good.dsp").substr(0, 200));
    write("out.csv", "precious");
    std::filesystem::create_directory(home / "folder");
    const auto before = files();
    for (const std::string line :
         {"convert bad.dsp out.csv", "convert good.dsp folder --to csv", "convert folder out.csv",
          "convert good.dsp /dev/full --to text", "convert - out.csv", "info good.dsp bad.dsp"}) {
        const auto done = shell("wavkit " + line);
        EXPECT_EQ(done.status, 1) << line;
        EXPECT_TRUE(done.err.starts_with("wavkit: ")) << done.err;
        EXPECT_EQ(files(), before) << line;
        EXPECT_EQ(contents("out.csv"), "precious") << line;
    }
    // A file may be converted onto itself, and links and permissions stay.
    std::filesystem::create_symlink("good.dsp", home / "link.dsp");
    std::filesystem::permissions(home / "good.dsp", std::filesystem::perms(0640));
    printed("convert link.dsp link.dsp --rate 10");
    EXPECT_TRUE(std::filesystem::is_symlink(home / "link.dsp"));
    EXPECT_EQ(int(std::filesystem::status(home / "good.dsp").permissions()), 0640);
    EXPECT_EQ(read("good.dsp").at(0)->delta, 0.1);
}

TEST_F(ConvertTest, InfoTellsWhatIsThere) {
    write("x.dsp", Signals{real<dsp>({3, -1, 1, 1}, 0.5), complex<dsp>({{3, 4}, {0, 1}})});
    EXPECT_EQ(printed("info x.dsp"),
              "x.dsp: binary signal file, 2 signals\n  signal    1 of 2\n  points    4\n"
              "  kind      real\n  delta     0.5\n  duration  2\n  mean      1\n"
              "  rms       1.73205\n  min       -1\n  max       3\n  signal    2 of 2\n"
              "  points    2\n  kind      complex\n  delta     1\n  duration  2\n"
              "  mean      1.5,2.5\n  rms       3.60555\n  min       0,1 (least magnitude)\n"
              "  max       3,4 (greatest magnitude)\n");
}

}  // namespace
}  // namespace wavkit::test
