// What pictures say, from the scripts that gnuplot gets, and that it draws them.
#include <array>
#include <cmath>

#include "tools/program.hpp"

namespace wavkit::test {
namespace {

class PicturesTest : public ProgramTest {
  protected:
    /// What gnuplot gets to draw.
    std::string script_of(const std::string& command, const std::string& picture) const {
        write("gnuplot", "#!/bin/sh\nexec /bin/cat\n");
        const auto done = shell("chmod +x gnuplot; PATH=$PWD:$PATH; wavkit " + command);
        EXPECT_EQ(done.status, 0) << command << done.err;
        return contents(picture);
    }

    /// What stands behind every occurrence of some words, to the end of the line.
    static std::vector<std::string> all(const std::string& script, const std::string& words) {
        std::vector<std::string> result;
        for (auto at = script.find(words); at != script.npos; at = script.find(words, at + 1)) {
            const auto start = at + words.size();
            result.push_back(script.substr(start, script.find('\n', start) - start));
        }
        return result;
    }

    static std::string first(const std::string& script, const std::string& words) {
        const auto found = all(script, words);
        return found.empty() ? "" : found[0];
    }
};

TEST_F(PicturesTest, AxesHaveUnitsPrefixesAndReferences) {
    auto x = sine(4096, 410, 2, 1e-7);
    write("x.dsp", Signals{x});
    const struct {
        std::string command, x, y, below;
    } pictures[] = {
        {"spectrum x.dsp --unit s", "frequency (MHz)", "amplitude", "Hann window, 4096 samples"},
        {"spectrum x.dsp --unit s --db --value-unit V", "frequency (MHz)", "amplitude (dB re 1 V)",
         ""},
        {"spectrum x.dsp --unit s --density --value-unit V --average 1024", "frequency (MHz)",
         "density (mV/√Hz)", "Hann window, 7 segments of 1024 samples, overlap 50 %"},
        {"spectrum x.dsp --rate 0.5 --density --db --signal 1", "frequency (Hz)",
         "density (dB re 1/√Hz)", "signal 1, Hann window, 4096 samples"},
        {"spectrum x.dsp --unit year", "frequency (10⁶ 1/year)", "amplitude", ""},
        {"filter x.dsp --rate 1e7 --lowpass 1e5 --value-unit Pa", "time (µs)", "value (Pa)", ""},
        {"design lowpass 1000 --rate 48000", "frequency (kHz)", "gain (dB)", ""},
        {"window hann", "bins", "response (dB re maximum)", ""},
        {"hist x.dsp --value-unit mV", "value (mV)", "count", "64 bins of 0.0625 mV"},
    };
    for (const auto& [command, across, upwards, below] : pictures) {
        const auto script = script_of(command + " --plot p.svg", "p.svg");
        EXPECT_EQ(first(script, "set xlabel "), "'" + across + "'") << command;
        EXPECT_EQ(first(script, "set ylabel "), "'" + upwards + "'") << command;
        if (!below.empty()) {
            EXPECT_NE(script.find("set label '" + below + "' at"), script.npos)
                << command << script.substr(0, 900);
        }
    }
    // Panels that are looked at together have the same axes; phases of nothing are not drawn.
    const auto design = script_of("design bandpass 0.1 0.2 --plot p.svg", "p.svg");
    EXPECT_EQ(all(design, "set xrange "), (std::vector<std::string>(2, "[0:0.5]")));
    for (const auto& point : rows(design.substr(design.rfind("$curve << EOD")))) {
        if (point.size() == 2) {
            EXPECT_LT(std::fabs(point[1]), 1e-6) << point[0];
        }
    }
    const auto filter =
        all(script_of("filter x.dsp --lowpass 0.01 --plot p.svg --rate 1", "p.svg"), "set yrange ");
    ASSERT_EQ(filter.size(), 2u);
    EXPECT_EQ(filter[0], filter[1]);
    const auto named =
        script_of("spectrum x.dsp --plot p.png --title \"A & B\" --size 640x400", "p.png");
    EXPECT_EQ(first(named, "set title '"), "A & B'");
    EXPECT_NE(named.find("size 640,400"), named.npos);
    // A title wider than the page loses its middle, and no half of a character.
    std::string wide;
    for (int i = 0; i < 200; ++i) wide += "ö";
    const auto cut =
        first(script_of("hist x.dsp --plot p.png --title " + wide, "p.png"), "set title 'ö");
    EXPECT_NE(cut.find("öö…öö"), cut.npos) << cut;
    EXPECT_LT(cut.size(), 2 * 130u);
}

TEST_F(PicturesTest, LabelsOfPeaksKeepApart) {
    const auto script = script_of(
        "spectrum " WAVKIT_DATA "/sunspots-yearly.txt --detrend --unit year --peaks 5 --plot p.png",
        "p.png");
    // The curve in pixels, and boxes that are narrower than the labels will be.
    std::array<double, 4> edge{};  // left, right, bottom, top
    for (std::size_t i = 0; i < 4; ++i) {
        edge[i] =
            std::stod(first(script, "set " + std::string(1, "lrbt"[i]) + "margin at screen "));
    }
    const double width = 1000, height = 560;
    const auto between = [&](const std::string& range) {
        return std::pair(std::stod(range.substr(1)), std::stod(range.substr(range.find(':') + 1)));
    };
    const auto [left, right] = between(first(script, "set xrange "));
    const auto [low, high] = between(first(script, "set yrange "));
    std::vector<std::array<double, 4>> boxes;
    std::set<std::string> texts;
    for (const auto& label : all(script, "set label '")) {
        const auto end = label.find('\'');
        const auto text = label.substr(0, end);
        if (text.empty() || text.starts_with("Hann")) continue;
        texts.insert(text);
        EXPECT_NE(text.find("/year"), text.npos);
        double x = 0, y = 0;
        ASSERT_EQ(std::sscanf(label.c_str() + end, "' at screen %lf,screen %lf", &x, &y), 2)
            << label;
        const double letters = 6.5 * double(text.size()), at = x * width;
        const bool before = label.find(" right ") != label.npos;
        boxes.push_back({before ? at - letters : at, before ? at : at + letters, y * height - 6,
                         y * height + 6});
    }
    EXPECT_EQ(texts.size(), 5u);
    for (std::size_t i = 0; i < boxes.size(); ++i) {
        const auto& a = boxes[i];
        for (std::size_t k = 0; k < i; ++k) {
            const auto& b = boxes[k];
            EXPECT_FALSE(a[0] < b[1] && b[0] < a[1] && a[2] < b[3] && b[2] < a[3]) << i << k;
        }
        for (const auto& point : rows(script.substr(script.find("$curve")))) {
            if (point.size() != 2) continue;
            const double x =
                width * (edge[0] + (point[0] - left) / (right - left) * (edge[1] - edge[0]));
            const double y =
                height * (edge[2] + (point[1] - low) / (high - low) * (edge[3] - edge[2]));
            EXPECT_FALSE(a[0] < x && x < a[1] && a[2] < y && y < a[3]) << i;
        }
    }
    // Peaks less than their usual digits apart are told apart.
    auto x = sine(1 << 16, 30000, 1);
    const auto beside = sine(1 << 16, 30005, 1);
    for (int i = 0; i < 1 << 16; ++i) x->data[i] += beside->data[i];
    write("x.dsp", Signals{x});
    const auto close =
        script_of("spectrum x.dsp --rate 1e6 --peaks 2 --plot p.png --band 4e5 5e5", "p.png");
    EXPECT_NE(close.find("'457.76 kHz"), close.npos) << close.substr(0, 2000);
    EXPECT_NE(close.find("'457.84 kHz"), close.npos);
}

TEST_F(PicturesTest, AreDrawnInEveryFormat) {
    write("x.dsp", Signals{sine(4096, 400, 1)});
    const struct {
        std::string name, begin;
    } formats[] = {{"p.png", "\x89PNG\r\n"}, {"p.pdf", "%PDF-"}, {"p.svg", "<?xml"}};
    for (const auto& [name, begin] : formats) {
        for (const std::string command :
             {"spectrum x.dsp --peaks 3 --plot ", "spectrum x.dsp --average 256 --waterfall ",
              "filter x.dsp --lowpass 0.1 --plot ", "design hilbert 0.4 --plot ",
              "window flattop --plot ", "hist x.dsp --plot ", "fit x.dsp --plot "}) {
            const auto done = shell("wavkit " + command + name);
            EXPECT_EQ(done.status, 0) << command << name << done.err;
            EXPECT_EQ(done.err, "") << command << name;
            EXPECT_TRUE(contents(name).starts_with(begin)) << command << name;
        }
    }
    EXPECT_EQ(files(), (std::set<std::string>{"p.pdf", "p.png", "p.svg", "x.dsp"}));
    const auto drawn = printed("spectrum x.dsp --plot - --peaks 1");
    EXPECT_NE(drawn.find("Hann window, 4096 samples\n"), drawn.npos) << drawn;
}

}  // namespace
}  // namespace wavkit::test
