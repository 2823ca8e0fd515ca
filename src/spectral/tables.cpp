#include "spectral/tables.hpp"
namespace wavkit {
template <Record R>
int fft_free_tables() {
    return 0;
}
template <Record R>
int bitrev_free_tables() {
    return 0;
}
template int fft_free_tables<dsp>();
template int fft_free_tables<dspf>();
template int bitrev_free_tables<dsp>();
template int bitrev_free_tables<dspf>();
}  // namespace wavkit
