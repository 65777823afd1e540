#pragma once
// Doppler centroid polynomial from the bins of the scan: SNR mask, filling of
// weak bins, phase variance of each bin, a first linear model of the wrapped
// phases, the weighted fit of seven terms, and the resolution of the PRF
// ambiguity from the data (MLBF, WDAR) or from the orbit geometry.
//
// The polynomial in samples r and lines l has the terms
//   c0 + c1 r + c2 l + c3 r l + c4 r^2 + c5 r^3 + c6 r^4
// in PRF units until dcnapoly scales it to Hz and seconds.
#include "doppler/dc_state.h"

// Turns state.bins into poly[0..6] (Hz, range and azimuth time in seconds
// from the first sample and line), ambiguity included when resolved.
// Status: 0; 1 too few valid bins or a failed fit; 8 no memory; -1 no bin
// with a usable SNR near a weak bin.
int dcnapoly(DcEstInput& input, DcEstState& state, double poly[7]);

// Ambiguity of the wrapped polynomial poly (PRF units, samples and lines)
// into state.ambiguity. 0 resolved; 1 unresolved; 10 bad ambFlag or no
// block wanted; other statuses of block reads and set-ups passed on.
int estambiguity(DcEstState& state, DcEstInput& input, const double poly[7]);

// Reads the best blocks and runs MLBF on state.mlbfBlocks, then WDAR on
// state.wdarBlocks, their centres set by the caller.
int bestblocksproc(DcEstState& state, DcEstInput& input, const double poly[7]);

// Variance of the lag-one phase estimate of every bin (krStd, PRF^2).
int getkrstd(DcEstInput& input, DcEstState& state);
// Variance (PRF^2) of the centroid estimate of one bin of nEff independent
// looks at signal-to-noise ratio snr; alpha = 2 V / (anLen PRF). 1e6 when the
// integration fails.
double dcPhaseVariance(double snr, double nEff, double alpha);

// First linear model of the wrapped phases: lin[0] constant, lin[1] per
// range sample, lin[2] per line (PRF units).
int unwrapdcbin(DcEstState& state, double lin[3]);

// Weighted fit of the seven terms to the wrapped residuals of the valid bins
// around the linear model; poly receives the terms (masked by polMask).
// Status 1 with fewer than 8 valid bins or a failed fit.
int getdccoef(const DcEstInput& input, DcEstState& state, const double lin[3], double poly[7]);

// Robust mean of values[0..n-1]: percentile trimming at p = 0.05 .. 0.45
// until the standard deviation is at most varTh.
int dcnastd(const double* values, int n, double varTh, double* mean, double* std, int* count);

// p and 1 - p percentiles of values[0..n-1] from a 1024-bin histogram.
int getpercentile(const double* values, int n, double p, double* lo, double* hi);

// Reads the block of blockl lines of blocks samples starting at line y and
// sample x into state.blockBuf (from state.data when inMemory).
int read_block(DcEstState& state, const DcEstInput& input, int y, int x);

// Value of the polynomial at sample r, line l.
double dcPolyValue(const double poly[7], double r, double l);
