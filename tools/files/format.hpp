// The file formats that the program knows, and their names.
#pragma once

#include <map>
#include <optional>
#include <string>

namespace wavkit::tool {

enum class Format { binary, text, csv, wav, flac };

/// What the samples of a sound file are.
enum class SampleType { pcm16, pcm24, float32 };

/// What --from and --to accept.
const std::map<std::string, Format>& formats();

/// How `info` calls a format, of which libsndfile knows more where it is sound.
std::string description(Format format);

/// The format that a file's name asks for, by its extension.
std::optional<Format> format_of_name(const std::string& path);

inline bool is_sound(Format format) { return format == Format::wav || format == Format::flac; }
inline bool is_signal_file(Format format) {
    return format == Format::binary || format == Format::text;
}

}  // namespace wavkit::tool
