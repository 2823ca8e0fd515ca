using System;
using System.Runtime.InteropServices;

namespace Corvane.QuillonInternal.DataAnalysis;

/// <summary>Shared objects by path or by name, and the functions in them.</summary>
internal static class SharedObject
{
#if NET
    /// <exception cref="DllNotFoundException">It is not there, or cannot be loaded.</exception>
    internal static IntPtr Open(string path) =>
        NativeLibrary.Load(path, typeof(SharedObject).Assembly, null);

    /// <exception cref="EntryPointNotFoundException">It is not in there.</exception>
    internal static IntPtr Find(IntPtr library, string name) => NativeLibrary.GetExport(library, name);
#else
    // The runtimes that .NET Standard stands for have no interface for this: the system's own loader.

    private const int Now = 2; // RTLD_NOW

    /// <exception cref="DllNotFoundException">It is not there, or cannot be loaded.</exception>
    internal static IntPtr Open(string path)
    {
        bool windows = RuntimeInformation.IsOSPlatform(OSPlatform.Windows);
        if (!windows) dlerror(); // found now, as the search for it would wipe out the error
        IntPtr library = windows ? LoadLibrary(path) : dlopen(path, Now);
        if (library != IntPtr.Zero) return library;
        throw new DllNotFoundException(windows ? $"error {Marshal.GetLastWin32Error()}"
                                               : Marshal.PtrToStringAnsi(dlerror()));
    }

    /// <exception cref="EntryPointNotFoundException">It is not in there.</exception>
    internal static IntPtr Find(IntPtr library, string name)
    {
        bool windows = RuntimeInformation.IsOSPlatform(OSPlatform.Windows);
        IntPtr function = windows ? GetProcAddress(library, name) : dlsym(library, name);
        return function != IntPtr.Zero ? function : throw new EntryPointNotFoundException($"it lacks {name}");
    }

    [DllImport("libdl.so.2")]
    private static extern IntPtr dlopen(string path, int mode);

    [DllImport("libdl.so.2")]
    private static extern IntPtr dlsym(IntPtr library, string name);

    [DllImport("libdl.so.2")]
    private static extern IntPtr dlerror();

    [DllImport("kernel32", CharSet = CharSet.Unicode, SetLastError = true)]
    private static extern IntPtr LoadLibrary(string path);

    [DllImport("kernel32", CharSet = CharSet.Ansi, ExactSpelling = true)]
    private static extern IntPtr GetProcAddress(IntPtr library, string name);
#endif
}
