// Signal files: opening, closing, and the choice of the format.
#include <cstdio>
#include <cstring>

#include "file/format.hpp"

#if defined(_WIN32)
#include <fcntl.h>
#include <io.h>
#endif

namespace wavkit {
namespace {

/// Keeps line ends as they are, on systems that would translate them.
void switch_to_binary([[maybe_unused]] std::FILE* stream) {
#if defined(_WIN32)
    _setmode(_fileno(stream), _O_BINARY);
#endif
}

std::FILE* open_standard(const char* mode) {
    std::FILE* const stream = mode[0] == 'r' ? stdin : mode[0] == 'w' ? stdout : nullptr;
    if (stream && (mode[1] == 'b' || (mode[1] && mode[2] == 'b'))) switch_to_binary(stream);
    return stream;
}

std::FILE* open(const char* path, const char* mode) {
    return std::strcmp(path, "-") == 0 ? open_standard(mode) : std::fopen(path, mode);
}

int close(std::FILE* stream) {
    return stream == stdin || stream == stdout ? 0 : std::fclose(stream);
}

/// The first byte of a binary signal in either byte order; no text begins with one.
constexpr bool begins_binary(int byte) { return byte == 0xEB || byte == 0xBE; }

template <Record R>
int read(R* x, std::FILE* stream) {
    x->points = 0;
    const int first = std::getc(stream);
    if (first == EOF) return 0;
    if (std::ungetc(first, stream) == EOF) return -1;
    return begins_binary(first) ? read_binary(x, stream) : read_text(x, stream);
}

constexpr int format_mask = 0xFF;

template <Record R>
int write(const R* x, std::FILE* stream, int flags) {
    const Parts parts{!(flags & DSP_FILE_NO_HEADER), !(flags & DSP_FILE_NO_DATA)};
    switch (flags & format_mask) {
        case DSP_FILE_BINARY:
            return write_binary(x, stream, parts);
        case DSP_FILE_TEXT:
            return write_text(x, stream, parts);
        case DSP_FILE_LINE:
            return write_summary(x, stream, parts);
        default:
            return -1;
    }
}

}  // namespace
}  // namespace wavkit

std::FILE* dspf_fopen(const char* path, const char* mode) { return wavkit::open(path, mode); }
std::FILE* dspff_fopen(const char* path, const char* mode) { return wavkit::open(path, mode); }

int dspf_fclose(std::FILE* stream) { return wavkit::close(stream); }
int dspff_fclose(std::FILE* stream) { return wavkit::close(stream); }

int dspf_fread(dsp* record, std::FILE* stream) { return wavkit::read(record, stream); }
int dspff_fread(dspf* record, std::FILE* stream) { return wavkit::read(record, stream); }

int dspf_fwrite(const dsp* record, std::FILE* stream) {
    return wavkit::write(record, stream, DSP_FILE_BINARY);
}
int dspff_fwrite(const dspf* record, std::FILE* stream) {
    return wavkit::write(record, stream, DSP_FILE_BINARY);
}

int dspf_fwrite2(const dsp* record, std::FILE* stream, int flags) {
    return wavkit::write(record, stream, flags);
}
int dspff_fwrite2(const dspf* record, std::FILE* stream, int flags) {
    return wavkit::write(record, stream, flags);
}

int dspf_fwrite_ascii(const dsp* record, std::FILE* stream) {
    return wavkit::write(record, stream, DSP_FILE_TEXT);
}
int dspff_fwrite_ascii(const dspf* record, std::FILE* stream) {
    return wavkit::write(record, stream, DSP_FILE_TEXT);
}
