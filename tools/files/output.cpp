#include "files/output.hpp"

#include <sys/stat.h>
#include <unistd.h>
#include <wavkit/dsp.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <utility>

#include "base/error.hpp"
#include "base/scratch.hpp"

namespace wavkit::tool {
namespace {

/// The temporary files of the moment, for the handler of interruptions, which may touch little
/// else.
using Path = std::array<char, 4096>;
std::array<Path, 4> unfinished{};

constexpr int interruptions[] = {SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGPIPE};

void remove_unfinished(int signal) {
    for (const Path& path : unfinished) {
        if (path[0]) unlink(path.data());
    }
    std::signal(signal, SIG_DFL);
    std::raise(signal);
}

/// No interruption is heard while it lives.
class Uninterrupted {
  public:
    Uninterrupted() {
        sigset_t all;
        sigemptyset(&all);
        for (const int signal : interruptions) sigaddset(&all, signal);
        pthread_sigmask(SIG_BLOCK, &all, &before_);
    }
    ~Uninterrupted() { pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
    Uninterrupted(const Uninterrupted&) = delete;
    Uninterrupted& operator=(const Uninterrupted&) = delete;

  private:
    sigset_t before_;
};

/// Has interruptions remove a file, until forget().
void remember(const std::string& path) {
    for (const int signal : interruptions) {
        if (std::signal(signal, remove_unfinished) == SIG_IGN) std::signal(signal, SIG_IGN);
    }
    for (Path& place : unfinished) {
        if (place[0] || path.size() >= place.size()) continue;
        std::copy_n(path.c_str(), path.size() + 1, place.data());
        return;
    }
}

void forget(const std::string& path) {
    for (Path& place : unfinished) {
        if (path == place.data()) place[0] = '\0';
    }
}

/// The permissions a new file at `path` would have, or those of the file that it replaces.
mode_t permissions(const std::string& path) {
    struct stat status {};
    if (stat(path.c_str(), &status) == 0) return status.st_mode & 0777;
    const mode_t mask = umask(0);
    umask(mask);
    return 0666 & ~mask;
}

/// What a name stands for: behind a link the file that it leads to, whether or not that is there
/// already, so that a rename keeps the link.
std::string behind_links(const std::string& path) {
    constexpr int most_links = 40;
    std::filesystem::path file = path;
    for (int i = 0; i < most_links; ++i) {
        std::error_code none;
        const auto next = std::filesystem::read_symlink(file, none);
        if (none) break;
        file = file.parent_path() / next;
    }
    return file.string();
}

}  // namespace

OutputFile::OutputFile(const std::string& path)
    : name_(path == "-" ? "standard output" : path), target_(path) {
    std::error_code ignored;
    const auto kind = std::filesystem::status(path, ignored).type();
    if (kind == std::filesystem::file_type::directory) {
        throw Error("cannot write " + name_ + ": it is a directory");
    }
    const bool plain = kind == std::filesystem::file_type::regular ||
                       kind == std::filesystem::file_type::not_found;
    if (path == "-" || !plain) {
        stream_ = std::tmpfile();
    } else {
        target_ = behind_links(path);
        temporary_ = target_ + ".XXXXXX.tmp";
        const Uninterrupted uninterrupted;
        const int file = mkstemps(temporary_.data(), 4);
        if (file < 0) fail();
        remember(temporary_);
        stream_ = fdopen(file, "w+b");
    }
    if (!stream_) fail();
}

OutputFile::~OutputFile() {
    if (stream_) std::fclose(stream_);
    if (temporary_.empty()) return;
    unlink(temporary_.c_str());
    forget(temporary_);
}

void OutputFile::fail() const {
    throw Error("cannot write " + name_ + ": " + std::strerror(errno));
}

void OutputFile::commit() {
    if (std::ferror(stream_) || std::fflush(stream_) != 0) fail();
    if (temporary_.empty()) return hand_over();
    if (fchmod(fileno(stream_), permissions(target_)) != 0) fail();
    if (std::rename(temporary_.c_str(), target_.c_str()) != 0) fail();
    forget(std::exchange(temporary_, ""));
}

void OutputFile::hand_over() {
    std::FILE* const to = dspf_fopen(target_.c_str(), "wb");
    if (!to) fail();
    std::rewind(stream_);
    const bool complete = copy_rest(stream_, to);
    const int reason = errno;
    const bool closed = dspf_fclose(to) == 0;
    if (!complete) errno = reason;
    if (!complete || !closed) fail();
}

}  // namespace wavkit::tool
