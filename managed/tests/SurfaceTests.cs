using System;
using System.Linq;
using System.Reflection;
using Xunit;

namespace Corvane.QuillonInternal.DataAnalysis.Tests;

/// <summary>The names that hosts are compiled against.</summary>
public class SurfaceTests
{
    private static string[] Members(Type type)
    {
        const BindingFlags all = BindingFlags.Instance | BindingFlags.Static | BindingFlags.Public |
                                 BindingFlags.NonPublic | BindingFlags.DeclaredOnly;
        return [.. type.GetMembers(all).OfType<MethodBase>().Where(m => !m.IsPrivate)
            .OrderBy(m => m.MetadataToken).Select(m =>
                (m.IsPublic ? "public " : m.IsFamily ? "protected " : "internal ") +
                (m.IsStatic ? "static " : m.IsVirtual && !m.IsFinal ? "virtual " : "") +
                (m is MethodInfo method ? method.ReturnType.Name + " " : "") + m.Name +
                "(" + string.Join(", ", m.GetParameters().Select(p => p.ParameterType.Name)) + ")")];
    }

    [Fact]
    public void DspInput()
    {
        Type type = typeof(DspInput);
        Assert.Equal("Corvane.QuillonInternal.DataAnalysis.DspInput", type.FullName);
        Assert.Equal("Corvane.QuillonInternal.DataAnalysis.Dsp", type.Assembly.GetName().Name);
        Assert.True(type is { IsPublic: true, IsAbstract: false, IsSealed: false });
        Assert.Equal([typeof(IDisposable)], type.GetInterfaces());
        var field = Assert.Single(type.GetFields(BindingFlags.Instance | BindingFlags.NonPublic));
        Assert.Equal("dsp_struct* m_dspInput", $"{field.FieldType.Name} {field.Name}");
        string[] accessors = [.. new[] { "Double Delta", "Double* Data", "Int32 Alloc", "Int32 Points",
                                         "Int32 Complex", "Void* Extra" }.SelectMany(p =>
        {
            string[] words = p.Split(' ');
            return new[] { $"public {words[0]} get_{words[1]}()", $"public Void set_{words[1]}({words[0]})" };
        })];
        Assert.Equal(["public .ctor()", .. accessors, "protected Void UnmanagedResouceDispose()",
            "internal dsp_struct* GetDspPtr()", "protected virtual Void Dispose(Boolean)",
            "public Void Dispose()", "protected virtual Void Finalize()"], Members(type));
    }

    [Fact]
    public void DspApi()
    {
        Type type = typeof(DspApi);
        Assert.True(type is { IsPublic: true, IsAbstract: true, IsSealed: true });
        string[] names = ["dsp_destroy(r)", "dspi_window2(r, i, i, d)", "dspi_swap_halves(r)",
            "dspi_zpad(r, i)", "dspi_rev(r)", "dspi_conj(r)", "dspi_fft(r, i)", "dspi_rfft(r)",
            "dspi_irfft(r)", "dspi_dft(r, i)", "dspi_rdft(r)", "dspi_irdft(r, i)", "dspi_scale(r, d)",
            "dspi_besi0(r)", "dspi_besj0(r)", "dspi_besj1(r)", "dspi_besy0(r)", "dspi_besy1(r)",
            "dspd_fir(r, r, r, r)", "dsps_mean(r, r)", "dsps_median(r, r)", "dsps_rms(r, r)",
            "dsps_samp_stddev(r, r)", "dsps_samp_var(r, r)", "dsps_min(r, r)", "dsps_max(r, r)"];
        Assert.Equal(names, Members(type).Select(m => m.Replace("public static Int32 ", "")
            .Replace("DspInput", "r").Replace("Int32", "i").Replace("Double", "d")));
    }
}
