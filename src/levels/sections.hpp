// Rows of second-order sections in the making.
#pragma once

#include <algorithm>
#include <array>
#include <complex>
#include <span>

#include "record_view.hpp"

namespace wavkit {

/// b0 b1 b2 a0 a1 a2
using SectionRow = std::array<double, DSP_IIR_VALUES>;

/// The gain of rows at a frequency in cycles a sample.
inline std::complex<double> gain_of(std::span<const SectionRow> rows, double frequency) {
    const auto back = std::polar(1.0, -two_pi<double> * frequency);
    std::complex<double> gain = 1;
    for (const auto& r : rows) {
        gain *= (r[0] + back * (r[1] + back * r[2])) / (r[3] + back * (r[4] + back * r[5]));
    }
    return gain;
}

/// Writes rows; a record that cannot hold them stays as it was.
inline int store_sections(dsp* sections, std::span<const SectionRow> rows) {
    Temporary<dsp> made;
    made->points = int(rows.size()) * DSP_IIR_VALUES;
    made->delta = sections->delta;
    if (dsp_alloc(made)) return -1;
    double* to = made->data;
    for (const auto& row : rows) to = std::ranges::copy(row, to).out;
    return dsp_copy(sections, made);
}

}  // namespace wavkit
