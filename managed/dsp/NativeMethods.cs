using System;
using System.Runtime.CompilerServices;

namespace Corvane.QuillonInternal.DataAnalysis;

using unsafe OfFourRecords = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, dsp_struct*, dsp_struct*, int>;
using unsafe OfFourRecordsAndInt = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, dsp_struct*, dsp_struct*, int, int>;
using unsafe OfFrames = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, int, int, int, int, dsp_struct*, int, int>;
using unsafe OfHampel = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, dsp_struct*, int, double, int, dsp_struct*, int, int>;
using unsafe OfLevels = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, dsp_struct*, double, double, dsp_struct*, int>;
using unsafe OfMedian = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, int, int, dsp_struct*, int, int>;
using unsafe OfRecord = delegate* unmanaged[Cdecl]<dsp_struct*, int>;
using unsafe OfRecordAndArc = delegate* unmanaged[Cdecl]<dsp_struct*, int, double, double, double, int>;
using unsafe OfRecordAndBand = delegate* unmanaged[Cdecl]<dsp_struct*, double, int, double, int>;
using unsafe OfRecordAndDesign = delegate* unmanaged[Cdecl]<dsp_struct*, int, int, int, double, double, double, double, int>;
using unsafe OfRecordAndDouble = delegate* unmanaged[Cdecl]<dsp_struct*, double, int>;
using unsafe OfRecordAndInt = delegate* unmanaged[Cdecl]<dsp_struct*, int, int>;
using unsafe OfRecordAndKind = delegate* unmanaged[Cdecl]<dsp_struct*, int, double, int>;
using unsafe OfRecordAndLimits = delegate* unmanaged[Cdecl]<dsp_struct*, int, double, double, int>;
using unsafe OfRecordAndWindow = delegate* unmanaged[Cdecl]<dsp_struct*, int, int, double, int>;
using unsafe OfSavgol = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, int, int, int, dsp_struct*, int, int>;
using unsafe OfThreeRecords = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, dsp_struct*, double, int, int, int>;
using unsafe OfThreeRecordsAlone = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, dsp_struct*, int>;
using unsafe OfThreeRecordsAndAngles = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, dsp_struct*, double, int, int>;
using unsafe OfThreeRecordsAndInt = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, dsp_struct*, int, int>;
using unsafe OfThreeRecordsAndSegments = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, dsp_struct*, int, int, int, int, int>;
using unsafe OfTwoRecords = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, int>;
using unsafe OfTwoRecordsAndInt = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, int, int>;
using unsafe OfTwoRecordsAndPeaks = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, double, double, double, double, double, double, int>;
using unsafe OfTwoRecordsAndRange = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, int, double, double, int, int, int>;
using unsafe OfTwoRecordsAndSine = delegate* unmanaged[Cdecl]<dsp_struct*, dsp_struct*, double, int, int>;

/// <summary>
/// The native functions, as plain pointers: their arguments are what the processor takes, so that a call
/// costs no more than the runtime's change to native code and back.
/// </summary>
/// <remarks>Null until a library is loaded, which happens before the first record exists.</remarks>
internal static unsafe class NativeMethods
{
    internal static OfRecord dsp_destroy, dspi_swap_halves, dspi_rev, dspi_conj, dspi_rfft, dspi_irfft,
        dspi_rdft, dspi_besi0, dspi_besj0, dspi_besj1, dspi_besy0, dspi_besy1;
    internal static OfRecordAndInt dspi_zpad, dspi_fft, dspi_dft, dspi_irdft;
    internal static OfRecordAndDouble dspi_scale;
    internal static OfRecordAndWindow dspi_window2;
    internal static OfTwoRecords dsps_mean, dsps_median, dsps_rms, dsps_samp_stddev, dsps_samp_var,
        dsps_min, dsps_max;
    internal static OfTwoRecordsAndSine dsps_sine_fit;
    internal static OfTwoRecordsAndPeaks dsps_peaks;
    internal static OfThreeRecords dsph_distortion;
    internal static OfThreeRecordsAndSegments dsph_cross;
    internal static OfTwoRecordsAndInt dsph_response;
    internal static OfThreeRecordsAndAngles dsph_rsmp_angle;
    internal static OfRecordAndKind dspc_weighting, dspc_integrator;
    internal static OfRecordAndBand dspc_octave;
    internal static OfRecordAndLimits dspc_octaves;
    internal static OfLevels dsph_levels;
    internal static OfSavgol dspd_savgol;
    internal static OfMedian dspd_median;
    internal static OfHampel dspd_hampel;
    internal static OfFrames dsph_stft, dsph_istft;
    internal static OfFourRecords dspd_fir, dspd_iir;
    internal static OfRecordAndDesign dspc_iir;
    internal static OfThreeRecordsAlone dspc_iir_response;
    internal static OfThreeRecordsAndInt dspd_iir_zero_phase;
    internal static OfRecordAndArc dspi_czt;
    internal static OfTwoRecordsAndRange dsph_zoom;
    internal static OfFourRecordsAndInt dsph_goertzel;

    /// <exception cref="EntryPointNotFoundException">The library lacks a function.</exception>
    internal static void Resolve(IntPtr library)
    {
        dsp_destroy = (OfRecord)Find(nameof(dsp_destroy));
        dspi_window2 = (OfRecordAndWindow)Find(nameof(dspi_window2));
        dspi_swap_halves = (OfRecord)Find(nameof(dspi_swap_halves));
        dspi_zpad = (OfRecordAndInt)Find(nameof(dspi_zpad));
        dspi_rev = (OfRecord)Find(nameof(dspi_rev));
        dspi_conj = (OfRecord)Find(nameof(dspi_conj));
        dspi_fft = (OfRecordAndInt)Find(nameof(dspi_fft));
        dspi_rfft = (OfRecord)Find(nameof(dspi_rfft));
        dspi_irfft = (OfRecord)Find(nameof(dspi_irfft));
        dspi_dft = (OfRecordAndInt)Find(nameof(dspi_dft));
        dspi_rdft = (OfRecord)Find(nameof(dspi_rdft));
        dspi_irdft = (OfRecordAndInt)Find(nameof(dspi_irdft));
        dspi_scale = (OfRecordAndDouble)Find(nameof(dspi_scale));
        dspi_besi0 = (OfRecord)Find(nameof(dspi_besi0));
        dspi_besj0 = (OfRecord)Find(nameof(dspi_besj0));
        dspi_besj1 = (OfRecord)Find(nameof(dspi_besj1));
        dspi_besy0 = (OfRecord)Find(nameof(dspi_besy0));
        dspi_besy1 = (OfRecord)Find(nameof(dspi_besy1));
        dspd_fir = (OfFourRecords)Find(nameof(dspd_fir));
        dspd_savgol = (OfSavgol)Find(nameof(dspd_savgol));
        dspd_median = (OfMedian)Find(nameof(dspd_median));
        dspd_hampel = (OfHampel)Find(nameof(dspd_hampel));
        dsph_stft = (OfFrames)Find(nameof(dsph_stft));
        dsph_istft = (OfFrames)Find(nameof(dsph_istft));
        dspd_iir = (OfFourRecords)Find(nameof(dspd_iir));
        dspc_iir = (OfRecordAndDesign)Find(nameof(dspc_iir));
        dspc_iir_response = (OfThreeRecordsAlone)Find(nameof(dspc_iir_response));
        dspd_iir_zero_phase = (OfThreeRecordsAndInt)Find(nameof(dspd_iir_zero_phase));
        dsps_mean = (OfTwoRecords)Find(nameof(dsps_mean));
        dsps_median = (OfTwoRecords)Find(nameof(dsps_median));
        dsps_rms = (OfTwoRecords)Find(nameof(dsps_rms));
        dsps_samp_stddev = (OfTwoRecords)Find(nameof(dsps_samp_stddev));
        dsps_samp_var = (OfTwoRecords)Find(nameof(dsps_samp_var));
        dsps_min = (OfTwoRecords)Find(nameof(dsps_min));
        dsps_max = (OfTwoRecords)Find(nameof(dsps_max));
        dsps_sine_fit = (OfTwoRecordsAndSine)Find(nameof(dsps_sine_fit));
        dsps_peaks = (OfTwoRecordsAndPeaks)Find(nameof(dsps_peaks));
        dsph_distortion = (OfThreeRecords)Find(nameof(dsph_distortion));
        dsph_cross = (OfThreeRecordsAndSegments)Find(nameof(dsph_cross));
        dsph_response = (OfTwoRecordsAndInt)Find(nameof(dsph_response));
        dspi_czt = (OfRecordAndArc)Find(nameof(dspi_czt));
        dsph_zoom = (OfTwoRecordsAndRange)Find(nameof(dsph_zoom));
        dsph_goertzel = (OfFourRecordsAndInt)Find(nameof(dsph_goertzel));
        dsph_rsmp_angle = (OfThreeRecordsAndAngles)Find(nameof(dsph_rsmp_angle));
        dspc_integrator = (OfRecordAndKind)Find(nameof(dspc_integrator));
        dspc_weighting = (OfRecordAndKind)Find(nameof(dspc_weighting));
        dspc_octave = (OfRecordAndBand)Find(nameof(dspc_octave));
        dspc_octaves = (OfRecordAndLimits)Find(nameof(dspc_octaves));
        dsph_levels = (OfLevels)Find(nameof(dsph_levels));

        void* Find(string name) => (void*)SharedObject.Find(library, name);
    }

    // The calls by their shape. The owner of a record lives until the native function is back.

    [MethodImpl(MethodImplOptions.AggressiveInlining)]
    internal static int Call(OfRecord function, DspInput x)
    {
        int result = function(x.GetDspPtr());
        GC.KeepAlive(x);
        return result;
    }

    [MethodImpl(MethodImplOptions.AggressiveInlining)]
    internal static int Call(OfRecordAndInt function, DspInput x, int argument)
    {
        int result = function(x.GetDspPtr(), argument);
        GC.KeepAlive(x);
        return result;
    }

    [MethodImpl(MethodImplOptions.AggressiveInlining)]
    internal static int Call(OfRecordAndDouble function, DspInput x, double argument)
    {
        int result = function(x.GetDspPtr(), argument);
        GC.KeepAlive(x);
        return result;
    }

    [MethodImpl(MethodImplOptions.AggressiveInlining)]
    internal static int Call(OfTwoRecords function, DspInput input, DspInput output)
    {
        int result = function(input.GetDspPtr(), output.GetDspPtr());
        GC.KeepAlive(input);
        GC.KeepAlive(output);
        return result;
    }
}
