// MATLAB's files of level 5, plain or compressed ("MAT-File Format", The MathWorks).
#pragma once

#include <cstdio>
#include <memory>
#include <string>

#include "files/block_writer.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {

bool looks_like_mat(const std::string& head);

/// Opens the numeric arrays of a file, each column of a matrix a signal. Spacing and start are
/// those of variables beside them: x_delta, x_start and so on for an array x, else fs, dt, t0 or a
/// vector t for all; which were used is told on standard error.
std::unique_ptr<SignalSource> open_mat(InputFile& input, const ReadOptions& options);

/// Writes each signal as a column, and beside it, as variables of their own, what is known of it.
std::unique_ptr<BlockWriter> mat_writer(std::FILE* to, bool single, bool compressed);

}  // namespace wavkit::tool
