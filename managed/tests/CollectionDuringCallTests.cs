using System;
using System.Runtime.CompilerServices;
using System.Runtime.InteropServices;
using Xunit;

namespace Corvane.QuillonInternal.DataAnalysis.Tests;

/// <summary>A record whose last use is a call must not be finalised while the call runs. The library's
/// allocation hooks give a look from within the call.</summary>
public unsafe partial class CollectionDuringCallTests
{
    private static readonly double[] Samples = GC.AllocateArray<double>(4, pinned: true);
    private static int hookCalls, finalised, finalisedDuringCall;

    private sealed class Forgotten : DspInput
    {
        internal Forgotten()
        {
            Data = (double*)Marshal.UnsafeAddrOfPinnedArrayElement(Samples, 0);
            Points = Samples.Length;
        }

        protected override void Dispose(bool disposing)
        {
            ++finalised;
            base.Dispose(disposing);
        }
    }

    [LibraryImport("libwavkit.so.2")]
    private static partial int dsp_lib_alloc(delegate* unmanaged[Cdecl]<void**, void> hook, void* previous);

    [LibraryImport("libwavkit.so.2")]
    private static partial int dsp_lib_realloc(delegate* unmanaged[Cdecl]<void**, void> hook, void* previous);

    /// <summary>Serves as either hook: what the second one is given besides the record, it
    /// ignores.</summary>
    [UnmanagedCallersOnly(CallConvs = [typeof(CallConvCdecl)])]
    private static void Grow(void** record)
    {
        ++hookCalls;
        LifeCycleTests.Collect();
        finalisedDuringCall = finalised;
        bool owned = *(int*)(record + 2) > 0; // alloc, behind delta and data
        record[1] = NativeMemory.Realloc(owned ? record[1] : null, 64 * sizeof(double));
    }

    [MethodImpl(MethodImplOptions.NoInlining)]
    private static int Call(string shape) => shape switch
    {
        "record" => DspApi.dspi_rfft(new Forgotten()),
        "record, int" => DspApi.dspi_zpad(new Forgotten(), 8),
        "record, window" => DspApi.dspi_window2(new Forgotten(), 2, 0, 0),
        "two records" => DspApi.dsps_mean(new Forgotten(), new Forgotten()),
        _ => DspApi.dspd_fir(new Forgotten(), new Forgotten(), new Forgotten(), new Forgotten()),
    };

    [Theory]
    [InlineData("record")]
    [InlineData("record, int")]
    [InlineData("record, window")]
    [InlineData("two records")]
    [InlineData("four records")]
    public void RecordsLiveAsLongAsTheCall(string shape)
    {
        using (new DspInput()) LifeCycleTests.Collect(); // the library is there, and nothing is pending
        (hookCalls, finalised, finalisedDuringCall) = (0, 0, 0);
        dsp_lib_alloc(&Grow, null);
        dsp_lib_realloc(&Grow, null);
        int result = Call(shape);
        dsp_lib_alloc(null, null);
        dsp_lib_realloc(null, null);
        Assert.Equal(0, result);
        Assert.True(hookCalls > 0);
        Assert.Equal(0, finalisedDuringCall);
        LifeCycleTests.Collect();
        Assert.True(finalised > 0);
    }
}
