// Sound files through libsndfile: one real signal a channel.
#pragma once

#include <cstdio>
#include <memory>
#include <optional>
#include <string>

#include "files/block_writer.hpp"
#include "files/format.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {

/// Whether contents, of which `head` is the start, are sound that libsndfile opens.
bool looks_like_sound(InputFile& input, const std::string& head);

/// The sampling rate of a file for signals of this spacing; throws where it is no whole number.
int whole_rate(double delta);

/// Opens the channels of a file, together or one after the other, or the one that is chosen.
std::unique_ptr<SignalSource> open_sound_file(InputFile& input, const ReadOptions& options,
                                              bool together);

/// Writes signals of one length and spacing as the channels of one file; a complex signal takes two
/// channels, re and im. The spacing becomes the nearest whole sampling rate; what was lost on the
/// way (clipped samples, a rate that is no whole number) is told on standard error.
std::unique_ptr<BlockWriter> sound_writer(std::FILE* to, Format format,
                                          std::optional<SampleType> type);

}  // namespace wavkit::tool
