// Put before the program by LD_PRELOAD: sends it the signal INTERRUPT at its step INTERRUPT_AT, of
// those on which a file comes about. Steps are counted from 1; of many writes two count.
#include <dlfcn.h>
#include <sys/stat.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>

namespace {

int interruption, at;

__attribute__((constructor)) void begin() {
    const char *const signal = std::getenv("INTERRUPT"), *const place = std::getenv("INTERRUPT_AT");
    if (!signal || !place) return;
    interruption = std::atoi(signal);
    at = std::atoi(place);
    unsetenv("LD_PRELOAD");  // not for what the program starts
}

void step() {
    static int steps;
    if (++steps == at) std::raise(interruption);
}

template <class Function>
Function* real(Function*, const char* name) {
    return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

}  // namespace

extern "C" {

int mkstemps(char* path, int suffix) {
    const int file = real(mkstemps, "mkstemps")(path, suffix);
    step();
    return file;
}

std::size_t fwrite(const void* from, std::size_t size, std::size_t count, FILE* to) {
    static int writes;
    if (writes < 2 && ++writes) step();
    return real(fwrite, "fwrite")(from, size, count, to);
}

int fflush(FILE* stream) {
    step();
    return real(fflush, "fflush")(stream);
}

int fchmod(int file, mode_t mode) noexcept {
    step();
    return real(fchmod, "fchmod")(file, mode);
}

int rename(const char* from, const char* to) noexcept {
    step();
    const int result = real(rename, "rename")(from, to);
    step();
    return result;
}
}
