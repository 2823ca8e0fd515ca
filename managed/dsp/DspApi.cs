using System;
using static Corvane.QuillonInternal.DataAnalysis.NativeMethods;

namespace Corvane.QuillonInternal.DataAnalysis;

/// <summary>
/// Native functions on signal records in double precision: each call goes straight to the native
/// function of its name and returns what that returns, 0 on success and -1 on failure.
/// </summary>
/// <remarks>
/// <para>
/// A disposed record makes every function throw <see cref="ObjectDisposedException"/>, and a null one
/// <see cref="NullReferenceException"/>; there are no other exceptions.
/// </para>
/// <para>
/// Inputs and outputs may be the same record. Any number of threads may call any functions at once, on
/// different records.
/// </para>
/// </remarks>
public static unsafe class DspApi
{
    /// <summary>Releases the samples that the library allocated, and makes the record an empty one
    /// with <see cref="DspInput.Delta"/> 1.0. A borrowed buffer is left alone.</summary>
    /// <param name="x">The record; it may be filled again.</param>
    /// <returns>Always 0.</returns>
    public static int dsp_destroy(DspInput x) => Call(NativeMethods.dsp_destroy, x);

    /// <summary>Multiplies a signal by a window of the catalogue and rotates it, so that the centre
    /// of the window lies at sample 0.</summary>
    /// <param name="x">The signal, changed in place; a borrowed buffer is exchanged for one of the
    /// library's.</param>
    /// <param name="window">A <see cref="DspWindow"/>.</param>
    /// <param name="scaleType">A <see cref="DspScale"/>.</param>
    /// <param name="winLength">Width of the window in samples; heeded only with
    /// <see cref="DspScale.Width"/>.</param>
    /// <returns>0, or -1 for a window or a scale that does not exist, or when memory runs
    /// out.</returns>
    public static int dspi_window2(DspInput x, int window, int scaleType, double winLength)
    {
        int result = NativeMethods.dspi_window2(x.GetDspPtr(), window, scaleType, winLength);
        GC.KeepAlive(x);
        return result;
    }

    /// <summary>Rotates a signal so that its first sample comes to lie in the middle: (a, b, c, d,
    /// e) becomes (d, e, a, b, c).</summary>
    /// <param name="x">The signal, changed in place.</param>
    /// <returns>Always 0.</returns>
    public static int dspi_swap_halves(DspInput x) => Call(NativeMethods.dspi_swap_halves, x);

    /// <summary>Appends zeros.</summary>
    /// <param name="x">The signal, changed in place; longer than that already, it stays as it
    /// is.</param>
    /// <param name="n">How many samples it shall have.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dspi_zpad(DspInput x, int n) => Call(NativeMethods.dspi_zpad, x, n);

    /// <summary>Reverses the order of the samples.</summary>
    /// <param name="x">The signal, changed in place.</param>
    /// <returns>Always 0.</returns>
    public static int dspi_rev(DspInput x) => Call(NativeMethods.dspi_rev, x);

    /// <summary>Conjugates complex samples; a real signal stays as it is.</summary>
    /// <param name="x">The signal, changed in place.</param>
    /// <returns>Always 0.</returns>
    public static int dspi_conj(DspInput x) => Call(NativeMethods.dspi_conj, x);

    /// <summary>Fourier transform of N = 2^m samples; a forward one is divided by N.</summary>
    /// <param name="x">The signal, which becomes complex, and its <see cref="DspInput.Delta"/> 1 /
    /// (N delta).</param>
    /// <param name="inverse">A <see cref="DspDirection"/>.</param>
    /// <returns>0; -1 when the length is no power of two (nothing is then changed), or when memory
    /// runs out.</returns>
    public static int dspi_fft(DspInput x, int inverse) => Call(NativeMethods.dspi_fft, x, inverse);

    /// <summary>Fourier transform of N = 2^m real samples into the bins 0 to N/2, divided by
    /// N.</summary>
    /// <param name="x">The signal, which becomes complex, and its <see cref="DspInput.Delta"/> 1 /
    /// (N delta).</param>
    /// <returns>0; -1 for a complex signal, when the length is no power of two (nothing is then
    /// changed), or when memory runs out.</returns>
    public static int dspi_rfft(DspInput x) => Call(NativeMethods.dspi_rfft, x);

    /// <summary>Turns the bins of <see cref="dspi_rfft"/> back into real samples, twice as many as
    /// bins less two.</summary>
    /// <param name="x">The bins, changed in place.</param>
    /// <returns>0; -1 when the number of samples would be no power of two (the record then holds
    /// the whole spectrum), or when memory runs out.</returns>
    public static int dspi_irfft(DspInput x) => Call(NativeMethods.dspi_irfft, x);

    /// <summary>Fourier transform of any length N; a forward one is divided by N.</summary>
    /// <param name="x">The signal, which becomes complex, and its <see cref="DspInput.Delta"/> 1 /
    /// (N delta).</param>
    /// <param name="inverse">A <see cref="DspDirection"/>.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dspi_dft(DspInput x, int inverse) => Call(NativeMethods.dspi_dft, x, inverse);

    /// <summary>Fourier transform of N real samples, any number, into the bins 0 to N/2, divided by
    /// N.</summary>
    /// <param name="x">The signal, which becomes complex, and its <see cref="DspInput.Delta"/> 1 /
    /// (N delta).</param>
    /// <returns>0; -1 for a complex signal (nothing is then changed), or when memory runs
    /// out.</returns>
    public static int dspi_rdft(DspInput x) => Call(NativeMethods.dspi_rdft, x);

    /// <summary>Turns the bins of <see cref="dspi_rdft"/> back into real samples.</summary>
    /// <param name="x">The bins, changed in place.</param>
    /// <param name="odd">0 for twice as many samples as bins less two, anything else for one
    /// more.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dspi_irdft(DspInput x, int odd) => Call(NativeMethods.dspi_irdft, x, odd);

    /// <summary>Multiplies every sample by a factor.</summary>
    /// <param name="x">The signal, changed in place.</param>
    /// <param name="factor">The factor.</param>
    /// <returns>Always 0.</returns>
    public static int dspi_scale(DspInput x, double factor) =>
        Call(NativeMethods.dspi_scale, x, factor);

    /// <summary>Modified Bessel function of the first kind, I0, of every sample; 1e100 beyond
    /// 700.</summary>
    /// <param name="x">The arguments, real, replaced by the values.</param>
    /// <returns>0, or -1 for a complex signal.</returns>
    public static int dspi_besi0(DspInput x) => Call(NativeMethods.dspi_besi0, x);

    /// <summary>Bessel function of the first kind J0 of every sample.</summary>
    /// <param name="x">The arguments, real, replaced by the values.</param>
    /// <returns>0, or -1 for a complex signal.</returns>
    public static int dspi_besj0(DspInput x) => Call(NativeMethods.dspi_besj0, x);

    /// <summary>Bessel function of the first kind J1 of every sample.</summary>
    /// <param name="x">The arguments, real, replaced by the values.</param>
    /// <returns>0, or -1 for a complex signal.</returns>
    public static int dspi_besj1(DspInput x) => Call(NativeMethods.dspi_besj1, x);

    /// <summary>Bessel function of the second kind Y0 of every sample; 0 where it is not above
    /// 0.</summary>
    /// <param name="x">The arguments, real, replaced by the values.</param>
    /// <returns>0, or -1 for a complex signal.</returns>
    public static int dspi_besy0(DspInput x) => Call(NativeMethods.dspi_besy0, x);

    /// <summary>Bessel function of the second kind Y1 of every sample; 0 where it is not above
    /// 0.</summary>
    /// <param name="x">The arguments, real, replaced by the values.</param>
    /// <returns>0, or -1 for a complex signal.</returns>
    public static int dspi_besy1(DspInput x) => Call(NativeMethods.dspi_besy1, x);

    /// <summary>Filters a block of samples: each output is the sum over k of taps[k] times the
    /// input k samples before.</summary>
    /// <param name="input">The block.</param>
    /// <param name="output">As many samples, complex if input or taps are.</param>
    /// <param name="taps">The taps.</param>
    /// <param name="state">The end of the block before, empty at first, kept from call to call so
    /// that a stream can be filtered block by block; or null, and what lies before the block counts
    /// as zeros.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dspd_fir(DspInput input, DspInput output, DspInput taps, DspInput? state)
    {
        int result = NativeMethods.dspd_fir(input.GetDspPtr(), output.GetDspPtr(), taps.GetDspPtr(),
            state == null ? null : state.GetDspPtr());
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(taps);
        GC.KeepAlive(state);
        return result;
    }

    /// <summary>Arithmetic mean.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">One sample, complex for a complex signal.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dsps_mean(DspInput input, DspInput output) =>
        Call(NativeMethods.dsps_mean, input, output);

    /// <summary>Median: the middle sample in order, or the mean of the two middle ones.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">One sample, complex for a complex signal.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dsps_median(DspInput input, DspInput output) =>
        Call(NativeMethods.dsps_median, input, output);

    /// <summary>Root mean square.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">One real sample.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dsps_rms(DspInput input, DspInput output) =>
        Call(NativeMethods.dsps_rms, input, output);

    /// <summary>Standard deviation estimated from a sample, over N - 1.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">One real sample.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dsps_samp_stddev(DspInput input, DspInput output) =>
        Call(NativeMethods.dsps_samp_stddev, input, output);

    /// <summary>Variance estimated from a sample, over N - 1.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">One real sample.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dsps_samp_var(DspInput input, DspInput output) =>
        Call(NativeMethods.dsps_samp_var, input, output);

    /// <summary>Smallest sample, of a complex signal the one of smallest magnitude.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">One sample, complex for a complex signal.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dsps_min(DspInput input, DspInput output) =>
        Call(NativeMethods.dsps_min, input, output);

    /// <summary>Largest sample, of a complex signal the one of largest magnitude.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">One sample, complex for a complex signal.</param>
    /// <returns>0, or -1 when memory runs out.</returns>
    public static int dsps_max(DspInput input, DspInput output) =>
        Call(NativeMethods.dsps_max, input, output);

    /// <summary>Fits a sine by least squares.</summary>
    /// <param name="input">The signal, real, 4 samples or more (3 with
    /// <see cref="DspSine.Fixed"/>).</param>
    /// <param name="output">Nine samples: frequency, amplitude, phase at the first sample in radians,
    /// offset, the rms value of what the sine leaves, and the standard errors of the first
    /// four.</param>
    /// <param name="frequency">Where the frequency is looked for, or what it is; 0 for the strongest
    /// tone.</param>
    /// <param name="flags">A <see cref="DspSine"/>.</param>
    /// <returns>0; -1 for a complex or too short a signal, or when memory runs out.</returns>
    public static int dsps_sine_fit(DspInput input, DspInput output, double frequency, int flags)
    {
        int result = NativeMethods.dsps_sine_fit(input.GetDspPtr(), output.GetDspPtr(), frequency, flags);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        return result;
    }

    /// <summary>Finds peaks by height, steepness, distance, prominence and width; NaN asks for
    /// nothing.</summary>
    /// <param name="input">The signal, real.</param>
    /// <param name="output">Ten samples for each peak: index, height, prominence, left and right base,
    /// width, its left and right end, the place between samples and the height there.</param>
    /// <param name="height">How high at least.</param>
    /// <param name="threshold">How far above both neighbours.</param>
    /// <param name="distance">How many samples from higher peaks.</param>
    /// <param name="prominence">How far above the higher base.</param>
    /// <param name="width">How many samples wide.</param>
    /// <param name="relHeight">Where widths are measured, in shares of the prominence; 0.5 is
    /// usual.</param>
    /// <returns>0; -1 for a complex signal, or when memory runs out.</returns>
    public static int dsps_peaks(DspInput input, DspInput output, double height, double threshold,
        double distance, double prominence, double width, double relHeight)
    {
        int result = NativeMethods.dsps_peaks(input.GetDspPtr(), output.GetDspPtr(), height, threshold,
            distance, prominence, width, relHeight);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        return result;
    }

    /// <summary>Measures harmonics and noise of a tone.</summary>
    /// <param name="input">The signal, real.</param>
    /// <param name="output">Fourteen samples: frequency, amplitude, phase in radians, offset, THD, THD+N,
    /// SINAD, SNR and SFDR in decibels, ENOB, rms noise, noise per root of the frequency, and frequency
    /// and amplitude of the strongest other component.</param>
    /// <param name="harmonics">The offset and the harmonics as complex samples, amplitude and phase, the
    /// tone's frequency apart; or null.</param>
    /// <param name="frequency">Where the tone is looked for; 0 for the strongest one.</param>
    /// <param name="count">How many harmonics, the tone among them.</param>
    /// <param name="window">A <see cref="DspWindow"/>.</param>
    /// <returns>0; -1 for a complex signal, for one with too few periods, for a window that does not
    /// exist, or when memory runs out.</returns>
    public static int dsph_distortion(DspInput input, DspInput output, DspInput? harmonics,
        double frequency, int count, int window)
    {
        int result = NativeMethods.dsph_distortion(input.GetDspPtr(), output.GetDspPtr(),
            harmonics == null ? null : harmonics.GetDspPtr(), frequency, count, window);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(harmonics);
        return result;
    }

    /// <summary>Adds what two signals have in common, segment by segment, to a state.</summary>
    /// <param name="input">What went in, real.</param>
    /// <param name="output">What came out, as many real samples.</param>
    /// <param name="state">The sums: empty for a fresh stream, then passed from block to
    /// block.</param>
    /// <param name="length">Samples of a segment, 2 or more.</param>
    /// <param name="step">From a segment to the next, 1 or more.</param>
    /// <param name="window">A <see cref="DspWindow"/>.</param>
    /// <param name="flags">1 takes the mean out of each segment, 0 does not.</param>
    /// <returns>0; -1 for complex signals, different lengths, a state that was begun with other numbers,
    /// a window that does not exist, or when memory runs out.</returns>
    public static int dsph_cross(DspInput input, DspInput output, DspInput state, int length, int step,
        int window, int flags)
    {
        int result = NativeMethods.dsph_cross(input.GetDspPtr(), output.GetDspPtr(), state.GetDspPtr(),
            length, step, window, flags);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(state);
        return result;
    }

    /// <summary>Tells the response, the coherence or the delay from a state of
    /// <see cref="dsph_cross"/>.</summary>
    /// <param name="state">The state, with a segment or more.</param>
    /// <param name="output">A sample for each frequency, or the delay.</param>
    /// <param name="kind">A <see cref="DspResponse"/>.</param>
    /// <returns>0; -1 for another state or kind, or when memory runs out.</returns>
    public static int dsph_response(DspInput state, DspInput output, int kind)
    {
        int result = NativeMethods.dsph_response(state.GetDspPtr(), output.GetDspPtr(), kind);
        GC.KeepAlive(state);
        GC.KeepAlive(output);
        return result;
    }

    /// <summary>Smooths by the polynomials that fit the samples around each best (Savitzky and Golay), or
    /// takes their derivatives.</summary>
    /// <param name="input">The signal or its next block.</param>
    /// <param name="output">The samples that are known by now; all of a whole signal.</param>
    /// <param name="window">Samples that a polynomial is fitted to, an odd number.</param>
    /// <param name="order">Of the polynomials, below the window.</param>
    /// <param name="derivative">0 for the values, 1 for slopes and so on, in the unit of
    /// <see cref="DspInput.Delta"/>.</param>
    /// <param name="state">A stream, empty at first, or null for a whole signal.</param>
    /// <param name="last">Anything but 0 ends the stream.</param>
    /// <returns>0; -1 for an even window, an order that it does not suffice for, or a signal shorter than
    /// it, or when memory runs out.</returns>
    public static int dspd_savgol(DspInput input, DspInput output, int window, int order, int derivative,
        DspInput? state, int last)
    {
        int result = NativeMethods.dspd_savgol(input.GetDspPtr(), output.GetDspPtr(), window, order,
            derivative, state == null ? null : state.GetDspPtr(), last);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(state);
        return result;
    }

    /// <summary>Takes the median of the samples around each.</summary>
    /// <param name="input">The signal or its next block, real.</param>
    /// <param name="output">The medians that are known by now; all of a whole signal.</param>
    /// <param name="window">How many samples.</param>
    /// <param name="ends">A <see cref="DspEnds"/>.</param>
    /// <param name="state">A stream, empty at first, or null for a whole signal.</param>
    /// <param name="last">Anything but 0 ends the stream.</param>
    /// <returns>0; -1 for a complex signal or one shorter than the window, or when memory runs
    /// out.</returns>
    public static int dspd_median(DspInput input, DspInput output, int window, int ends, DspInput? state,
        int last)
    {
        int result = NativeMethods.dspd_median(input.GetDspPtr(), output.GetDspPtr(), window, ends,
            state == null ? null : state.GetDspPtr(), last);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(state);
        return result;
    }

    /// <summary>Replaces outliers, and what is no number, by the median of the samples around
    /// them.</summary>
    /// <param name="input">The signal or its next block, real.</param>
    /// <param name="output">The samples that are known by now; all of a whole signal.</param>
    /// <param name="outliers">Where in the output they were, or null.</param>
    /// <param name="window">How many samples.</param>
    /// <param name="threshold">How many standard deviations, 1.4826 median deviations, a sample may be off
    /// the median; 3 is usual.</param>
    /// <param name="ends">A <see cref="DspEnds"/>.</param>
    /// <param name="state">A stream, empty at first, or null for a whole signal.</param>
    /// <param name="last">Anything but 0 ends the stream.</param>
    /// <returns>0; -1 for a complex signal or one shorter than the window, or when memory runs
    /// out.</returns>
    public static int dspd_hampel(DspInput input, DspInput output, DspInput? outliers, int window,
        double threshold, int ends, DspInput? state, int last)
    {
        int result = NativeMethods.dspd_hampel(input.GetDspPtr(), output.GetDspPtr(),
            outliers == null ? null : outliers.GetDspPtr(), window, threshold, ends,
            state == null ? null : state.GetDspPtr(), last);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(outliers);
        GC.KeepAlive(state);
        return result;
    }

    /// <summary>Spectra of short frames, one behind the other.</summary>
    /// <param name="input">The signal or its next block.</param>
    /// <param name="output">Complex rows, size / 2 + 1 bins each, or size bins of a complex signal.</param>
    /// <param name="window">A <see cref="DspWindow"/>.</param>
    /// <param name="size">Samples of a frame.</param>
    /// <param name="hop">Samples from frame to frame.</param>
    /// <param name="flags">A <see cref="DspSpectrum"/>.</param>
    /// <param name="state">A stream, empty at first, or null for a whole signal.</param>
    /// <param name="last">Anything but 0 ends the stream.</param>
    /// <returns>0; -1 for a hop beyond the size or a window that does not exist, or when memory runs
    /// out.</returns>
    public static int dsph_stft(DspInput input, DspInput output, int window, int size, int hop, int flags,
        DspInput? state, int last)
    {
        int result = NativeMethods.dsph_stft(input.GetDspPtr(), output.GetDspPtr(), window, size, hop,
            flags, state == null ? null : state.GetDspPtr(), last);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(state);
        return result;
    }

    /// <summary>The signal whose frames have the spectra of <see cref="dsph_stft"/>, or come nearest to
    /// them.</summary>
    /// <param name="input">Whole rows of bins, all or the next ones.</param>
    /// <param name="output">The samples that are known by now; of all rows, up to the centre of the last
    /// frame.</param>
    /// <param name="window">That of the rows.</param>
    /// <param name="size">That of the rows.</param>
    /// <param name="hop">That of the rows.</param>
    /// <param name="flags">Those of the rows; <see cref="DspSpectrum.TwoSided"/> gives a complex
    /// signal.</param>
    /// <param name="state">A stream, empty at first, or null for all rows.</param>
    /// <param name="last">Anything but 0 ends the stream.</param>
    /// <returns>0; -1 where windows that far apart lose samples, for rows that are not whole, or when
    /// memory runs out.</returns>
    public static int dsph_istft(DspInput input, DspInput output, int window, int size, int hop, int flags,
        DspInput? state, int last)
    {
        int result = NativeMethods.dsph_istft(input.GetDspPtr(), output.GetDspPtr(), window, size, hop,
            flags, state == null ? null : state.GetDspPtr(), last);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(state);
        return result;
    }

    /// <summary>Designs a recursive filter as second-order sections.</summary>
    /// <param name="sections">Rows of six samples, b0 b1 b2 a0 a1 a2, a row for each section.</param>
    /// <param name="design">A <see cref="DspIir"/>.</param>
    /// <param name="band">A <see cref="DspIirBand"/>; notch and peak have none.</param>
    /// <param name="order">Of the prototype, half that of a filter for a band.</param>
    /// <param name="f1">The edge or the lower one, in cycles per sample; of notch and peak where they
    /// lie.</param>
    /// <param name="f2">The upper edge of a band; of notch and peak how wide they are.</param>
    /// <param name="ripple">Of the pass band of Chebyshev I and elliptic filters in decibels.</param>
    /// <param name="attenuation">Of the stop band of Chebyshev II and elliptic filters in
    /// decibels.</param>
    /// <returns>0; -1 for what there is no design of, or when memory runs out.</returns>
    public static int dspc_iir(DspInput sections, int design, int band, int order, double f1, double f2,
        double ripple, double attenuation)
    {
        int result = NativeMethods.dspc_iir(sections.GetDspPtr(), design, band, order, f1, f2, ripple,
            attenuation);
        GC.KeepAlive(sections);
        return result;
    }

    /// <summary>Filters a block by sections; the state carries a long signal from block to
    /// block.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">As many samples.</param>
    /// <param name="sections">Rows of six samples.</param>
    /// <param name="state">The history of the stream, empty at its start; or null.</param>
    /// <returns>0; -1 where there are no sections, or when memory runs out.</returns>
    public static int dspd_iir(DspInput input, DspInput output, DspInput sections, DspInput? state)
    {
        int result = NativeMethods.dspd_iir(input.GetDspPtr(), output.GetDspPtr(), sections.GetDspPtr(),
            state == null ? null : state.GetDspPtr());
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(sections);
        GC.KeepAlive(state);
        return result;
    }

    /// <summary>Filters forwards and backwards: without delay, by the square of the gain.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">As many samples.</param>
    /// <param name="sections">Rows of six samples.</param>
    /// <param name="extension">Samples by which the ends are continued; below 0 as many as is
    /// usual.</param>
    /// <returns>0; -1 where there are no sections, for a pole at 1, or when memory runs out.</returns>
    public static int dspd_iir_zero_phase(DspInput input, DspInput output, DspInput sections, int extension)
    {
        int result = NativeMethods.dspd_iir_zero_phase(input.GetDspPtr(), output.GetDspPtr(),
            sections.GetDspPtr(), extension);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(sections);
        return result;
    }

    /// <summary>The gain of sections at any frequencies.</summary>
    /// <param name="output">Complex, as many samples as frequencies.</param>
    /// <param name="sections">Rows of six samples.</param>
    /// <param name="at">Frequencies in cycles per sample.</param>
    /// <returns>0; -1 where there are no sections, or when memory runs out.</returns>
    public static int dspc_iir_response(DspInput output, DspInput sections, DspInput at)
    {
        int result = NativeMethods.dspc_iir_response(output.GetDspPtr(), sections.GetDspPtr(),
            at.GetDspPtr());
        GC.KeepAlive(output);
        GC.KeepAlive(sections);
        GC.KeepAlive(at);
        return result;
    }

    /// <summary>Evaluates the z-transform of a signal on an arc of a circle, over its points.</summary>
    /// <param name="input">The signal, which becomes complex with that many samples.</param>
    /// <param name="points">How many points the arc has.</param>
    /// <param name="start">The first of them, in cycles a sample.</param>
    /// <param name="step">From one to the next, in cycles a sample.</param>
    /// <param name="radius">Of the circle; 1 for frequencies.</param>
    /// <returns>0; -1 for an empty signal, an arc that does not exist, or when memory runs out.</returns>
    public static int dspi_czt(DspInput input, int points, double start, double step, double radius)
    {
        int result = NativeMethods.dspi_czt(input.GetDspPtr(), points, start, step, radius);
        GC.KeepAlive(input);
        return result;
    }

    /// <summary>Measures the amplitude spectrum between two frequencies, as closely as wanted.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">The complex bins.</param>
    /// <param name="points">How many bins.</param>
    /// <param name="first">The frequency of the first bin.</param>
    /// <param name="last">The frequency of the last bin.</param>
    /// <param name="window">A <see cref="DspWindow"/>.</param>
    /// <param name="flags">0 shows amplitudes; 2 half of them, as a two-sided spectrum does; 4 sums.</param>
    /// <returns>0; -1 for an empty signal, frequencies or a window that do not exist, or when memory runs
    /// out.</returns>
    public static int dsph_zoom(DspInput input, DspInput output, int points, double first, double last,
        int window, int flags)
    {
        int result = NativeMethods.dsph_zoom(input.GetDspPtr(), output.GetDspPtr(), points, first, last,
            window, flags);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        return result;
    }

    /// <summary>Measures single frequencies of a stream, block by block.</summary>
    /// <param name="input">The next samples.</param>
    /// <param name="frequencies">The frequencies, real.</param>
    /// <param name="output">A complex sample for each of them, over all samples so far.</param>
    /// <param name="state">Empty for a fresh stream, then passed from block to block.</param>
    /// <param name="flags">0 shows amplitudes; 2 half of them, as a two-sided spectrum does; 4 sums.</param>
    /// <returns>0; -1 for frequencies that do not exist, a state that was begun with others, or when
    /// memory runs out.</returns>
    public static int dsph_goertzel(DspInput input, DspInput frequencies, DspInput output, DspInput state,
        int flags)
    {
        int result = NativeMethods.dsph_goertzel(input.GetDspPtr(), frequencies.GetDspPtr(),
            output.GetDspPtr(), state.GetDspPtr(), flags);
        GC.KeepAlive(input);
        GC.KeepAlive(frequencies);
        GC.KeepAlive(output);
        GC.KeepAlive(state);
        return result;
    }

    /// <summary>Reads a signal at equal angles of a shaft, told by the pulses of its tachometer.</summary>
    /// <param name="input">The signal.</param>
    /// <param name="output">The samples over the angle, the reciprocal of their number in a revolution
    /// apart.</param>
    /// <param name="pulses">The places of the pulses in samples, ascending, 5 or more.</param>
    /// <param name="perRevolution">Pulses in a revolution.</param>
    /// <param name="angles">Samples in a revolution; below 1 enough for the longest one.</param>
    /// <returns>0; -1 for pulses that are fewer or do not ascend, too many samples, or when memory runs
    /// out.</returns>
    public static int dsph_rsmp_angle(DspInput input, DspInput output, DspInput pulses,
        double perRevolution, int angles)
    {
        int result = NativeMethods.dsph_rsmp_angle(input.GetDspPtr(), output.GetDspPtr(),
            pulses.GetDspPtr(), perRevolution, angles);
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(pulses);
        return result;
    }

    /// <summary>Designs the taps of a filter that integrates without drift.</summary>
    /// <param name="taps">The taps; to be multiplied by the spacing of the samples for each
    /// integral.</param>
    /// <param name="times">1 or 2 integrals.</param>
    /// <param name="low">From where on it integrates, in cycles a sample.</param>
    /// <returns>0; -1 for other integrals or edges, or when memory runs out.</returns>
    public static int dspc_integrator(DspInput taps, int times, double low)
    {
        int result = NativeMethods.dspc_integrator(taps.GetDspPtr(), times, low);
        GC.KeepAlive(taps);
        return result;
    }

    /// <summary>Makes the second-order sections of a frequency weighting.</summary>
    /// <param name="sections">Six samples for each section.</param>
    /// <param name="weighting">A <see cref="DspWeighting"/>.</param>
    /// <param name="rate">Samples a second, above 2000.</param>
    /// <returns>0; -1 for another weighting or rate, or when memory runs out.</returns>
    public static int dspc_weighting(DspInput sections, int weighting, double rate)
    {
        int result = NativeMethods.dspc_weighting(sections.GetDspPtr(), weighting, rate);
        GC.KeepAlive(sections);
        return result;
    }

    /// <summary>Makes the second-order sections of a band of a fraction of an octave.</summary>
    /// <param name="sections">Six samples for each section.</param>
    /// <param name="centre">Of the band, in hertz.</param>
    /// <param name="fraction">Bands in an octave.</param>
    /// <param name="rate">Samples a second.</param>
    /// <returns>0; -1 for a band that does not end below half the rate, or when memory runs
    /// out.</returns>
    public static int dspc_octave(DspInput sections, double centre, int fraction, double rate)
    {
        int result = NativeMethods.dspc_octave(sections.GetDspPtr(), centre, fraction, rate);
        GC.KeepAlive(sections);
        return result;
    }

    /// <summary>Lists the centres of the bands of a fraction of an octave.</summary>
    /// <param name="centres">The centres in hertz.</param>
    /// <param name="fraction">Bands in an octave.</param>
    /// <param name="low">The lowest.</param>
    /// <param name="high">The highest.</param>
    /// <returns>0; -1 for another fraction or limits, or when memory runs out.</returns>
    public static int dspc_octaves(DspInput centres, int fraction, double low, double high)
    {
        int result = NativeMethods.dspc_octaves(centres.GetDspPtr(), fraction, low, high);
        GC.KeepAlive(centres);
        return result;
    }

    /// <summary>Measures the levels of a signal or of its next block, in decibels.</summary>
    /// <param name="input">The signal, real, seconds apart.</param>
    /// <param name="output">Seven samples: levels of the mean square, of the greatest and the least
    /// time-weighted one, of the greatest value, of a second that holds as much, and of the time-weighted one
    /// at the end; and how many seconds there were.</param>
    /// <param name="sections">Those of a weighting or a band; none for the signal as it is.</param>
    /// <param name="timeConstant">In milliseconds: 125 is fast, 1000 slow.</param>
    /// <param name="reference">The value of 0 dB.</param>
    /// <param name="state">Empty for a fresh stream, then passed from block to block; or null.</param>
    /// <returns>0; -1 for a complex signal, sections, a state or numbers that are none, or when memory
    /// runs out.</returns>
    public static int dsph_levels(DspInput input, DspInput output, DspInput sections, double timeConstant,
        double reference, DspInput? state)
    {
        int result = NativeMethods.dsph_levels(input.GetDspPtr(), output.GetDspPtr(), sections.GetDspPtr(),
            timeConstant, reference, state == null ? null : state.GetDspPtr());
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        GC.KeepAlive(sections);
        GC.KeepAlive(state);
        return result;
    }
}
