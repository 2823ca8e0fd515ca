// What the readers and writers of signal files share; each format lives in a file of its own.
#pragma once

#include <cstdio>

#include "record_view.hpp"

namespace wavkit {

/// Header lines of a text signal, up to their value.
inline constexpr char points_label[] = "#DSP points = ";
inline constexpr char complex_label[] = "#DSP complex = ";
inline constexpr char type_label[] = "#DSP type = ";
inline constexpr char delta_label[] = "#DSP delta = ";

/// What of a signal goes into the stream.
struct Parts {
    bool header, data;
};

// Readers: 1 when a signal was read, -1 otherwise. The record arrives with no points.

template <Record R>
int read_binary(R* x, std::FILE* stream);

template <Record R>
int read_text(R* x, std::FILE* stream);

// Writers: 0, or -1 where the stream refuses.

template <Record R>
int write_binary(const R* x, std::FILE* stream, Parts parts);

template <Record R>
int write_text(const R* x, std::FILE* stream, Parts parts);

template <Record R>
int write_summary(const R* x, std::FILE* stream, Parts parts);

}  // namespace wavkit
