#include "window/generate.hpp"
namespace wavkit {
template <Record R>
int window_free_cache() {
    return 0;
}
template int window_free_cache<dsp>();
template int window_free_cache<dspf>();
}  // namespace wavkit
