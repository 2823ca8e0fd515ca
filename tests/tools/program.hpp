// The built program, run in a directory of its own.
#pragma once

#include <sys/wait.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "support/signals.hpp"

namespace wavkit::test {

using Signals = std::vector<Signal<dsp>>;

struct Outcome {
    int status;
    std::string out, err;
};

class ProgramTest : public ::testing::Test {
  protected:
    void SetUp() override {
        std::string pattern = ::testing::TempDir() + "wavkit.XXXXXX";
        home = mkdtemp(pattern.data());
    }
    void TearDown() override { std::filesystem::remove_all(home); }

    /// Runs a shell command line in which `wavkit` is the program.
    Outcome shell(const std::string& line) const {
        const std::string whole = "cd " + home.string() +
                                  " && wavkit() { " WAVKIT_PROGRAM
                                  " \"$@\"; } && set -o pipefail && { " +
                                  line + "; } >.out 2>.err </dev/null";
        const int status = std::system(("bash -c '" + whole + "'").c_str());
        return {WEXITSTATUS(status), contents(".out"), contents(".err")};
    }

    /// Runs the program, which must succeed, and gives what it printed.
    std::string printed(const std::string& arguments) const {
        const auto done = shell("wavkit " + arguments);
        EXPECT_EQ(done.status, 0) << arguments << "\n" << done.err;
        return done.out;
    }

    std::string contents(const std::string& name) const {
        std::ifstream file(home / name, std::ios::binary);
        std::ostringstream text;
        text << file.rdbuf();
        return text.str();
    }

    void write(const std::string& name, const std::string& text) const {
        std::ofstream(home / name, std::ios::binary) << text;
    }

    void write(const std::string& name, const Signals& signals) const {
        std::FILE* const file = dspf_fopen((home / name).c_str(), "wb");
        for (const auto& x : signals) ASSERT_EQ(dspf_fwrite(x, file), 0);
        ASSERT_EQ(dspf_fclose(file), 0);
    }

    /// The signals of a signal file.
    Signals read(const std::string& name) const {
        Signals signals;
        std::FILE* const file = dspf_fopen((home / name).c_str(), "rb");
        EXPECT_NE(file, nullptr) << name;
        if (!file) return signals;
        for (Signal<dsp> x; dspf_fread(x, file) == 1;) signals.push_back(x);
        dspf_fclose(file);
        return signals;
    }

    /// What the program makes of a file: read, written as a binary signal file, read here.
    Signals through(const std::string& name, const std::string& options = "") const {
        printed("convert " + name + " read.dsp " + options);
        return read("read.dsp");
    }

    /// The rows of a table without its header, as numbers.
    static std::vector<std::vector<double>> rows(std::string table) {
        std::vector<std::vector<double>> result;
        for (char& c : table) c = c == ',' ? ' ' : c;
        std::istringstream lines(table);
        std::string line;
        std::getline(lines, line);
        while (std::getline(lines, line)) {
            std::istringstream fields(line);
            result.emplace_back();
            for (double value; fields >> value;) result.back().push_back(value);
        }
        return result;
    }

    /// The names of the files there, but for what shell() keeps.
    std::set<std::string> files() const {
        std::set<std::string> names;
        for (const auto& entry : std::filesystem::directory_iterator(home)) {
            const auto name = entry.path().filename().string();
            if (name != ".out" && name != ".err") names.insert(name);
        }
        return names;
    }

    std::filesystem::path home;
};

/// The number behind the n-th time that a name stands in a line of JSON.
inline double member(const std::string& json, const std::string& name, int n = 0) {
    auto at = json.find("\"" + name + "\":");
    while (n-- > 0 && at != json.npos) at = json.find("\"" + name + "\":", at + 1);
    return at == json.npos ? NAN : std::strtod(json.c_str() + at + name.size() + 3, nullptr);
}

/// A sine that lies `cycles` times in `n` samples.
inline Signal<dsp> sine(int n, double cycles, double amplitude, double delta = 1.0) {
    std::vector<long double> samples;
    for (int i = 0; i < n; ++i) {
        samples.push_back(amplitude * std::sin(2 * pi<long double> * cycles * i / n + 0.4L));
    }
    return real<dsp>(samples, delta);
}

}  // namespace wavkit::test
