#pragma once
#include <string>

#include "base/fcomplex.h"

// Azimuth focusing of a range-compressed raster: overlapping azimuth blocks,
// each focused by multirg with the Doppler model evaluated at its centre,
// stitched into the output raster.

// Files and times of the input raster.
struct AzimuthFocusFiles {
  std::string input;   // range-compressed raster (unused when in core)
  std::string output;  // focused raster (unused when in core)
  double frg_hz = 0.0;
  double fc_hz = 0.0;
  double prf_hz = 0.0;
  double FastStartTime = 0.0;  // two-way delay of sample 0, s
  double bandwidth_hz = 0.0;   // range bandwidth
  double SlowStartTime = 0.0;  // time of line 0, s
  // The input is a temporary the job erases: the output may take over its
  // file and be written over the lines already read (see handOverFile).
  bool overwriteInput = false;
};

// The scene: sizes, Doppler models in, geometry and output sizes out.
// Polynomial layout: c0 (constant), c1 (x), c2 (y), c3 (xy), c4 (x^2),
// c5 (x^3), c6 (x^4), trg0_s, taz0_s; x is fast time - trg0_s, y slow time
// - taz0_s.
struct AzimuthFocusScene {
  int verbose = 0;
  int samples = 0;
  int lines = 0;
  int outSamples = 0;  // filled
  int outLines = 0;    // filled
  double polyDC[9] = {};
  double polyFR[9] = {};
  double polyDCOut[18] = {};  // copies of the polynomial sets (filled)
  double polyFROut[18] = {};
  double DCref = 0.0;  // fixed reference centroid, 0 = none
  int inCore = 0;
  fcomplex* buffer = nullptr;  // in core: input raster, focused in place
  // Filled:
  double Veq = 0.0;              // equivalent speed, m/s
  double azSpacing = 0.0;        // m
  double rgSpacing = 0.0;        // slant range, m
  double centroid = 0.0;         // at the scene centre, Hz
  double firstLineTime = 0.0;    // s
  double firstSampleTime = 0.0;  // two-way, s
};

// Azimuth processing configuration; overlaps are half the full overlaps,
// bandwidths in hertz. |ApplyAzShift| >= lines (|ApplyRgShift| >= samples)
// asks for the automatic shift plus the rest in lines (samples); below, the
// value is the shift in seconds.
struct AzimuthFocusConf {
  int PerformInterpolation = 0;
  double StoltPadding = 0.0;
  double AntennaLength = 10.0;
  int WhiteningFlag = 0;
  double RangeWindowHammingParameter = 0.0;
  double AzimuthWindowHammingParameter = 0.0;
  double RangeLookBandwidth = 0.0;
  double AzimuthLookBandwidth = 0.0;
  double RangeTransitionBandwidth = 0.0;
  double AzimuthTransitionBandwidth = 0.0;
  int SamplesInBlock = 0;
  int LinesInBlock = 0;
  int RangeOverlap = 0;    // half of the full range overlap
  int AzimuthOverlap = 0;  // half of the full azimuth overlap
  // Non-zero: the overlap is azimuth_overlap_from_scene's, AzimuthOverlap
  // is not used.
  int AzimuthOverlapFromScene = 0;
  double ApplyAzShift = 0.0;
  double ApplyRgShift = 0.0;
  // Budget of the job in MiB: a block that does not fit in it with the
  // sub-block work area is held as a strip of its columns that follows the
  // range sub-blocks (same product). 0: the block is held whole.
  int Memory = 0;
};

// Status 0, 1, 4, 5, 7, 9 or a kernel's status. In core, the focused rows
// (outSamples at pitch outSamples) are packed at the start of scene.buffer.
int azimuthfoc(const AzimuthFocusFiles& files, AzimuthFocusScene& scene,
               const AzimuthFocusConf& conf);

// The plan of azimuth blocks: step between blocks and the index of the last
// one (blocks 0..last are visited; the last has lines - step*last lines).
struct AzimuthBlockPlan {
  int overlap = 0;  // full azimuth overlap
  int step = 0;
  int last = 0;
  int progressTotal = 0;
};
// 1 when LinesInBlock is not larger than the full overlap.
int azimuth_block_plan(int lines, int linesInBlock, int halfOverlap, AzimuthBlockPlan& plan);

// Full azimuth overlap in lines (even) that the blocks of this scene need:
// one aperture of the processed Doppler band at the far range, plus on each
// side the largest distance between a target's focused line and the centre
// of its echo, (centroid - dcref) / Doppler rate, over the scene. veq is the
// equivalent speed of the scene (m/s), dcref the kernels' reference
// centroid (Hz), whose offset the azimuth shift of the product carries.
int azimuth_overlap_from_scene(const AzimuthFocusFiles& files, const AzimuthFocusScene& scene,
                               const AzimuthFocusConf& conf, double veq, double dcref);

// Shifts in seconds (azimuth, range) as azimuthfoc applies them, with the
// scene's central squint and equivalent geometry.
void azimuth_focus_shifts(const AzimuthFocusConf& conf, int lines, int samples, double squint,
                          double Req, double Veq, double prf_hz, double frg_hz, double& azShift,
                          double& rgShift);
