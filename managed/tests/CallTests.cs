using System;
using Xunit;

namespace Corvane.QuillonInternal.DataAnalysis.Tests;

/// <summary>Each call by a result that no other function and no other arguments give.</summary>
public class CallTests
{
    private static readonly double Root = Math.Sqrt(3) / 2; // sin(pi / 3)

    private static void Check(Signal x, Func<DspInput, int> call, int complex, params double[] expected)
    {
        using (x)
        {
            Assert.Equal(0, call(x));
            x.ShouldBe(complex, expected);
        }
    }

    [Fact]
    public void LayoutAndScale()
    {
        Check(Signal.Real(1, 2, 3, 4, 5), DspApi.dspi_swap_halves, 0, 4, 5, 1, 2, 3);
        Check(Signal.Real(1, 2, 3, 4, 5), DspApi.dspi_rev, 0, 5, 4, 3, 2, 1);
        Check(Signal.Real(1, 2), x => DspApi.dspi_zpad(x, 5), 0, 1, 2, 0, 0, 0);
        Check(Signal.Interleaved(1, 2, -3, -4), DspApi.dspi_conj, 1, 1, -2, -3, 4);
        Check(Signal.Interleaved(1, 2, -3, -4), x => DspApi.dspi_scale(x, -0.75), 1, -0.75, -1.5, 2.25, 3);
    }

    /// <summary>Abramowitz and Stegun, tables 9.1 and 9.8.</summary>
    [Fact]
    public void BesselFunctions()
    {
        Check(Signal.Real(0, 1.5), DspApi.dspi_besi0, 0, 1, 1.6467231897728904);
        Check(Signal.Real(0, 1.5), DspApi.dspi_besj0, 0, 1, 0.5118276717359181);
        Check(Signal.Real(0, 1.5), DspApi.dspi_besj1, 0, 0, 0.5579365079100996);
        Check(Signal.Real(0, 1.5), DspApi.dspi_besy0, 0, 0, 0.3824489237977589);
        Check(Signal.Real(0, 1.5), DspApi.dspi_besy1, 0, 0, -0.4123086269739113);
    }

    /// <summary>A pulse at sample 1 of 4, whose bins turn by a quarter, also where a length that is no
    /// power of two tells these transforms from those of any length.</summary>
    [Fact]
    public void TransformsOfPowersOfTwo()
    {
        double[] bins = [0.25, 0, 0, -0.25, -0.25, 0, 0, 0.25];
        Check(Signal.Real(0, 1, 0, 0), x => DspApi.dspi_fft(x, 0), 1, bins);
        Check(Signal.Interleaved(bins), x => DspApi.dspi_fft(x, 1), 1, 0, 0, 1, 0, 0, 0, 0, 0);
        Check(Signal.Real(0, 1, 0, 0), DspApi.dspi_rfft, 1, bins[..6]);
        Check(Signal.Interleaved(bins[..6]), DspApi.dspi_irfft, 0, 0, 1, 0, 0);

        using Signal three = Signal.Real(0, 1, 0), four = Signal.Interleaved(0, 0, 1, 0, 0, 0, 0, 0);
        Assert.Equal(-1, DspApi.dspi_fft(three, 0));
        Assert.Equal(-1, DspApi.dspi_rfft(three));
        three.ShouldBe(0, 0, 1, 0);
        four.Delta = 0.5;
        Assert.Equal(0, DspApi.dspi_fft(four, 0));
        Assert.Equal(0.5, four.Delta); // 1 / (4 * 0.5)
        Assert.Equal(-1, DspApi.dspi_irfft(four)); // of 6 samples
    }

    /// <summary>The same with 3 samples, whose bins turn by a third.</summary>
    [Fact]
    public void TransformsOfAnyLength()
    {
        double[] bins = [1 / 3.0, 0, -1 / 6.0, -Root / 3, -1 / 6.0, Root / 3];
        Check(Signal.Real(0, 1, 0), x => DspApi.dspi_dft(x, 0), 1, bins);
        Check(Signal.Interleaved(bins), x => DspApi.dspi_dft(x, 1), 1, 0, 0, 1, 0, 0, 0);
        Check(Signal.Real(0, 1, 0), DspApi.dspi_rdft, 1, bins[..4]);
        Check(Signal.Interleaved(bins[..4]), x => DspApi.dspi_irdft(x, 1), 0, 0, 1, 0);
        Check(Signal.Interleaved(0.5, 0, -0.5, 0), x => DspApi.dspi_irdft(x, 0), 0, 0, 1);
    }

    /// <summary>A Hann window of 8 samples about sample 4, in three scales and two layouts, and one of 4
    /// samples.</summary>
    [Fact]
    public void Windows()
    {
        const int hann = 2, rms = 1, peak = 2, width = 8, still = 32;
        double a = (1 - Math.Sqrt(0.5)) / 2, b = (1 + Math.Sqrt(0.5)) / 2, power = Math.Sqrt(8 / 3.0);
        double[] window = [0, a, 0.5, b, 1, b, 0.5, a];
        double[] ones = [1, 1, 1, 1, 1, 1, 1, 1];
        Check(Signal.Real(ones), x => DspApi.dspi_window2(x, hann, peak + still, 0), 0, window);
        Check(Signal.Real(ones), x => DspApi.dspi_window2(x, hann, peak, 0), 0,
            [.. window[4..], .. window[..4]]);
        Check(Signal.Real(ones), x => DspApi.dspi_window2(x, hann, rms + still, 0), 0,
            Array.ConvertAll(window, w => w * power));
        Check(Signal.Real(ones), x => DspApi.dspi_window2(x, hann, peak + still + width, 4), 0,
            0, 0, 0, 0.5, 1, 0.5, 0, 0);
        using Signal unknown = Signal.Real(ones);
        Assert.Equal(-1, DspApi.dspi_window2(unknown, 24, 0, 0));
    }

    /// <summary>A block by itself, and two blocks of a stream.</summary>
    [Fact]
    public void Filters()
    {
        using Signal first = Signal.Real(1, 2, 3), second = Signal.Real(4, 5), taps = Signal.Real(1, 10, 100);
        using Signal output = Signal.Real(), state = Signal.Real();
        Assert.Equal(0, DspApi.dspd_fir(first, output, taps, null));
        output.ShouldBe(0, 1, 12, 123);
        Assert.Equal(0, DspApi.dspd_fir(first, output, taps, state));
        Assert.Equal(0, DspApi.dspd_fir(second, output, taps, state));
        output.ShouldBe(0, 234, 345);
        state.ShouldBe(0, 4, 5);
        first.ShouldBe(0, 1, 2, 3);
        taps.ShouldBe(0, 1, 10, 100);
    }

    /// <summary>A signal in which all of them differ, also from those of a population.</summary>
    [Fact]
    public void Statistics()
    {
        static void Check(Func<DspInput, DspInput, int> function, double expected)
        {
            using Signal input = Signal.Real(2, -4, 7, 1, 9), output = Signal.Real(5, 5);
            Assert.Equal(0, function(input, output));
            output.ShouldBe(0, expected);
            input.ShouldBe(0, 2, -4, 7, 1, 9);
        }
        Check(DspApi.dsps_mean, 3);
        Check(DspApi.dsps_median, 2);
        Check(DspApi.dsps_rms, Math.Sqrt(30.2));
        Check(DspApi.dsps_samp_stddev, Math.Sqrt(26.5));
        Check(DspApi.dsps_samp_var, 26.5);
        Check(DspApi.dsps_min, -4);
        Check(DspApi.dsps_max, 9);
    }
}
