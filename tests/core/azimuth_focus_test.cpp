// Point targets focused through the azimuth block driver, in core: every
// kernel (plain omega-K, least-squares Stolt table, chirp-z Stolt zoom) with
// an ERS-like centroid and with one near half the PRF. Targets sit in the
// middle of blocks and sub-blocks and on their seams.
#include "core/azimuth_focus.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <complex>
#include <vector>

#include "support/point_targets.h"
#include "support/scenes.h"

namespace {

using namespace support;
using namespace support::compressed;

struct Focused {
  AzimuthFocusScene scene;
  std::vector<fcomplex> image;
  std::vector<Target> targets;
};

// Simulates and focuses in core. The annotation does not depend on the data
// nor, with the automatic shifts, on the number of lines: a first pass on a
// short empty raster gives it, and with it the places of the targets.
// `slopeHz`: the processing centroid moves by that much across the swath
// while the echoes keep g.dc (a centroid estimated with a range trend).
// `pixels`: output (row, column) of the targets, kPixels when empty.
Focused focusScene(const Geometry& g, const AzimuthFocusConf& conf, double slopeHz = 0.0,
                   const std::vector<std::array<double, 2>>& pixels = {}) {
  Focused f;
  AzimuthFocusFiles files;
  fillScene(g, files, f.scene);
  f.scene.polyDC[1] = slopeHz / (g.samples / g.frg);
  {
    AzimuthFocusScene probeScene = f.scene;
    AzimuthFocusConf probeConf = conf;
    probeScene.lines = 1500;
    probeConf.ApplyAzShift = probeScene.lines;
    std::vector<fcomplex> probe(static_cast<std::size_t>(g.samples) * probeScene.lines);
    probeScene.inCore = 1;
    probeScene.buffer = probe.data();
    EXPECT_EQ(azimuthfoc(files, probeScene, probeConf), 0);
    EXPECT_EQ(probeScene.outLines, 100);
    f.targets = placeTargets(g, probeScene.firstLineTime, probeScene.firstSampleTime);
    if (!pixels.empty()) {
      f.targets.clear();
      for (const auto& p : pixels)
        f.targets.push_back({probeScene.firstLineTime + p[0] / g.prf,
                             (probeScene.firstSampleTime + p[1] / g.frg) * kC / 2.0, 1.0});
    }
  }
  f.scene.inCore = 1;
  f.image = simulate(g, f.targets);
  f.scene.buffer = f.image.data();
  EXPECT_EQ(azimuthfoc(files, f.scene, conf), 0);
  f.image.resize(static_cast<std::size_t>(f.scene.outLines) * f.scene.outSamples);
  return f;
}

// Every target at its zero-Doppler pixel, with the widths and sidelobes of
// the windows (the azimuth one weighted by the antenna pattern), equally
// bright, and with peak phases -4 pi R0 / lambda up to one constant.
void checkTargets(const Geometry& g, const AzimuthFocusConf& conf, const Focused& f) {
  // The chirp-z kernel leaves the range window out.
  const double pa = conf.AzimuthWindowHammingParameter;
  const double pr = conf.PerformInterpolation == 1 ? 1.0 : conf.RangeWindowHammingParameter;
  const double azlook = conf.AzimuthLookBandwidth, rglook = conf.RangeLookBandwidth;
  const IrMetrics thAz = theoryOfWeight([&](double u) {
    const double fa = std::fabs(u * g.prf);
    if (fa >= azlook / 2.0) return 0.0;
    return (pa + (1.0 - pa) * std::cos(kPi * fa / (azlook / 2.0))) * g.pattern(g.dc + u * g.prf);
  });
  const IrMetrics thRg = theoryOfWeight([&](double u) {
    const double fr = std::fabs(u * g.frg);
    if (fr > g.B / 2.0 || fr >= rglook / 2.0) return 0.0;
    return pr + (1.0 - pr) * std::cos(kPi * fr / (rglook / 2.0));
  });
  std::vector<double> residual, amplitude;
  for (const Target& t : f.targets) {
    const double row = (t.t0 - f.scene.firstLineTime) * g.prf;
    const double col = (2.0 * t.R0 / kC - f.scene.firstSampleTime) * g.frg;
    const PtaResult m = measureTarget(f.image.data(), f.scene.outLines, f.scene.outSamples, row, col);
    expectTarget(m, row, col, thAz, thRg);
    residual.push_back(m.phase + 4.0 * kPi * t.R0 / g.lambda());
    amplitude.push_back(m.peakAmplitude);
  }
  const auto [lo, hi] = std::minmax_element(amplitude.begin(), amplitude.end());
  EXPECT_LT(*hi / *lo, 1.02);
  EXPECT_LT(phaseSpread(residual) * 180.0 / kPi, bars::kPhaseDeg);
}

TEST(AzimuthFocusPointTargets, ErsLikeCentroidFocusesAtZeroDoppler) {
  Geometry g;
  g.dc = 300.0;
  const AzimuthFocusConf conf = sceneConf(g);
  const Focused f = focusScene(g, conf);
  EXPECT_EQ(f.scene.outSamples, g.samples - 64);
  EXPECT_EQ(f.scene.outLines, g.lines - 1400);
  EXPECT_NEAR(f.scene.Veq, g.V, 0.05);
  EXPECT_DOUBLE_EQ(f.scene.azSpacing, f.scene.Veq / g.prf);
  EXPECT_DOUBLE_EQ(f.scene.rgSpacing, 149896229.0 / g.frg);
  EXPECT_DOUBLE_EQ(f.scene.centroid, 300.0);
  checkTargets(g, conf, f);
}

// Kernel (PerformInterpolation) and centroid as a fraction of the PRF.
struct KernelCase {
  int interpolation;
  double centroidPrf;
};

class AzimuthKernels : public ::testing::TestWithParam<KernelCase> {};

TEST_P(AzimuthKernels, PointTargetsMeetTheBars) {
  Geometry g;
  g.dc = GetParam().centroidPrf * g.prf;
  const AzimuthFocusConf conf = sceneConf(g, GetParam().interpolation, GetParam().interpolation ? 0.4 : 0.0);
  checkTargets(g, conf, focusScene(g, conf));
}

INSTANTIATE_TEST_SUITE_P(PointTargets, AzimuthKernels,
                         ::testing::Values(KernelCase{0, 0.48}, KernelCase{7, 300.0 / 1679.9}, KernelCase{7, 0.48},
                                           KernelCase{1, 300.0 / 1679.9}, KernelCase{1, 0.48}));

// The peak phase is -4 pi R0 / lambda itself, whatever the centroid, its
// ambiguity, and a 150 Hz range trend of the processing centroid against
// the echoes' (the azimuth shift turned with the absolute wavenumber, the
// residual wavenumber offset of each range sub-block removed). With a
// Doppler rate that drifts along the orbit (here four times an ERS drift)
// one speed per block left -8 to +7 degrees and 0.05 line at 2300 Hz, and
// a target on a block seam at 100 degrees; the blocks are resampled to the
// speed of their centres. Three PRFs from zero Doppler the kernel holds
// too (measured within 2.2 degrees and 0.004 line).
TEST(AzimuthFocusPointTargets, PeakPhaseFreeOfTheCentroid) {
  struct Case {
    double dc, slope, drift;
  };
  for (const Case c : {Case{0.0, 0.0, 0.0}, Case{320.0, 150.0, 0.0}, Case{-450.0, 0.0, 0.0},
                       Case{2300.0, 0.0, 0.0}, Case{2300.0, 150.0, 0.0}, Case{2300.0, 0.0, 2e-5},
                       Case{5040.0, 0.0, 0.0}}) {
    Geometry g;
    g.dc = c.dc;
    g.drift = c.drift;
    const AzimuthFocusConf conf = sceneConf(g, 7, 0.4);
    const Focused f = focusScene(g, conf, c.slope);
    // The measurement upsamples the azimuth spectrum in the band of the
    // wrapped centroid; n whole PRFs above it the phase at a peak between
    // lines turns by 2 pi n times the line.
    const double n = std::round(c.dc / g.prf);
    for (const Target& t : f.targets) {
      const double row = (t.t0 - f.scene.firstLineTime) * g.prf;
      const double col = (2.0 * t.R0 / kC - f.scene.firstSampleTime) * g.frg;
      const PtaResult m = measureTarget(f.image.data(), f.scene.outLines, f.scene.outSamples, row, col);
      const double residual =
          std::remainder(m.phase + 2.0 * kPi * n * m.peakLine + 4.0 * kPi * t.R0 / g.lambda(), 2.0 * kPi);
      EXPECT_LT(std::fabs(residual) * 180.0 / kPi, bars::kPhaseDeg)
          << "centroid " << c.dc << " Hz, trend " << c.slope << " Hz, drift " << c.drift << ", target at "
          << row << ", " << col;
      EXPECT_NEAR(m.peakLine, row, bars::kPositionPixels) << "centroid " << c.dc << " Hz, drift " << c.drift;
    }
  }
}

// Three PRFs from zero Doppler across a swath of five 1024-sample range
// sub-blocks: each sub-block moved its targets by 0.007 line and -4 degrees
// more than the one before (the running range shift applied before the
// Stolt mapping), -16 degrees at the far range.
TEST(AzimuthFocusPointTargets, PeakPhaseAcrossRangeSubBlocksFarFromZeroDoppler) {
  Geometry g;
  g.dc = 3.0 * g.prf;
  g.samples = 4800;
  AzimuthFocusConf conf = sceneConf(g, 7, 0.4);
  conf.SamplesInBlock = 1024;
  std::vector<std::array<double, 2>> pixels;
  for (int k = 0; k < 6; ++k) pixels.push_back({1000.3 + 700.0 * k, 40.2 + 820.0 * k});
  const Focused f = focusScene(g, conf, 0.0, pixels);
  for (const Target& t : f.targets) {
    const double row = (t.t0 - f.scene.firstLineTime) * g.prf;
    const double col = (2.0 * t.R0 / kC - f.scene.firstSampleTime) * g.frg;
    const PtaResult m = measureTarget(f.image.data(), f.scene.outLines, f.scene.outSamples, row, col);
    const double residual =
        std::remainder(m.phase + 2.0 * kPi * 3.0 * m.peakLine + 4.0 * kPi * t.R0 / g.lambda(), 2.0 * kPi);
    EXPECT_LT(std::fabs(residual) * 180.0 / kPi, 1.0) << "target at " << row << ", " << col;
    EXPECT_NEAR(m.peakLine, row, 0.002) << "target at " << row << ", " << col;
  }
}

}  // namespace
