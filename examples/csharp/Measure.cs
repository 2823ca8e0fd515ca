// A typical measurement in C#: the amplitude spectrum of a recording, and the strongest components in it.
//
//   Measure FILE [SPACING]    one sample a line, SPACING apart (default 1)
using System;
using System.Collections.Generic;
using System.Globalization;
using System.IO;
using System.Linq;
using Corvane.QuillonInternal.DataAnalysis;

internal static unsafe class Measure
{
    private record struct Peak(double Frequency, double Amplitude);

    private static int Main(string[] arguments)
    {
        try
        {
            if (arguments.Length is not (1 or 2)) throw new FormatException("usage: Measure FILE [SPACING]");
            double spacing = arguments.Length == 2 ? Number(arguments[1]) : 1.0;
            if (!(spacing > 0 && double.IsFinite(spacing))) throw new FormatException("no spacing above 0");
            double[] samples = File.ReadLines(arguments[0]).Select(Number).ToArray();
            if (samples.Length == 0) throw new FormatException("no samples");
            Console.WriteLine($"{samples.Length} samples, {Text(spacing)} apart");
            Console.WriteLine($"{"frequency",12}{"period",12}{"amplitude",12}");
            foreach (Peak peak in Strongest(samples, spacing).Take(3))
            {
                Console.WriteLine(
                    $"{Text(peak.Frequency),12}{Text(1 / peak.Frequency),12}{Text(peak.Amplitude),12}");
            }
            return 0;
        }
        catch (Exception e) when (e is IOException or UnauthorizedAccessException or FormatException
                                      or DllNotFoundException or OutOfMemoryException)
        {
            Console.Error.WriteLine($"Measure: {e.Message}");
            return 1;
        }
    }

    private static double Number(string text) =>
        double.TryParse(text, NumberStyles.Float, CultureInfo.InvariantCulture, out double value) &&
        double.IsFinite(value)
            ? value
            : throw new FormatException($"'{text}' is no number");

    private static string Text(double value) => value.ToString("G5", CultureInfo.InvariantCulture);

    private static IEnumerable<Peak> Strongest(double[] samples, double spacing)
    {
        double[] amplitudes = AmplitudeSpectrum(samples, spacing, out double resolution);
        return Enumerable.Range(1, Math.Max(amplitudes.Length - 2, 0))
            .Where(k => amplitudes[k] > amplitudes[k - 1] && amplitudes[k] >= amplitudes[k + 1])
            .Select(k => Top(amplitudes, k, resolution))
            .OrderByDescending(peak => peak.Amplitude);
    }

    /// <summary>The signal about its mean, through a window, as amplitudes of its bins.</summary>
    private static double[] AmplitudeSpectrum(double[] samples, double spacing, out double resolution)
    {
        double mean = Mean(samples);
        double[] changes = Array.ConvertAll(samples, x => x - mean);
        fixed (double* pinned = changes)
        {
            // The record borrows the array and moves to a block of its own where it needs more room.
            using var signal = new DspInput { Delta = spacing, Data = pinned, Points = changes.Length };
            try
            {
                Check(DspApi.dspi_window2(signal, (int)DspWindow.Gausstop, (int)DspScale.Mean, 0));
                Check(DspApi.dspi_scale(signal, 2)); // half of each component is at its negative frequency
                Check(DspApi.dspi_rdft(signal));
                resolution = signal.Delta;
                return Magnitudes(signal);
            }
            finally
            {
                DspApi.dsp_destroy(signal);
            }
        }
    }

    private static double Mean(double[] samples)
    {
        fixed (double* pinned = samples)
        {
            using var signal = new DspInput { Data = pinned, Points = samples.Length };
            using var mean = new DspInput();
            Check(DspApi.dsps_mean(signal, mean));
            double value = *mean.Data;
            DspApi.dsp_destroy(mean); // the library made room for it
            return value;
        }
    }

    private static double[] Magnitudes(DspInput spectrum)
    {
        var magnitudes = new double[spectrum.Complex != 0 ? spectrum.Points : 0];
        double* bins = spectrum.Data;
        for (int k = 0; k < magnitudes.Length; ++k)
        {
            magnitudes[k] = Math.Sqrt(bins[2 * k] * bins[2 * k] + bins[2 * k + 1] * bins[2 * k + 1]);
        }
        return magnitudes;
    }

    /// <summary>A parabola through the logarithms of three bins meets the top of this window's
    /// lobe.</summary>
    private static Peak Top(double[] amplitudes, int k, double resolution)
    {
        double left = Math.Log(amplitudes[k - 1]), middle = Math.Log(amplitudes[k]),
               right = Math.Log(amplitudes[k + 1]);
        double offset = (left - right) / (left - 2 * middle + right) / 2;
        if (!double.IsFinite(offset)) offset = 0; // beside a bin of nothing at all
        return new Peak((k + offset) * resolution, Math.Exp(middle - (left - right) * offset / 4));
    }

    private static void Check(int status)
    {
        if (status != 0) throw new OutOfMemoryException("the memory does not suffice");
    }
}
