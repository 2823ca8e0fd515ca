using System;
using System.Collections.Generic;
using System.Linq;
using System.Reflection;
using System.Reflection.Emit;
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

    /// <summary>Calls a function with integers, numbers and records as they stand, those being pointers;
    /// what it takes is what it is given.</summary>
    private static int CallNative(string name, params object[] arguments)
    {
        Type[] types = [.. arguments.Select(argument => argument.GetType())];
        var call = new DynamicMethod(name, typeof(int), types, typeof(CallTests).Module);
        ILGenerator code = call.GetILGenerator();
        for (int i = 0; i < types.Length; ++i) code.Emit(OpCodes.Ldarg, i);
        code.Emit(OpCodes.Ldc_I8, NativeLibrary.GetExport(Library, name));
        code.Emit(OpCodes.Conv_I);
        code.EmitCalli(OpCodes.Calli, CallingConvention.Cdecl, typeof(int), types);
        code.Emit(OpCodes.Ret);
        return (int)call.Invoke(null, arguments)!;
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

    internal static bool IsOptional(ParameterInfo parameter) =>
        new NullabilityInfoContext().Create(parameter).WriteState == NullabilityState.Nullable;

    private static void Compare(string name, int points, int complex, int flag)
    {
        MethodInfo function = typeof(DspApi).GetMethod(name)!;
        Record* records = stackalloc Record[8];
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
            // A state may be missing.
            if (parameter.Name == "state" && flag == 0 && IsOptional(parameter)) return null;
            return new DspInput
                { Delta = 0.5, Data = Samples(place), Points = count, Complex = kind, Extra = (void*)7 };
        })];

        object[] native = [.. arguments.Select((argument, place) =>
            argument is null or DspInput ? argument is null ? 0 : (nint)(records + place) : argument)];
        Assert.Equal(CallNative(name, native), function.Invoke(null, arguments));
        for (int place = 0; place < arguments.Length; ++place)
        {
            if (arguments[place] is not DspInput x) continue;
            Record* y = records + place;
            Assert.Equal((y->Delta, y->Alloc, y->Points, y->Complex, y->Extra),
                (x.Delta, x.Alloc, x.Points, x.Complex, (ulong)x.Extra));
            int count = x.Points * (1 + x.Complex);
            Assert.Equal(new Span<double>(y->Data, count), new Span<double>(x.Data, count));
            Assert.Equal(0, CallNative("dsp_destroy", (nint)y));
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
