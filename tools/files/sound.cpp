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
#include "base/number.hpp"
#include "base/scratch.hpp"
#include "files/facts_text.hpp"
#include "files/float_wav.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_scalars = 1 << 16;

using Handle = std::unique_ptr<SNDFILE, int (*)(SNDFILE*)>;

sf_count_t seek(sf_count_t to, int whence, void* stream) {
    auto* const file = static_cast<std::FILE*>(stream);
    return fseeko(file, off_t(to), whence) == 0 ? sf_count_t(ftello(file)) : -1;
}

sf_count_t place(void* stream) { return ftello(static_cast<std::FILE*>(stream)); }

sf_count_t size(void* stream) {
    const sf_count_t at = place(stream), end = seek(0, SEEK_END, stream);
    seek(at, SEEK_SET, stream);
    return end;
}

/// libsndfile does not tell of all that it could not write; a stream remembers.
SF_VIRTUAL_IO written_stream = {
    size, seek,
    [](void* to, sf_count_t count, void* stream) {
        return sf_count_t(std::fread(to, 1, std::size_t(count), static_cast<std::FILE*>(stream)));
    },
    [](const void* from, sf_count_t count, void* stream) {
        return sf_count_t(
            std::fwrite(from, 1, std::size_t(count), static_cast<std::FILE*>(stream)));
    },
    place};

/// libsndfile on a stream whose buffer holds nothing yet: on its descriptor where it reads.
Handle open_sound(std::FILE* stream, int mode, SF_INFO& info, const std::string& what) {
    const int file = fileno(stream);
    lseek(file, 0, SEEK_SET);
    Handle handle(mode == SFM_READ ? sf_open_fd(file, mode, &info, SF_FALSE)
                                   : sf_open_virtual(&written_stream, mode, &info, stream),
                  sf_close);
    if (!handle) {
        std::string reason = sf_strerror(nullptr);
        while (!reason.empty() && (reason.back() == '\n' || reason.back() == '.')) {
            reason.pop_back();
        }
        throw Error(what + ": " + reason);
    }
    return handle;
}

/// How libsndfile calls a part of a format.
std::string format_name(int format) {
    SF_FORMAT_INFO info{};
    info.format = format;
    return sf_command(nullptr, SFC_GET_FORMAT_INFO, &info, sizeof info) == 0 && info.name
               ? info.name
               : "sound";
}

int samples_of(SampleType type) {
    switch (type) {
        case SampleType::pcm16:
            return SF_FORMAT_PCM_16;
        case SampleType::pcm24:
            return SF_FORMAT_PCM_24;
        case SampleType::pcm32:
            return SF_FORMAT_PCM_32;
        case SampleType::float32:
        case SampleType::float64:
            break;
    }
    return 0;  // written without libsndfile
}

bool is_float(SampleType type) {
    return type == SampleType::float32 || type == SampleType::float64;
}

/// A plain WAV file ends at 4 GiB; RF64 is what takes over there, and where the length is not known
/// before the end, it becomes a WAV file if it can.
int container_of(Format format, const SignalShape& shape, int channels) {
    if (format == Format::flac) return SF_FORMAT_FLAC;
    const bool fits = shape.points && 4.0 * double(*shape.points) * channels < 4.0e9;
    return fits ? SF_FORMAT_WAV : SF_FORMAT_RF64;
}

/// One channel of a sound file, from 0, or all of them.
class SoundStream : public SampleStream {
  public:
    SoundStream(InputFile& input, std::optional<std::size_t> channel)
        : name_(input.name()),
          file_(open_sound(input.stream(), SFM_READ, info_, "cannot read " + name_)),
          channel_(channel) {
        delta = 1.0 / info_.samplerate;
        if (info_.frames >= 0) length = std::size_t(info_.frames);
        if (!channel) channels = std::size_t(info_.channels);
        Facts seconds;
        seconds.axis_unit = "s";
        facts.assign(channels, seconds);
    }

    const SF_INFO& info() const { return info_; }

    std::size_t read(std::span<double> values) override {
        const std::size_t done = channel_ ? read_channel(values) : read_all(values);
        if (sf_error(file_.get()) != SF_ERR_NO_ERROR) {
            throw Error("cannot read " + name_ + ": " + sf_strerror(file_.get()));
        }
        taken_ += sf_count_t(done / channels);
        return done;
    }

    void skip() override {}  // each channel is opened by itself

    double done() const override { return double(taken_) / double(info_.frames); }

  private:
    std::size_t read_all(std::span<double> values) {
        const auto wanted = sf_count_t(values.size() / channels * channels);
        return std::size_t(
            std::max<sf_count_t>(sf_read_double(file_.get(), values.data(), wanted), 0));
    }

    std::size_t read_channel(std::span<double> values) {
        const auto width = std::size_t(info_.channels);
        const auto most = std::max<std::size_t>(block_scalars / width, 1);
        frames_.resize(most * width);
        std::size_t done = 0;
        while (done < values.size()) {
            const auto wanted = std::min(values.size() - done, most);
            const auto got = sf_readf_double(file_.get(), frames_.data(), sf_count_t(wanted));
            if (got <= 0) break;
            for (std::size_t i = 0; i < std::size_t(got); ++i) {
                values[done++] = frames_[i * width + *channel_];
            }
        }
        return done;
    }

    SF_INFO info_{};
    std::string name_;
    Handle file_;
    std::optional<std::size_t> channel_;
    std::vector<double> frames_;  // of all channels, where one is read
    sf_count_t taken_ = 0;
};

/// The channels of a file one behind the other, in a file without a name.
class SeparateChannels {
  public:
    explicit SeparateChannels(InputFile& input) {
        SoundStream all(input, std::nullopt);
        stride_ = all.length.value_or(0);
        constexpr std::size_t most_scalars = 1 << 20;
        const auto most = std::max<std::size_t>(most_scalars / all.channels, 1);
        std::vector<double> frames(most * all.channels), channel;
        while (const auto count = all.read(frames) / all.channels) {
            channel.resize(std::min(count, stride_ - frames_));
            for (std::size_t c = 0; c < all.channels; ++c) {
                for (std::size_t i = 0; i < channel.size(); ++i) {
                    channel[i] = frames[i * all.channels + c];
                }
                go_to(c, frames_);
                const auto written =
                    std::fwrite(channel.data(), sizeof(double), channel.size(), file_.get());
                if (written != channel.size()) fail_with_scratch();
            }
            frames_ += channel.size();
        }
    }

    std::size_t read(std::size_t channel, std::size_t frame, std::span<double> values) {
        const auto count = std::min(values.size(), frames_ - frame);
        go_to(channel, frame);
        if (std::fread(values.data(), sizeof(double), count, file_.get()) != count) {
            fail_with_scratch();
        }
        return count;
    }

  private:
    void go_to(std::size_t channel, std::size_t frame) {
        const auto offset = long((channel * stride_ + frame) * sizeof(double));
        if (std::fseek(file_.get(), offset, SEEK_SET) != 0) fail_with_scratch();
    }

    Stream file_ = scratch();
    std::size_t stride_ = 0, frames_ = 0;  // promised, and read
};

/// The channels of a sound file one after the other, the chosen one alone, or all together.
class SoundFile : public SignalSource {
  public:
    SoundFile(InputFile& file, const ReadOptions& reading, bool together)
        : SignalSource(file, reading) {
        info_ = SoundStream(file, std::nullopt).info();
        const auto& info = info_;
        description = format_name(info.format & SF_FORMAT_TYPEMASK) + ", " +
                      format_name(info.format & SF_FORMAT_SUBMASK);
        sound = true;
        const int channel = reading.channel.value_or(1);
        if (channel < 1 || channel > info.channels) {
            throw Error(name() + " has " + std::to_string(info.channels) + " channel" +
                        (info.channels == 1 ? "" : "s") + ", no channel " +
                        std::to_string(channel));
        }
        const auto first = std::size_t(channel - 1);
        const std::size_t count = reading.channel ? 1 : std::size_t(info.channels);
        if (together) streams_ = {std::nullopt};
        for (std::size_t i = 0; i < count && !together; ++i) streams_.emplace_back(first + i);
    }

  private:
    std::unique_ptr<SampleStream> following() override {
        const auto index = std::size_t(number() - 1);
        if (index == streams_.size()) return nullptr;
        // Few channels are read each by itself, the first of many as well: often no other is
        // wanted.
        constexpr std::size_t few = 4;
        if (index == 0 || streams_.size() <= few) {
            return std::make_unique<SoundStream>(input(), streams_[index]);
        }
        return std::make_unique<SeparateChannel>(*this, index);
    }

    /// One of many channels; the file is taken apart when the first of them is read.
    class SeparateChannel : public SampleStream {
      public:
        SeparateChannel(SoundFile& file, std::size_t channel) : file_(file), channel_(channel) {
            delta = 1.0 / file.info_.samplerate;
            if (file.info_.frames >= 0) length = std::size_t(file.info_.frames);
        }
        std::size_t read(std::span<double> values) override {
            if (!file_.separate_) file_.separate_.emplace(file_.input());
            const auto count = file_.separate_->read(channel_, taken_, values);
            taken_ += count;
            return count;
        }
        void skip() override {}
        double done() const override { return double(taken_) / double(file_.info_.frames); }

      private:
        SoundFile& file_;
        std::size_t channel_, taken_ = 0;
    };

    SF_INFO info_{};
    std::optional<SeparateChannels> separate_;
    std::vector<std::optional<std::size_t>> streams_;  // the channels of each
};

/// The channels of one sound file. What is lost on the way is told on standard error.
class SoundWriter : public BlockWriter {
  public:
    SoundWriter(std::FILE* to, Format format, SampleType type)
        : to_(to), format_(format), type_(type) {
        if (format == Format::flac && type != SampleType::pcm16 && type != SampleType::pcm24) {
            throw UsageError("FLAC holds whole numbers of 16 or 24 bits: use --bits 16 or 24");
        }
    }

    void begin(const SignalShape& shape) override {
        if (std::exchange(begun_, true)) {
            throw Error("one signal fits a sound file here; choose with --signal");
        }
        tell_of_lost_start(shape.facts_of(0));
        SF_INFO info{};
        info.samplerate = whole_rate(shape.delta);
        info.channels = int(shape.width());
        info.format = container_of(format_, shape, info.channels) | samples_of(type_);
        file_ = open_sound(to_, SFM_WRITE, info, cannot_write);
        sf_command(file_.get(), SFC_SET_CLIPPING, nullptr, SF_TRUE);
        sf_command(file_.get(), SFC_RF64_AUTO_DOWNGRADE, nullptr, SF_TRUE);
        channels_ = std::size_t(info.channels);
    }

    void write(std::span<const double> values) override {
        const auto bad = std::ranges::find_if(values, [](double v) { return std::isnan(v); });
        if (bad != values.end()) {
            const auto sample = taken_ + std::size_t(bad - values.begin()) / channels_;
            throw Error("sample " + std::to_string(sample) +
                        " is not a number; only --bits float can hold it");
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
        if (clipped_ > 0) {
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

bool looks_like_sound(InputFile& input, const std::string& head) {
    static constexpr std::array magics{"RIFF", "RIFX", "RF64", "fLaC",    "OggS",           "FORM",
                                       ".snd", "caff", "riff", "NIST_1A", "Creative Voice", "PVF1"};
    if (std::ranges::any_of(magics, [&](const char* magic) { return head.starts_with(magic); })) {
        return true;
    }
    // What is no text may be one of the rarer formats.
    const bool text = std::ranges::none_of(head, [](char c) {
        return static_cast<unsigned char>(c) < ' ' && !(c >= '\t' && c <= '\r');
    });
    if (text) return false;
    const int file = fileno(input.stream());
    const auto place = lseek(file, 0, SEEK_CUR);
    lseek(file, 0, SEEK_SET);
    SF_INFO info{};
    const bool opens = Handle(sf_open_fd(file, SFM_READ, &info, SF_FALSE), sf_close) != nullptr;
    lseek(file, place, SEEK_SET);
    return opens;
}

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

std::unique_ptr<SignalSource> open_sound_file(InputFile& input, const ReadOptions& options,
                                              bool together) {
    return std::make_unique<SoundFile>(input, options, together);
}

std::unique_ptr<BlockWriter> sound_writer(std::FILE* to, Format format,
                                          std::optional<SampleType> type) {
    const auto usual = format == Format::flac ? SampleType::pcm24 : SampleType::float32;
    const auto chosen = type.value_or(usual);
    if (format == Format::wav && is_float(chosen)) {
        return float_wav_writer(to, chosen == SampleType::float64);
    }
    return std::make_unique<SoundWriter>(to, format, chosen);
}

}  // namespace wavkit::tool
