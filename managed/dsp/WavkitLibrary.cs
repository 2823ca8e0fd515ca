using System;
using System.Collections.Generic;
using System.IO;
using System.Runtime.InteropServices;
using System.Threading;

namespace Corvane.QuillonInternal.DataAnalysis;

/// <summary>Finds the native library and loads it, once.</summary>
internal static class WavkitLibrary
{
    private const string Variable = "WAVKIT_LIBRARY";
    private static readonly object Gate = new();
    private static bool loaded;

    /// <summary>Sees to it that <see cref="NativeMethods"/> can be called.</summary>
    /// <exception cref="DllNotFoundException">No library could be loaded. The next call looks
    /// again.</exception>
    internal static void Require()
    {
        if (!Volatile.Read(ref loaded)) Load();
    }

    private static void Load()
    {
        lock (Gate)
        {
            if (loaded) return;
            var failures = new List<string>();
            foreach (string candidate in Candidates())
            {
                string? failure = TryLoad(candidate);
                if (failure == null)
                {
                    Volatile.Write(ref loaded, true);
                    return;
                }
                failures.Add($"{candidate} ({failure})");
            }
            throw new DllNotFoundException(
                $"The native library of wavkit was not found: {string.Join("; ", failures)}. " +
                $"It belongs beside the assembly, or {Variable} says where it is.");
        }
    }

    /// <summary>What the variable names and nothing else, or else every place in turn.</summary>
    private static IEnumerable<string> Candidates()
    {
        string? named = Environment.GetEnvironmentVariable(Variable);
        if (!string.IsNullOrEmpty(named))
        {
            yield return Path.GetFullPath(Directory.Exists(named) ? Path.Combine(named, FileName) : named);
            yield break;
        }
        string? folder = Path.GetDirectoryName(typeof(WavkitLibrary).Assembly.Location);
        if (string.IsNullOrEmpty(folder)) folder = AppContext.BaseDirectory; // in a single-file program
        string inPackage = Path.Combine("runtimes", RuntimeIdentifier, "native", FileName);
        yield return Path.Combine(folder, FileName);
        yield return Path.Combine(folder, inPackage);
        yield return Path.GetFullPath(Path.Combine(folder, "..", "..", inPackage)); // from lib/FRAMEWORK/
        yield return FileName; // wherever the loader looks
    }

    /// <summary>Says why it could not, or nothing.</summary>
    private static string? TryLoad(string candidate)
    {
        if (Path.IsPathRooted(candidate) && !File.Exists(candidate)) return "no such file";
        try
        {
            NativeMethods.Resolve(SharedObject.Open(candidate));
            return null;
        }
        catch (Exception e) when (e is DllNotFoundException or EntryPointNotFoundException
                                      or BadImageFormatException)
        {
            return e.Message.Replace('\n', ' ');
        }
    }

    private static string FileName =>
        RuntimeInformation.IsOSPlatform(OSPlatform.Windows) ? "wavkit.dll"
        : RuntimeInformation.IsOSPlatform(OSPlatform.OSX) ? "libwavkit.2.dylib"
        : "libwavkit.so.2";

    private static string RuntimeIdentifier =>
        (RuntimeInformation.IsOSPlatform(OSPlatform.Windows) ? "win-"
         : RuntimeInformation.IsOSPlatform(OSPlatform.OSX) ? "osx-"
         : "linux-") +
        RuntimeInformation.ProcessArchitecture.ToString().ToLowerInvariant();
}
