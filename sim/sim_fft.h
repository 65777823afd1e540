#pragma once
// Small radix-2 FFT in double precision for the simulator's analysis tools
// (point-target upsampling, reference correlations in tests). Lengths must
// be powers of two.
#include <complex>
#include <vector>

using cdouble = std::complex<double>;

bool isPowerOfTwo(int n);
int nextPowerOfTwo(int n);
// In-place transform; sign -1 forward (exp(-j 2 pi nk / N)), +1 backward,
// no scaling either way. Throws std::invalid_argument for a length that is
// not a power of two.
void simFft(cdouble* data, int n, int sign);
// Row-major rows x cols array, both powers of two.
void simFft2(std::vector<cdouble>& data, int rows, int cols, int sign);
