#pragma once

// Mapping between a wanted focused block and the block of the extracted raw
// matrix that feeds it. Slow times are seconds since 1985, fast times
// two-way delays in seconds.

// A block given by its start time pair and size; the first line and sample
// are its position in the extracted raw matrix (raw blocks only).
struct ImBlock {
  double slowStart = 0.0;
  double fastStart = 0.0;
  int lines = 0;
  int samples = 0;
  int firstLine = 0;
  int firstSample = 0;
};

// The extracted raw matrix and what focusing one line and sample needs of it.
struct ImCutGeometry {
  double slowStart = 0.0;  // first raw line
  double slowDelta = 0.0;  // 1 / PRF
  int lines = 0;
  double fastStart = 0.0;  // first raw sample
  double fastDelta = 0.0;  // 1 / range sampling rate
  int samples = 0;
  int replicaLen = 0;     // range compression drops replicaLen - 1 samples
  int apertureLines = 0;  // lines of the synthetic aperture around a focused line
  double azShift = 0.0;   // s, beam centre after zero Doppler (getDCshift)
  double rgShift = 0.0;   // s, two-way range walk of the squinted beam (getDCshift)
};

// Shifts implied by the Doppler centroid of a block: azimuth shift
// tan(squint) R / Veq (s), R being the mid-swath slant range (m), and range
// shift 2 (1/cos(squint) - 1) R / c (s). With interpolation on, the range
// shift is left to the interpolation (0). Both 0 when shiftStep is off.
// Returns 0.
int getDCshift(double squintRad, double midRange, double veq, int interpolation, int shiftStep,
               double& azShift, double& rgShift);

// Raw block that feeds `focused`. 10 with "Requested focused block cannot be
// obtained from the given extracted data matrix." when it leaves the matrix.
int imcutter(const ImCutGeometry& geometry, const ImBlock& focused, ImBlock& raw);
// Largest focused block that `raw` feeds (its lines and samples positions
// taken from raw's first line and sample). 1 when nothing remains.
int imcutter_inv(const ImCutGeometry& geometry, const ImBlock& raw, ImBlock& focused);
