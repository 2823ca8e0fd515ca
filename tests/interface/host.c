// A host in C: the records as it lays them out, its own memory, and a signal on its way through the
// families and a file.
#include <stddef.h>
#include <stdio.h>
#include <stdlib.h>

#include "wavkit/dsp.h"

_Static_assert(offsetof(dsp, data) == sizeof(double), "data follows delta");
_Static_assert(offsetof(dspf, data) == offsetof(dsp, data), "both records have one layout");
_Static_assert(offsetof(dsp, points) == offsetof(dsp, alloc) + 4, "points follows alloc");
_Static_assert(offsetof(dsp, complex) == offsetof(dsp, points) + 4, "complex follows points");
_Static_assert(offsetof(dsp, extra) == offsetof(dsp, complex) + 8, "extra is aligned to 8 bytes");
_Static_assert(sizeof(dsp) == offsetof(dsp, extra) + 8 && sizeof(dspf) == sizeof(dsp), "no tail");

static int failures;

static void expect(int holds, const char* what) {
    if (holds) return;
    fprintf(stderr, "failed: %s\n", what);
    ++failures;
}

static int blocks;

static void allocate(dsp* record) {
    if (record->alloc > 0) free(record->data);
    record->data = malloc((size_t)record->points * (record->complex ? 2 : 1) * sizeof(double));
    ++blocks;
}

static void reallocate(dsp* record, int old_points, int old_complex) {
    (void)old_points;
    (void)old_complex;
    record->data =
        realloc(record->data, (size_t)record->points * (record->complex ? 2 : 1) * sizeof(double));
    ++blocks;
}

static void release(dsp* record) { free(record->data); }

static int is_near(double a, double b) { return a - b < 1e-15 && b - a < 1e-15; }

/// One turn of a cosine through the spectrum and back.
static void transform(void) {
    const double half = 0.7071067811865476;  // cos(pi / 4)
    double turn[] = {1, half, 0, -half, -1, -half, 0, half};
    dsp x, spectrum;
    dsp_init(&x);
    dsp_init(&spectrum);
    x.data = turn;
    x.points = 8;
    x.delta = 0.25;

    expect(dsp_copy(&spectrum, &x) == 0 && spectrum.data != turn, "a copy has its own block");
    expect(dspi_rfft(&spectrum) == 0, "rfft");
    expect(spectrum.complex == 1 && spectrum.points == 5, "half a spectrum");
    expect(spectrum.delta == 0.5, "spacing in hertz");
    for (int k = 0; k < spectrum.points; ++k) {
        expect(is_near(spectrum.data[2 * k], k == 1 ? 0.5 : 0), "a line at the first bin");
        expect(is_near(spectrum.data[2 * k + 1], 0), "no imaginary part");
    }
    int difference = 9;
    expect(dspi_irfft(&spectrum) == 0, "irfft");
    expect(dsp_cmp(&spectrum, &x, 1e-15, &difference) == 0 && difference == 0,
           "the signal is back");
    expect(dsp_destroy(&spectrum) == 0 && dsp_destroy(&x) == 0, "destroy");
}

/// Two signals of single precision, one after the other in a file.
static void store(void) {
    float samples[] = {1.5F, -2, 3, 0.25F};
    dspf x, y;
    dspf_init(&x);
    dspf_init(&y);
    x.data = samples;
    x.points = 2;
    x.complex = 1;

    FILE* file = tmpfile();
    expect(dspff_fwrite(&x, file) == 0 && dspff_fwrite_ascii(&x, file) == 0, "write");
    rewind(file);
    for (int i = 0; i < 2; ++i) {
        int difference = 9;
        expect(dspff_fread(&y, file) == 1 && y.complex == 1, "read");
        expect(dspf_cmp(&x, &y, 0, &difference) == 0 && difference == 0, "what was written");
    }
    expect(dspff_fread(&y, file) == 0, "the end");
    expect(dspf_fclose(file) == 0, "close");
    dspf_destroy(&y);
}

int main(void) {
    dsp_alloc_hook previous = allocate;
    expect(dsp_version() == 201 && dspf_version() == 201, "version");
    expect(dsp_lib_alloc(allocate, &previous) == 0 && previous == NULL, "no hook at first");
    dsp_lib_realloc(reallocate, NULL);
    dsp_lib_free(release, NULL);
    transform();
    expect(blocks > 0, "the host's memory is used");
    expect(dsp_free_internal() == 0, "release of the caches");
    dsp_lib_alloc(NULL, &previous);
    expect(previous == allocate, "the hook that was installed");
    dsp_lib_realloc(NULL, NULL);
    dsp_lib_free(NULL, NULL);
    store();
    return failures != 0;
}
