using System;
using System.Collections.Generic;
using System.Linq;
using System.Reflection;
using System.Runtime.InteropServices;
using Xunit;

namespace Corvane.QuillonInternal.DataAnalysis.Tests;

/// <summary>The facade beside the native library, whose own tests say what is right.</summary>
public unsafe class CallTests
{
    private static readonly nint Library =
        NativeLibrary.Load("libwavkit.so.2", typeof(CallTests).Assembly, null);

    /// <summary>The record as C lays it out.</summary>
    private struct Record
    {
        internal double Delta;
        internal double* Data;
        internal int Alloc, Points, Complex;
        internal ulong Extra;
    }

    private static int CallNative(string name, Record* r, object?[] arguments)
    {
        void* f = (void*)NativeLibrary.GetExport(Library, name);
        return arguments switch
        {
            [_] => ((delegate* unmanaged[Cdecl]<Record*, int>)f)(r),
            [_, int n] => ((delegate* unmanaged[Cdecl]<Record*, int, int>)f)(r, n),
            [_, double v] => ((delegate* unmanaged[Cdecl]<Record*, double, int>)f)(r, v),
            [_, int w, int s, double l] =>
                ((delegate* unmanaged[Cdecl]<Record*, int, int, double, int>)f)(r, w, s, l),
            [_, _] => ((delegate* unmanaged[Cdecl]<Record*, Record*, int>)f)(r, r + 1),
            [_, _, double v, int n] =>
                ((delegate* unmanaged[Cdecl]<Record*, Record*, double, int, int>)f)(r, r + 1, v, n),
            [_, _, _, double v, int n, int w] =>
                ((delegate* unmanaged[Cdecl]<Record*, Record*, Record*, double, int, int, int>)f)(
                    r, r + 1, r + 2, v, n, w),
            [_, _, double a, double b, double c, double d, double e, double g] =>
                ((delegate* unmanaged[Cdecl]<Record*, Record*, double, double, double, double, double,
                    double, int>)f)(r, r + 1, a, b, c, d, e, g),
            [_, int design, int band, int order, double a, double b, double c, double d] =>
                ((delegate* unmanaged[Cdecl]<Record*, int, int, int, double, double, double, double,
                    int>)f)(r, design, band, order, a, b, c, d),
            [_, _, _] => ((delegate* unmanaged[Cdecl]<Record*, Record*, Record*, int>)f)(r, r + 1, r + 2),
            [_, _, _, int n] =>
                ((delegate* unmanaged[Cdecl]<Record*, Record*, Record*, int, int>)f)(r, r + 1, r + 2, n),
            [_, _, int n] => ((delegate* unmanaged[Cdecl]<Record*, Record*, int, int>)f)(r, r + 1, n),
            [_, _, _, int l, int s, int w, int n] =>
                ((delegate* unmanaged[Cdecl]<Record*, Record*, Record*, int, int, int, int, int>)f)(
                    r, r + 1, r + 2, l, s, w, n),
            [_, int n, double a, double b, double c] =>
                ((delegate* unmanaged[Cdecl]<Record*, int, double, double, double, int>)f)(r, n, a, b, c),
            [_, _, int n, double a, double b, int w, int m] =>
                ((delegate* unmanaged[Cdecl]<Record*, Record*, int, double, double, int, int, int>)f)(
                    r, r + 1, n, a, b, w, m),
            [_, _, _, _, int n] =>
                ((delegate* unmanaged[Cdecl]<Record*, Record*, Record*, Record*, int, int>)f)(
                    r, r + 1, r + 2, r + 3, n),
            _ => ((delegate* unmanaged[Cdecl]<Record*, Record*, Record*, Record*, int>)f)(
                r, r + 1, r + 2, arguments[3] == null ? null : r + 3),
        };
    }

    private static readonly List<double[]> Lent = [];

    private static double* Samples(int place)
    {
        Lent.Add(GC.AllocateArray<double>(8, pinned: true));
        new[] { 1.5 + place, -4, 7 - place, 2, 0.25, 3, -1, 5 }.CopyTo(Lent[^1], 0);
        return (double*)Marshal.UnsafeAddrOfPinnedArrayElement(Lent[^1], 0);
    }

    public static TheoryData<string> Functions => [.. typeof(DspApi)
        .GetMethods(BindingFlags.Static | BindingFlags.Public).Select(function => function.Name)];

    /// <summary>Over lengths, kinds and flags among which no two functions do the same.</summary>
    [Theory]
    [MemberData(nameof(Functions))]
    public void EveryCallIsTheNativeOneOfItsName(string name)
    {
        for (int i = 0; i < 8; ++i) Compare(name, 3 + i % 2, i / 2 % 2, i / 4);
    }

    private static void Compare(string name, int points, int complex, int flag)
    {
        MethodInfo function = typeof(DspApi).GetMethod(name)!;
        Record* records = stackalloc Record[4];
        object?[] arguments = [.. function.GetParameters().Select(parameter =>
        {
            int place = parameter.Position;
            if (parameter.Name is "f1" or "f2") return (object?)(parameter.Name == "f1" ? 0.1 : 0.2);
            if (parameter.Name == "attenuation") return 40.0;
            if (parameter.Name == "order") return 3;
            if (parameter.ParameterType == typeof(double)) return 2.5;
            if (parameter.Name == "window") return (int)DspWindow.Hann;
            if (parameter.Name == "scaleType") return (int)(DspScale.Peak | DspScale.Width);
            if (parameter.ParameterType == typeof(int)) return 4 * flag;
            bool table = parameter.Name == "sections"; // of one row
            int count = table ? 6 : points, kind = table ? 0 : complex;
            records[place] = new Record
                { Delta = 0.5, Data = Samples(place), Alloc = 0, Points = count, Complex = kind, Extra = 7 };
            // The filter's state, which may be missing.
            if (place == 3 && flag == 0 && name == nameof(DspApi.dspd_fir)) return null;
            return new DspInput
                { Delta = 0.5, Data = Samples(place), Points = count, Complex = kind, Extra = (void*)7 };
        })];

        Assert.Equal(CallNative(name, records, arguments), function.Invoke(null, arguments));
        for (int place = 0; place < arguments.Length; ++place)
        {
            if (arguments[place] is not DspInput x) continue;
            Record* y = records + place;
            Assert.Equal((y->Delta, y->Alloc, y->Points, y->Complex, y->Extra),
                (x.Delta, x.Alloc, x.Points, x.Complex, (ulong)x.Extra));
            int count = x.Points * (1 + x.Complex);
            Assert.Equal(new Span<double>(y->Data, count), new Span<double>(x.Data, count));
            Assert.Equal(0, CallNative("dsp_destroy", y, [null]));
            Assert.Equal(0, DspApi.dsp_destroy(x));
            x.Dispose();
        }
    }

    /// <summary>Names whose numbers the library knows.</summary>
    [Fact]
    public void WindowsHaveTheNumbersOfTheirNames()
    {
        var find = (delegate* unmanaged[Cdecl]<byte*, int*, int>)
            NativeLibrary.GetExport(Library, "dsp_window_from_str");
        foreach (DspWindow window in Enum.GetValues<DspWindow>())
        {
            int number;
            fixed (byte* name = System.Text.Encoding.ASCII.GetBytes($"{window}\0".Replace("nH", "n_H")))
            {
                Assert.Equal((0, (int)window), (find(name, &number), number));
            }
        }
        Assert.Equal(24, Enum.GetValues<DspWindow>().Length);
    }
}
