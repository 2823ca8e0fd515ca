#include "show/gnuplot.hpp"

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cctype>
#include <cerrno>
#include <cstring>

#include "base/error.hpp"
#include "base/scratch.hpp"
#include "base/text.hpp"

extern char** environ;

namespace wavkit::tool {
namespace {

/// The last line that gnuplot complained with.
std::string complaint(std::FILE* errors) {
    std::rewind(errors);
    std::array<char, 512> line{};
    std::string last;
    while (std::fgets(line.data(), int(line.size()), errors)) {
        std::string text(line.data());
        while (!text.empty() && std::isspace(static_cast<unsigned char>(text.back()))) {
            text.pop_back();
        }
        if (!text.empty()) last = text;
    }
    return last;
}

}  // namespace

std::string script_text(const std::string& text) {
    std::string result = "'";
    for (const char c : printable(text)) result.append(c == '\'' ? 2 : 1, c);
    return result + "'";
}

void run_gnuplot(std::FILE* script, std::FILE* to) {
    const auto errors = scratch();
    if (std::ferror(script) || std::fflush(script) != 0) fail_with_scratch();
    lseek(fileno(script), 0, SEEK_SET);
    std::array<int, 2> pipe_ends;
    if (pipe(pipe_ends.data()) != 0) throw Error(std::string("no pipe: ") + std::strerror(errno));
    for (const int end : pipe_ends) fcntl(end, F_SETFD, FD_CLOEXEC);
    Stream picture(fdopen(pipe_ends[0], "rb"), std::fclose);
    posix_spawn_file_actions_t streams;
    posix_spawn_file_actions_init(&streams);
    posix_spawn_file_actions_adddup2(&streams, fileno(script), STDIN_FILENO);
    posix_spawn_file_actions_adddup2(&streams, pipe_ends[1], STDOUT_FILENO);
    posix_spawn_file_actions_adddup2(&streams, fileno(errors.get()), STDERR_FILENO);
    std::string program = "gnuplot", option = "-d";  // no start-up files of the user's
    std::array<char*, 3> arguments{program.data(), option.data(), nullptr};
    pid_t child;
    const int failure =
        posix_spawnp(&child, program.c_str(), &streams, nullptr, arguments.data(), environ);
    posix_spawn_file_actions_destroy(&streams);
    close(pipe_ends[1]);
    if (failure == ENOENT) {
        throw Error("pictures need gnuplot, which is not installed (Debian: gnuplot-nox)");
    }
    if (failure != 0) throw Error(std::string("cannot run gnuplot: ") + std::strerror(failure));
    // gnuplot does not tell what it could not write.
    const bool complete = picture && copy_rest(picture.get(), to);
    const int reason = errno;
    picture.reset();
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    if (!complete) throw Error(std::string("cannot write the picture: ") + std::strerror(reason));
    if (status != 0) throw Error("gnuplot failed: " + complaint(errors.get()));
}

}  // namespace wavkit::tool
