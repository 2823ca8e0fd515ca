// Signals in text files, in memory where there is a file system for that.
#include <fast_float/fast_float.h>
#include <unistd.h>

#include <charconv>
#include <filesystem>

#include "peers.hpp"

namespace wavkit::bench {
namespace {

using File = std::unique_ptr<FILE, int (*)(FILE*)>;

File open(const std::string& path, const char* mode) {
    File file(std::fopen(path.c_str(), mode), std::fclose);
    if (!file) std::abort();
    return file;
}

std::string contents(const std::string& path) {
    std::string text(std::filesystem::file_size(path), '\0');
    if (std::fread(text.data(), 1, text.size(), open(path, "rb").get()) != text.size())
        std::abort();
    return text;
}

/// Behind the header.
const char* numbers_of(const std::string& text) {
    const char* at = text.c_str();
    while (*at == '#') at = std::strchr(at, '\n') + 1;
    return at;
}

/// A peer that writes number after number into a buffer.
template <class T, class Format>
Peer<T> writer(const char* name, const std::string& path, Format format) {
    return {name, [=](Operands<T> o) {
                const File file = open(path, "wb");
                constexpr std::size_t size = 65536;
                static char buffer[size + 64];
                char* at = buffer;
                for (std::size_t i = 0; i < o.n; ++i) {
                    at = format(at, at + 40, o.a[i]);
                    *at++ = '\n';
                    if (at < buffer + size && i + 1 < o.n) continue;
                    std::fwrite(buffer, 1, std::size_t(at - buffer), file.get());
                    at = buffer;
                }
            }};
}

/// A peer that reads number after number from the whole file.
template <class T, class Parse>
Peer<T> reader(const char* name, const std::string& path, Parse parse) {
    return {name, [=](Operands<T> o) {
                const std::string text = contents(path);
                const char *at = numbers_of(text), *const end = text.data() + text.size();
                for (std::size_t i = 0; i < o.n; ++i) at = parse(at, end, o.y[i]).ptr + 1;
            }};
}

template <Record R, class T = scalar<R>>
void texts(const Family<R>& f) {
    constexpr int digits = sizeof(T) == 8 ? 16 : 7;
    const std::filesystem::path memory = "/dev/shm";
    const auto place = is_directory(memory) ? memory : std::filesystem::temp_directory_path();
    const std::string path = place / ("wavkit-bench-" + std::to_string(::getpid()));
    const auto parsed = [=](const T*, std::size_t) {
        const std::string text = contents(path);
        Values values;
        char* end = nullptr;
        for (const char* at = numbers_of(text); *at; at = end + 1) {
            values.push_back(std::strtod(at, &end));
        }
        return values;
    };
    const auto x = real(-10, 10);
    f.row("text, write", x,
          [=](R* a, R* out) {
              out->points = 1;  // the result lies in the file
              return dsp_alloc(out) | dspf_fwrite_ascii(a, open(path, "wb").get());
          },
          {writer<T>("to_chars", path,
                     [](char* at, char* end, T v) {
                         return std::to_chars(at, end, v, std::chars_format::general, digits).ptr;
                     }),
           writer<T>("to_chars, shortest", path,
                     [](char* at, char* end, T v) { return std::to_chars(at, end, v).ptr; })},
          {parsed, sizeof(T) == 8 ? 1e-14 : 1e-6});
    Signal<R> signal(f.n);
    for (std::size_t i = 0; i < f.n; ++i) signal->data[i] = T(uniform(-10, 10));
    dspf_fwrite_ascii(signal.get(), open(path, "wb").get());
    f.row("text, read", x,
          [=](R*, R* out) { return dspf_fread(out, open(path, "rb").get()) == 1 ? 0 : -1; },
          {reader<T>("from_chars", path,
                     [](auto at, auto end, T& v) { return std::from_chars(at, end, v); }),
           reader<T>("fast_float", path,
                     [](auto at, auto end, T& v) { return fast_float::from_chars(at, end, v); })});
    std::filesystem::remove(path);
}

[[maybe_unused]] const bool added = at_every_size("files", [](const auto& f) {
    if (f.wants("text, write, read")) texts(f);
});

}  // namespace
}  // namespace wavkit::bench
