#include "core/azimuth_focus.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "azimuth_test_scene.h"
#include "core/azimuth_block.h"

#ifdef _OPENMP
#include <omp.h>
#endif

namespace {

using namespace azimuth_scene;

// Configuration of the point-target scenes: 4096-line blocks with a full
// azimuth overlap of 1400 lines (longer than the 1314-line aperture),
// 256-sample range sub-blocks with a full overlap of 64.
AzimuthFocusConf sceneConf(const Geometry& g) {
  AzimuthFocusConf c;
  c.PerformInterpolation = 0;
  c.AntennaLength = g.La;
  c.WhiteningFlag = 0;
  c.RangeWindowHammingParameter = 0.75;
  c.AzimuthWindowHammingParameter = 0.6;
  c.RangeLookBandwidth = g.B;
  c.RangeTransitionBandwidth = g.B;
  c.AzimuthLookBandwidth = 0.8 * g.prf;
  c.AzimuthTransitionBandwidth = 0.8 * g.prf;
  c.SamplesInBlock = 256;
  c.LinesInBlock = 4096;
  c.RangeOverlap = 32;
  c.AzimuthOverlap = 700;
  c.ApplyAzShift = g.lines;    // automatic
  c.ApplyRgShift = g.samples;  // automatic
  return c;
}

void fillScene(const Geometry& g, AzimuthFocusFiles& files, AzimuthFocusScene& scene) {
  files.frg_hz = g.frg;
  files.fc_hz = g.fc;
  files.prf_hz = g.prf;
  files.FastStartTime = g.fastStart();
  files.bandwidth_hz = g.B;
  files.SlowStartTime = 0.0;
  scene.samples = g.samples;
  scene.lines = g.lines;
  const double tref = g.fastStart() + 0.5 * g.samples / g.frg;
  scene.polyDC[0] = g.dc;
  scene.polyDC[7] = tref;
  scene.polyDC[8] = 0.0;
  g.ratePoly(tref, scene.polyFR[0], scene.polyFR[1], scene.polyFR[4]);
  scene.polyFR[7] = tref;
}

// Output pixels (row, col) of the targets, placed in the middle of blocks and
// sub-blocks and on their seams (output row 2696, output columns 192, 384).
const double kPixels[][2] = {{1000.3, 100.2},  {2695.6, 191.7}, {2000.0, 384.4},
                             {4000.7, 300.5},  {2696.2, 50.0},  {3500.4, 250.3},
                             {4700.1, 400.0}};

// Targets whose zero-Doppler positions fall near kPixels, given the
// annotation of a focused scene.
std::vector<Target> placeTargets(const Geometry& g, double firstLine, double firstSample) {
  std::vector<Target> t;
  for (const auto& p : kPixels)
    t.push_back({firstLine + p[0] / g.prf, (firstSample + p[1] / g.frg) * kC / 2.0, 1.0});
  return t;
}

struct Focused {
  AzimuthFocusScene scene;
  std::vector<fcomplex> image;
  std::vector<Target> targets;
};

// Simulates and focuses in core. The target times come from a first pass on
// an empty raster that gives the output annotation.
Focused focusScene(const Geometry& g, const AzimuthFocusConf& conf) {
  Focused f;
  AzimuthFocusFiles files;
  fillScene(g, files, f.scene);
  // The annotation does not depend on the data nor, with the automatic
  // shifts, on the number of lines: a short empty raster gives it.
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
  }
  f.scene.inCore = 1;
  f.image = simulate(g, f.targets);
  f.scene.buffer = f.image.data();
  EXPECT_EQ(azimuthfoc(files, f.scene, conf), 0);
  f.image.resize(static_cast<std::size_t>(f.scene.outLines) * f.scene.outSamples);
  return f;
}

void checkTargets(const Geometry& g, const AzimuthFocusConf& conf, const Focused& f) {
  const double lam = g.lambda();
  // The chirp-z kernel leaves the range window out.
  const double pa = conf.AzimuthWindowHammingParameter;
  const double pr = conf.PerformInterpolation == 1 ? 1.0 : conf.RangeWindowHammingParameter;
  const double azlook = conf.AzimuthLookBandwidth, rglook = conf.RangeLookBandwidth;
  const Profile thAz = theoryProfile([&](double u) {
    const double f = std::fabs(u * g.prf);
    if (f >= azlook / 2.0) return 0.0;
    return (pa + (1.0 - pa) * std::cos(kPi * f / (azlook / 2.0))) * g.pattern(g.dc + u * g.prf);
  });
  const Profile thRg = theoryProfile([&](double u) {
    const double f = std::fabs(u * g.frg);
    if (f > g.B / 2.0 || f >= rglook / 2.0) return 0.0;
    return pr + (1.0 - pr) * std::cos(kPi * f / (rglook / 2.0));
  });
  std::vector<double> residual, amplitude;
  for (const Target& t : f.targets) {
    const double row = (t.t0 - f.scene.firstLineTime) * g.prf;
    const double col = (2.0 * t.R0 / kC - f.scene.firstSampleTime) * g.frg;
    const PointMeasure m =
        measure(f.image.data(), f.scene.outLines, f.scene.outSamples, row, col);
    SCOPED_TRACE(testing::Message() << "target at row " << row << " col " << col);
    EXPECT_NEAR(m.row, row, 0.05);
    EXPECT_NEAR(m.col, col, 0.05);
    EXPECT_NEAR(m.az.width / thAz.width, 1.0, 0.05);
    EXPECT_NEAR(m.rg.width / thRg.width, 1.0, 0.05);
    EXPECT_NEAR(m.az.pslr, thAz.pslr, 1.0);
    EXPECT_NEAR(m.rg.pslr, thRg.pslr, 1.0);
    EXPECT_NEAR(m.az.islr, thAz.islr, 1.0);
    EXPECT_NEAR(m.rg.islr, thRg.islr, 1.0);
    residual.push_back(m.phase + 4.0 * kPi * t.R0 / lam);
    amplitude.push_back(m.amplitude);
  }
  // Equal targets come out equally bright in every block and sub-block.
  const auto [lo, hi] = std::minmax_element(amplitude.begin(), amplitude.end());
  EXPECT_LT(*hi / *lo, 1.02);
  // Peak phases agree with -4 pi R0 / lambda up to one constant.
  std::complex<double> mean = 0.0;
  for (double r : residual) mean += std::polar(1.0, r);
  for (double r : residual) {
    const double d = std::arg(std::polar(1.0, r) / mean) * 180.0 / kPi;
    EXPECT_LT(std::fabs(d), 5.0);
  }
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

void focusWithStolt(int interp) {
  Geometry g;
  g.dc = 300.0;
  AzimuthFocusConf conf = sceneConf(g);
  conf.PerformInterpolation = interp;
  conf.StoltPadding = 0.4;
  const Focused f = focusScene(g, conf);
  checkTargets(g, conf, f);
}

// Stolt kernels: the running range shift keeps the sub-blocks on one grid.
TEST(AzimuthFocusPointTargets, LeastSquaresStoltThroughTheDriver) { focusWithStolt(7); }

TEST(HeavyAzimuthFocusPointTargets, ChirpZStoltThroughTheDriver) { focusWithStolt(1); }

TEST(AzimuthFocusPointTargets, CentroidNearHalfPrfFocusesAtZeroDoppler) {
  Geometry g;
  g.dc = 0.48 * g.prf;
  const AzimuthFocusConf conf = sceneConf(g);
  const Focused f = focusScene(g, conf);
  checkTargets(g, conf, f);
}

}  // namespace
