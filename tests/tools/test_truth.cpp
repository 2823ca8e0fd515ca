// What a name may hold, what an output may refuse, and which peaks are real.
#include "tools/program.hpp"

namespace wavkit::test {
namespace {

using TruthTest = ProgramTest;

TEST_F(TruthTest, NamesAndUnitsAreNoProgramForPictures) {
    const std::string name = "`touch A`'\"\n!touch B\nset output '\x1b[31m_^{x}\xff\xc2.dsp";
    write(name, Signals{sine(256, 20, 1)});
    // As gnuplot gets it, and as a picture.
    write("all.sh",
          "chmod +x gnuplot\n"
          "name=$(ls | grep -av -e sh$ -e ^gnuplot$)\n"
          "unit=$'\\xc2\\xb5`touch C`\\'\\n!touch D\\n\\xe2\\x82'\n"
          "for to in a.png a.svg -; do\n"
          "    wavkit spectrum \"$name\" --unit \"$unit\" --peaks 1 --plot $to || exit\n"
          "    wavkit filter \"$name\" --lowpass 0.1 --plot $to || exit\n"
          "done\n"
          "wavkit spectrum \"$name\" --unit \"$unit\" --waterfall w.png --average 16 || exit\n"
          "PATH=$PWD:$PATH wavkit spectrum \"$name\" --unit \"$unit\" --peaks 1 --plot s.svg\n");
    write("gnuplot", "#!/bin/sh\nexec /bin/cat\n");
    const auto done = shell(". ./all.sh");
    EXPECT_EQ(done.status, 0) << done.err;
    for (const std::string touched : {"A", "B", "C", "D"}) EXPECT_FALSE(files().contains(touched));
    const auto script = contents("s.svg"), svg = contents("a.svg");
    const std::string shown =
        "`touch A`''\"\\n!touch B\\nset output ''\\x1b[31m_^{x}\\xff\\xc2.dsp";
    EXPECT_NE(script.find("set title '" + shown), script.npos) << script.substr(0, 900);
    EXPECT_EQ(svg.find_first_of("\x1b\xff"), svg.npos);
    EXPECT_NE(svg.find("</svg>"), svg.npos);
    // Terminals get the names of files and units in the same way, and messages on one line.
    EXPECT_EQ(done.out.find("\x1b[31m"), done.out.npos);
    write("no.sh", "wavkit info $'no\\n\\x1b[31m\\xff'");
    EXPECT_EQ(shell(". ./no.sh").err,
              "wavkit: cannot read no\\n\\x1b[31m\\xff: No such file or directory\n");
}

TEST_F(TruthTest, AFullOutputIsAnError) {
    write("x.dsp", Signals{sine(256, 20, 1), sine(256, 20, 1)});
    for (const std::string command :
         {"info x.dsp", "stats x.dsp --json", "spectrum x.dsp", "spectrum x.dsp --peaks 2",
          "correlate x.dsp", "envelope x.dsp", "window hann", "hist x.dsp", "fit x.dsp --json",
          "roots 1 2 1", "design lowpass 0.1", "convert x.dsp - --to csv", "--help"}) {
        const auto done = shell("wavkit " + command + " >/dev/full");
        EXPECT_EQ(done.status, 1) << command;
        EXPECT_NE(done.err.find("cannot write standard output"), done.err.npos) << command;
    }
}

TEST_F(TruthTest, SideLobesAreNoPeaks) {
    std::vector<std::string> windows;
    for (char name[64]; dsp_window_to_str(int(windows.size()), name, 64) == 0;)
        windows.emplace_back(name);
    // Between bins, beside an offset that leaks as well.
    const auto weak = sine(1000, 371.81, 0.03);
    auto one = sine(1000, 123.37, 1), two = sine(1000, 123.37, 1);
    for (int i = 0; i < 1000; ++i) {
        one->data[i] += 2.5;
        two->data[i] += weak->data[i];
    }
    write("one.dsp", Signals{one});
    write("two.dsp", Signals{two});
    // Whole cycles leak nothing through the uniform window: a hundred-thousandth stays a peak.
    auto whole = sine(1024, 101, 1);
    const auto harmonic = sine(1024, 303, 1e-5);
    for (int i = 0; i < 1024; ++i) whole->data[i] += harmonic->data[i];
    write("whole.dsp", Signals{whole});
    EXPECT_NEAR(rows(printed("spectrum whole.dsp --window uniform --peaks 2")).at(1)[2], 1e-5,
                1e-7);

    for (const auto& window : windows) {
        for (const std::string options :
             {"", "--fraction 0.3", "--any-length", "--average 200 --any-length"}) {
            SCOPED_TRACE(window + " " + options);
            const auto peaks = [&](const std::string& file) {
                return rows(
                    printed("spectrum " + file + " --peaks 5 --window " + window + " " + options));
            };
            const auto alone = peaks("one.dsp"), both = peaks("two.dsp");
            ASSERT_EQ(alone.size(), 1u);
            EXPECT_NEAR(alone[0][0], 0.12337, 0.002);
            ASSERT_EQ(both.size(), 2u);
            EXPECT_NEAR(both[1][0], 0.37181, 0.002);
        }
    }
    const auto aside = rows(printed("spectrum one.dsp --window hamming --peaks 5 --band 0.2 0.5"));
    EXPECT_EQ(aside.size(), 0u);  // leaked from outside of the band
}

TEST_F(TruthTest, FiguresAreThoseOfAPerson) {
    std::vector<long double> large(1000, 1e200L), small(1000, 1e-200L);
    large[3] = large[4] = -1e200L;
    write("x.dsp", Signals{real<dsp>(large, 0.1), real<dsp>(small), complex<dsp>({{NAN, 0}})});
    const auto text = printed("stats x.dsp");
    for (const std::string line :
         {"geometric mean         1e+200\n", "duration               100\n",
          "geometric mean         1e-200\n", "sum                    nan,"})
        EXPECT_NE(text.find(line), text.npos) << line << text;
    EXPECT_EQ(text.find("-nan"), text.npos);
    write("short.dsp", Signals{real<dsp>({1, 2, 3}, 0.1), real<dsp>({1}, 0.0010000000004L)});
    EXPECT_NE(printed("stats short.dsp --json").find("\"duration\":0.3,"), text.npos);
    const auto shown = printed("info short.dsp");
    EXPECT_NE(shown.find("duration  0.3\n"), shown.npos) << shown;
    EXPECT_NE(shown.find("delta     0.001\n"), shown.npos) << shown;
}

TEST_F(TruthTest, ManyChannelsAndLongSignalsTakeLittleMemory) {
    // Six channels apart and together again, bit by bit.
    std::string made;
    for (int c = 1; c <= 6; ++c) {
        made += "wavkit generate noise 0.1 --seed " + std::to_string(c) +
                " --points 3000 --rate 8000 --type float && ";
    }
    ASSERT_EQ(shell("{ " + made + "true; } >six.dsp").status, 0);
    printed("convert six.dsp six.wav");
    printed("convert six.wav back.dsp --type float");
    EXPECT_EQ(contents("back.dsp"), contents("six.dsp"));
    printed("convert back.dsp again.wav");
    EXPECT_EQ(contents("again.wav"), contents("six.wav"));
    printed("convert six.wav fifth.dsp --channel 5 --type float");
    EXPECT_EQ(contents("fifth.dsp"), contents("six.dsp").substr(4 * contents("fifth.dsp").size(),
                                                                contents("fifth.dsp").size()));
    // 32 MB of samples pass through less memory, and none is taken for a segment that nothing
    // fills.
#ifdef __SANITIZE_ADDRESS__
    const std::string lean;
#else
    const std::string lean = "ulimit -v 32000; ";
#endif
    write("x.csv", [] {
        std::string text;
        for (int i = 0; i < 4000000; ++i) text += "1\n";
        return text;
    }());
    EXPECT_EQ(shell(lean + "wavkit convert x.csv x.dsp --from csv").status, 0);
    EXPECT_EQ(shell(lean + "wavkit convert x.dsp x.wav --bits 16").status, 0);
    EXPECT_EQ(shell(lean + "wavkit convert x.wav y.dsp").err, "");
    EXPECT_EQ(contents("y.dsp").size(), 24u + 8 * 4000000u);
    const auto done = shell(lean + "wavkit spectrum six.wav --average 1073741824");
    EXPECT_NE(done.err.find("six.wav: the signal has 3000 samples"), done.err.npos) << done.err;
}

TEST_F(TruthTest, ALinkLeadsToItsFile) {
    write("x.txt", "1\n2\n");
    ASSERT_EQ(shell("mkdir d && ln -s d/to.csv link.csv && wavkit convert x.txt link.csv").status,
              0);
    EXPECT_EQ(contents("d/to.csv"), "value\n1\n2\n");
    EXPECT_TRUE(std::filesystem::is_symlink(home / "link.csv"));
}

}  // namespace
}  // namespace wavkit::test
