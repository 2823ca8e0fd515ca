// A host in C that uses complex numbers of its own beside the library's.
#include <complex.h>
#include <tgmath.h>

#include "wavkit/dsp.h"

static double complex turn = 0.5 - 0.5 * I;  // the header leaves the macro as it was
#undef complex

int main(void) {
    double half[] = {1, 0, creal(turn), cimag(turn), 0, 0};  // bins 0, 1 and 2 of four samples
    const double samples[] = {2, 2, 0, 0};
    struct {
        dsp spectrum;
        double behind;
    } host = {.spectrum = {.data = half, .points = 3, .complex = 1, .extra = 7}, .behind = 11};

    if (dspi_irfft(&host.spectrum) || host.spectrum.complex || host.spectrum.points != 4) return 1;
    for (int i = 0; i < 4; ++i) {
        if (fabs(host.spectrum.data[i] - samples[i]) > 1e-15) return 2;
    }
    if (host.spectrum.extra != 7 || host.behind != 11) return 3;
    dsp_destroy(&host.spectrum);
    return dsp_free_internal();
}
