// The second half of a symmetric sequence from its first.
#include "record_view.hpp"

namespace wavkit {
namespace {

template <Record R>
scalar<R> mirrored(scalar<R> sample) {
    return sample;
}

template <Record R>
Bin<scalar<R>> mirrored(Bin<scalar<R>> sample) {
    return conj(sample);
}

/// Writes the samples from `last` down to index 1 behind the first n.
template <Record R, class Sample>
void append_mirrored(Sample* samples, int n, int last) {
    for (int i = last; i >= 1; --i) samples[n + last - i] = mirrored<R>(samples[i]);
}

template <Record R>
int reconstruct(R* x, int odd) {
    const int n = x->points;
    if (n < (odd ? 2 : 3)) return 0;
    const int last = odd ? n - 1 : n - 2;  // the sample that the first new one mirrors
    if (last > longest_transform - n) return -1;
    x->points = n + last;
    if (dsp_realloc(x, n, x->complex)) return -1;
    if (x->complex) {
        append_mirrored<R>(bins(x).data(), n, last);
    } else {
        append_mirrored<R>(x->data, n, last);
    }
    return 0;
}

}  // namespace
}  // namespace wavkit

int dspi_orecon(dsp* x, int odd) { return wavkit::reconstruct(x, odd); }
int dspfi_orecon(dspf* x, int odd) { return wavkit::reconstruct(x, odd); }

int dspi_recon(dsp* x) { return dspi_orecon(x, 0); }
int dspfi_recon(dspf* x) { return dspfi_orecon(x, 0); }
