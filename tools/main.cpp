// wavkit: signals from the command line.
#include <wavkit/dsp.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <exception>
#include <string>

#include "base/error.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"

namespace {

constexpr int bad_input = 1, bad_usage = 2;

/// One line on standard error, whatever a user's names are made of.
int complain(const std::string& who, const std::string& what, int status) {
    std::fprintf(stderr, "%s: %s\n", who.c_str(), wavkit::tool::printable(what).c_str());
    return status;
}

/// The status that stays when all that was printed has reached its place.
int with_output(int status) {
    const bool failed = std::ferror(stdout) != 0;
    if (std::fflush(stdout) == 0 && !failed) return status;
    const std::string reason = failed ? "" : std::string(": ") + std::strerror(errno);
    return complain("wavkit", "cannot write standard output" + reason, bad_input);
}

/// The subcommand in use, as a user writes it.
std::string invoked(const CLI::App& program) {
    const auto chosen = program.get_subcommands();
    return chosen.empty() ? "wavkit" : "wavkit " + chosen.front()->get_name();
}

std::string version() {
    const int number = dsp_version();
    return "wavkit " + std::to_string(number / 100) + "." + std::to_string(number % 100);
}

void run(CLI::App& program, int argc, char** argv) {
    program.set_version_flag("--version", version());
    program.require_subcommand(1);
    program.footer(
        "A file named - is standard input or output, so commands pipe:\n"
        "  wavkit convert tone.wav - | wavkit spectrum - --peaks 3\n\n"
        "Exit status: 0 done, 1 bad input or output, 2 bad usage.\n"
        "wavkit help COMMAND explains a command.");
    program.get_formatter()->column_width(36);
    wavkit::tool::add_info(program);
    wavkit::tool::add_convert(program);
    wavkit::tool::add_spectrum(program);
    wavkit::tool::add_distortion(program);
    wavkit::tool::add_stft(program);
    wavkit::tool::add_correlate(program);
    wavkit::tool::add_envelope(program);
    wavkit::tool::add_window(program);
    wavkit::tool::add_stats(program);
    wavkit::tool::add_hist(program);
    wavkit::tool::add_fit(program);
    wavkit::tool::add_roots(program);
    wavkit::tool::add_interp(program);
    wavkit::tool::add_design(program);
    wavkit::tool::add_filter(program);
    wavkit::tool::add_smooth(program);
    wavkit::tool::add_generate(program);
    wavkit::tool::add_resample(program);
    wavkit::tool::add_decimate(program);
    wavkit::tool::add_cut(program);
    wavkit::tool::add_join(program);
    wavkit::tool::add_mix(program);
    wavkit::tool::add_scale(program);
    wavkit::tool::add_derive(program);
    wavkit::tool::add_integrate(program);
    wavkit::tool::add_edges(program);
    wavkit::tool::add_peaks(program);
    wavkit::tool::add_response(program);
    wavkit::tool::add_orders(program);
    wavkit::tool::add_levels(program);
    wavkit::tool::add_help(program);
    wavkit::tool::offer_skipping(program);
    if (argc > 1 && argv[1][0] != '-') wavkit::tool::check_command(program, argv[1]);
    program.parse(argc, argv);
}

/// Runs the program and turns what it throws into a line and an exit status.
int outcome(CLI::App& program, int argc, char** argv) {
    try {
        run(program, argc, argv);
        return 0;
    } catch (const CLI::Success& asked) {
        return program.exit(asked);
    } catch (const CLI::RuntimeError& told) {
        return told.get_exit_code();
    } catch (const CLI::ParseError& error) {
        const auto who = invoked(program);
        return complain(who, std::string(error.what()) + " (" + who + " --help)", bad_usage);
    } catch (const wavkit::tool::UsageError& error) {
        return complain(invoked(program), error.what(), bad_usage);
    }
}

}  // namespace

int main(int argc, char** argv) {
    std::signal(SIGXFSZ, SIG_IGN);  // a file that becomes too long is an error like a full disk
    try {
        CLI::App program("Looks at sampled signals, converts them and measures their spectra.",
                         "wavkit");
        return with_output(outcome(program, argc, argv));
    } catch (const std::bad_alloc&) {
        return complain("wavkit", "out of memory", bad_input);
    } catch (const std::exception& error) {
        return complain("wavkit", error.what(), bad_input);
    }
}
