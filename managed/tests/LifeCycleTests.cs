using System;
using System.Linq;
using System.Reflection;
using System.Runtime.CompilerServices;
using System.Runtime.InteropServices;
using System.Threading.Tasks;
using Xunit;

namespace Corvane.QuillonInternal.DataAnalysis.Tests;

public unsafe partial class LifeCycleTests
{
    private const BindingFlags Declared = BindingFlags.DeclaredOnly | BindingFlags.Static |
        BindingFlags.Instance | BindingFlags.Public | BindingFlags.NonPublic;

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

    [Fact]
    public void NoFunctionTakesADisposedOrAMissingRecord()
    {
        using var live = new DspInput();
        var disposed = new DspInput();
        disposed.Dispose();
        int places = 0;
        foreach (var function in typeof(DspApi).GetMethods(Declared))
        {
            object? Call(int place, DspInput? record) => function.Invoke(null,
                BindingFlags.DoNotWrapExceptions, null, [.. function.GetParameters().Select(p =>
                    p.Position == place ? record :
                    p.ParameterType == typeof(DspInput) ? live :
                    Convert.ChangeType(0, p.ParameterType))], null);

            foreach (var place in function.GetParameters().Where(p => p.ParameterType == typeof(DspInput)))
            {
                var refusal = Assert.Throws<ObjectDisposedException>(() => Call(place.Position, disposed));
                Assert.Equal("DspInput", refusal.ObjectName);
                ++places;
                if (CallTests.IsOptional(place)) continue;
                Assert.Throws<NullReferenceException>(() => Call(place.Position, null));
            }
        }
        Assert.Equal(93, places); // of 49 functions
    }

    /// <summary>What hosts are compiled against, in the order that they know.</summary>
    [Fact]
    public void TheMembersOfARecord()
    {
        var members = typeof(DspInput).GetMethods(Declared).Where(m => !m.IsPrivate)
            .OrderBy(m => m.MetadataToken)
            .Select(m => (m.IsPublic ? "public " : m.IsFamily ? "protected " : "internal ") + m);
        string[] accessors = [.. new[] { "Double Delta", "Double* Data", "Int32 Alloc", "Int32 Points",
                                         "Int32 Complex", "Void* Extra" }.Select(p => p.Split(' '))
            .SelectMany(p => new[] { $"public {p[0]} get_{p[1]}()", $"public Void set_{p[1]}({p[0]})" })];
        Assert.Equal([.. accessors, "protected Void UnmanagedResouceDispose()",
            $"internal {typeof(DspInput).Namespace}.dsp_struct* GetDspPtr()", "protected Void Dispose(Boolean)",
            "public Void Dispose()", "protected Void Finalize()"], members);
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
        // A million blocks of the smallest size would be 30 MiB; the runtime itself takes a few.
        Assert.InRange(BytesAllocated() - before, long.MinValue, 15 << 20);
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

    /// <summary>Calls from many threads, while the finaliser has work to do.</summary>
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
