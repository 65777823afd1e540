#pragma once
#include <string>

#include "base/fcomplex.h"

// Correction of the I/Q channels of raw echoes: offsets, gain imbalance and
// quadrature skew.
//
// Model of a received sample: I = A cos(p) + mI, Q = g A sin(p + e) + mQ.
// The offsets mI, mQ are removed, Q is scaled by level(I)/level(Q), and the
// skew e is removed by Q' = (Q - I sin e) / cos e, which leaves I as the
// reference channel. The skew is estimated as asin(2 sum(IQ) / (sum(II) +
// sum(QQ))) on the level-equalised channels.

// Geometry of a raw raster as the estimator needs it (taken from the raster's
// record by the caller or by Ortog::estimate()).
struct OrtogRaster {
  int lines = 0;
  int samples = 0;
  int prefixBytes = 0;  // 4 for "RAW DATA" (SWST float per line), 0 when aligned
  long long headerOffset = 0;
  double slowStartTime = 0.0;
  double slowTimeDelta = 0.0;
};

// Slow-time polynomial fits of the channel statistics (the tool path).
class Ortog {
 public:
  Ortog() = default;
  Ortog(const std::string& rawFile, int linesPerBlock, int blockPitch)
      : rawFile(rawFile), linesPerBlock(linesPerBlock), blockPitch(blockPitch) {}

  std::string rawFile;    // raw raster; its record is rawFile + ".hdr"
  int linesPerBlock = 1;  // lines per statistics block
  int blockPitch = 50;    // lines between block starts
  // Degree-2 polynomials, constant term first, of the slow time since
  // timeOrigin.
  double qMean[3] = {0, 0, 0};
  double iMean[3] = {0, 0, 0};
  double qLevel[3] = {0, 0, 0};
  double iLevel[3] = {0, 0, 0};
  double phase[3] = {0, 0, 0};  // radians
  double timeOrigin = 0.0;

  // Reads the raster geometry from rawFile + ".hdr" and estimates.
  int estimate();
  // Estimates with the geometry given.
  int estimate(const OrtogRaster& raster);
  // Corrects n samples of one line at slow time t.
  void apply_ortog(fcomplex* line, double t, int n) const;
  // Corrects the whole raster rawFile in place (geometry from its record).
  int apply_ortog();
  // Same with the geometry given.
  int apply_ortog(const OrtogRaster& raster);
};

// Streaming form used by rangefoc: corrects `lines` rows of `samples` (row
// pitch `pitch`) with recursive estimates of the statistics carried from one
// call to the next. Block 0 works line by line on each line's own values and
// does not touch the skew; later blocks smooth every statistic with
// s = 0.99 s + 0.01 v and correct the skew. Returns 0.
int ortogN(fcomplex* data, int pitch, int samples, int lines, int block);
// Clears the state of ortogN (a new scene).
void ortogN_reset();
