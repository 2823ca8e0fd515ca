// The library as a whole: version, start-up, release of its caches.
#include "state.hpp"

namespace wavkit {
namespace {

constexpr int version = 201;  // major * 100 + minor

}  // namespace
}  // namespace wavkit

int dsp_lib_init() { return 0; }
int dspf_lib_init() { return 0; }

int dsp_version() { return wavkit::version; }
int dspf_version() { return wavkit::version; }

int dsp_free_internal() { return wavkit::free_state<dsp>(); }
int dspf_free_internal() { return wavkit::free_state<dspf>(); }
