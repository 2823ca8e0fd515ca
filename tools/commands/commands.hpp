// The subcommands; each declares its own options and does its work when it is chosen.
#pragma once

#include <CLI/CLI.hpp>

namespace wavkit::tool {

void add_info(CLI::App& program);
void add_convert(CLI::App& program);
void add_spectrum(CLI::App& program);
void add_distortion(CLI::App& program);
void add_stft(CLI::App& program);
void add_correlate(CLI::App& program);
void add_envelope(CLI::App& program);
void add_window(CLI::App& program);
void add_stats(CLI::App& program);
void add_hist(CLI::App& program);
void add_fit(CLI::App& program);
void add_roots(CLI::App& program);
void add_interp(CLI::App& program);
void add_design(CLI::App& program);
void add_filter(CLI::App& program);
void add_smooth(CLI::App& program);
void add_generate(CLI::App& program);
void add_resample(CLI::App& program);
void add_decimate(CLI::App& program);
void add_cut(CLI::App& program);
void add_join(CLI::App& program);
void add_mix(CLI::App& program);
void add_scale(CLI::App& program);
void add_derive(CLI::App& program);
void add_integrate(CLI::App& program);
void add_edges(CLI::App& program);
void add_peaks(CLI::App& program);
void add_response(CLI::App& program);
void add_orders(CLI::App& program);
void add_levels(CLI::App& program);

void add_help(CLI::App& program);

/// Gives every command that writes a file --skip-existing.
void offer_skipping(CLI::App& program);

/// Throws where there is no command of that name, and says which one may be meant.
void check_command(const CLI::App& program, const std::string& name);

}  // namespace wavkit::tool
