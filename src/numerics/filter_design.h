#pragma once
// Short filter designers: Parks-McClellan equiripple FIR and generalised
// least-squares interpolation kernels.
#include "base/fcomplex.h"

enum RemezType : int { REMEZ_BANDPASS = 1, REMEZ_DIFFERENTIATOR = 2, REMEZ_HILBERT = 3 };

// Equiripple design of n taps. bands[0 .. 2 nbands - 1] are band edges in
// cycles per sample (0 .. 0.5), desired[nbands] the gains, weights[nbands]
// the error weights. h[0..n-1] receives the taps. Status 1 for bad arguments
// or a failed exchange.
int remez_(double* h, int n, int nbands, const double* bands, const double* desired,
           const double* weights, int type);
// remez_ with type band-pass, taps stored as complex numbers with zero imaginary part.
int remez(fcomplex* h, int n, int nbands, const double* bands, const double* desired,
          const double* weights);

// Table of nfrac interpolation kernels of n taps, row r at h[r n .. r n + n - 1].
// Row r interpolates at position (n - 1) / 2 + f with f = r / (nfrac - 1) - 0.5
// (nfrac 101: f = (r - 50) / 100) from taps m = 0 .. n - 1:
//   y(f) = sum_m h[r n + m] x[m].
// The kernels minimise the mean-square error for a signal whose spectrum is flat
// on a one-sided band of width `bandwidth` (cycles per sample, at most 1):
// frequencies -bandwidth .. 0, i.e. the autocorrelation
//   R(d) = exp(-j pi bandwidth d) sinc(bandwidth d),
// which is the case of a spectrum (interpolated along frequency) whose signal
// occupies the first samples of the transform window.
int MakeGLS(fcomplex* h, int n, int nfrac, double bandwidth = 1.0);
// Same for a band centred on zero: R(d) = sinc(bandwidth d), real kernels.
int MakeGLSlowpass(fcomplex* h, int n, int nfrac, double bandwidth);

// Interpolates in[0..nIn-1] at positions pos[0..nOut-1] (in samples) with a
// kernel table from MakeGLS / MakeGLSlowpass; samples outside the input count
// as zero.
void glsF(const float* in, int nIn, const double* pos, float* out, int nOut, const fcomplex* table,
          int n, int nfrac);
void glsFcomplex(const fcomplex* in, int nIn, const double* pos, fcomplex* out, int nOut,
                 const fcomplex* table, int n, int nfrac);
