using System;
using System.Diagnostics;
using System.IO;
using System.Linq;
using System.Runtime.InteropServices;
using Xunit;

namespace Corvane.QuillonInternal.DataAnalysis.Tests;

/// <summary>
/// Where the native library is found. A process loads it once, so each case starts this program anew, in
/// a folder that holds what the case says.
/// </summary>
public sealed class LibrarySearchTests : IDisposable
{
    private const string Library = "libwavkit.so.2";
    private static readonly string Native =
        $"runtimes/linux-{RuntimeInformation.ProcessArchitecture}/native/".ToLowerInvariant() + Library;
    private static readonly string Program = typeof(LibrarySearchTests).Assembly.Location;
    private static readonly string OurLibrary = Path.Combine(Path.GetDirectoryName(Program)!, Library);

    private readonly string root = Directory.CreateTempSubdirectory("wavkit").FullName;

    /// <summary>The host: uses a record, and prints the file that the library came from.</summary>
    public static int Main()
    {
        try
        {
            using var record = new DspInput();
            DspApi.dspi_rev(record);
        }
        catch (DllNotFoundException e)
        {
            Console.WriteLine(e.Message);
            return 1;
        }
        string map = File.ReadLines("/proc/self/maps").First(line => line.Contains("libwavkit"));
        Console.WriteLine(map[map.IndexOf('/')..]);
        return 0;
    }

    public LibrarySearchTests()
    {
        foreach (string file in new[] { Program, Path.ChangeExtension(Program, "runtimeconfig.json"),
                                        typeof(DspInput).Assembly.Location })
        {
            Put(file, "lib/any/" + Path.GetFileName(file));
        }
    }

    public void Dispose() => Directory.Delete(root, true);

    private void Put(string file, string place)
    {
        string path = Path.Combine(root, place);
        Directory.CreateDirectory(Path.GetDirectoryName(path)!);
        File.Copy(file, path, true);
    }

    private (int Status, string Output) RunHost(string variable = "", string value = "")
    {
        var start = new ProcessStartInfo("dotnet", [$"{root}/lib/any/{Path.GetFileName(Program)}"]);
        start.RedirectStandardOutput = true;
        start.Environment.Remove("WAVKIT_LIBRARY");
        if (variable.Length > 0) start.Environment[variable] = Path.Combine(root, value);
        using var process = Process.Start(start)!;
        string output = process.StandardOutput.ReadToEnd().Trim();
        process.WaitForExit();
        return (process.ExitCode, output);
    }

    public static readonly TheoryData<string, string, string> Places = new()
    {
        { "lib/any/" + Library, "", "" },
        { "lib/any/" + Native, "", "" },
        { Native, "", "" },
        { "elsewhere/" + Library, "LD_LIBRARY_PATH", "elsewhere" },
        { "elsewhere/" + Library, "WAVKIT_LIBRARY", "elsewhere" },
        { "elsewhere/libwavkit-mine.so", "WAVKIT_LIBRARY", "elsewhere/libwavkit-mine.so" },
    };

    [Theory]
    [MemberData(nameof(Places))]
    public void EveryPlaceIsFound(string place, string variable, string value)
    {
        Put(OurLibrary, place);
        if (variable == "WAVKIT_LIBRARY") Put(OurLibrary, "lib/any/" + Library); // which it overrules
        Assert.Equal((0, Path.Combine(root, place)), RunHost(variable, value));
    }

    [Fact]
    public void TheVariableIsObeyedEvenIfNothingIsThere()
    {
        Put(OurLibrary, "lib/any/" + Library);
        var (status, message) = RunHost("WAVKIT_LIBRARY", "missing.so");
        Assert.Equal(1, status);
        Assert.Contains("missing.so (no such file)", message);
    }

    /// <summary>In the package a library of something else, on the loader's path no library at
    /// all.</summary>
    [Fact]
    public void TheMessageNamesEveryPlaceAndItsFault()
    {
        string other = Process.GetCurrentProcess().Modules.Cast<ProcessModule>()
            .First(module => module.ModuleName == "libSystem.Native.so").FileName;
        Put(other, Native);
        Put(typeof(DspInput).Assembly.Location, "elsewhere/" + Library);
        var (status, message) = RunHost("LD_LIBRARY_PATH", "elsewhere");
        Assert.Equal(1, status);
        Assert.Contains($"{root}/lib/any/{Library} (no such file)", message);
        Assert.Contains($"{root}/lib/any/{Native} (no such file)", message);
        Assert.Matches($@"{root}/{Native} \([^)]*dsp_destroy", message);
        Assert.Contains("invalid ELF header", message);
        Assert.Contains("WAVKIT_LIBRARY", message);
        Assert.DoesNotContain('\n', message);
    }
}
