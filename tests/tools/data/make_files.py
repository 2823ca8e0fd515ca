"""Makes the .npy and .mat files beside it, with NumPy and SciPy."""
import numpy as np
from scipy.io import savemat

ramp = np.arange(6) * 0.5 - 1
table = np.array([[1, -10], [2, -20], [3, 300]], dtype="<i2")
np.save("big_endian.npy", ramp.astype(">f4"))
np.save("complex.npy", (ramp + 1j * ramp[::-1]).astype("<c8"))
np.save("columns.npy", table)
np.save("fortran.npy", np.asfortranarray(table))
np.save("rows.npy", table.T.copy())
np.save("half.npy", np.array([0.5, -2, 6e-8, 65504], dtype="<f2"))

savemat("plain.mat", {"fs": 4.0, "x": ramp, "note": "no signal", "y": table})
savemat("time.mat", {"t": 3 + 0.25 * np.arange(6), "u": ramp + 2j, "s": {"a": 1}}, do_compression=True)
savemat("column.mat", {"x": ramp.astype("f4")[:, None], "dt": 0.125, "t0": -2}, oned_as="column")
