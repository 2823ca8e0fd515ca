// The library as a whole: version, start-up, release of its caches.
#include "filter/convolution.hpp"
#include "record_view.hpp"
#include "transform/caches.hpp"
#include "transform/tables.hpp"
#include "window/generate.hpp"

namespace wavkit {
namespace {

constexpr int version = 201;  // major * 100 + minor

template <Record R>
int free_caches() {
    return status(fir_free_cache<R>() || sfir_free_cache<R>() || bitrev_free_tables<R>() ||
                  dct_free_tables<R>() || dft_free_tables<R>() || filter_free_scratch<R>() ||
                  fft_free_tables<R>() || window_free_cache<R>());
}

}  // namespace
}  // namespace wavkit

int dsp_lib_init() { return 0; }
int dspf_lib_init() { return 0; }

int dsp_version() { return wavkit::version; }
int dspf_version() { return wavkit::version; }

int dsp_free_internal() { return wavkit::free_caches<dsp>(); }
int dspf_free_internal() { return wavkit::free_caches<dspf>(); }
