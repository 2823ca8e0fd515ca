// Modified Bessel function, for whoever needs it of a number rather than of a signal.
#pragma once

namespace wavkit {

/// I0(t), the modified Bessel function of the first kind and order 0, for t >= 0. Infinite where
/// e^t exceeds a double (t > 709.78). Single precision rounds the result.
double bessel_i0(double t);

}  // namespace wavkit
