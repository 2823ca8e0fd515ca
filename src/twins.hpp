// The double names for single-precision records, so that a template writes dsp_copy(x, y) for both.
// Exported functions that families call on each other are listed; a new one that is needed joins
// them.
#pragma once

#include "wavkit/dsp.h"

inline int dsp_init(dspf* x) { return dspf_init(x); }
inline int dsp_alloc(dspf* x) { return dspf_alloc(x); }
inline int dsp_realloc(dspf* x, int points, int complex) {
    return dspf_realloc(x, points, complex);
}
inline int dsp_destroy(dspf* x) { return dspf_destroy(x); }
inline int dsp_copy(dspf* to, const dspf* from) { return dspf_copy(to, from); }
inline int dsp_copy_at_most(dspf* to, const dspf* from, int n) {
    return dspf_copy_at_most(to, from, n);
}
inline int dspu_subvec(const dspf* from, dspf* to, int start, int count) {
    return dspfu_subvec(from, to, start, count);
}
inline int dsp_append(dspf* to, const dspf* from) { return dspf_append(to, from); }
inline int dsp_cmp(const dspf* a, const dspf* b, float tolerance, int* result) {
    return dspf_cmp(a, b, tolerance, result);
}
inline int dspi_rtoc(dspf* x) { return dspfi_rtoc(x); }

inline int dspb_add(const dspf* a, const dspf* b, dspf* out) { return dspfb_add(a, b, out); }
inline int dspb_sub(const dspf* a, const dspf* b, dspf* out) { return dspfb_sub(a, b, out); }
inline int dspb_mul(const dspf* a, const dspf* b, dspf* out) { return dspfb_mul(a, b, out); }
inline int dspb_conj_mul(const dspf* a, const dspf* b, dspf* out) {
    return dspfb_conj_mul(a, b, out);
}
inline int dspb_avg_add(const dspf* a, const dspf* b, dspf* out, float weight) {
    return dspfb_avg_add(a, b, out, weight);
}
inline int dspb_min(const dspf* a, const dspf* b, dspf* out) { return dspfb_min(a, b, out); }
inline int dspb_max(const dspf* a, const dspf* b, dspf* out) { return dspfb_max(a, b, out); }

inline int dspi_real(dspf* x) { return dspfi_real(x); }
inline int dspi_neg(dspf* x) { return dspfi_neg(x); }
inline int dspi_conj(dspf* x) { return dspfi_conj(x); }
inline int dspi_zero(dspf* x) { return dspfi_zero(x); }
inline int dspi_scale(dspf* x, float factor) { return dspfi_scale(x, factor); }
inline int dspi_rev(dspf* x) { return dspfi_rev(x); }
inline int dspi_recip(dspf* x) { return dspfi_recip(x); }
inline int dspi_log(dspf* x) { return dspfi_log(x); }
inline int dspi_exp(dspf* x) { return dspfi_exp(x); }
inline int dspi_sort(dspf* x) { return dspfi_sort(x); }
inline int dspu_magsq(const dspf* from, dspf* to) { return dspfu_magsq(from, to); }

inline int dspi_zpad(dspf* x, int n) { return dspfi_zpad(x, n); }
inline int dspi_zpad2(dspf* x, int n, int mode) { return dspfi_zpad2(x, n, mode); }
inline int dspi_unzpad(dspf* x, int n, int mode) { return dspfi_unzpad(x, n, mode); }
inline int dspi_swap_halves(dspf* x) { return dspfi_swap_halves(x); }
inline int dspi_swap_halves2(dspf* x) { return dspfi_swap_halves2(x); }

inline int dspi_bitrev_scale(dspf* x) { return dspfi_bitrev_scale(x); }
inline int dspi_bitrev(dspf* x) { return dspfi_bitrev(x); }
inline int dspi_fft(dspf* x, int inverse) { return dspfi_fft(x, inverse); }
inline int dspi_rfft(dspf* x) { return dspfi_rfft(x); }
inline int dspi_irfft(dspf* x) { return dspfi_irfft(x); }
inline int dspi_dft(dspf* x, int inverse) { return dspfi_dft(x, inverse); }
inline int dspi_rdft(dspf* x) { return dspfi_rdft(x); }
inline int dspi_irdft(dspf* x, int odd) { return dspfi_irdft(x, odd); }
inline int dspi_orecon(dspf* x, int odd) { return dspfi_orecon(x, odd); }

inline int dspi_window2(dspf* x, int window, int scale_type, float win_length) {
    return dspfi_window2(x, window, scale_type, win_length);
}
inline int dspi_window(dspf* x, int window, int scale_type) {
    return dspfi_window(x, window, scale_type);
}
inline int dsp_window_enbw(float* enbw, int window, int n) {
    return dspf_window_enbw(enbw, window, n);
}
inline int dspi_window_gauss(dspf* x, float sigma, int scale_type) {
    return dspfi_window_gauss(x, sigma, scale_type);
}
inline int dspi_window_kaiser(dspf* x, float beta, int scale_type) {
    return dspfi_window_kaiser(x, beta, scale_type);
}
inline int dspi_window_sinc(dspf* x, float x0, float p, int scale_type) {
    return dspfi_window_sinc(x, x0, p, scale_type);
}

inline int dsph_dft(const dspf* in, dspf* out, int window, int flags) {
    return dspfh_dft(in, out, window, flags);
}

inline int dspc_fir(dspf* h, int type, float f1, float f2) { return dspfc_fir(h, type, f1, f2); }
inline int dspi_window_fir(dspf* h, int window, float bw) {
    return dspfi_window_fir(h, window, bw);
}
inline int dspd_iir(const dspf* in, dspf* out, const dsp* sections, dsp* state) {
    return dspfd_iir(in, out, sections, state);
}
inline int dspd_rsmp2(const dspf* in, dspf* out, const dspf* kernel, int phases, const dsp* at,
                      dspf* state) {
    return dspfd_rsmp2(in, out, kernel, phases, at, state);
}

inline int dspc_line(dspf* x, float slope, float offset) { return dspfc_line(x, slope, offset); }

inline int dsps_sum(const dspf* x, dspf* out) { return dspfs_sum(x, out); }
inline int dsps_mean(const dspf* x, dspf* out) { return dspfs_mean(x, out); }
inline int dsps_rms(const dspf* x, dspf* out) { return dspfs_rms(x, out); }
inline int dsps_pop_var(const dspf* x, dspf* out) { return dspfs_pop_var(x, out); }
inline int dsps_magsq_sum(const dspf* x, dspf* out) { return dspfs_magsq_sum(x, out); }
inline int dsps_sine_fit(const dspf* x, dspf* out, float frequency, int flags) {
    return dspfs_sine_fit(x, out, frequency, flags);
}

inline int dsps_psolve(const dspf* polynomial, dspf* out, float x0) {
    return dspfs_psolve(polynomial, out, x0);
}
inline int dsps_pcsolve(const dspf* polynomial, dspf* out, float re0, float im0) {
    return dspfs_pcsolve(polynomial, out, re0, im0);
}
inline int dspb_cspline_2d(const dspf* x, const dspf* y, dspf* y2, float d0, float dn, int start,
                           int end) {
    return dspfb_cspline_2d(x, y, y2, d0, dn, start, end);
}
