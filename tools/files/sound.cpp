#include "files/sound.hpp"

#include <sndfile.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>
#include <memory>
#include <utility>

#include "base/error.hpp"
#include "base/progress.hpp"
#include "files/csv.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_frames = 1 << 14;

using Handle = std::unique_ptr<SNDFILE, int (*)(SNDFILE*)>;

/// libsndfile on the descriptor of a stream whose buffer holds nothing yet.
Handle open_sound(std::FILE* stream, int mode, SF_INFO& info, const std::string& what) {
    const int file = fileno(stream);
    lseek(file, 0, SEEK_SET);
    Handle handle(sf_open_fd(file, mode, &info, SF_FALSE), sf_close);
    if (!handle) {
        std::string reason = sf_strerror(nullptr);
        while (!reason.empty() && (reason.back() == '\n' || reason.back() == '.')) {
            reason.pop_back();
        }
        throw Error(what + ": " + reason);
    }
    return handle;
}

std::string format_name(int command, int format) {
    SF_FORMAT_INFO info{};
    info.format = format;
    return sf_command(nullptr, command, &info, sizeof info) == 0 && info.name ? info.name : "sound";
}

/// The sampling rate of a file for signals of this spacing.
int whole_rate(double delta) {
    const double exact = 1 / delta, rate = std::round(exact);
    if (!(rate >= 1) || !(rate <= std::numeric_limits<int>::max()) ||
        std::fabs(exact - rate) > 1e-3 * rate) {
        throw Error("a sound file needs a whole number of samples a second, not " + number(exact) +
                    "; give --rate or --delta");
    }
    if (std::fabs(exact - rate) > 1e-6 * rate) {
        std::fprintf(stderr, "wavkit: the sampling rate %s is stored as %.0f\n",
                     number(exact).c_str(), rate);
    }
    return int(rate);
}

int samples_of(SampleType type) {
    switch (type) {
        case SampleType::pcm16:
            return SF_FORMAT_PCM_16;
        case SampleType::pcm24:
            return SF_FORMAT_PCM_24;
        case SampleType::float32:
            break;
    }
    return SF_FORMAT_FLOAT;
}

/// A plain WAV file ends at 4 GiB; RF64 is what takes over there, and where the length is not known
/// before the end, it becomes a WAV file if it can.
int container_of(Format format, const SignalShape& shape, int channels) {
    if (format == Format::flac) return SF_FORMAT_FLAC;
    const bool fits = shape.points && 4.0 * double(*shape.points) * channels < 4.0e9;
    return fits ? SF_FORMAT_WAV : SF_FORMAT_RF64;
}

/// The channel that was asked for, if the file has it.
std::optional<int> chosen_channel(const SF_INFO& info, const std::string& name,
                                  std::optional<int> channel) {
    if (channel && (*channel < 1 || *channel > info.channels)) {
        throw Error(name + " has " + std::to_string(info.channels) + " channel" +
                    (info.channels == 1 ? "" : "s") + ", no channel " + std::to_string(*channel));
    }
    return channel;
}

void check_complete(SNDFILE* file, const std::string& name) {
    if (sf_error(file) == SF_ERR_NO_ERROR) return;
    throw Error("cannot read " + name + ": " + sf_strerror(file));
}

/// One channel of a sound file, or all of them.
class SoundStream : public SampleStream {
  public:
    explicit SoundStream(InputFile& input)
        : name_(input.name()),
          file_(open_sound(input.stream(), SFM_READ, info_, "cannot read " + name_)) {
        delta = 1.0 / info_.samplerate;
        sound = true;
        channels = std::size_t(info_.channels);
        if (info_.frames >= 0) length = std::size_t(info_.frames);
    }

    /// Reads one channel alone, the first without a choice.
    void choose(std::optional<int> channel) {
        first_ = std::size_t(chosen_channel(info_, name_, channel).value_or(1) - 1);
        last = first_ + 1 == channels;
        channels = 1;
        frames_.resize(block_frames * std::size_t(info_.channels));
    }

    std::size_t read(std::span<double> values) override {
        const std::size_t done = frames_.empty() ? read_all(values) : read_chosen(values);
        check_complete(file_.get(), name_);
        taken_ += sf_count_t(done / channels);
        return done;
    }

    double done() const override { return double(taken_) / double(info_.frames); }

  private:
    std::size_t read_all(std::span<double> values) {
        const auto wanted = sf_count_t(values.size() / channels * channels);
        return std::size_t(
            std::max<sf_count_t>(sf_read_double(file_.get(), values.data(), wanted), 0));
    }

    std::size_t read_chosen(std::span<double> values) {
        const auto width = std::size_t(info_.channels);
        std::size_t done = 0;
        while (done < values.size()) {
            const auto wanted = std::min(values.size() - done, block_frames);
            const auto got = sf_readf_double(file_.get(), frames_.data(), sf_count_t(wanted));
            if (got <= 0) break;
            for (std::size_t i = 0; i < std::size_t(got); ++i) {
                values[done++] = frames_[i * width + first_];
            }
        }
        return done;
    }

    SF_INFO info_{};
    std::string name_;
    Handle file_;
    std::size_t first_ = 0;
    std::vector<double> frames_;  // of all channels, where one is chosen
    sf_count_t taken_ = 0;
};

/// The channels of one sound file. What is lost on the way is told on standard error.
class SoundWriter : public BlockWriter {
  public:
    SoundWriter(std::FILE* to, Format format, SampleType type)
        : to_(to), format_(format), type_(type) {
        if (format == Format::flac && type == SampleType::float32) {
            throw UsageError("FLAC holds whole numbers only: use --bits 16 or 24");
        }
    }

    void begin(const SignalShape& shape) override {
        if (std::exchange(begun_, true)) {
            throw Error("one signal fits a sound file here; choose with --signal");
        }
        SF_INFO info{};
        info.samplerate = whole_rate(shape.delta);
        info.channels = int(shape.channels) * (shape.complex ? 2 : 1);
        info.format = container_of(format_, shape, info.channels) | samples_of(type_);
        file_ = open_sound(to_, SFM_WRITE, info, cannot_write);
        sf_command(file_.get(), SFC_SET_CLIPPING, nullptr, SF_TRUE);
        sf_command(file_.get(), SFC_RF64_AUTO_DOWNGRADE, nullptr, SF_TRUE);
        channels_ = std::size_t(info.channels);
    }

    void write(std::span<const double> values) override {
        if (type_ != SampleType::float32) {
            const auto bad = std::ranges::find_if(values, [](double v) { return std::isnan(v); });
            if (bad != values.end()) {
                const auto sample = taken_ + std::size_t(bad - values.begin()) / channels_;
                throw Error("sample " + std::to_string(sample) +
                            " is not a number; only --bits float can hold it");
            }
        }
        clipped_ += std::ranges::count_if(values, [](double v) { return std::fabs(v) > 1; });
        taken_ += values.size() / channels_;
        const auto count = sf_count_t(values.size());
        if (sf_write_double(file_.get(), values.data(), count) != count) {
            throw Error(std::string(cannot_write) + ": " + sf_strerror(file_.get()));
        }
    }

    void end() override {
        if (sf_close(file_.release()) != 0) throw Error(cannot_write);
        if (type_ != SampleType::float32 && clipped_ > 0) {
            std::fprintf(stderr, "wavkit: %td sample%s beyond -1 to 1 clipped\n", clipped_,
                         clipped_ == 1 ? "" : "s");
        }
    }

  private:
    static constexpr const char* cannot_write = "cannot write this sound file";

    std::FILE* to_;
    Format format_;
    SampleType type_;
    bool begun_ = false;
    Handle file_{nullptr, sf_close};
    std::size_t channels_ = 1, taken_ = 0;
    std::ptrdiff_t clipped_ = 0;
};

}  // namespace

bool looks_like_sound(const std::string& head) {
    static constexpr std::array magics{"RIFF", "RIFX", "RF64", "fLaC",
                                       "OggS", "FORM", ".snd", "caff"};
    return std::ranges::any_of(magics, [&](const char* magic) { return head.starts_with(magic); });
}

Sound read_sound(InputFile& input, std::optional<int> channel) {
    SF_INFO info{};
    const auto file = open_sound(input.stream(), SFM_READ, info, "cannot read " + input.name());
    const auto channels = std::size_t(info.channels);
    chosen_channel(info, input.name(), channel);
    Sound sound;
    sound.format =
        (info.format & SF_FORMAT_TYPEMASK) == SF_FORMAT_FLAC ? Format::flac : Format::wav;
    sound.description = format_name(SFC_GET_FORMAT_INFO, info.format & SF_FORMAT_TYPEMASK) + ", " +
                        format_name(SFC_GET_FORMAT_INFO, info.format & SF_FORMAT_SUBMASK);
    const std::size_t first = channel ? std::size_t(*channel - 1) : 0;
    const std::size_t count = channel ? 1 : channels;
    for (std::size_t c = 0; c < count; ++c) sound.channels.emplace_back(1.0 / info.samplerate);

    Progress progress("reading " + input.name());
    std::vector<double> frames(block_frames * channels), samples;
    sf_count_t done = 0;
    while (true) {
        const auto got = sf_readf_double(file.get(), frames.data(), block_frames);
        if (got <= 0) break;
        for (std::size_t c = 0; c < count; ++c) {
            samples.clear();
            for (sf_count_t i = 0; i < got; ++i) {
                samples.push_back(frames[std::size_t(i) * channels + first + c]);
            }
            sound.channels[c].append(samples);
        }
        done += got;
        progress.done(double(done) / double(info.frames));
    }
    check_complete(file.get(), input.name());
    return sound;
}

std::unique_ptr<SampleStream> stream_sound(InputFile& input, std::optional<int> channel,
                                           std::optional<int> signal) {
    if (channel && signal && *signal != 1) {
        throw Error(input.name() + " holds 1 signal in that channel, no signal " +
                    std::to_string(*signal));
    }
    auto stream = std::make_unique<SoundStream>(input);
    stream->choose(channel ? channel : signal);
    return stream;
}

std::unique_ptr<SampleStream> stream_channels(InputFile& input) {
    return std::make_unique<SoundStream>(input);
}

std::unique_ptr<BlockWriter> sound_writer(std::FILE* to, Format format,
                                          std::optional<SampleType> type) {
    const auto usual = format == Format::flac ? SampleType::pcm24 : SampleType::float32;
    return std::make_unique<SoundWriter>(to, format, type.value_or(usual));
}

}  // namespace wavkit::tool
