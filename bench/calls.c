/* Short calls repeated from C: what the same calls cost a managed host is measured against these.
 * Both sides work in the same samples, which are zeros. */
#include <wavkit/dsp.h>

enum { short_signal = 16, long_signal = 1024 };

/* Nothing to do for a real signal: the call itself. */
WAVKIT_API void repeat_conj(int times, double* samples) {
    dsp x = {1, samples, 0, short_signal, 0, 0};
    for (int i = 0; i < times; ++i) dspi_conj(&x);
}

WAVKIT_API void repeat_scale(int times, double* samples) {
    dsp x = {1, samples, 0, short_signal, 0, 0};
    for (int i = 0; i < times; ++i) dspi_scale(&x, 0.5);
}

WAVKIT_API void repeat_mean(int times, double* samples) {
    dsp x = {1, samples, 0, short_signal, 0, 0}, out = {1, samples + short_signal, 1, 1, 0, 0};
    for (int i = 0; i < times; ++i) dsps_mean(&x, &out);
}

/* `samples` has room for the spectrum. */
WAVKIT_API void repeat_rfft(int times, double* samples) {
    dsp x = {1, samples, long_signal + 2, 0, 0, 0};
    for (int i = 0; i < times; ++i) {
        x.points = long_signal;
        x.complex = 0;
        dspi_rfft(&x);
    }
}

/* Long signals, in place: what a host adds to them must not be seen. */
WAVKIT_API void repeat_long_scale(int times, double* samples, int points) {
    dsp x = {1, samples, 0, points, 0, 0};
    for (int i = 0; i < times; ++i) dspi_scale(&x, 1.0);
}

WAVKIT_API void repeat_long_rms(int times, double* samples, int points) {
    dsp x = {1, samples, 0, points, 0, 0}, out;
    dsp_init(&out);
    for (int i = 0; i < times; ++i) dsps_rms(&x, &out);
    dsp_destroy(&out);
}

WAVKIT_API void repeat_long_fft(int times, double* samples, int points) {
    dsp x = {1, samples, 0, points / 2, 1, 0};
    for (int i = 0; i < times; ++i) dspi_fft(&x, 0);
}
