using System;
using System.Runtime.InteropServices;

namespace Corvane.QuillonInternal.DataAnalysis;

/// <summary>
/// Owns one native signal record: a run of equally spaced samples, real or interleaved complex.
/// </summary>
/// <remarks>
/// <para>
/// The object owns the record, not the samples. A buffer that the library allocated into the record
/// (<see cref="Alloc"/> above 0) is released by <see cref="DspApi.dsp_destroy"/>, which must be called
/// before the object is disposed; a buffer of the host's (<see cref="Alloc"/> 0) is never released, and
/// must stay pinned for as long as <see cref="Data"/> points at it.
/// </para>
/// <para>
/// The properties do not check whether the object was disposed and must not be used after that. Every
/// function of <see cref="DspApi"/> throws <see cref="ObjectDisposedException"/> for a disposed object.
/// </para>
/// <para>An object belongs to one thread at a time.</para>
/// </remarks>
public unsafe class DspInput : IDisposable
{
    // The garbage collector may finalise an object whose last use is under way. Whatever works on the
    // record keeps its owner alive until it is done.
    private dsp_struct* m_dspInput;

    /// <summary>
    /// Creates an empty record: <see cref="Delta"/> 0.0, no samples, no buffer.
    /// </summary>
    /// <remarks>Set <see cref="Delta"/> to the spacing of the samples before a transform uses it.</remarks>
    /// <exception cref="DllNotFoundException">The native library was not found; the message says where it
    /// was looked for.</exception>
    public DspInput()
    {
        WavkitLibrary.Require();
        m_dspInput = (dsp_struct*)Marshal.AllocHGlobal(sizeof(dsp_struct));
        *m_dspInput = default;
    }

    private void ReleaseRecord()
    {
        Marshal.FreeHGlobal((IntPtr)m_dspInput);
        m_dspInput = null;
    }

    /// <summary>Spacing between samples, the step in x; 0.0 at first.</summary>
    public double Delta
    {
        get
        {
            double value = m_dspInput->delta;
            GC.KeepAlive(this);
            return value;
        }
        set
        {
            m_dspInput->delta = value;
            GC.KeepAlive(this);
        }
    }

    /// <summary>
    /// The samples; interleaved pairs (re, im, re, im, ...) when <see cref="Complex"/> is not 0. Null at
    /// first.
    /// </summary>
    /// <remarks>Functions that need more room exchange the buffer: read the pointer again after
    /// them.</remarks>
    public double* Data
    {
        get
        {
            double* value = m_dspInput->data;
            GC.KeepAlive(this);
            return value;
        }
        set
        {
            m_dspInput->data = value;
            GC.KeepAlive(this);
        }
    }

    /// <summary>
    /// Capacity of <see cref="Data"/> in values, two for a complex sample; 0 or less: the buffer is
    /// borrowed and never released. 0 at first.
    /// </summary>
    public int Alloc
    {
        get
        {
            int value = m_dspInput->alloc;
            GC.KeepAlive(this);
            return value;
        }
        set
        {
            m_dspInput->alloc = value;
            GC.KeepAlive(this);
        }
    }

    /// <summary>Number of samples; 0 at first.</summary>
    public int Points
    {
        get
        {
            int value = m_dspInput->points;
            GC.KeepAlive(this);
            return value;
        }
        set
        {
            m_dspInput->points = value;
            GC.KeepAlive(this);
        }
    }

    /// <summary>0 for real samples, anything else for complex ones (the library stores 1); 0 at
    /// first.</summary>
    public int Complex
    {
        get
        {
            int value = m_dspInput->complex;
            GC.KeepAlive(this);
            return value;
        }
        set
        {
            m_dspInput->complex = value;
            GC.KeepAlive(this);
        }
    }

    /// <summary>A word for the host alone, which the library never reads; null at first.</summary>
    public void* Extra
    {
        get
        {
            void* value = m_dspInput->extra;
            GC.KeepAlive(this);
            return value;
        }
        set
        {
            m_dspInput->extra = value;
            GC.KeepAlive(this);
        }
    }

    /// <summary>Releases the record, not its samples; once released, it does nothing.</summary>
    protected void UnmanagedResouceDispose() => ReleaseRecord();

    /// <summary>The record, for as long as the caller keeps this object alive.</summary>
    /// <exception cref="ObjectDisposedException">The object was disposed.</exception>
    internal dsp_struct* GetDspPtr()
    {
        if (m_dspInput == null) ThrowDisposed();
        return m_dspInput;
    }

    /// <summary>Releases the record, not its samples; once released, it does nothing.</summary>
    /// <param name="disposing">Whether <see cref="Dispose()"/> calls, and not the finaliser.</param>
    protected virtual void Dispose(bool disposing) => ReleaseRecord();

    /// <summary>
    /// Releases the record, not its samples: call <see cref="DspApi.dsp_destroy"/> first where the library
    /// allocated them. Disposing again does nothing.
    /// </summary>
    public void Dispose()
    {
        Dispose(true);
        GC.SuppressFinalize(this);
    }

    /// <summary>Releases the record of an object that was never disposed.</summary>
    ~DspInput() => Dispose(false);

    // Apart, so that GetDspPtr is small enough to be inlined.
    private void ThrowDisposed() => throw new ObjectDisposedException(GetType().Name);
}
