// The elementary functions of vectors, and the loops that carry them over a signal.
#pragma once

#include "kernel/bessel.hpp"
#include "kernel/exponential.hpp"
#include "kernel/inverse_trigonometric.hpp"
#include "kernel/logarithm.hpp"
#include "kernel/magnitude.hpp"
#include "kernel/map.hpp"
#include "kernel/trigonometric.hpp"
