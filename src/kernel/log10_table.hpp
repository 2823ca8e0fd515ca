// Decimal logarithms of floats, by 32 stretches.
//
// A number from 3/4 to 3/2 belongs to the stretch that the five highest bits of its mantissa count.
// `reciprocal` is that of about the middle of the stretch, 1 on either side of 1, and of so few
// bits that products with it keep theirs; high + low is the logarithm of what it is the reciprocal
// of, high a multiple of 2^-17.
#pragma once

namespace wavkit::kernel {
namespace {

struct DecimalLogarithms {
    alignas(64) float reciprocal[32], high[32], low[32];
};

inline constexpr DecimalLogarithms decimal_logarithms{
    {1.0f,       0.953125f,  0.9296875f, 0.8984375f, 0.875f,     0.8515625f, 0.828125f,  0.8125f,
     0.7890625f, 0.7734375f, 0.75f,      0.734375f,  0.71875f,   0.703125f,  0.6875f,    0.671875f,
     1.3203125f, 1.2890625f, 1.265625f,  1.2421875f, 1.21875f,   1.1953125f, 1.171875f,  1.15625f,
     1.1328125f, 1.109375f,  1.09375f,   1.078125f,  1.0546875f, 1.0390625f, 1.0234375f, 1.0f},
    {0.0f,           0.0208511353f,  0.0316619873f,  0.0465087891f,
     0.0579910278f,  0.0697860718f,  0.0819015503f,  0.0901794434f,
     0.102890015f,   0.111572266f,   0.124938965f,   0.134078979f,
     0.143424988f,   0.15296936f,    0.162727356f,   0.172714233f,
     -0.120674133f,  -0.110275269f,  -0.102302551f,  -0.0941848755f,
     -0.0859146118f, -0.0774841309f, -0.0688781738f, -0.0630493164f,
     -0.0541610718f, -0.0450820923f, -0.0389175415f, -0.0326690674f,
     -0.0231246948f, -0.0166397095f, -0.0100631714f, 0.0f},
    {0.0f,
     -9.96280733e-07f,
     1.02095066e-06f,
     3.34023184e-06f,
     9.19145634e-07f,
     -2.60007005e-06f,
     2.55409009e-06f,
     -2.81301027e-06f,
     -1.4187832e-06f,
     2.50942526e-06f,
     -2.2823545e-07f,
     3.13655596e-06f,
     -2.8454906e-06f,
     -1.90014305e-06f,
     -5.84593316e-08f,
     -2.71499403e-06f,
     -2.60166507e-06f,
     1.2939887e-06f,
     -2.49362529e-06f,
     -2.2791844e-06f,
     -1.6890187e-08f,
     2.66968959e-06f,
     -3.1155796e-06f,
     -2.42934084e-06f,
     3.03919023e-06f,
     3.71755004e-06f,
     -5.24526456e-07f,
     -4.93705556e-08f,
     8.95977109e-07f,
     -1.96184646e-06f,
     1.84537885e-06f,
     0.0f}};

}  // namespace
}  // namespace wavkit::kernel
