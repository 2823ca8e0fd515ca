// Sound files through libsndfile: one real signal a channel.
#pragma once

#include <cstdio>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "base/signal.hpp"
#include "files/block_writer.hpp"
#include "files/format.hpp"
#include "files/input.hpp"

namespace wavkit::tool {

class SampleStream;

enum class SampleType { pcm16, pcm24, float32 };

/// Whether contents begin like one of the usual sound files.
bool looks_like_sound(const std::string& head);

/// What a sound file is: "WAV (Microsoft), 16 bit PCM, 44100 Hz".
struct Sound {
    std::string description;
    Format format;
    std::vector<Signal> channels;
};

/// Reads all channels, or the one given (from 1).
Sound read_sound(InputFile& input, std::optional<int> channel);

/// One channel, the first without a choice, to be read as it is needed. As every channel is a
/// signal of its own, `signal` chooses one as well.
std::unique_ptr<SampleStream> stream_sound(InputFile& input, std::optional<int> channel,
                                           std::optional<int> signal);

/// All channels side by side.
std::unique_ptr<SampleStream> stream_channels(InputFile& input);

/// Writes signals of one length and spacing as the channels of one file; a complex signal takes two
/// channels, re and im. The spacing becomes the nearest whole sampling rate; what was lost on the
/// way (clipped samples, a rate that is no whole number) is told on standard error.
std::unique_ptr<BlockWriter> sound_writer(std::FILE* to, Format format,
                                          std::optional<SampleType> type);

}  // namespace wavkit::tool
