/* A typical measurement: 1024 samples taken every microsecond, their amplitude spectrum, its
 * strongest line, and the spectrum kept in a file.
 *
 *   measure [FILE]    where the spectrum goes (default spectrum.dsp) */
#include <math.h>
#include <stdio.h>
#include <wavkit/dsp.h>

enum { samples = 1024 };

/* Stands in for the instrument: a carrier of 2 V near 123.4 kHz, a weaker one, an offset. */
static void acquire(double* volts, double delta) {
    const double two_pi = 6.283185307179586;
    for (int i = 0; i < samples; ++i) {
        const double t = i * delta;
        volts[i] = 2.0 * sin(two_pi * 123.4e3 * t) + 0.05 * sin(two_pi * 300e3 * t + 1.0) + 0.5;
    }
}

/* The strongest line: through the logarithms of the magnitudes of three bins, a parabola meets the
 * top of this window's lobe to a few thousandths of a bin. */
static int find_line(const dsp* spectrum, double* frequency, double* amplitude) {
    dsp levels, peak;
    dsp_init(&levels);
    dsp_init(&peak);
    const int failed = dspu_mag(spectrum, &levels) || dspi_log(&levels) ||
                       dsps_peak(&levels, &peak, DSP_PEAK_PARABOLIC, 0);
    if (!failed) {
        *frequency = peak.data[1] * spectrum->delta;
        *amplitude = exp(peak.data[0]);
    }
    dsp_destroy(&levels);
    dsp_destroy(&peak);
    return failed;
}

static int save(const dsp* spectrum, const char* path) {
    FILE* file = dspf_fopen(path, "wb");
    if (!file) return -1;
    const int failed = dspf_fwrite(spectrum, file);
    return dspf_fclose(file) || failed;
}

int main(int argc, char** argv) {
    const char* path = argc > 1 ? argv[1] : "spectrum.dsp";
    double volts[samples];

    /* The record borrows the instrument's buffer: `alloc` stays 0 and nobody frees it. */
    dsp signal, spectrum;
    dsp_init(&signal);
    dsp_init(&spectrum);
    signal.delta = 1e-6;
    signal.points = samples;
    signal.data = volts;
    acquire(volts, signal.delta);

    double frequency, amplitude;
    if (dsph_fft(&signal, &spectrum, 0, 1.0, DSP_WINDOW_GAUSSTOP, 0) ||
        find_line(&spectrum, &frequency, &amplitude) || save(&spectrum, path)) {
        fprintf(stderr, "measure: out of memory, or %s cannot be written\n", path);
        return 1;
    }
    printf("%d samples at %g MHz -> %d bins of %.3f Hz\n", signal.points, 1e-6 / signal.delta,
           spectrum.points, spectrum.delta);
    printf("strongest line: %.2f kHz, amplitude %.3f V\n", frequency / 1e3, amplitude);
    printf("spectrum written to %s\n", path);

    dsp_destroy(&spectrum);
    return dsp_free_internal();
}
