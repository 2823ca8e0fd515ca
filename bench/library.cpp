// The exported names are defined here: each jumps to where the library in use has it, as a host's
// call does through its table of linked functions.
#include "library.hpp"

#include <dlfcn.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>

namespace wavkit::bench {
namespace {

struct Entries {
#define ENTRY(returned, name, parameters, arguments) returned(*name) parameters;
#include "entries.inc"
#undef ENTRY
};

Entries in_use;
std::vector<Entries> loaded;

/// The name in an opened library, where there is one.
template <class Function>
void find(void* library, const char* name, Function& function) {
    function = library ? reinterpret_cast<Function>(dlsym(library, name)) : nullptr;
    if (function) return;
    std::fprintf(stderr, "%s\n", dlerror());
    std::exit(2);
}

/// A file of its own for each set, since the loader takes a file only once.
Entries load(const std::filesystem::path& library, const char* set) {
    const auto copy = std::filesystem::temp_directory_path() /
                      ("wavkit-bench-" + std::to_string(::getpid()) + set + ".so");
    std::filesystem::copy_file(library, copy, std::filesystem::copy_options::overwrite_existing);
    ::setenv("WAVKIT_SET", set, 1);
    void* const opened = dlopen(copy.c_str(), RTLD_NOW | RTLD_LOCAL);
    std::filesystem::remove(copy);
    Entries entries;
#define ENTRY(returned, name, parameters, arguments) find(opened, #name, entries.name);
#include "entries.inc"
#undef ENTRY
    entries.dsp_version();  // the first call chooses the set
    return entries;
}

}  // namespace

std::vector<std::string> load_sets(const std::string& library) {
    std::vector<std::string> names;
#define SET(name, supported) \
    if (supported) names.push_back(#name), loaded.push_back(load(library, #name));
#include "sets.inc"
#undef SET
    use(names.size() - 1);
    return names;
}

void use(std::size_t set) { in_use = loaded[set]; }

}  // namespace wavkit::bench

#define ENTRY(returned, name, parameters, arguments) \
    returned name parameters { return wavkit::bench::in_use.name arguments; }
#include "entries.inc"
#undef ENTRY
