#include "files/transfer.hpp"

#include <algorithm>
#include <memory>
#include <vector>

#include "base/error.hpp"
#include "base/progress.hpp"
#include "base/scratch.hpp"
#include "files/block_writer.hpp"
#include "files/output.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_scalars = 1 << 16;

std::size_t frames_at_once(std::size_t width) {
    return std::max<std::size_t>(block_scalars / width, 1);
}

/// Passes what a stream holds on, whole points at a time.
template <class Take>
void pass(SampleStream& stream, Progress& progress, Take take) {
    const std::size_t width = stream.width();
    std::vector<double> block(frames_at_once(width) * width);
    for (std::size_t count; (count = stream.read(block)) > 0; progress.done(stream.done())) {
        take(std::span<const double>(block).first(count));
    }
}

void copy(SampleStream& stream, BlockWriter& writer, Progress& progress) {
    writer.begin({stream.delta, stream.complex, stream.channels, stream.length, stream.facts});
    pass(stream, progress, [&](auto values) { writer.write(values); });
    writer.end();
}

/// Signals of which some may be wanted side by side, which shows when all are there: they wait in a
/// file, block by block, and in a block one run of scalars behind the other.
class Waiting {
  public:
    void add(SampleStream& stream, Progress& progress) {
        const std::size_t width = stream.width();
        Run run{end_, 0, width, frames_at_once(width), 0};
        std::vector<double> scalars;
        pass(stream, progress, [&](std::span<const double> values) {
            scalars.clear();
            for (std::size_t first = 0; first < width; ++first) {
                for (auto i = first; i < values.size(); i += width) scalars.push_back(values[i]);
            }
            const auto count = std::fwrite(scalars.data(), sizeof(double), values.size(), file());
            if (count != values.size()) fail_with_scratch();
            end_ += count;
        });
        run.points = (end_ - run.first) / width;
        for (std::size_t c = 0; c < stream.channels; ++c) {
            auto facts = stream.facts_of(c);
            facts.beside |= c > 0;
            signals_.push_back({stream.delta, stream.complex, facts, {}});
            for (std::size_t part = 0; part < width / stream.channels; ++part, ++run.index) {
                signals_.back().runs.push_back(run);
            }
        }
    }

    /// Writes what belongs together side by side, or everything; the parts of complex signals, too,
    /// where a format has none of these.
    void write(BlockWriter& writer, bool everything, bool parts_apart, Progress& progress) {
        if (signals_.empty()) throw Error("there is no signal to write");
        for (std::size_t first = 0, count = 1; first < signals_.size(); first += count) {
            const auto rest = std::span(signals_).subspan(first);
            count = everything ? rest.size() : 1;
            while (count < rest.size() && side_by_side(rest[0], rest[count])) ++count;
            write_together(writer, rest.first(count), parts_apart, progress);
        }
    }

    std::size_t size() const { return signals_.size(); }

  private:
    struct Run {
        std::size_t first, index, width, block, points;
    };
    struct Held {
        double delta;
        bool complex;
        Facts facts;
        std::vector<Run> runs;  // one, or two of a complex signal
        std::size_t points() const { return runs[0].points; }
    };

    static bool side_by_side(const Held& a, const Held& b) {
        return b.facts.beside && !a.complex && !b.complex && a.points() == b.points() &&
               a.delta == b.delta && a.facts.start == b.facts.start;
    }

    void write_together(BlockWriter& writer, std::span<const Held> held, bool parts_apart,
                        Progress& progress) {
        const auto points = held[0].points();
        std::vector<Run> runs;
        std::vector<Facts> facts;
        for (const auto& signal : held) {
            if (signal.points() != points || signal.delta != held[0].delta) {
                throw Error(
                    "signals of different lengths or spacings do not fit one such file; choose "
                    "one with --signal");
            }
            if (!parts_apart && signal.complex != held[0].complex) throw Error(real_beside_complex);
            runs.insert(runs.end(), signal.runs.begin(), signal.runs.end());
            facts.insert(facts.end(), parts_apart ? signal.runs.size() : 1, signal.facts);
        }
        const bool complex = !parts_apart && held[0].complex;
        writer.begin({held[0].delta, complex, facts.size(), points, facts});
        const auto most = frames_at_once(runs.size());
        std::vector<double> values, frames;
        for (std::size_t start = 0; start < points; start += most) {
            values.resize(std::min(most, points - start));
            frames.resize(values.size() * runs.size());
            for (std::size_t c = 0; c < runs.size(); ++c) {
                read(runs[c], start, values);
                for (std::size_t i = 0; i < values.size(); ++i) {
                    frames[i * runs.size() + c] = values[i];
                }
            }
            writer.write(frames);
            progress.done(double(start) / double(points));
        }
        writer.end();
    }

    void read(const Run& run, std::size_t point, std::span<double> values) {
        while (!values.empty()) {
            const auto begin = point / run.block * run.block, within = point - begin;
            const auto length = std::min(run.block, run.points - begin);
            const auto count = std::min(values.size(), length - within);
            const auto at = run.first + begin * run.width + run.index * length + within;
            if (std::fseek(file(), long(at * sizeof(double)), SEEK_SET) != 0 ||
                std::fread(values.data(), sizeof(double), count, file()) != count) {
                fail_with_scratch();
            }
            values = values.subspan(count);
            point += count;
        }
    }

    std::FILE* file() const { return file_.get(); }

    Stream file_ = scratch();
    std::size_t end_ = 0;
    std::vector<Held> signals_;
};

}  // namespace

void transfer(const std::string& in, const ReadOptions& reading, const std::string& out,
              const WriteOptions& writing) {
    const auto format = writing.checked_format_for(out);
    InputFile input(in);
    OutputFile output(out);
    {
        Progress progress("converting " + input.name());
        const auto writer = block_writer(output.stream(), format, writing);
        const bool beside = takes_channels(format);
        const auto source = beside ? open_channels(input, reading) : open_signals(input, reading);
        if (!beside || source->sound) {
            while (auto* const stream = source->next()) copy(*stream, *writer, progress);
        } else {
            Waiting signals;
            while (auto* const stream = source->next()) signals.add(*stream, progress);
            const bool one_table = format == Format::npy && signals.size() > 1;
            signals.write(*writer, is_sound(format) || one_table, is_sound(format), progress);
        }
    }
    output.commit();
}

}  // namespace wavkit::tool
