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

/// Passes what a stream holds on, whole points at a time.
template <class Take>
void pass(SampleStream& stream, Progress& progress, Take take) {
    const std::size_t width = stream.channels * (stream.complex ? 2 : 1);
    std::vector<double> block(std::max<std::size_t>(block_scalars / width, 1) * width);
    for (std::size_t count; (count = stream.read(block)) > 0; progress.done(stream.done())) {
        take(std::span<const double>(block).first(count));
    }
}

void copy(SampleStream& stream, BlockWriter& writer, Progress& progress) {
    writer.begin({stream.delta, stream.complex, stream.channels, stream.length});
    pass(stream, progress, [&](auto values) { writer.write(values); });
    writer.end();
}

/// Signals that come one after the other and are wanted side by side: they wait in a file.
class SideBySide {
  public:
    void add(SampleStream& stream, Progress& progress) {
        const std::size_t width = stream.complex ? 2 : 1;
        std::size_t scalars = 0;
        pass(stream, progress, [&](std::span<const double> values) {
            if (std::fwrite(values.data(), sizeof(double), values.size(), file_.get()) !=
                values.size()) {
                fail_with_scratch();
            }
            scalars += values.size();
        });
        const auto points = scalars / width;
        if (channels_.empty()) {
            points_ = points;
            delta_ = stream.delta;
        } else if (points != points_ || stream.delta != delta_) {
            throw Error(
                "signals of different lengths or spacings do not fit one sound file; choose "
                "one with --signal");
        }
        for (std::size_t part = 0; part < width; ++part) channels_.push_back({end_ + part, width});
        end_ += scalars;
    }

    void write(BlockWriter& writer, Progress& progress) {
        writer.begin({delta_, false, channels_.size(), points_});
        const auto most = std::max<std::size_t>(block_scalars / channels_.size(), 256);
        std::vector<double> values, frames;
        for (std::size_t start = 0; start < points_; start += most) {
            const auto count = std::min(most, points_ - start);
            frames.resize(count * channels_.size());
            for (std::size_t c = 0; c < channels_.size(); ++c) {
                const auto [first, step] = channels_[c];
                values.resize((count - 1) * step + 1);
                read_at(first + start * step, values);
                for (std::size_t i = 0; i < count; ++i) {
                    frames[i * channels_.size() + c] = values[i * step];
                }
            }
            writer.write(frames);
            progress.done(double(start) / double(points_));
        }
        writer.end();
    }

  private:
    void read_at(std::size_t scalar, std::span<double> values) {
        const auto offset = long(scalar * sizeof(double));
        if (std::fseek(file_.get(), offset, SEEK_SET) != 0 ||
            std::fread(values.data(), sizeof(double), values.size(), file_.get()) !=
                values.size()) {
            fail_with_scratch();
        }
    }

    struct Channel {
        std::size_t first, step;  // scalars of the file
    };

    Stream file_ = scratch();
    std::vector<Channel> channels_;
    std::size_t points_ = 0, end_ = 0;
    double delta_ = 1;
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
        const auto source =
            is_sound(format) ? open_channels(input, reading) : open_signals(input, reading);
        if (is_sound(format) && !source->sound) {
            SideBySide signals;
            while (auto* const stream = source->next()) signals.add(*stream, progress);
            signals.write(*writer, progress);
        } else {
            while (auto* const stream = source->next()) copy(*stream, *writer, progress);
        }
    }
    output.commit();
}

}  // namespace wavkit::tool
