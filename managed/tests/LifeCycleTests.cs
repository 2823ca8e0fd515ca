using System;
using System.Linq;
using System.Runtime.CompilerServices;
using System.Runtime.InteropServices;
using System.Threading.Tasks;
using Xunit;

namespace Corvane.QuillonInternal.DataAnalysis.Tests;

public unsafe partial class LifeCycleTests
{
    /// <summary>Counts how its records go, and lets them go by every way there is.</summary>
    private sealed class Probe : DspInput
    {
        internal static int Disposed, Finalised;

        internal void LetGo() => UnmanagedResouceDispose();

        internal void LetGoAsTheFinaliser() => Dispose(false);

        protected override void Dispose(bool disposing)
        {
            ++(disposing ? ref Disposed : ref Finalised);
            base.Dispose(disposing);
        }
    }

    /// <summary>Calls a function with a record for each of its parameters, the given one at its place, and
    /// null or zero for the rest.</summary>
    private static void Call(string name, DspInput? record, int place)
    {
        using var other = new DspInput();
        var method = typeof(DspApi).GetMethod(name)!;
        object?[] arguments = [.. method.GetParameters().Select(p =>
            p.Position == place ? record :
            p.ParameterType == typeof(DspInput) ? other : Convert.ChangeType(0, p.ParameterType))];
        method.Invoke(null, System.Reflection.BindingFlags.DoNotWrapExceptions, null, arguments, null);
    }

    /// <summary>Every function, with every place where it takes a record.</summary>
    public static TheoryData<string, int> RecordParameters()
    {
        var all = new TheoryData<string, int>();
        foreach (var method in typeof(DspApi).GetMethods())
        {
            if (!method.IsStatic) continue;
            foreach (var parameter in method.GetParameters())
            {
                if (parameter.ParameterType == typeof(DspInput)) all.Add(method.Name, parameter.Position);
            }
        }
        return all;
    }

    [Theory]
    [MemberData(nameof(RecordParameters))]
    public void NothingTakesADisposedRecord(string function, int place)
    {
        var record = new DspInput();
        record.Dispose();
        var exception = Assert.Throws<ObjectDisposedException>(() => Call(function, record, place));
        Assert.Equal("DspInput", exception.ObjectName);
        if (function == nameof(DspApi.dspd_fir) && place == 3) return; // the one that may be missing
        Assert.Throws<NullReferenceException>(() => Call(function, null, place));
    }

    [Fact]
    public void ARecordStartsEmpty()
    {
        using var record = new DspInput();
        Assert.Equal((0.0, 0, 0, 0), (record.Delta, record.Alloc, record.Points, record.Complex));
        Assert.True(record.Extra == null && record.Data == null);
    }

    [Fact]
    public void EveryWayOfLettingGoLeavesADisposedRecord()
    {
        Action<Probe>[] ways = [x => x.Dispose(), x => x.LetGo(), x => x.LetGoAsTheFinaliser()];
        foreach (var way in ways)
        {
            var record = new Probe();
            Assert.Equal(0, DspApi.dspi_rev(record));
            way(record);
            var exception = Assert.Throws<ObjectDisposedException>(() => DspApi.dspi_rev(record));
            Assert.Equal(nameof(Probe), exception.ObjectName);
            foreach (var again in ways) again(record);
        }
    }

    [Fact]
    public void TheFinaliserRunsForForgottenRecordsOnly()
    {
        [MethodImpl(MethodImplOptions.NoInlining)]
        static void Make()
        {
            for (int i = 0; i < 100; ++i) _ = new Probe();
            for (int i = 0; i < 100; ++i) new Probe().Dispose();
        }
        Collect();
        (Probe.Disposed, Probe.Finalised) = (0, 0);
        Make();
        Collect();
        Assert.Equal((100, 100), (Probe.Disposed, Probe.Finalised));
    }

    internal static void Collect()
    {
        GC.Collect();
        GC.WaitForPendingFinalizers();
    }

    [Fact]
    public void ABufferOfTheLibraryOutlivesItsOwnerUntilDestroyed()
    {
        double* samples;
        int capacity;
        using (var record = new DspInput())
        {
            Assert.Equal(0, DspApi.dspi_zpad(record, 1000));
            samples = record.Data;
            capacity = record.Alloc;
            Assert.True(capacity >= 1000);
            samples[999] = 17;
        }
        using var heir = new DspInput { Data = samples, Alloc = capacity, Points = 1000, Extra = samples };
        using Signal largest = Signal.Real();
        Assert.Equal(0, DspApi.dsps_max(heir, largest));
        largest.ShouldBe(0, 17);
        Assert.Equal(0, DspApi.dsp_destroy(heir));
        Assert.Equal((1.0, 0, 0, 0), (heir.Delta, heir.Alloc, heir.Points, heir.Complex));
        Assert.True(heir.Extra == null && heir.Data == null);
    }

    [Fact]
    public void APinnedArrayIsWorkedInAndNeverReleased()
    {
        double[] host = [1, 2, 3];
        fixed (double* pinned = host)
        {
            using var record = new DspInput { Data = pinned, Alloc = 0, Points = 3, Delta = 0.5 };
            Assert.Equal(0, DspApi.dspi_scale(record, 2));
            Assert.True(record.Data == pinned);
            Assert.Equal([2, 4, 6], host);

            Assert.Equal(0, DspApi.dspi_zpad(record, 4)); // needs more room: a block of its own
            Assert.True(record.Data != pinned && record.Alloc >= 4);
            Assert.Equal(0, DspApi.dspi_scale(record, 2));
            Assert.Equal([4, 8, 12, 0], new Span<double>(record.Data, 4));
            Assert.Equal(0, DspApi.dsp_destroy(record));

            record.Data = pinned; // and lent once more
            record.Points = 3;
            Assert.Equal(0, DspApi.dsp_destroy(record));
        }
        Assert.Equal([2, 4, 6], host);
    }

    [Fact]
    public void AMillionRoundsDoNotGrow()
    {
        static void Rounds(int count)
        {
            for (int i = 0; i < count; ++i)
            {
                using var record = new DspInput();
                if (DspApi.dspi_zpad(record, 4) != 0 || DspApi.dsp_destroy(record) != 0) Assert.Fail("zpad");
            }
        }
        Rounds(1);
        long before = BytesAllocated();
        Rounds(1_000_000);
        // A million blocks of the smallest size would be 30 MiB.
        Assert.InRange(BytesAllocated() - before, -1 << 20, 1 << 20);
    }

    /// <summary>What malloc has handed out and not taken back, in bytes.</summary>
    private static long BytesAllocated()
    {
        MallocInfo info = mallinfo2();
        return (long)info.Fields[7];
    }

    private struct MallocInfo
    {
        internal fixed ulong Fields[10];
    }

    [LibraryImport("libc")]
    private static partial MallocInfo mallinfo2();

    /// <summary>Calls that share no table, from many threads, while the finaliser has work to do.</summary>
    [Fact]
    public void DistinctRecordsWorkAtTheSameTime()
    {
        Parallel.For(0, 64, thread =>
        {
            for (int round = 0; round < 200; ++round)
            {
                _ = new DspInput();
                using Signal x = Signal.Real(thread, round, 3), mean = Signal.Real();
                if (round % 50 == 0) GC.Collect();
                Assert.Equal(0, DspApi.dspi_scale(x, 3));
                Assert.Equal(0, DspApi.dspi_rev(x));
                Assert.Equal(0, DspApi.dsps_mean(x, mean));
                x.ShouldBe(0, 9, 3 * round, 3 * thread);
                mean.ShouldBe(0, 3 + round + thread);
            }
        });
    }
}
