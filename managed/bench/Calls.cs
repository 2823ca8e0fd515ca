// What a call through the facade costs, beside the same call from C in the same run.
//
//   Dsp.Bench LIBRARY    the native loops: build/lib/libwavkit_calls.so
using System;
using System.Diagnostics;
using System.Runtime.InteropServices;
using Corvane.QuillonInternal.DataAnalysis;

internal static unsafe class Calls
{
    private const int ShortSignal = 16;
    private const int LongSignal = 1024;
    private const int Rounds = 25;
    private const int RoundLength = 20_000_000; // nanoseconds

    /// <summary>Zeros, in which both sides work; room for the long signal's spectrum.</summary>
    private static readonly double* Samples = Zeros(LongSignal + 2);

    private static double* Zeros(int count)
    {
        var zeros = (double*)NativeMemory.AlignedAlloc((nuint)count * sizeof(double), 64);
        new Span<double>(zeros, count).Clear();
        return zeros;
    }

    private static int Main(string[] arguments)
    {
        if (arguments.Length != 1 || !NativeLibrary.TryLoad(arguments[0], out nint library))
        {
            Console.Error.WriteLine("Dsp.Bench: the library of native loops is missing");
            return 1;
        }
        Console.WriteLine($"{"",-24}{"C#, ns",10}{"C, ns",10}{"ratio",10}{"more, ns",10}");
        Compare("dspi_conj, real", Conj, Native(library, "repeat_conj"));
        Compare("dspi_scale, 16 points", Scale, Native(library, "repeat_scale"));
        Compare("dsps_mean, 16 points", Mean, Native(library, "repeat_mean"));
        Compare("dspi_rfft, 1024 points", Rfft, Native(library, "repeat_rfft"));
        Console.WriteLine($"{"new DspInput, Dispose",-24}{Best(Make, CountFor(Make)),10:F1}");
        return 0;
    }

    private static Action<int> Native(nint library, string name)
    {
        var function = (delegate* unmanaged[Cdecl]<int, double*, void>)NativeLibrary.GetExport(library, name);
        return times => function(times, Samples);
    }

    /// <summary>Turn by turn, so that a slow moment of the machine hits both.</summary>
    private static void Compare(string what, Action<int> managed, Action<int> native)
    {
        int count = CountFor(native);
        Best(managed, count); // until it is compiled for good
        double ours = double.MaxValue, theirs = double.MaxValue;
        for (int round = 0; round < Rounds; ++round)
        {
            theirs = Math.Min(theirs, Time(native, count));
            ours = Math.Min(ours, Time(managed, count));
        }
        Console.WriteLine($"{what,-24}{ours,10:F1}{theirs,10:F1}{ours / theirs,10:F2}{ours - theirs,10:F1}");
    }

    /// <summary>How many calls make a round of the length above.</summary>
    private static int CountFor(Action<int> repeat)
    {
        int count = 1000;
        repeat(count);
        return (int)Math.Clamp(RoundLength / Math.Max(Time(repeat, count), 0.5), 1000, 20_000_000);
    }

    private static double Best(Action<int> repeat, int count)
    {
        double best = double.MaxValue;
        for (int round = 0; round < Rounds; ++round) best = Math.Min(best, Time(repeat, count));
        return best;
    }

    /// <summary>Nanoseconds a call.</summary>
    private static double Time(Action<int> repeat, int count)
    {
        long start = Stopwatch.GetTimestamp();
        repeat(count);
        return Stopwatch.GetElapsedTime(start).TotalNanoseconds / count;
    }

    private static void Conj(int times)
    {
        using var x = new DspInput { Data = Samples, Points = ShortSignal };
        for (int i = 0; i < times; ++i) DspApi.dspi_conj(x);
    }

    private static void Scale(int times)
    {
        using var x = new DspInput { Data = Samples, Points = ShortSignal };
        for (int i = 0; i < times; ++i) DspApi.dspi_scale(x, 0.5);
    }

    private static void Mean(int times)
    {
        using var x = new DspInput { Data = Samples, Points = ShortSignal };
        using var mean = new DspInput { Data = Samples + ShortSignal, Alloc = 1 };
        for (int i = 0; i < times; ++i) DspApi.dsps_mean(x, mean);
    }

    private static void Rfft(int times)
    {
        using var x = new DspInput { Data = Samples, Alloc = LongSignal + 2 };
        for (int i = 0; i < times; ++i)
        {
            x.Points = LongSignal;
            x.Complex = 0;
            DspApi.dspi_rfft(x);
        }
    }

    private static void Make(int times)
    {
        for (int i = 0; i < times; ++i)
        {
            using var x = new DspInput();
        }
    }
}
