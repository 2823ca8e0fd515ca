using System.Runtime.InteropServices;

namespace Corvane.QuillonInternal.DataAnalysis;

/// <summary>The native signal record, field by field.</summary>
[StructLayout(LayoutKind.Sequential)]
internal unsafe struct dsp_struct
{
    internal double delta;
    internal double* data;
    internal int alloc;
    internal int points;
    internal int complex;
    internal void* extra; // a 64-bit word; a pointer is one wherever the native library is built
}
