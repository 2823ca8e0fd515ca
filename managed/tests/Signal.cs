using System;
using Xunit;

// The library has one set of hooks, and the counters of the tests are everybody's.
[assembly: CollectionBehavior(DisableTestParallelization = true)]

namespace Corvane.QuillonInternal.DataAnalysis.Tests;

/// <summary>A record with samples that the library allocated, released with it.</summary>
internal sealed unsafe class Signal : DspInput
{
    private Signal(double[] values, int complex)
    {
        Delta = 1.0;
        Complex = complex;
        Assert.Equal(0, DspApi.dspi_zpad(this, values.Length / (1 + complex)));
        values.CopyTo(new Span<double>(Data, values.Length));
    }

    internal static Signal Real(params double[] values) => new(values, 0);

    /// <param name="values">Real and imaginary parts in turn.</param>
    internal static Signal Interleaved(params double[] values) => new(values, 1);

    internal double[] Values => new Span<double>(Data, Points * (1 + Complex)).ToArray();

    internal void ShouldBe(int complex, params double[] expected)
    {
        Assert.Equal(complex, Complex);
        double[] values = Values;
        Assert.Equal(expected.Length, values.Length);
        for (int i = 0; i < expected.Length; ++i) Assert.Equal(expected[i], values[i], 1e-13);
    }

    protected override void Dispose(bool disposing)
    {
        if (disposing) DspApi.dsp_destroy(this);
        base.Dispose(disposing);
    }
}
