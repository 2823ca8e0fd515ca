// The file formats that the program knows, and their names.
#pragma once

#include <map>
#include <optional>
#include <string>

namespace wavkit::tool {

enum class Format { binary, text, csv, wav, flac, npy, uff, tdms, mat };

/// What the samples of a sound file are.
enum class SampleType { pcm16, pcm24, pcm32, float32, float64 };

/// What --from and --to accept.
const std::map<std::string, Format>& formats();
const std::map<std::string, Format>& written_formats();

/// How `info` calls a format, of which libsndfile knows more where it is sound.
std::string description(Format format);

/// The format that a file's name asks for, by its extension.
std::optional<Format> format_of_name(const std::string& path);

inline bool is_sound(Format format) { return format == Format::wav || format == Format::flac; }
/// Formats whose signals may lie side by side.
inline bool takes_channels(Format format) {
    return is_sound(format) || format == Format::csv || format == Format::npy;
}
/// Formats of which a file holds whole signals, in double or single precision.
inline bool is_signal_file(Format format) {
    return format == Format::binary || format == Format::text || format == Format::npy ||
           format == Format::mat;
}

}  // namespace wavkit::tool
