#pragma once
// Omega-K kernels of one azimuth block with Stolt mapping: each azimuth row
// is resampled from the range wavenumber k to kz = sqrt(k^2 - kx^2).
//
// Common arguments: `padded`, `M` (output FFT length), `n` (output samples)
// and `spacing` (output range spacing, m) come from OutImagePar; kx, kx2, dk
// (par.lines values each) from AzimuthGrid; az, rg (m) from ShiftDistances.
// The result goes to par.data when par.scale is 1.0 (row pitch par.samples,
// samples beyond n zeroed), else to par.out packed at pitch n.
#include "core/azimuth_block.h"

// Chirp-z zoom of each row onto a fine input grid, then a two-tap
// phase-corrected interpolator onto the kz grid. Status 0; 1 for bad sizes;
// 7 or 8 when memory runs out.
int ChirpInterpWK(AzimuthBlockPar& par, int padded, int M, int n, const double* kx,
                  const double* kx2, const double* dk, double spacing, double az, double rg);

// Zero-padded row spectrum interpolated onto the kz grid with a table of
// least-squares filters of 2 par.interp + 1 taps (101 fractional positions).
// Status 0; 1 for bad sizes; 7 when memory runs out.
int LSInterpWK(AzimuthBlockPar& par, int padded, int M, int n, const double* kx,
               const double* kx2, const double* dk, double spacing, double az, double rg);
