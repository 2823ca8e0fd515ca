using System;

namespace Corvane.QuillonInternal.DataAnalysis;

/// <summary>The windows of <see cref="DspApi.dspi_window2"/>; its parameter takes their
/// numbers.</summary>
public enum DspWindow
{
    /// <summary>No window; also Rectangular.</summary>
    Uniform = 0,
    /// <summary>Triangle.</summary>
    Bartlett = 1,
    /// <summary>Two cosine terms, sidelobes -31 dB.</summary>
    Hann = 2,
    /// <summary>Two cosine terms, sidelobes -43 dB.</summary>
    Hamming = 3,
    /// <summary>Three cosine terms, sidelobes -58 dB.</summary>
    Blackman = 4,
    /// <summary>Three cosine terms, sidelobes -71 dB.</summary>
    BlackmanHarris3 = 5,
    /// <summary>Four cosine terms, sidelobes -93 dB.</summary>
    BlackmanHarris4 = 6,
    /// <summary>Five cosine terms, sidelobes -125 dB.</summary>
    Gausstop = 7,
    /// <summary>Flat top of four cosine terms.</summary>
    Flat4 = 8,
    /// <summary>Flat top of five cosine terms.</summary>
    Flattop = 9,
    /// <summary>Flat top of six cosine terms.</summary>
    Flat6 = 10,
    /// <summary>Flat top of seven cosine terms.</summary>
    Flat7 = 11,
    /// <summary>Flat top of six cosine terms, sidelobes -121 dB.</summary>
    P501 = 12,
    /// <summary>Flat top of seven cosine terms, sidelobes -147 dB.</summary>
    P601 = 13,
    /// <summary>Kaiser's with sidelobes of -70 dB.</summary>
    Kaiser70 = 14,
    /// <summary>Kaiser's with sidelobes of -80 dB.</summary>
    Kaiser80 = 15,
    /// <summary>Kaiser's with sidelobes of -90 dB.</summary>
    Kaiser90 = 16,
    /// <summary>Kaiser's with sidelobes of -100 dB.</summary>
    Kaiser100 = 17,
    /// <summary>Kaiser's with sidelobes of -110 dB.</summary>
    Kaiser110 = 18,
    /// <summary>Kaiser's with sidelobes of -120 dB.</summary>
    Kaiser120 = 19,
    /// <summary>Gaussian with sidelobes of -60 dB.</summary>
    Gauss60 = 20,
    /// <summary>Gaussian with sidelobes of -70 dB.</summary>
    Gauss70 = 21,
    /// <summary>Gaussian with sidelobes of -80 dB.</summary>
    Gauss80 = 22,
    /// <summary>The main lobe of sin(x) / x.</summary>
    Riemann = 23,
}

/// <summary>What the scale type of <see cref="DspApi.dspi_window2"/> is put together from: one of the
/// first three and any of the others.</summary>
[Flags]
public enum DspScale
{
    /// <summary>The window's mean is 1: a sine keeps its amplitude.</summary>
    Mean = 0,
    /// <summary>The window's mean square is 1: noise keeps its power.</summary>
    Rms = 1,
    /// <summary>The centre of the window is 1.</summary>
    Peak = 2,
    /// <summary>Equal samples at both ends; Kaiser, Gauss and Riemann only.</summary>
    Symmetric = 4,
    /// <summary>The window's length holds; sums of cosines and the uniform window only.</summary>
    Width = 8,
    /// <summary>Rotate under the uniform window too.</summary>
    RotateUniform = 16,
    /// <summary>Do not rotate under any other window.</summary>
    NoRotation = 32,
}

/// <summary>Directions of <see cref="DspApi.dspi_fft"/> and <see cref="DspApi.dspi_dft"/>.</summary>
public enum DspDirection
{
    /// <summary>From samples to bins.</summary>
    Forward = 0,
    /// <summary>From bins to samples.</summary>
    Inverse = 1,
}

/// <summary>What <see cref="DspApi.dsps_sine_fit"/> fits.</summary>
public enum DspSine
{
    /// <summary>Four parameters: the frequency that fits best.</summary>
    Free = 0,
    /// <summary>Three parameters: the frequency as it is given.</summary>
    Fixed = 1,
}

/// <summary>What <see cref="DspApi.dsph_response"/> tells.</summary>
public enum DspResponse
{
    /// <summary>Cross-spectrum over that of the input.</summary>
    H1 = 0,
    /// <summary>Spectrum of the output over the conjugate cross-spectrum.</summary>
    H2 = 1,
    /// <summary>How much of the output the input explains, 0 to 1.</summary>
    Coherence = 2,
    /// <summary>Cross-spectral density.</summary>
    Cross = 3,
    /// <summary>Power density of the input.</summary>
    Input = 4,
    /// <summary>Power density of the output.</summary>
    Output = 5,
    /// <summary>The phase in radians, without jumps.</summary>
    Phase = 6,
    /// <summary>By how much the output comes later.</summary>
    Delay = 7,
}

/// <summary>What windows of <see cref="DspApi.dspd_median"/> and <see cref="DspApi.dspd_hampel"/> find
/// beyond the ends of a signal.</summary>
public enum DspEnds
{
    /// <summary>Nothing: they hold fewer samples there.</summary>
    Shorter = 0,
    /// <summary>The sample at the end over and over.</summary>
    Hold = 1,
    /// <summary>The signal backwards, its last sample first.</summary>
    Mirror = 2,
    /// <summary>Zeros.</summary>
    Zero = 3,
}

/// <summary>Flags of <see cref="DspApi.dsph_stft"/> and <see cref="DspApi.dsph_istft"/>.</summary>
[Flags]
public enum DspSpectrum
{
    /// <summary>Half of the bins, as real signals need.</summary>
    OneSided = 0,
    /// <summary>All bins, the frequency 0 in the middle.</summary>
    TwoSided = 2,
}

/// <summary>What <see cref="DspApi.dspc_iir"/> designs.</summary>
public enum DspIir
{
    /// <summary>Flattest where it passes; 3 dB down at its edges.</summary>
    Butterworth = 0,
    /// <summary>Ripples where it passes.</summary>
    Chebyshev1 = 1,
    /// <summary>Ripples where it stops.</summary>
    Chebyshev2 = 2,
    /// <summary>Ripples everywhere: the steepest of its order.</summary>
    Elliptic = 3,
    /// <summary>Flattest delay; 3 dB down at its edges.</summary>
    Bessel = 4,
    /// <summary>The same with the asymptote of Butterworth's filter.</summary>
    BesselPhase = 5,
    /// <summary>The same with the edges of a prototype that delays by 1.</summary>
    BesselDelay = 6,
    /// <summary>Stops a single frequency.</summary>
    Notch = 7,
    /// <summary>Passes a single frequency.</summary>
    Peak = 8,
}

/// <summary>The bands of <see cref="DspApi.dspc_iir"/>.</summary>
public enum DspIirBand
{
    /// <summary>Passes what is between two edges.</summary>
    BandPass = 0,
    /// <summary>Stops what is between two edges.</summary>
    BandStop = 1,
    /// <summary>Passes what is above the edge.</summary>
    HighPass = 2,
    /// <summary>Passes what is below the edge.</summary>
    LowPass = 3,
}

/// <summary>The weightings of <see cref="DspApi.dspc_weighting"/>.</summary>
public enum DspWeighting
{
    /// <summary>None.</summary>
    Z = 0,
    /// <summary>As the ear hears soft sounds.</summary>
    A = 1,
    /// <summary>As it hears loud ones.</summary>
    C = 2,
}
