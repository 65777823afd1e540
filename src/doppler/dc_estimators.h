#pragma once
// Absolute Doppler centroid estimators of single blocks, used to resolve the
// PRF ambiguity, and the selection of the blocks they run on.
//
// MLBF (multi-look beat frequency): two range looks of the block, a given
// distance apart in range frequency, beat against each other at a frequency
// proportional to the absolute centroid; a chirp-z search finds the beat.
// WDAR: the azimuth lag-one phase as a function of range frequency has a slope
// proportional to the absolute centroid.
//
// Both results are in units of the PRF. The filter and transform set-up of
// each estimator lives between its init and close calls, one set-up at a time.
#include <vector>

#include "doppler/dc_state.h"

// A cell of a map selected by topNpoints.
struct MapPoint {
  int x = 0;  // column
  int y = 0;  // row
  float value = 0.0f;
};

// Histogram of values[0..n-1] over nbins bins: step = (max - min) / (nbins - 1),
// value v counts in bin round((v - min) / step), half away from zero. hist
// receives the counts. When all values are equal (step 0) they all count in
// bin 0. Status 1 for n or nbins below 1.
int make_hist(const float* values, int n, double* step, double* min, int* hist, int nbins);
int make_hist(const double* values, int n, double* step, double* min, int* hist, int nbins);
// Bin of v in a histogram of make_hist.
int hist_bin(double v, double min, double step);

// Sorts keys[lo..hi] ascending in place, moving idx along with them.
void my_qsort(int lo, int hi, float* keys, int* idx);

// Candidates (x[i], y[i]), i < count, in the order of preference. A candidate
// whose box of spacing sx x sy centred on it leaves the width x height map, or
// which lies closer than ceil(sx) in x and ceil(sy) in y to an already kept
// one, is dropped: its x becomes -1. Returns the number kept.
int sel_no_overlap(int* x, int* y, int count, int width, int height, double sx, double sy);

// The n highest cells of the width x height map (row-major) that do not
// overlap at spacing sx x sy and keep clear of the border, in descending
// order of value; found receives their number. Status 1 for a bad map.
int topNpoints(const float* map, std::vector<MapPoint>& out, int n, int width, int height,
               double sx, double sy, int* found);

// MLBF set-up: look filters and look distances (state.lookDist). An even
// fLength is raised by one with a warning. Status 10 for nMlbf below 1, the
// remez status when the design fails.
int multimlbf_init(DcEstState& state);
// Chirp-z set-up of the beat frequency search (after multimlbf_init).
int chirpZ_init(DcEstState& state);
// Estimates of block state.blockBuf (blockl lines of blocks samples) into
// state.mlbfBlocks[blockIndex]: one estimate and one quality per distance.
// Status 1 without set-up.
int multimlbf(DcEstState& state, int blockIndex);
// Releases the MLBF set-up (filters and chirp-z plans).
void multimlbf_close();
// True while an MLBF set-up is held.
bool multimlbf_ready();

// WDAR set-up: range transform plan and the length of the slope transform.
int wdar_init(DcEstState& state);
// Estimate of block state.blockBuf into state.wdarBlocks[blockIndex].value;
// poly is the wrapped centroid polynomial in samples and lines (PRF units),
// giving the phase at zero range frequency. -1 without set-up.
int wdar(DcEstState& state, const double poly[7], int blockIndex);
// The same on a block in `work` (ns x nl samples), transformed in place;
// blocks may be estimated side by side on different threads.
int wdarInPlace(DcEstState& state, int blockIndex, fcomplex* work);
// Releases the WDAR set-up.
void wdar_close();
bool wdar_ready();

// Look distances of the MLBF set-up: d_i = 2 lookBf rgBand + i s.
std::vector<double> mlbfLookDistances(const DcEstState& state);
