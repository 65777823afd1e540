#pragma once
#include <complex>

// Complex sample of every raster of the focusing chain and of every
// transform buffer: two 32-bit floats, real part first.
using fcomplex = std::complex<float>;
using dcomplex = std::complex<double>;
static_assert(sizeof(fcomplex) == 8, "fcomplex must be two packed floats");
