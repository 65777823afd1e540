#pragma once
// Doppler centroid estimation from a range-compressed raster: the driver, the
// scan of the raster into bins with the lag-one phase estimate of each bin,
// the contrast map, and the log "DCEST_resume.txt".
//
// Every call returns 0 on success or a status (1 bad condition, 4 read
// failed, 5 write failed, 7/8 out of memory, 9 not opened, 10 bad parameter).
#include <string>

#include "doppler/dc_state.h"

// Estimates the Doppler centroid polynomial of the raster of `input`.
// poly receives c0..c6 of the terms 1, r, l, r l, r^2, r^3, r^4 with r the
// range time (s, from the first sample) and l the azimuth time (s, from the
// first line), in Hz, ambiguity included. `input.lines` is trimmed to whole
// bin rows.
int getnadcpoly(DcEstInput& input, DcEstState& state, double poly[7]);

// Checks the bin and cell sizes, sizes the bin grid and contrast maps, the
// read buffer (bin rows within `memory`) and the block arrays; trims
// input.lines to whole bin rows.
int setprocbuf(DcEstInput& input, DcEstState& state);

// Cubic B-spline, the autocorrelation of a two-way sinc^2 azimuth antenna
// pattern with the lag in units of anLen / (2 V).
double dcBspline3(double x);

// r0 and r1 of the theoretic azimuth autocorrelation: B(0) and
// B(2 V / (anLen PRF)).
int dcTheoreticAutocorrelation(const DcEstInput& input, DcEstState& state);

// Reads the raster once in rows of whole bins, estimates each bin and fills
// the contrast maps; ends with getcontrast.
int getnadcbins(DcEstInput& input, DcEstState& state);

// Lag-one estimate of one block of blocks x blockl samples, stored line by
// line (range fastest). Fills dcWrapped, contrast, power, noise and valid.
void dcBinEstimate(const fcomplex* block, const DcEstState& state, DcBin& bin);

// Smooths the two contrast maps and turns the second into the contrast map.
int getcontrast(DcEstState& state);

// Writes "<outDir>/DCEST_resume.txt".
int infodump(const DcEstInput& input, const DcEstState& state, const double poly[7]);

// Writes the resume profile `path` (and syncs it to disk).
int resumefile(const std::string& path, const DcEstInput& input, const DcEstState& state,
               const double poly[7]);
