// Whatever happens while a file is written, its name leads to what was there or to all that is new.
#include <csignal>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

namespace fs = std::filesystem;

/// A command, as it stands before the name of its output, and the formats that it writes.
struct Writer {
    std::string command;
    std::vector<std::string> formats;

    bool reads() const { return command.find("IN") != command.npos; }

    /// The command line. (IN is the file that it reads.)
    std::string line(const std::string& in, const std::string& out) const {
        std::string text = command + " " + out;
        if (reads()) text.replace(text.find("IN"), 2, in);
        return text;
    }
};

const std::vector<std::string> of_signals{"csv", "txt", "dsp", "npy", "mat", "wav", "flac"},
    of_numbers{"csv", "txt", "dsp", "npy", "mat"};

const std::vector<Writer> writers = {{"convert IN", of_signals},
                                     {"cut IN --samples --begin 9 -o", {"wav", "dsp"}},
                                     {"join IN x.dsp -o", {"csv", "flac"}},
                                     {"mix IN x.dsp -o", {"wav", "dsp"}},
                                     {"scale IN --gain 0.5 -o", {"csv", "npy"}},
                                     {"derive IN -o", {"csv", "mat"}},
                                     {"integrate IN -o", {"csv", "txt"}},
                                     {"integrate IN --highpass 50 -o", {"csv", "wav"}},
                                     {"spectrum IN -o", of_numbers},
                                     {"spectrum IN --plot", {"svg"}},
                                     {"spectrum IN --average 64 --waterfall", {"png"}},
                                     {"correlate IN x.dsp -o", {"csv", "dsp"}},
                                     {"response IN x.dsp --segment 1024 -o", {"csv", "dsp"}},
                                     {"response IN x.dsp --segment 64 --plot", {"svg"}},
                                     {"envelope IN -o", {"csv", "dsp"}},
                                     {"edges IN --level 0 -o", {"csv"}},
                                     {"window hann --points 999 -o", {"csv", "dsp"}},
                                     {"filter IN --lowpass 100 -o", {"csv", "wav"}},
                                     {"smooth IN -o", {"csv", "wav"}},
                                     {"smooth IN --plot", {"svg"}},
                                     {"stft IN --length 64 -o", {"csv", "dsp"}},
                                     {"design lowpass 0.1 --length 801 -o", {"csv", "mat"}},
                                     {"generate cos 0.1 --points 2000 -o", {"csv", "flac"}},
                                     {"hist IN --bins 1000 -o", {"csv", "npy"}},
                                     {"interp IN --rate 1500 -o", {"csv", "dsp"}},
                                     {"resample IN --rate 1500 -o", {"csv", "wav"}},
                                     {"decimate IN --by 2 -o", {"csv", "dsp"}}};

class OutputsTest : public ProgramTest {
  protected:
    void SetUp() override {
        ProgramTest::SetUp();
        write("x.dsp", Signals{sine(4000, 1234, 0.5, 0.001)});
        fs::create_directory(home / "folder");
    }

    /// Runs a line for every command and format, which fails and leaves all as it is.
    template <class Line>
    void expect_nothing_new(Line line) {
        for (const Writer& writer : writers) {
            for (const auto& format : writer.formats) {
                const std::string out = "out." + format, text = line(writer, out);
                write(out, "precious");
                const auto before = files();
                const auto done = shell(text);
                EXPECT_EQ(done.status, 1) << text << done.err;
                EXPECT_NE(done.err.find("wavkit: cannot "), done.err.npos) << text << done.err;
                EXPECT_EQ(contents(out), "precious") << text;
                EXPECT_EQ(files(), before) << text;
                fs::remove(home / out);
            }
        }
    }
};

TEST_F(OutputsTest, AFullDiskLeavesWhatWasThere) {
    expect_nothing_new([](const Writer& writer, const std::string& out) {
        return "( ulimit -f 1; wavkit " + writer.line("x.dsp", out) + " ) 2>&1 | cat >&2";
    });
}

TEST_F(OutputsTest, WhatIsNoFileIsTold) {
    fs::create_directory_symlink("folder", home / "to_folder");
    for (const Writer& writer : writers) {
        for (const std::string out : {"folder", "to_folder", "folder/none/out", "/dev/full"}) {
            if (writer.formats[0].ends_with("g")) continue;  // a picture is told by its name
            const std::string line = "wavkit " + writer.line("x.dsp", out) + " --to ";
            const auto before = files();
            const auto done = shell(line + writer.formats[0]);
            EXPECT_EQ(done.status, 1) << line << done.err;
            EXPECT_EQ(files(), before) << line;
        }
    }
}

/// At each step of writing, the name leads to what was there or to the whole file. A signal that
/// can be heard leaves nothing else.
TEST_F(OutputsTest, InterruptionsLeaveTheOldOrTheNewFile) {
    const auto interrupt = [&](const Writer& writer, const std::string& format, int signal) {
        SCOPED_TRACE(writer.command);
        const std::string out = "out." + format;
        printed(writer.line("x.dsp", "whole." + format));
        const std::string whole = contents("whole." + format);
        write(out, "precious");
        const auto before = files();
        int at = 1;
        for (Outcome done{1, "", ""}; done.status != 0; ++at) {
            done = shell("INTERRUPT=" + std::to_string(signal) +
                         " INTERRUPT_AT=" + std::to_string(at) +
                         " ASAN_OPTIONS=verify_asan_link_order=0 LD_PRELOAD=" WAVKIT_INTERRUPT
                         " " WAVKIT_PROGRAM " " +
                         writer.line("x.dsp", out));
            const std::string found = contents(out);
            EXPECT_TRUE(found == "precious" || found == whole) << at;
            if (signal == SIGTERM) {
                EXPECT_EQ(files(), before) << at;
            }
            ASSERT_TRUE(done.status == 0 || done.status == 128 + signal) << done.err;
        }
        EXPECT_GT(at, 5);
        shell("rm -f *.tmp");
    };
    for (const auto& format : of_signals) interrupt(writers[0], format, SIGKILL);
    for (const Writer& writer : writers) interrupt(writer, writer.formats[0], SIGTERM);
}

TEST_F(OutputsTest, LinksAndInputsGetTheWholeFile) {
    for (const Writer& writer : writers) {
        for (const auto& format : writer.formats) {
            printed(writer.line("x.dsp", "whole." + format));
            const std::string whole = contents("whole." + format), link = "link." + format;
            ASSERT_GT(whole.size(), 1024u) << writer.command;
            fs::create_symlink("new." + format, home / link);  // nothing there yet
            printed(writer.line("x.dsp", link));
            EXPECT_TRUE(fs::is_symlink(home / link));
            EXPECT_EQ(contents("new." + format), whole) << writer.command;
            fs::remove(home / link);
            if (format != "dsp" || !writer.reads()) continue;
            write("same.dsp", contents("x.dsp"));
            printed(writer.line("same.dsp", "same.dsp"));
            EXPECT_EQ(contents("same.dsp"), whole) << writer.command;
        }
    }
}

}  // namespace
}  // namespace wavkit::test
