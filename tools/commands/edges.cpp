// wavkit edges: when a signal crosses a level, how often and for how long.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <limits>
#include <memory>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"
#include "files/block_writer.hpp"
#include "files/output.hpp"
#include "files/reading.hpp"
#include "files/stream.hpp"
#include "files/writing.hpp"
#include "measure/edges.hpp"
#include "measure/prepare.hpp"
#include "show/labels.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

struct EdgesOptions {
    ReportFiles files;
    std::string out;
    std::optional<double> level, hysteresis;
    bool times = false;
    ReadOptions reading;
    WriteOptions writing;
};

/// One channel in the making.
struct Channel {
    Crossing crossing;
    Facts facts;
    EdgeFinder finder;
    EdgeSummary summary;
    std::vector<Edge> edges;  // where they are wanted
};

/// Where edges go that are written.
class EdgeList {
  public:
    EdgeList(const std::string& path, const WriteOptions& options) : output_(path) {
        const auto format = options.format_for(path);
        if (format != Format::csv) writer_ = block_writer(output_.stream(), format, options);
    }

    void begin() {
        if (writer_) return writer_->begin({1, false, 1, std::nullopt});
        std::fprintf(output_.stream(), "%stime,edge\n", begun_ ? "\n" : "");
        begun_ = true;
    }
    void add(double time, bool rising) {
        if (writer_) return writer_->write({&time, 1});
        std::fprintf(output_.stream(), "%s,%s\n", number(time).c_str(), rising ? "1" : "-1");
    }
    void end() {
        if (writer_) writer_->end();
    }
    void commit() { output_.commit(); }

  private:
    OutputFile output_;
    std::unique_ptr<BlockWriter> writer_;  // none into CSV, whose header is another
    bool begun_ = false;
};

/// The edges of the signals of one file.
class EdgesOfFile {
  public:
    EdgesOfFile(const EdgesOptions& options, const std::string& file, Page& page)
        : options_(options), page_(page), input_(file) {
        if (!options.out.empty()) list_.emplace(options.out, options.writing);
    }

    void run() {
        if (!options_.level) find_ranges();
        Progress progress("looking for edges in " + input_.name());
        const auto source = open();
        seconds_ = source->sound || options_.reading.rate;
        while (auto* const stream = next_of(*source)) find_edges(*stream, progress);
        if (list_) list_->commit();
    }

  private:
    /// The next signal, or channels side by side.
    static SampleStream* next_of(SignalSource& source) {
        auto* const stream = source.next();
        if (stream && stream->complex) throw DataError("a complex signal has no edges");
        if (stream) check_axis(stream->delta);
        return stream;
    }

    /// Channels one after the other where their edges are written as they come.
    std::unique_ptr<SignalSource> open() {
        std::rewind(input_.stream());
        return list_ ? open_signals(input_, options_.reading)
                     : open_channels(input_, options_.reading);
    }

    void find_ranges() {
        Progress progress("reading " + input_.name());
        const auto source = open();
        while (auto* const stream = next_of(*source)) {
            const auto first = ranges_.size();
            ranges_.resize(first + stream->channels);
            each_finite_block(*stream, progress, [&](std::span<const double> values) {
                for (std::size_t i = 0; i < values.size(); ++i) {
                    ranges_[first + i % stream->channels].add(values[i]);
                }
            });
        }
    }

    Channel channel(std::size_t signal, const Facts& facts) const {
        const auto range = ranges_.empty() ? Range() : ranges_[signal];
        const Crossing crossing(options_.level, options_.hysteresis, range);
        return {crossing, facts, EdgeFinder(crossing), {}, {}};
    }

    void find_edges(SampleStream& stream, Progress& progress) {
        std::vector<Channel> channels;
        for (std::size_t c = 0; c < stream.channels; ++c) {
            channels.push_back(channel(signal_ + c, stream.facts_of(c)));
        }
        if (list_) list_->begin();
        const auto points =
            each_finite_block(stream, progress, [&](std::span<const double> values) {
                for (std::size_t i = 0; i < values.size(); ++i) {
                    auto& c = channels[i % channels.size()];
                    const auto edge = c.finder.take(values[i]);
                    if (!edge) continue;
                    c.summary.add(*edge);
                    if (options_.times) c.edges.push_back(*edge);
                    if (list_) list_->add(c.facts.start + edge->place * stream.delta, edge->rising);
                }
            });
        if (list_) list_->end();
        for (const auto& c : channels) {
            ++signal_;
            if (options_.files.json) {
                add_json(c, points, stream.delta);
            } else if (options_.out != "-") {
                print(c, stream.delta);
            }
        }
    }

    /// The figures by their names in JSON; those that need more edges than there are, are not
    /// there.
    static std::vector<std::pair<std::string, double>> figures(const Channel& c, double delta) {
        const auto& s = c.summary;
        std::vector<std::pair<std::string, double>> list{{"level", c.crossing.level},
                                                         {"hysteresis", c.crossing.hysteresis},
                                                         {"rising", s.rising()},
                                                         {"falling", s.falling()}};
        if (s.first()) list.emplace_back("first_at", c.facts.start + *s.first() * delta);
        if (s.last()) list.emplace_back("last_at", c.facts.start + *s.last() * delta);
        if (s.periods().count() > 0) {
            list.emplace_back("frequency", 1 / (s.periods().mean() * delta));
            list.emplace_back("period", s.periods().mean() * delta);
            list.emplace_back("period_min", s.periods().least() * delta);
            list.emplace_back("period_max", s.periods().greatest() * delta);
            list.emplace_back("period_deviation", s.periods().deviation() * delta);
            list.emplace_back("duty", s.duty());
        }
        if (s.highs().count() > 0) list.emplace_back("high_time", s.highs().mean() * delta);
        if (s.lows().count() > 0) list.emplace_back("low_time", s.lows().mean() * delta);
        return list;
    }

    void add_json(const Channel& c, std::size_t points, double delta) {
        auto& members = page_.add_signal(false, double(points), delta, c.facts);
        for (const auto& [name, value] : figures(c, delta)) {
            members.emplace_back(name, json_number(value));
        }
        if (!options_.times) return;
        for (const bool rising : {true, false}) {
            std::vector<double> times;
            for (const auto& edge : c.edges) {
                if (edge.rising == rising) times.push_back(c.facts.start + edge.place * delta);
            }
            members.emplace_back(rising ? "rising_at" : "falling_at", json_numbers(times));
        }
    }

    void print(const Channel& c, double delta) {
        auto* const to = page_.text();
        if (signal_ > 1) std::fprintf(to, "\n%-18s %zu\n", "signal", signal_);
        for (auto [name, value] : figures(c, delta)) {
            const bool time =
                name.starts_with("period") || name.ends_with("time") || name.ends_with("at");
            const auto axis = c.facts.axis(seconds_);
            const auto unit = printable(name == "frequency" ? inverse_unit(axis)
                                        : time              ? axis
                                                            : "");
            std::ranges::replace(name, '_', ' ');
            std::fprintf(to, "%-18s %s%s%s\n", name.c_str(), rounded(value).c_str(),
                         unit.empty() ? "" : " ", unit.c_str());
        }
        if (!options_.times) return;
        std::fprintf(to, "\n%18s  edge\n", "time");
        for (const auto& edge : c.edges) {
            std::fprintf(to, "%18.9g  %s\n", c.facts.start + edge.place * delta,
                         edge.rising ? "rises" : "falls");
        }
    }

    const EdgesOptions& options_;
    Page& page_;
    InputFile input_;
    std::optional<EdgeList> list_;
    std::vector<Range> ranges_;  // of every signal
    std::size_t signal_ = 0;     // signals so far
    bool seconds_ = false;
};

void run(const EdgesOptions& options) {
    options.files.check_single(options.out, "");
    options.writing.check_without_sound(options.out, "a list of edges");
    report_files("edges", options.files, [&](const std::string& file, Page& page) {
        EdgesOfFile(options, file, page).run();
    });
}

constexpr const char* about =
    R"(An edge is where the line between two samples crosses the level. It counts when the signal goes on
by half the hysteresis at least, so that noise about the level makes no edges. Without --level the
level is halfway between the extremes and the hysteresis a tenth of their distance; with --level
alone there is none.

Frequency and period are those of rising edges, least, greatest, mean and standard deviation; duty is
the share of these periods that the signal is high, high and low time how long it is so at a time.
--times prints every edge; -o writes them as CSV, time and 1 for a rising edge, -1 for a falling one,
or the times alone as a signal file. Every signal of a file is looked at, and all channels. The
recordings may be longer than memory.

Examples:
  wavkit edges tacho.wav --level 0.5 --hysteresis 0.2
  wavkit edges clock.csv --time -o edges.csv
  wavkit edges run*.dsp --json --jobs 4)";

}  // namespace

void add_edges(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "edges", "Finds when a signal crosses a level: times, periods, frequency, duty.");
    const auto options = std::make_shared<EdgesOptions>();
    options->files.declare(*command);
    command->add_option("--level", options->level, "the level to cross")
        ->check(number_between(-1e300, 1e300))
        ->type_name("LEVEL");
    command->add_option("--hysteresis", options->hysteresis, "how far a signal goes across")
        ->check(number_between(0, 1e300))
        ->type_name("WIDTH");
    command->add_flag("--times", options->times, "print every edge");
    command->add_option("-o,--output", options->out, "write the edges; - is standard output")
        ->type_name("FILE");
    options->writing.declare_without_sound(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
